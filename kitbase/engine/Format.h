// Rendering a command's result: the six formatters and the parameters that steer them.
//
// A formatter writes one result (a meta object) through a Writer. It may use the result's
// template (the command's OutputSpec template) to order fields: a structure's fields come in the
// order of the template of the same name, then the fields the template lacks in the result's
// order. FormatParams holds the output parameters (the command's defaults, overridden or extended
// by the user's --format-param); the keys that steer "simple" and "table" are:
//
//   fields:<Struct>          comma-separated field names to show, in order (simple, table, csv)
//   show-header:<Struct>     "false": simple omits the "<Struct>:" line, table its heading row
//   table-columns            table and csv: the columns and their order (wins over fields:)
//   units:<Struct>.<Field>   simple: " <unit>" after the value; table: heading "Field (unit)"
//   wrap-last                "true": a table too wide for the width narrows its last column first
//
// simple, table and keyvalue show text in the terminal escape form (engine/Text.h PutEscaped);
// csv quotes per RFC 4180; json and xml escape by their own rules. The user's settings are
// checked against the result's shape beforehand (engine/FormatCheck.h); the formatters take
// whatever they are given. Rendering reads the result and never changes it; it throws nothing
// but std::bad_alloc.
#pragma once

#include "engine/Writer.h"

#include <kitbase/Export.h>
#include <kitbase/MetaObj.h>

#include <string>
#include <utility>
#include <vector>

namespace Kitbase {
namespace Engine {

class KITBASE_API FormatParams {
public:
    typedef std::pair<std::string, std::string> KeyValue;

    FormatParams() {}
    explicit FormatParams(const std::vector<KeyValue>& defaults) : params_(defaults) {}

    // Replaces the value of an existing key in place, or adds the key last.
    void Set(const std::string& key, const std::string& value);
    // The value of key, or null.
    const std::string* Get(const std::string& key) const;
    const std::vector<KeyValue>& All() const { return params_; }

    // Steering, as read by the formatters.
    std::vector<std::string> Fields(const std::string& structName) const;  // empty: not set
    bool ShowHeader(const std::string& structName) const;
    const std::string* Unit(const std::string& structName, const std::string& field) const;
    std::vector<std::string> TableColumns() const;  // empty: not set
    bool WrapLast() const;

private:
    std::vector<KeyValue> params_;
};

struct RenderRequest {
    const MetaObj::MetaObject* result = nullptr;          // what to render; not null
    const MetaObj::MetaObject* resultTemplate = nullptr;  // the OutputSpec template, or null
    const FormatParams* params = nullptr;                 // null: no parameters
    std::size_t width = 80;                               // terminal columns (table fitting)
};

// The kind's name as the schema and messages print it: bool, int, string, struct, list.
KITBASE_API const char* MetaKindName(MetaObj::MetaType type);

// The formatter names, in the order help and refusals list them.
KITBASE_API const std::vector<std::string>& FormatterNames();
KITBASE_API bool IsFormatter(const std::string& name);

// Renders request.result with the named formatter. False (nothing written) for an unknown name.
KITBASE_API bool Render(const std::string& formatter, const RenderRequest& request, Writer& out);

// The individual formatters.
KITBASE_API void RenderSimple(const RenderRequest& request, Writer& out);
KITBASE_API void RenderTable(const RenderRequest& request, Writer& out);
KITBASE_API void RenderCsv(const RenderRequest& request, Writer& out);
KITBASE_API void RenderJson(const RenderRequest& request, Writer& out);
KITBASE_API void RenderXml(const RenderRequest& request, Writer& out);
KITBASE_API void RenderKeyValue(const RenderRequest& request, Writer& out);

}  // namespace Engine
}  // namespace Kitbase

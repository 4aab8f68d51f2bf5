// What the formatters share: reading meta objects without dynamic casts, finding the template
// that applies to a structure, mapping structure fields to columns, and the one-line text of a
// value. Internal to libkitbase.
//
// Pointers handed out here point into the result or its template, which the caller keeps alive
// for the whole rendering.
#pragma once

#include "engine/Format.h"

#include <kitbase/MetaObj.h>

#include <string>
#include <vector>

namespace Kitbase {
namespace Engine {
namespace Fmt {

using MetaObj::MetaBool;
using MetaObj::MetaInt;
using MetaObj::MetaList;
using MetaObj::MetaObject;
using MetaObj::MetaString;
using MetaObj::MetaStruct;

// GetType() tells the concrete class, so a static cast is exact and cheaper than a dynamic one.
inline const MetaStruct& AsStruct(const MetaObject& object) {
    return static_cast<const MetaStruct&>(object);
}
inline const MetaList& AsList(const MetaObject& object) {
    return static_cast<const MetaList&>(object);
}
inline bool IsScalar(const MetaObject& object) {
    MetaObj::MetaType type = object.GetType();
    return type == MetaObj::MetaTypeString || type == MetaObj::MetaTypeInt ||
           type == MetaObj::MetaTypeBool;
}
inline bool IsStructList(const MetaObject& object) {
    return object.GetType() == MetaObj::MetaTypeList &&
           AsList(object).GetElementType() == MetaObj::MetaTypeStruct;
}

// The structure template that applies to a structure named name: tmpl when it is a structure of
// that name, else null.
const MetaStruct* TemplateFor(const MetaObject* tmpl, const std::string& name);
// The element template of a list of structures: the list's own, else that of fallback when
// fallback is a list of structures, else null.
const MetaStruct* ElementTemplate(const MetaList& list, const MetaObject* fallback);
// The template of a structure's field: the same-named field of the structure's template, or null.
const MetaObject* FieldTemplate(const MetaStruct* structTemplate, const std::string& field);

// Columns of structures of one kind: a fixed list of names, each with the value shown when a
// structure lacks that field (the template's empty value, or null). Map() tells, for one
// structure, the value in each column and which of its fields no column holds. With grow set,
// such fields become new columns instead (table and csv gather columns over all rows).
//
// Consecutive structures with the same field names reuse the previous mapping, so a long list
// of alike rows costs one comparison per field.
class Columns {
public:
    void Reset(const std::vector<std::string>& names, const MetaStruct* structTemplate, bool grow);
    // Columns from selection when it is not empty, else from the template's fields.
    void ResetFor(const std::vector<std::string>& selection, const MetaStruct* structTemplate,
                  bool grow);

    void Map(const MetaStruct& row);

    std::size_t Count() const { return names_.size(); }
    const std::string& Name(std::size_t column) const { return names_[column]; }
    // After Map: the value in each column (null when neither the row nor a template has one).
    const std::vector<const MetaObject*>& Cells() const { return cells_; }
    // After Map without grow: indices into row.GetFields() of the fields in no column.
    const std::vector<std::size_t>& Extras() const { return extras_; }

private:
    std::vector<std::string> names_;
    std::vector<const MetaObject*> defaults_;
    bool grow_ = false;
    std::vector<std::string> layout_;  // field names of the structure mapped last
    std::vector<int> fieldColumn_;     // their columns, -1 for extras
    bool mapped_ = false;
    std::vector<const MetaObject*> cells_;
    std::vector<std::size_t> extras_;
};

// One-line text of a value, as simple, table and csv show it: a scalar's value (empty when it
// has none), the elements of a list of scalars joined by ", ", a list of structures as
// "{Field: value, ...}" items joined by ", ". Null shows as empty text. Raw: not escaped.
void AppendText(std::string& text, const MetaObject* value);
// The same as a terminal shows it (escaped, see PutEscaped) straight into a writer; scalars take
// no detour through a string unless they need escaping. scratch is reused between calls.
void PutText(Writer& out, const MetaObject* value, std::string& scratch);
// Display width of the shown (escaped) text.
std::size_t TextWidth(const MetaObject* value, std::string& scratch);
// Appends the shown (escaped) text of value to text.
void AppendShown(std::string& text, const MetaObject* value, std::string& scratch);

}  // namespace Fmt
}  // namespace Engine
}  // namespace Kitbase

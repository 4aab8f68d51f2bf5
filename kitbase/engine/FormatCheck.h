// Checking the user's --format-param settings against the shape of a command's result, before
// the command runs.
//
// Accepted keys: fields:<Struct> (comma-separated fields of that structure), show-header:<Struct>
// (a boolean), table-columns (fields of the structure the table's rows are), units:<Struct>.<Field>
// (any text) and wrap-last (a boolean). Structures and fields are those of the result template,
// structures nested in it (fields that are structures or lists of them) included. Booleans take
// the same spellings as boolean options: true, false, yes, no, 1 or 0, in any case.
// Nothing is kept; nothing throws but std::bad_alloc.
#pragma once

#include <kitbase/Export.h>
#include <kitbase/MetaObj.h>

#include <string>
#include <utility>
#include <vector>

namespace Kitbase {
namespace Engine {

// resultTemplate: the command's OutputSpec template, or null when it declares none. False with
// *error set to one line (naming what is accepted) for the first setting refused.
KITBASE_API bool CheckFormatParams(
    const std::vector<std::pair<std::string, std::string> >& settings,
    const MetaObj::MetaObject* resultTemplate, std::string* error);

}  // namespace Engine
}  // namespace Kitbase

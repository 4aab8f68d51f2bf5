// --format-param validation against the result template.
#include "engine/FormatCheck.h"

#include "engine/FormatCommon.h"
#include "engine/Text.h"

namespace Kitbase {
namespace Engine {

namespace {

using namespace Fmt;

const char kKeys[] =
    "keys are fields:<Struct>, show-header:<Struct>, table-columns, units:<Struct>.<Field> and "
    "wrap-last";

// The structures of a template by name, with their fields in order (merged when a name occurs
// twice), and the structure a table's rows would be.
class Shapes {
public:
    explicit Shapes(const MetaObject* tmpl) {
        if (tmpl == nullptr) return;
        if (tmpl->GetType() == MetaObj::MetaTypeStruct) rows_ = AsStruct(*tmpl).GetName();
        if (IsStructList(*tmpl) && AsList(*tmpl).GetTemplate()) {
            rows_ = AsList(*tmpl).GetTemplate()->GetName();
        }
        Collect(tmpl, 0);
    }

    bool Empty() const { return names_.empty(); }
    const std::string& Rows() const { return rows_; }
    const std::vector<std::string>* Fields(const std::string& name) const {
        for (std::size_t i = 0; i < names_.size(); ++i) {
            if (names_[i] == name) return &fields_[i];
        }
        return nullptr;
    }
    std::string NamesText() const { return JoinNames(names_, " and "); }
    const std::vector<std::string>& Names() const { return names_; }

private:
    void Collect(const MetaObject* tmpl, int depth) {
        if (tmpl == nullptr || depth > 32) return;  // a template is a tree; 32 is beyond any use
        if (tmpl->GetType() == MetaObj::MetaTypeList) {
            if (AsList(*tmpl).GetTemplate()) Collect(AsList(*tmpl).GetTemplate().get(), depth + 1);
            return;
        }
        if (tmpl->GetType() != MetaObj::MetaTypeStruct) return;
        const MetaStruct& shape = AsStruct(*tmpl);
        std::vector<std::string>* fields = Add(shape.GetName());
        for (const MetaStruct::Field& field : shape.GetFields()) {
            bool known = false;
            for (const std::string& name : *fields) known = known || name == field.first;
            if (!known) fields->push_back(field.first);
        }
        for (const MetaStruct::Field& field : shape.GetFields()) Collect(field.second.get(), depth + 1);
    }

    std::vector<std::string>* Add(const std::string& name) {
        for (std::size_t i = 0; i < names_.size(); ++i) {
            if (names_[i] == name) return &fields_[i];
        }
        names_.push_back(name);
        fields_.emplace_back();
        return &fields_.back();
    }

    std::vector<std::string> names_;
    std::vector<std::vector<std::string> > fields_;
    std::string rows_;
};

class Checker {
public:
    Checker(const Shapes& shapes, std::string* error) : shapes_(shapes), error_(error) {}

    bool Check(const std::string& key, const std::string& value) {
        if (key == "wrap-last") return Bool(key, value);
        if (key == "table-columns") {
            if (shapes_.Rows().empty()) {
                return Fail(Quote(key) + " needs a result made of structures; " + Structures());
            }
            return FieldList(key, shapes_.Rows(), value);
        }
        if (key.compare(0, 7, "fields:") == 0) {
            const std::string name = key.substr(7);
            return Structure(key, name) && FieldList(key, name, value);
        }
        if (key.compare(0, 12, "show-header:") == 0) {
            return Structure(key, key.substr(12)) && Bool(key, value);
        }
        if (key.compare(0, 6, "units:") == 0) return Unit(key);
        return Fail("unknown key " + Quote(key) + "; " + kKeys);
    }

private:
    bool Fail(const std::string& message) {
        *error_ = "global option '--format-param': " + message;
        return false;
    }

    static std::string DidYouMean(const std::string& word, const std::vector<std::string>& names) {
        std::vector<std::string> near = NearestNames(word, names);
        if (near.empty()) return std::string();
        return "; did you mean " + JoinNames(QuoteEach(near), " or ") + "?";
    }

    std::string Structures() const {
        if (shapes_.Empty()) return "this command's output has no structures";
        return "this command's structures are " + shapes_.NamesText();
    }

    bool Structure(const std::string& key, const std::string& name) {
        if (shapes_.Fields(name) != nullptr) return true;
        return Fail("unknown structure " + Quote(name) + " in " + Quote(key) + "; " +
                    Structures() + DidYouMean(name, shapes_.Names()));
    }

    bool Field(const std::string& key, const std::string& structName, const std::string& field) {
        const std::vector<std::string>& fields = *shapes_.Fields(structName);
        for (const std::string& name : fields) {
            if (name == field) return true;
        }
        return Fail("unknown field " + Quote(field) + " in " + Quote(key) + "; the fields of " +
                    structName + " are " + JoinNames(fields, " and ") + DidYouMean(field, fields));
    }

    bool FieldList(const std::string& key, const std::string& structName,
                   const std::string& value) {
        for (const std::string& field : SplitCommaList(value)) {
            if (!Field(key, structName, field)) return false;
        }
        return true;
    }

    bool Bool(const std::string& key, const std::string& value) {
        bool ignored;
        if (ParseBool(value, &ignored)) return true;
        return Fail(Quote(key) + " takes true, false, yes, no, 1 or 0, got " + Quote(value));
    }

    // units:<Struct>.<Field>: the structure is the longest known name followed by a dot.
    bool Unit(const std::string& key) {
        const std::string rest = key.substr(6);
        std::string::size_type dot = rest.rfind('.');
        while (dot != std::string::npos) {
            if (shapes_.Fields(rest.substr(0, dot)) != nullptr) {
                return Field(key, rest.substr(0, dot), rest.substr(dot + 1));
            }
            dot = dot == 0 ? std::string::npos : rest.rfind('.', dot - 1);
        }
        if (rest.find('.') == std::string::npos) {
            return Fail(Quote(key) + " names no field; write units:<Struct>.<Field>");
        }
        return Structure(key, rest.substr(0, rest.find('.')));
    }

    const Shapes& shapes_;
    std::string* error_;
};

}  // namespace

bool CheckFormatParams(const std::vector<std::pair<std::string, std::string> >& settings,
                       const MetaObj::MetaObject* resultTemplate, std::string* error) {
    Shapes shapes(resultTemplate);
    Checker checker(shapes, error);
    for (const std::pair<std::string, std::string>& setting : settings) {
        if (!checker.Check(setting.first, setting.second)) return false;
    }
    return true;
}

}  // namespace Engine
}  // namespace Kitbase

// The "keyvalue" formatter: one key=value line per scalar, for shell scripts.
//
// Keys: a structure's fields are Struct.Field; the rows of a list of structures are
// Struct[i].Field; elements of a list field are Struct.Field[j], and structures inside a list
// field continue the key: Struct.Field[j].Inner. A scalar result is Value=..., a list of scalars
// Value[i]=... Fields come in template order, then the rest. Values are written in the terminal
// escape form with backslashes escaped too (\\, \n, \r, \t, \xNN), so every entry stays on one
// line and decodes back to the value; a value-less scalar gives an empty value, an empty list
// no line. Keys are escaped the same way.
#include "engine/FormatCommon.h"

#include "engine/Text.h"


namespace Kitbase {
namespace Engine {
namespace {

using namespace Fmt;

class KeyValueFormatter {
public:
    explicit KeyValueFormatter(Writer& out) : out_(out) {}

    void Top(const MetaObject& result, const MetaObject* tmpl) {
        std::string key;
        if (result.GetType() == MetaObj::MetaTypeStruct) {
            const MetaStruct& row = AsStruct(result);
            Struct(row, TemplateFor(tmpl, row.GetName()), row.GetName());
        } else if (IsStructList(result)) {
            const MetaList& list = AsList(result);
            const MetaStruct* rowTemplate = ElementTemplate(list, tmpl);
            const std::vector<boost::shared_ptr<MetaObject> >& rows = list.GetElements();
            for (std::size_t i = 0; i < rows.size(); ++i) {
                const MetaStruct& row = AsStruct(*rows[i]);
                key = row.GetName();
                AppendIndex(key, i);
                Struct(row, TemplateFor(rowTemplate, row.GetName()), key);
            }
        } else {
            Entry("Value", &result, nullptr);
        }
    }

private:
    static void AppendIndex(std::string& key, std::size_t index) {
        key += '[';
        key += std::to_string(index);
        key += ']';
    }

    void Struct(const MetaStruct& row, const MetaStruct* tmpl, const std::string& prefix) {
        Columns columns;
        columns.ResetFor(std::vector<std::string>(), tmpl, false);
        columns.Map(row);
        std::string key;
        for (std::size_t c = 0; c < columns.Count(); ++c) {
            key = prefix + "." + columns.Name(c);
            Entry(key, columns.Cells()[c], FieldTemplate(tmpl, columns.Name(c)));
        }
        const std::vector<MetaStruct::Field>& fields = row.GetFields();
        for (std::size_t e = 0; e < columns.Extras().size(); ++e) {
            const MetaStruct::Field& field = fields[columns.Extras()[e]];
            key = prefix + "." + field.first;
            Entry(key, field.second.get(), nullptr);
        }
    }

    void Entry(const std::string& key, const MetaObject* value, const MetaObject* tmpl) {
        if (value != nullptr && value->GetType() == MetaObj::MetaTypeList) {
            const MetaList& list = AsList(*value);
            const MetaStruct* rowTemplate = ElementTemplate(list, tmpl);
            const std::vector<boost::shared_ptr<MetaObject> >& elements = list.GetElements();
            for (std::size_t i = 0; i < elements.size(); ++i) {
                std::string element = key;
                AppendIndex(element, i);
                if (elements[i]->GetType() == MetaObj::MetaTypeStruct) {
                    const MetaStruct& row = AsStruct(*elements[i]);
                    Struct(row, TemplateFor(rowTemplate, row.GetName()), element);
                } else {
                    Entry(element, elements[i].get(), nullptr);
                }
            }
            return;
        }
        PutEscaped(out_, key, true, escaped_);
        out_.Put('=');
        scratch_.clear();
        AppendText(scratch_, value);
        PutEscaped(out_, scratch_, true, escaped_);
        out_.Put('\n');
    }

    Writer& out_;
    std::string scratch_;
    std::string escaped_;
};

}  // namespace

void RenderKeyValue(const RenderRequest& request, Writer& out) {
    KeyValueFormatter(out).Top(*request.result, request.resultTemplate);
}

}  // namespace Engine
}  // namespace Kitbase

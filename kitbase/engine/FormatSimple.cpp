// The "simple" formatter: one "Field: value" line per field, for people reading a terminal.
//
//   Name:                   header line, unless show-header:Name is false
//      Field: value unit    three blanks deeper than the header, also without it
//      Nested:              a list of structures: its elements one level deeper still
//
// A list of structures prints its elements as blocks separated by blank lines, a list of scalars
// one element per line, a scalar alone on its line. Names, values and units are shown in the
// terminal escape form (PutEscaped), so host data never forges a line or reaches the terminal
// as a control sequence.
#include "engine/FormatCommon.h"

#include "engine/Text.h"

#include <map>

namespace Kitbase {
namespace Engine {
namespace {

using namespace Fmt;

const std::size_t kIndentStep = 3;

class SimpleFormatter {
public:
    SimpleFormatter(const FormatParams& params, Writer& out) : params_(params), out_(out) {}

    void Value(const MetaObject& result, const MetaObject* tmpl) {
        if (result.GetType() == MetaObj::MetaTypeStruct) {
            const MetaStruct& row = AsStruct(result);
            Struct(row, TemplateFor(tmpl, row.GetName()), 0);
        } else if (IsStructList(result)) {
            const MetaList& list = AsList(result);
            const MetaStruct* rowTemplate = ElementTemplate(list, tmpl);
            const std::vector<boost::shared_ptr<MetaObject> >& rows = list.GetElements();
            for (std::size_t i = 0; i < rows.size(); ++i) {
                if (i > 0) out_.Put('\n');
                const MetaStruct& row = AsStruct(*rows[i]);
                Struct(row, TemplateFor(rowTemplate, row.GetName()), 0);
            }
        } else if (result.GetType() == MetaObj::MetaTypeList) {
            const std::vector<boost::shared_ptr<MetaObject> >& items = AsList(result).GetElements();
            for (std::size_t i = 0; i < items.size(); ++i) {
                PutText(out_, items[i].get(), scratch_);
                out_.Put('\n');
            }
        } else {
            PutText(out_, &result, scratch_);
            out_.Put('\n');
        }
    }

private:
    // What the parameters say about structures of one name, worked out once for all the rows of
    // a list: the columns, the header, and each column's template and unit.
    struct Layout {
        Columns columns;
        const MetaStruct* tmpl = nullptr;
        bool header = true;
        bool selected = false;  // fields:<Struct> names the fields: no others are shown
        std::vector<const MetaObject*> fieldTemplates;
        std::vector<const std::string*> units;
    };

    Layout& LayoutOf(const MetaStruct& row, const MetaStruct* tmpl) {
        const std::string& name = row.GetName();
        std::map<std::string, Layout>::iterator it = layouts_.find(name);
        if (it != layouts_.end() && it->second.tmpl == tmpl) return it->second;
        Layout& layout = layouts_[name];
        std::vector<std::string> fields = params_.Fields(name);
        layout.columns.ResetFor(fields, tmpl, false);
        layout.tmpl = tmpl;
        layout.header = params_.ShowHeader(name);
        layout.selected = !fields.empty();
        layout.fieldTemplates.clear();
        layout.units.clear();
        for (std::size_t c = 0; c < layout.columns.Count(); ++c) {
            layout.fieldTemplates.push_back(FieldTemplate(tmpl, layout.columns.Name(c)));
            layout.units.push_back(params_.Unit(name, layout.columns.Name(c)));
        }
        return layout;
    }

    void Struct(const MetaStruct& row, const MetaStruct* tmpl, std::size_t indent) {
        const std::string& name = row.GetName();
        Layout& layout = LayoutOf(row, tmpl);
        if (layout.header) {
            out_.PutRepeat(' ', indent);
            PutEscaped(out_, name);
            out_.Put(":\n", 2);
        }
        layout.columns.Map(row);
        // Copies: a nested structure of the same name maps the shared layout again.
        std::vector<const MetaObject*> cells = layout.columns.Cells();
        std::vector<std::size_t> extras = layout.columns.Extras();
        for (std::size_t c = 0; c < cells.size(); ++c) {
            Field(layout.columns.Name(c), cells[c], layout.fieldTemplates[c], layout.units[c],
                  indent + kIndentStep);
        }
        if (layout.selected) return;
        const std::vector<MetaStruct::Field>& fields = row.GetFields();
        for (std::size_t e = 0; e < extras.size(); ++e) {
            const MetaStruct::Field& field = fields[extras[e]];
            Field(field.first, field.second.get(), nullptr, params_.Unit(name, field.first),
                  indent + kIndentStep);
        }
    }

    void Field(const std::string& fieldName, const MetaObject* value,
               const MetaObject* fieldTemplate, const std::string* unit, std::size_t indent) {
        out_.PutRepeat(' ', indent);
        PutEscaped(out_, fieldName);
        out_.Put(':');
        if (value != nullptr && IsStructList(*value)) {
            out_.Put('\n');
            const MetaList& list = AsList(*value);
            const MetaStruct* rowTemplate = ElementTemplate(list, fieldTemplate);
            const std::vector<boost::shared_ptr<MetaObject> >& rows = list.GetElements();
            for (std::size_t i = 0; i < rows.size(); ++i) {
                const MetaStruct& row = AsStruct(*rows[i]);
                Struct(row, TemplateFor(rowTemplate, row.GetName()), indent + kIndentStep);
            }
            return;
        }
        scratch_.clear();
        AppendText(scratch_, value);
        if (!scratch_.empty()) {
            out_.Put(' ');
            PutEscaped(out_, scratch_, false, escaped_);
            if (unit != nullptr && value->GetType() != MetaObj::MetaTypeList) {
                out_.Put(' ');
                PutEscaped(out_, *unit);
            }
        }
        out_.Put('\n');
    }

    const FormatParams& params_;
    Writer& out_;
    std::map<std::string, Layout> layouts_;
    std::string scratch_;
    std::string escaped_;
};

}  // namespace

void RenderSimple(const RenderRequest& request, Writer& out) {
    static const FormatParams kNone;
    SimpleFormatter(request.params ? *request.params : kNone, out)
        .Value(*request.result, request.resultTemplate);
}

}  // namespace Engine
}  // namespace Kitbase

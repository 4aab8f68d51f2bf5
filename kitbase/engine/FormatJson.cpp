// The "json" and "xml" formatters: the whole result, every field, for programs to read.
//
// Both write every field of a structure in template order, then the fields the template lacks in
// the result's order; a template field the structure lacks is written as the template's empty
// value (json null). Object keys and field tags are escaped once per column and reused for every
// row, so a long list costs no per-cell allocation.
#include "engine/FormatCommon.h"

#include "engine/Text.h"

#include <deque>
#include <map>

namespace Kitbase {
namespace Engine {
namespace {

using namespace Fmt;

// The column layout of one structure name, with each column's key already written out.
struct Layout {
    Columns columns;
    const MetaStruct* tmpl = nullptr;
    std::vector<std::string> keys;
    bool ready = false;
};

// Layouts by structure name, and per nesting depth a copy of the cells being written (a nested
// structure of the same name maps its layout again while the outer one is still being written).
class LayoutCache {
public:
    template <class KeyWriter>
    Layout& For(const MetaStruct& row, const MetaStruct* tmpl, KeyWriter writeKey) {
        Layout& layout = layouts_[row.GetName()];
        if (!layout.ready || layout.tmpl != tmpl) {
            layout.tmpl = tmpl;
            layout.columns.ResetFor(std::vector<std::string>(), tmpl, false);
            layout.keys.clear();
            for (std::size_t c = 0; c < layout.columns.Count(); ++c) {
                layout.keys.push_back(writeKey(layout.columns.Name(c)));
            }
            layout.ready = true;
        }
        return layout;
    }

    std::vector<const MetaObject*>& CellsAt(std::size_t depth) {
        if (cells_.size() <= depth) cells_.resize(depth + 1);
        return cells_[depth];
    }
    std::vector<std::size_t>& ExtrasAt(std::size_t depth) {
        if (extras_.size() <= depth) extras_.resize(depth + 1);
        return extras_[depth];
    }

private:
    std::map<std::string, Layout> layouts_;
    // Deques: growing them for a deeper level keeps the outer levels' vectors in place.
    std::deque<std::vector<const MetaObject*> > cells_;
    std::deque<std::vector<std::size_t> > extras_;
};

// The walk json and xml share: a structure maps its fields onto the columns of its kind, a list
// takes the template of its elements, and everything else is a scalar (or nothing). Derived
// says how each is written: Scalar(value), List(list, template, depth), Struct(row, template,
// layout, cells, extras, depth), and Key(name), the column heading written out once per layout.
template <class Derived>
class TreeWriter {
public:
    explicit TreeWriter(Writer& out) : out_(out) {}

    void Value(const MetaObject* value, const MetaObject* tmpl, std::size_t depth) {
        if (value != nullptr && value->GetType() == MetaObj::MetaTypeStruct) {
            const MetaStruct& row = AsStruct(*value);
            const MetaStruct* rowTemplate = TemplateFor(tmpl, row.GetName());
            Layout& layout = cache_.For(row, rowTemplate, Derived::Key);
            layout.columns.Map(row);
            std::vector<const MetaObject*>& cells = cache_.CellsAt(depth);
            std::vector<std::size_t>& extras = cache_.ExtrasAt(depth);
            cells = layout.columns.Cells();
            extras = layout.columns.Extras();
            Self().Struct(row, rowTemplate, layout, cells, extras, depth);
        } else if (value != nullptr && value->GetType() == MetaObj::MetaTypeList) {
            Self().List(AsList(*value), tmpl, depth);
        } else {
            Self().Scalar(value);
        }
    }

protected:
    void Indent(std::size_t depth) {
        out_.Put('\n');
        out_.PutRepeat(' ', 2 * depth);
    }

    Writer& out_;

private:
    Derived& Self() { return static_cast<Derived&>(*this); }
    LayoutCache cache_;
};

// ---- json ----

class JsonFormatter : public TreeWriter<JsonFormatter> {
public:
    using TreeWriter::TreeWriter;

    static std::string Key(const std::string& name) {
        std::string key;
        {
            Writer writer(&key, 256);
            PutJsonString(writer, name);
            writer.Put(": ", 2);
        }
        return key;
    }

    void Scalar(const MetaObject* value) {
        if (value == nullptr || !value->HasValue()) {
            out_.Put("null", 4);
        } else if (value->GetType() == MetaObj::MetaTypeString) {
            PutJsonString(out_, static_cast<const MetaString*>(value)->GetValue());
        } else if (value->GetType() == MetaObj::MetaTypeInt) {
            out_.PutInt(static_cast<const MetaInt*>(value)->GetValue());
        } else if (static_cast<const MetaBool*>(value)->GetValue()) {
            out_.Put("true", 4);
        } else {
            out_.Put("false", 5);
        }
    }

    void List(const MetaList& list, const MetaObject* tmpl, std::size_t depth) {
        const std::vector<boost::shared_ptr<MetaObject> >& elements = list.GetElements();
        if (elements.empty()) {
            out_.Put("[]", 2);
            return;
        }
        const MetaStruct* rowTemplate = ElementTemplate(list, tmpl);
        out_.Put('[');
        for (std::size_t i = 0; i < elements.size(); ++i) {
            if (i > 0) out_.Put(',');
            Indent(depth + 1);
            Value(elements[i].get(), rowTemplate, depth + 1);
        }
        Indent(depth);
        out_.Put(']');
    }

    void Struct(const MetaStruct& row, const MetaStruct* tmpl, const Layout& layout,
                const std::vector<const MetaObject*>& cells,
                const std::vector<std::size_t>& extras, std::size_t depth) {
        if (cells.empty() && extras.empty()) {
            out_.Put("{}", 2);
            return;
        }
        out_.Put('{');
        bool first = true;
        for (std::size_t c = 0; c < cells.size(); ++c) {
            if (!first) out_.Put(',');
            first = false;
            Indent(depth + 1);
            out_.Put(layout.keys[c]);
            Value(cells[c], FieldTemplate(tmpl, layout.columns.Name(c)), depth + 1);
        }
        const std::vector<MetaStruct::Field>& fields = row.GetFields();
        for (std::size_t e = 0; e < extras.size(); ++e) {
            if (!first) out_.Put(',');
            first = false;
            Indent(depth + 1);
            const MetaStruct::Field& field = fields[extras[e]];
            out_.Put(Key(field.first));
            Value(field.second.get(), nullptr, depth + 1);
        }
        Indent(depth);
        out_.Put('}');
    }
};

// ---- xml ----

class XmlFormatter : public TreeWriter<XmlFormatter> {
public:
    using TreeWriter::TreeWriter;

    static std::string Key(const std::string& name) {
        std::string tag;
        {
            Writer writer(&tag, 256);
            writer.PutText("<field name=\"");
            PutXmlText(writer, name, true);
            writer.Put("\">", 2);
        }
        return tag;
    }

    // One element for the scalar; without a value, an empty element marked null.
    void Scalar(const MetaObject* value) {
        const char* kind = "string";
        if (value != nullptr && value->GetType() == MetaObj::MetaTypeInt) kind = "int";
        if (value != nullptr && value->GetType() == MetaObj::MetaTypeBool) kind = "bool";
        out_.Put('<');
        out_.PutText(kind);
        if (value == nullptr || !value->HasValue()) {
            out_.PutText(" null=\"true\"/>");
            return;
        }
        out_.Put('>');
        switch (value->GetType()) {
            case MetaObj::MetaTypeString:
                PutXmlText(out_, static_cast<const MetaString*>(value)->GetValue(), false);
                break;
            case MetaObj::MetaTypeInt:
                out_.PutInt(static_cast<const MetaInt*>(value)->GetValue());
                break;
            default:
                out_.PutText(static_cast<const MetaBool*>(value)->GetValue() ? "true" : "false");
        }
        out_.Put("</", 2);
        out_.PutText(kind);
        out_.Put('>');
    }

    void List(const MetaList& list, const MetaObject* tmpl, std::size_t depth) {
        const std::vector<boost::shared_ptr<MetaObject> >& elements = list.GetElements();
        if (elements.empty()) {
            out_.PutText("<list/>");
            return;
        }
        const MetaStruct* rowTemplate = ElementTemplate(list, tmpl);
        out_.PutText("<list>");
        for (std::size_t i = 0; i < elements.size(); ++i) {
            Indent(depth + 1);
            Value(elements[i].get(), rowTemplate, depth + 1);
        }
        Indent(depth);
        out_.PutText("</list>");
    }

    void Struct(const MetaStruct& row, const MetaStruct* tmpl, const Layout& layout,
                const std::vector<const MetaObject*>& cells,
                const std::vector<std::size_t>& extras, std::size_t depth) {
        out_.PutText("<structure name=\"");
        PutXmlText(out_, row.GetName(), true);
        if (cells.empty() && extras.empty()) {
            out_.Put("\"/>", 3);
            return;
        }
        out_.Put("\">", 2);
        for (std::size_t c = 0; c < cells.size(); ++c) {
            Indent(depth + 1);
            Field(layout.keys[c], cells[c], FieldTemplate(tmpl, layout.columns.Name(c)),
                  depth + 1);
        }
        const std::vector<MetaStruct::Field>& fields = row.GetFields();
        for (std::size_t e = 0; e < extras.size(); ++e) {
            Indent(depth + 1);
            const MetaStruct::Field& field = fields[extras[e]];
            Field(Key(field.first), field.second.get(), nullptr, depth + 1);
        }
        Indent(depth);
        out_.PutText("</structure>");
    }

private:
    void Field(const std::string& tag, const MetaObject* value, const MetaObject* tmpl,
               std::size_t depth) {
        out_.Put(tag);
        if (value != nullptr && !IsScalar(*value)) {
            Indent(depth + 1);
            Value(value, tmpl, depth + 1);
            Indent(depth);
        } else {
            Value(value, tmpl, depth + 1);
        }
        out_.PutText("</field>");
    }
};

}  // namespace

void RenderJson(const RenderRequest& request, Writer& out) {
    JsonFormatter(out).Value(request.result, request.resultTemplate, 0);
    out.Put('\n');
}

void RenderXml(const RenderRequest& request, Writer& out) {
    out.PutText("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<output>\n  ");
    XmlFormatter(out).Value(request.result, request.resultTemplate, 1);
    out.PutText("\n</output>\n");
}

}  // namespace Engine
}  // namespace Kitbase

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

// ---- json ----

std::string JsonKey(const std::string& name) {
    std::string key;
    {
        Writer writer(&key, 256);
        PutJsonString(writer, name);
        writer.Put(": ", 2);
    }
    return key;
}

class JsonFormatter {
public:
    explicit JsonFormatter(Writer& out) : out_(out) {}

    void Value(const MetaObject* value, const MetaObject* tmpl, std::size_t depth) {
        if (value == nullptr || !value->HasValue()) {
            out_.Put("null", 4);
            return;
        }
        switch (value->GetType()) {
            case MetaObj::MetaTypeString:
                PutJsonString(out_, static_cast<const MetaString*>(value)->GetValue());
                return;
            case MetaObj::MetaTypeInt:
                out_.PutInt(static_cast<const MetaInt*>(value)->GetValue());
                return;
            case MetaObj::MetaTypeBool:
                if (static_cast<const MetaBool*>(value)->GetValue()) {
                    out_.Put("true", 4);
                } else {
                    out_.Put("false", 5);
                }
                return;
            case MetaObj::MetaTypeStruct: {
                const MetaStruct& row = AsStruct(*value);
                Struct(row, TemplateFor(tmpl, row.GetName()), depth);
                return;
            }
            case MetaObj::MetaTypeList:
                List(AsList(*value), tmpl, depth);
                return;
        }
    }

private:
    void Indent(std::size_t depth) {
        out_.Put('\n');
        out_.PutRepeat(' ', 2 * depth);
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

    void Struct(const MetaStruct& row, const MetaStruct* tmpl, std::size_t depth) {
        Layout& layout = cache_.For(row, tmpl, JsonKey);
        layout.columns.Map(row);
        std::vector<const MetaObject*>& cells = cache_.CellsAt(depth);
        std::vector<std::size_t>& extras = cache_.ExtrasAt(depth);
        cells = layout.columns.Cells();
        extras = layout.columns.Extras();
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
            PutJsonString(out_, field.first);
            out_.Put(": ", 2);
            Value(field.second.get(), nullptr, depth + 1);
        }
        Indent(depth);
        out_.Put('}');
    }

    Writer& out_;
    LayoutCache cache_;
};

// ---- xml ----

std::string XmlFieldTag(const std::string& name) {
    std::string tag;
    {
        Writer writer(&tag, 256);
        writer.PutText("<field name=\"");
        PutXmlText(writer, name, true);
        writer.Put("\">", 2);
    }
    return tag;
}

class XmlFormatter {
public:
    explicit XmlFormatter(Writer& out) : out_(out) {}

    // One element for the value, starting at the current position (already indented).
    void Value(const MetaObject* value, const MetaObject* tmpl, std::size_t depth) {
        if (value == nullptr) {
            out_.PutText("<string null=\"true\"/>");
            return;
        }
        switch (value->GetType()) {
            case MetaObj::MetaTypeString:
                Scalar("string", value);
                return;
            case MetaObj::MetaTypeInt:
                Scalar("int", value);
                return;
            case MetaObj::MetaTypeBool:
                Scalar("bool", value);
                return;
            case MetaObj::MetaTypeStruct: {
                const MetaStruct& row = AsStruct(*value);
                Struct(row, TemplateFor(tmpl, row.GetName()), depth);
                return;
            }
            case MetaObj::MetaTypeList:
                List(AsList(*value), tmpl, depth);
                return;
        }
    }

private:
    void Indent(std::size_t depth) {
        out_.Put('\n');
        out_.PutRepeat(' ', 2 * depth);
    }

    void Scalar(const char* kind, const MetaObject* value) {
        out_.Put('<');
        out_.PutText(kind);
        if (!value->HasValue()) {
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

    void Struct(const MetaStruct& row, const MetaStruct* tmpl, std::size_t depth) {
        Layout& layout = cache_.For(row, tmpl, XmlFieldTag);
        layout.columns.Map(row);
        std::vector<const MetaObject*>& cells = cache_.CellsAt(depth);
        std::vector<std::size_t>& extras = cache_.ExtrasAt(depth);
        cells = layout.columns.Cells();
        extras = layout.columns.Extras();
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
            Field(XmlFieldTag(field.first), field.second.get(), nullptr, depth + 1);
        }
        Indent(depth);
        out_.PutText("</structure>");
    }

    Writer& out_;
    LayoutCache cache_;
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

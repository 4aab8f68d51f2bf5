// Output parameters, formatter dispatch and the helpers the formatters share.
#include "engine/FormatCommon.h"

#include "engine/Text.h"

#include "util/Text.h"

#include <charconv>

namespace Kitbase {
namespace Engine {

// ---- parameters ----

void FormatParams::Set(const std::string& key, const std::string& value) {
    SetKey(params_, key, value);
}

const std::string* FormatParams::Get(const std::string& key) const { return FindKey(params_, key); }

std::vector<std::string> FormatParams::Fields(const std::string& structName) const {
    const std::string* value = Get("fields:" + structName);
    return value ? SplitCommaList(*value) : std::vector<std::string>();
}

bool FormatParams::ShowHeader(const std::string& structName) const {
    const std::string* value = Get("show-header:" + structName);
    bool show = true;
    if (value && ParseBool(*value, &show)) return show;
    return true;
}

const std::string* FormatParams::Unit(const std::string& structName,
                                      const std::string& field) const {
    const std::string* value = Get("units:" + structName + "." + field);
    return (value && !value->empty()) ? value : nullptr;
}

std::vector<std::string> FormatParams::TableColumns() const {
    const std::string* value = Get("table-columns");
    return value ? SplitCommaList(*value) : std::vector<std::string>();
}

bool FormatParams::WrapLast() const {
    const std::string* value = Get("wrap-last");
    bool wrap = false;
    return value && ParseBool(*value, &wrap) && wrap;
}

const char* MetaKindName(MetaObj::MetaType type) {
    switch (type) {
        case MetaObj::MetaTypeBool: return "bool";
        case MetaObj::MetaTypeInt: return "int";
        case MetaObj::MetaTypeString: return "string";
        case MetaObj::MetaTypeStruct: return "struct";
        case MetaObj::MetaTypeList: return "list";
    }
    return "unknown";
}

// ---- dispatch ----

const std::vector<std::string>& FormatterNames() {
    static const std::vector<std::string> names = {"simple", "table", "json",
                                                   "xml",    "csv",   "keyvalue"};
    return names;
}

bool IsFormatter(const std::string& name) {
    const std::vector<std::string>& names = FormatterNames();
    for (std::size_t i = 0; i < names.size(); ++i) {
        if (names[i] == name) return true;
    }
    return false;
}

bool Render(const std::string& formatter, const RenderRequest& request, Writer& out) {
    if (request.result == nullptr) return true;
    if (formatter == "simple") {
        RenderSimple(request, out);
    } else if (formatter == "table") {
        RenderTable(request, out);
    } else if (formatter == "json") {
        RenderJson(request, out);
    } else if (formatter == "xml") {
        RenderXml(request, out);
    } else if (formatter == "csv") {
        RenderCsv(request, out);
    } else if (formatter == "keyvalue") {
        RenderKeyValue(request, out);
    } else {
        return false;
    }
    return true;
}

// ---- shared helpers ----

namespace Fmt {

const MetaStruct* TemplateFor(const MetaObject* tmpl, const std::string& name) {
    if (tmpl == nullptr || tmpl->GetType() != MetaObj::MetaTypeStruct) return nullptr;
    const MetaStruct& candidate = AsStruct(*tmpl);
    return candidate.GetName() == name ? &candidate : nullptr;
}

const MetaStruct* ElementTemplate(const MetaList& list, const MetaObject* fallback) {
    if (list.GetTemplate()) return list.GetTemplate().get();
    if (fallback != nullptr && IsStructList(*fallback)) {
        return AsList(*fallback).GetTemplate().get();
    }
    return nullptr;
}

const MetaObject* FieldTemplate(const MetaStruct* structTemplate, const std::string& field) {
    if (structTemplate == nullptr) return nullptr;
    const std::vector<MetaStruct::Field>& fields = structTemplate->GetFields();
    for (std::size_t i = 0; i < fields.size(); ++i) {
        if (fields[i].first == field) return fields[i].second.get();
    }
    return nullptr;
}

void Columns::Reset(const std::vector<std::string>& names, const MetaStruct* structTemplate,
                    bool grow) {
    names_ = names;
    defaults_.clear();
    for (std::size_t i = 0; i < names_.size(); ++i) {
        defaults_.push_back(FieldTemplate(structTemplate, names_[i]));
    }
    grow_ = grow;
    layout_.clear();
    fieldColumn_.clear();
    mapped_ = false;
}

void Columns::ResetFor(const std::vector<std::string>& selection,
                       const MetaStruct* structTemplate, bool grow) {
    if (!selection.empty()) {
        Reset(selection, structTemplate, false);
        return;
    }
    std::vector<std::string> names;
    if (structTemplate != nullptr) {
        const std::vector<MetaStruct::Field>& fields = structTemplate->GetFields();
        for (std::size_t i = 0; i < fields.size(); ++i) names.push_back(fields[i].first);
    }
    Reset(names, structTemplate, grow);
}

void Columns::Map(const MetaStruct& row) {
    const std::vector<MetaStruct::Field>& fields = row.GetFields();
    bool same = mapped_ && fields.size() == layout_.size();
    for (std::size_t i = 0; same && i < fields.size(); ++i) same = fields[i].first == layout_[i];
    if (!same) {
        layout_.resize(fields.size());
        fieldColumn_.assign(fields.size(), -1);
        for (std::size_t i = 0; i < fields.size(); ++i) {
            layout_[i] = fields[i].first;
            std::size_t column = 0;
            while (column < names_.size() && names_[column] != fields[i].first) ++column;
            if (column == names_.size()) {
                if (!grow_) continue;
                names_.push_back(fields[i].first);
                defaults_.push_back(nullptr);
            }
            fieldColumn_[i] = static_cast<int>(column);
        }
        mapped_ = true;
    }
    cells_ = defaults_;
    extras_.clear();
    for (std::size_t i = 0; i < fields.size(); ++i) {
        int column = fieldColumn_[i];
        if (column >= 0) {
            // A second field of the same name (impossible through SetField) keeps the first.
            if (cells_[column] == defaults_[column]) cells_[column] = fields[i].second.get();
        } else {
            extras_.push_back(i);
        }
    }
}

namespace {
void AppendStructInline(std::string& text, const MetaStruct& row) {
    text += '{';
    const std::vector<MetaStruct::Field>& fields = row.GetFields();
    for (std::size_t i = 0; i < fields.size(); ++i) {
        if (i > 0) text += ", ";
        text += fields[i].first;
        text += ": ";
        AppendText(text, fields[i].second.get());
    }
    text += '}';
}
}  // namespace

void AppendText(std::string& text, const MetaObject* value) {
    if (value == nullptr || !value->HasValue()) return;
    switch (value->GetType()) {
        case MetaObj::MetaTypeString:
            text += static_cast<const MetaString*>(value)->GetValue();
            return;
        case MetaObj::MetaTypeInt: {
            char digits[24];
            std::to_chars_result result = std::to_chars(
                digits, digits + sizeof digits, static_cast<const MetaInt*>(value)->GetValue());
            text.append(digits, static_cast<std::size_t>(result.ptr - digits));
            return;
        }
        case MetaObj::MetaTypeBool:
            text += static_cast<const MetaBool*>(value)->GetValue() ? "true" : "false";
            return;
        case MetaObj::MetaTypeStruct:
            AppendStructInline(text, AsStruct(*value));
            return;
        case MetaObj::MetaTypeList: {
            const std::vector<boost::shared_ptr<MetaObject> >& elements =
                AsList(*value).GetElements();
            for (std::size_t i = 0; i < elements.size(); ++i) {
                if (i > 0) text += ", ";
                AppendText(text, elements[i].get());
            }
            return;
        }
    }
}

void PutText(Writer& out, const MetaObject* value, std::string& scratch) {
    if (value == nullptr || !value->HasValue()) return;
    switch (value->GetType()) {
        case MetaObj::MetaTypeString: {
            const std::string& text = static_cast<const MetaString*>(value)->GetValue();
            if (!quarn::util::NeedsEscape(text.data(), text.size())) {
                out.Put(text);
                return;
            }
            scratch.clear();
            quarn::util::EscapeTo(scratch, text.data(), text.size());
            out.Put(scratch);
            return;
        }
        case MetaObj::MetaTypeInt:
            out.PutInt(static_cast<const MetaInt*>(value)->GetValue());
            return;
        case MetaObj::MetaTypeBool:
            if (static_cast<const MetaBool*>(value)->GetValue()) {
                out.Put("true", 4);
            } else {
                out.Put("false", 5);
            }
            return;
        default:
            scratch.clear();
            AppendText(scratch, value);
            PutEscaped(out, scratch);
            return;
    }
}

std::size_t TextWidth(const MetaObject* value, std::string& scratch) {
    if (value == nullptr || !value->HasValue()) return 0;
    switch (value->GetType()) {
        case MetaObj::MetaTypeString: {
            const std::string& text = static_cast<const MetaString*>(value)->GetValue();
            if (!quarn::util::NeedsEscape(text.data(), text.size())) return DisplayWidth(text);
            scratch.clear();
            quarn::util::EscapeTo(scratch, text.data(), text.size());
            return DisplayWidth(scratch);
        }
        case MetaObj::MetaTypeInt: {
            char digits[24];
            std::to_chars_result result = std::to_chars(
                digits, digits + sizeof digits, static_cast<const MetaInt*>(value)->GetValue());
            return static_cast<std::size_t>(result.ptr - digits);
        }
        case MetaObj::MetaTypeBool:
            return static_cast<const MetaBool*>(value)->GetValue() ? 4 : 5;
        default:
            scratch.clear();
            AppendText(scratch, value);
            return EscapedWidth(scratch.data(), scratch.size());
    }
}

void AppendShown(std::string& text, const MetaObject* value, std::string& scratch) {
    scratch.clear();
    AppendText(scratch, value);
    quarn::util::EscapeTo(text, scratch.data(), scratch.size());
}

}  // namespace Fmt
}  // namespace Engine
}  // namespace Kitbase

// The "table" and "csv" formatters: one row per structure, one column per field.
//
// Columns: table-columns when set, else fields:<Struct>, else the template's fields followed by
// the fields the rows add (in order of first appearance). A table is aligned by display width
// (code points) in two passes over the rows, writing cells straight from the meta objects; only
// list cells and the wrapped last column go through a reused scratch string. A scalar result, or
// a list of scalars, prints as "simple" does (csv: one value per line).
#include "engine/FormatCommon.h"

#include "engine/Text.h"

namespace Kitbase {
namespace Engine {
namespace {

using namespace Fmt;

const std::size_t kGap = 2;          // blanks between table columns
const std::size_t kMinWrapWidth = 10;  // the wrapped last column is never narrower

// The rows of a structure or list-of-structures result, and the columns they are shown in.
struct Grid {
    std::vector<const MetaStruct*> rows;
    std::string structName;
    Columns columns;
};

// False when the result is not made of structures.
bool BuildGrid(const RenderRequest& request, const FormatParams& params, Grid* grid) {
    const MetaObject& result = *request.result;
    const MetaStruct* rowTemplate = nullptr;
    if (result.GetType() == MetaObj::MetaTypeStruct) {
        grid->rows.push_back(&AsStruct(result));
        rowTemplate = TemplateFor(request.resultTemplate, AsStruct(result).GetName());
    } else if (IsStructList(result)) {
        const MetaList& list = AsList(result);
        rowTemplate = ElementTemplate(list, request.resultTemplate);
        grid->rows.reserve(list.Size());
        const std::vector<boost::shared_ptr<MetaObject> >& elements = list.GetElements();
        for (std::size_t i = 0; i < elements.size(); ++i) {
            grid->rows.push_back(&AsStruct(*elements[i]));
        }
    } else {
        return false;
    }
    if (!grid->rows.empty()) {
        grid->structName = grid->rows[0]->GetName();
    } else if (rowTemplate != nullptr) {
        grid->structName = rowTemplate->GetName();
    }
    std::vector<std::string> selection = params.TableColumns();
    if (selection.empty()) selection = params.Fields(grid->structName);
    grid->columns.ResetFor(selection, TemplateFor(rowTemplate, grid->structName), true);
    return true;
}

// Splits one line of text into segments of at most width columns, at blanks where possible.
class Segments {
public:
    Segments(const std::string& text, std::size_t width)
        : text_(text), width_(width < 1 ? 1 : width), pos_(0), done_(false) {}

    bool Next(const char** data, std::size_t* size) {
        if (done_) return false;
        if (pos_ > 0) {
            while (pos_ < text_.size() && text_[pos_] == ' ') ++pos_;
            if (pos_ >= text_.size()) {
                done_ = true;
                return false;
            }
        }
        const char* start = text_.data() + pos_;
        std::size_t left = text_.size() - pos_;
        std::size_t cut = OffsetOfColumn(start, left, width_);
        *data = start;
        if (cut >= left) {
            *size = left;
            done_ = true;
            return true;
        }
        std::size_t end = cut;
        if (start[cut] != ' ') {
            std::size_t blank = cut;  // just past the last blank before the cut, 0 when none
            while (blank > 0 && start[blank - 1] != ' ') --blank;
            std::size_t keep = blank > 0 ? blank - 1 : 0;
            while (keep > 0 && start[keep - 1] == ' ') --keep;
            if (keep > 0) {
                end = keep;
                cut = blank - 1;
            }
        } else {
            while (end > 0 && start[end - 1] == ' ') --end;
        }
        *size = end;
        pos_ += cut;
        return true;
    }

private:
    const std::string& text_;
    std::size_t width_;
    std::size_t pos_;
    bool done_;
};

class TableFormatter {
public:
    TableFormatter(const FormatParams& params, std::size_t width, Writer& out)
        : params_(params), terminalWidth_(width), out_(out), pending_(0) {}

    void Render(Grid& grid) {
        Columns& columns = grid.columns;
        // Pass 1: the columns and their widths.
        for (std::size_t r = 0; r < grid.rows.size(); ++r) {
            columns.Map(*grid.rows[r]);
            const std::vector<const MetaObject*>& cells = columns.Cells();
            if (widths_.size() < cells.size()) widths_.resize(cells.size(), 0);
            for (std::size_t c = 0; c < cells.size(); ++c) {
                std::size_t w = TextWidth(cells[c], scratch_);
                if (w > widths_[c]) widths_[c] = w;
            }
        }
        const std::size_t count = columns.Count();
        if (count == 0) return;
        widths_.resize(count, 0);
        headings_.resize(count);
        bool header = params_.ShowHeader(grid.structName);
        for (std::size_t c = 0; c < count; ++c) {
            headings_[c] = columns.Name(c);
            const std::string* unit = params_.Unit(grid.structName, columns.Name(c));
            if (unit != nullptr) headings_[c] += " (" + *unit + ")";
            if (header) {
                std::size_t w = DisplayWidth(headings_[c]);
                if (w > widths_[c]) widths_[c] = w;
            }
        }
        // The wrapped last column takes what the others leave of the terminal.
        wrap_ = false;
        if (params_.WrapLast()) {
            std::size_t used = 0;
            for (std::size_t c = 0; c + 1 < count; ++c) used += widths_[c] + kGap;
            std::size_t room = terminalWidth_ > used ? terminalWidth_ - used : 0;
            if (room < kMinWrapWidth) room = kMinWrapWidth;
            if (widths_[count - 1] > room) {
                widths_[count - 1] = room;
                wrap_ = true;
            }
        }
        // Pass 2: heading, dashes, rows.
        if (header) {
            for (std::size_t c = 0; c + 1 < count; ++c) Cell(c, headings_[c]);
            LastCell(headings_[count - 1], count);
            for (std::size_t c = 0; c < count; ++c) {
                Gap();
                out_.PutRepeat('-', widths_[c]);
                pending_ = kGap;
            }
            EndLine();
        }
        for (std::size_t r = 0; r < grid.rows.size(); ++r) {
            columns.Map(*grid.rows[r]);
            const std::vector<const MetaObject*>& cells = columns.Cells();
            for (std::size_t c = 0; c + 1 < count; ++c) Cell(c, cells[c]);
            if (wrap_) {
                scratch_.clear();
                AppendText(scratch_, cells[count - 1]);
                LastCell(scratch_, count);
            } else {
                Cell(count - 1, cells[count - 1]);
                EndLine();
            }
        }
    }

private:
    // Blanks owed before the next cell; dropped at the end of a line, so no line ends in blanks.
    void Gap() {
        if (pending_ > 0) out_.PutRepeat(' ', pending_);
        pending_ = 0;
    }
    void EndLine() {
        out_.Put('\n');
        pending_ = 0;
    }

    void Cell(std::size_t column, const std::string& text) {
        std::size_t w = DisplayWidth(text);
        if (w > 0) {
            Gap();
            PutOneLine(out_, text.data(), text.size());
        }
        pending_ += widths_[column] - w + kGap;
    }

    void Cell(std::size_t column, const MetaObject* value) {
        std::size_t w;
        if (value != nullptr && value->GetType() == MetaObj::MetaTypeString) {
            const std::string& text = static_cast<const MetaString*>(value)->GetValue();
            w = value->HasValue() ? DisplayWidth(text) : 0;
            if (w > 0) {
                Gap();
                PutOneLine(out_, text.data(), text.size());
            }
        } else if (value != nullptr && IsScalar(*value)) {
            w = TextWidth(value, scratch_);
            if (w > 0) {
                Gap();
                PutText(out_, value, scratch_);
            }
        } else {
            scratch_.clear();
            AppendText(scratch_, value);
            w = DisplayWidth(scratch_);
            if (w > 0) {
                Gap();
                PutOneLine(out_, scratch_.data(), scratch_.size());
            }
        }
        pending_ += widths_[column] - w + kGap;
    }

    // The last column, wrapped when wrap-last applies; ends the line(s).
    void LastCell(const std::string& text, std::size_t count) {
        if (!wrap_) {
            if (!text.empty()) {
                Gap();
                PutOneLine(out_, text.data(), text.size());
            }
            EndLine();
            return;
        }
        line_ = text;
        for (std::size_t i = 0; i < line_.size(); ++i) {
            unsigned char c = static_cast<unsigned char>(line_[i]);
            if (c < 0x20 || c == 0x7f) line_[i] = ' ';
        }
        std::size_t offset = 0;
        for (std::size_t c = 0; c + 1 < count; ++c) offset += widths_[c] + kGap;
        Segments segments(line_, widths_[count - 1]);
        const char* data;
        std::size_t size;
        bool first = true;
        while (segments.Next(&data, &size)) {
            if (!first) pending_ = offset;
            if (size > 0) {
                Gap();
                out_.Put(data, size);
            }
            EndLine();
            first = false;
        }
        if (first) EndLine();
    }

    const FormatParams& params_;
    std::size_t terminalWidth_;
    Writer& out_;
    std::size_t pending_;
    bool wrap_ = false;
    std::vector<std::size_t> widths_;
    std::vector<std::string> headings_;
    std::string scratch_;
    std::string line_;
};

// ---- csv ----

void PutCsvField(Writer& out, const char* text, std::size_t size) {
    bool quote = false;
    for (std::size_t i = 0; i < size && !quote; ++i) {
        char c = text[i];
        quote = c == ',' || c == '"' || c == '\r' || c == '\n';
    }
    if (!quote) {
        out.Put(text, size);
        return;
    }
    out.Put('"');
    std::size_t run = 0;
    for (std::size_t i = 0; i < size; ++i) {
        if (text[i] != '"') continue;
        out.Put(text + run, i + 1 - run);
        out.Put('"');
        run = i + 1;
    }
    out.Put(text + run, size - run);
    out.Put('"');
}

void PutCsvValue(Writer& out, const MetaObject* value, std::string& scratch) {
    if (value != nullptr && value->HasValue() &&
        (value->GetType() == MetaObj::MetaTypeInt || value->GetType() == MetaObj::MetaTypeBool)) {
        PutText(out, value, scratch);
        return;
    }
    if (value != nullptr && value->GetType() == MetaObj::MetaTypeString) {
        const std::string& text = static_cast<const MetaString*>(value)->GetValue();
        PutCsvField(out, text.data(), text.size());
        return;
    }
    scratch.clear();
    AppendText(scratch, value);
    PutCsvField(out, scratch.data(), scratch.size());
}

const char kCrLf[] = "\r\n";

}  // namespace

void RenderTable(const RenderRequest& request, Writer& out) {
    static const FormatParams kNone;
    const FormatParams& params = request.params ? *request.params : kNone;
    Grid grid;
    if (!BuildGrid(request, params, &grid)) {
        RenderSimple(request, out);
        return;
    }
    TableFormatter(params, request.width, out).Render(grid);
}

void RenderCsv(const RenderRequest& request, Writer& out) {
    static const FormatParams kNone;
    const FormatParams& params = request.params ? *request.params : kNone;
    Grid grid;
    std::string scratch;
    if (!BuildGrid(request, params, &grid)) {
        const MetaObject& result = *request.result;
        if (result.GetType() == MetaObj::MetaTypeList) {
            const std::vector<boost::shared_ptr<MetaObject> >& items = AsList(result).GetElements();
            for (std::size_t i = 0; i < items.size(); ++i) {
                PutCsvValue(out, items[i].get(), scratch);
                out.Put(kCrLf, 2);
            }
        } else {
            PutCsvValue(out, &result, scratch);
            out.Put(kCrLf, 2);
        }
        return;
    }
    Columns& columns = grid.columns;
    for (std::size_t r = 0; r < grid.rows.size(); ++r) columns.Map(*grid.rows[r]);
    const std::size_t count = columns.Count();
    if (count == 0) return;
    for (std::size_t c = 0; c < count; ++c) {
        if (c > 0) out.Put(',');
        PutCsvField(out, columns.Name(c).data(), columns.Name(c).size());
    }
    out.Put(kCrLf, 2);
    for (std::size_t r = 0; r < grid.rows.size(); ++r) {
        columns.Map(*grid.rows[r]);
        const std::vector<const MetaObject*>& cells = columns.Cells();
        for (std::size_t c = 0; c < count; ++c) {
            if (c > 0) out.Put(',');
            PutCsvValue(out, cells[c], scratch);
        }
        out.Put(kCrLf, 2);
    }
}

}  // namespace Engine
}  // namespace Kitbase

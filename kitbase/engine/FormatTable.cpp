// The "table" and "csv" formatters: one row per structure, one column per field.
//
// Columns: table-columns when set, else fields:<Struct>, else the template's fields followed by
// the fields the rows add (in order of first appearance). A table is aligned by display width
// (code points of the shown text: cells are in the terminal escape form) in two passes over the
// rows, writing cells straight from the meta objects. A table wider than the terminal is fitted:
// columns are narrowed (each keeps at least its longest word while the words fit) and their
// cells wrap at blanks, a word being split only when it alone is wider than its column; a table
// that would need a column narrower than 6 to fit is left at its natural widths instead. With
// wrap-last the last column gives way first: the others keep their width while the last has 10
// columns or more. A scalar result, or a list of scalars, prints as "simple" does (csv: one
// value per line, quoted per RFC 4180).
#include "engine/FormatCommon.h"

#include "engine/Text.h"

#include "util/Text.h"

#include <algorithm>
#include <numeric>

namespace Kitbase {
namespace Engine {
namespace {

using namespace Fmt;

const std::size_t kGap = 2;            // blanks between table columns
const std::size_t kMinWrapWidth = 10;  // wrap-last leaves the last column at least this wide
const std::size_t kMinFitWidth = 6;    // fitting never narrows a column below this (or its words)

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

// Display width of the widest blank-separated word of text.
std::size_t LongestWord(const std::string& text) {
    std::size_t longest = 0, start = 0;
    while (start <= text.size()) {
        std::size_t blank = text.find(' ', start);
        if (blank == std::string::npos) blank = text.size();
        longest = std::max(longest, DisplayWidth(text.data() + start, blank - start));
        start = blank + 1;
    }
    return longest;
}

// Shares room among columns, none getting more than its cap: the narrow ones get their cap, the
// others an equal share of what is left (the remainder going to the leftmost). Each column gets
// at least one column of room when caps allow.
std::vector<std::size_t> Share(const std::vector<std::size_t>& caps, std::size_t room) {
    std::vector<std::size_t> order(caps.size());
    std::iota(order.begin(), order.end(), 0);
    std::stable_sort(order.begin(), order.end(),
                     [&caps](std::size_t a, std::size_t b) { return caps[a] < caps[b]; });
    std::vector<std::size_t> given(caps.size(), 0);
    std::size_t left = caps.size();
    for (std::size_t k = 0; k < order.size(); ++k, --left) {
        std::size_t share = room / left;
        if (caps[order[k]] <= share) {
            given[order[k]] = caps[order[k]];
            room -= caps[order[k]];
            continue;
        }
        // Every remaining column is wider than the fair share: split what is left evenly.
        std::vector<std::size_t> rest(order.begin() + static_cast<std::ptrdiff_t>(k), order.end());
        std::sort(rest.begin(), rest.end());
        for (std::size_t r = 0; r < rest.size(); ++r) {
            given[rest[r]] = share + (r < room % left ? 1 : 0);
        }
        break;
    }
    for (std::size_t c = 0; c < given.size(); ++c) {
        if (given[c] == 0 && caps[c] > 0) given[c] = 1;
    }
    return given;
}

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
        header_ = params_.ShowHeader(grid.structName);
        for (std::size_t c = 0; c < count; ++c) {
            headings_[c].clear();
            SetHeading(c, columns.Name(c), params_.Unit(grid.structName, columns.Name(c)));
            if (header_) widths_[c] = std::max(widths_[c], DisplayWidth(headings_[c]));
        }
        std::vector<std::size_t> natural = widths_;
        Fit(grid);
        wrap_ = widths_ != natural;
        // Pass 2: heading, dashes, rows.
        if (header_) {
            for (std::size_t c = 0; c < count; ++c) lines_[c] = headings_[c];
            if (wrap_) {
                WrappedRow(count);
            } else {
                for (std::size_t c = 0; c < count; ++c) Cell(c, headings_[c]);
                EndLine();
            }
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
            if (wrap_) {
                for (std::size_t c = 0; c < count; ++c) {
                    lines_[c].clear();
                    AppendShown(lines_[c], cells[c], scratch_);
                }
                WrappedRow(count);
            } else {
                for (std::size_t c = 0; c < count; ++c) Cell(c, cells[c]);
                EndLine();
            }
        }
    }

private:
    void SetHeading(std::size_t c, const std::string& name, const std::string* unit) {
        std::string heading = name;
        if (unit != nullptr) heading += " (" + *unit + ")";
        headings_[c] = Escaped(heading);
    }

    // Narrows the columns to the terminal width when the table is wider (widths_ holds the
    // natural widths on entry). Each column keeps its longest word while those fit together.
    void Fit(Grid& grid) {
        const std::size_t count = widths_.size();
        lines_.assign(count, std::string());
        std::size_t gaps = kGap * (count - 1);
        std::size_t total = std::accumulate(widths_.begin(), widths_.end(), gaps);
        if (total <= terminalWidth_) return;
        std::size_t room = terminalWidth_ > gaps ? terminalWidth_ - gaps : 0;
        if (params_.WrapLast()) {
            // The last column gives way first, down to kMinWrapWidth.
            std::size_t others = total - widths_[count - 1];
            std::size_t last = terminalWidth_ > others ? terminalWidth_ - others : 0;
            last = std::max(last, std::min(widths_[count - 1], kMinWrapWidth));
            if (others + last <= terminalWidth_ || count == 1) {
                widths_[count - 1] = std::min(widths_[count - 1], std::max<std::size_t>(last, 1));
                return;
            }
        }
        std::vector<std::size_t> words = LongestWords(grid);
        std::size_t needed = std::accumulate(words.begin(), words.end(), std::size_t(0));
        if (needed > room) {
            // Long words are split to share the width, unless that leaves a column too narrow
            // to read: then the table keeps its natural widths and runs past the terminal.
            std::vector<std::size_t> shared = Share(words, room);
            for (std::size_t c = 0; c < count; ++c)
                if (shared[c] < std::min(words[c], kMinFitWidth)) return;
            widths_ = shared;
            return;
        }
        std::vector<std::size_t> natural = widths_;
        std::vector<std::size_t> more(count);
        for (std::size_t c = 0; c < count; ++c) more[c] = widths_[c] - words[c];
        std::vector<std::size_t> extra = Share(more, room - needed);
        for (std::size_t c = 0; c < count; ++c) widths_[c] = words[c] + extra[c];
        Tighten(grid, natural);
    }

    // A narrowed column whose wrapped cells leave part of it blank on every line gives that
    // part to the narrowed columns that can still use it.
    void Tighten(Grid& grid, const std::vector<std::size_t>& natural) {
        const std::size_t count = widths_.size();
        std::vector<std::size_t> used(count, 0);
        auto measure = [&](std::size_t c, const std::string& text) {
            Segments segments(text, widths_[c]);
            const char* data;
            std::size_t size;
            while (segments.Next(&data, &size)) used[c] = std::max(used[c], DisplayWidth(data, size));
        };
        if (header_) {
            for (std::size_t c = 0; c < count; ++c) {
                if (widths_[c] < natural[c]) measure(c, headings_[c]);
            }
        }
        for (std::size_t r = 0; r < grid.rows.size(); ++r) {
            grid.columns.Map(*grid.rows[r]);
            const std::vector<const MetaObject*>& cells = grid.columns.Cells();
            for (std::size_t c = 0; c < count; ++c) {
                if (widths_[c] >= natural[c]) continue;
                line_.clear();
                AppendShown(line_, cells[c], scratch_);
                measure(c, line_);
            }
        }
        std::size_t slack = 0;
        std::vector<std::size_t> caps(count, 0);
        for (std::size_t c = 0; c < count; ++c) {
            if (widths_[c] >= natural[c]) continue;
            if (used[c] < widths_[c]) {
                slack += widths_[c] - std::max<std::size_t>(used[c], 1);
                widths_[c] = std::max<std::size_t>(used[c], 1);
            } else {
                caps[c] = natural[c] - widths_[c];
            }
        }
        std::vector<std::size_t> extra = Share(caps, slack);
        for (std::size_t c = 0; c < count; ++c) widths_[c] += extra[c];
    }

    // Per column: the widest word of its cells and heading (never more than the column).
    std::vector<std::size_t> LongestWords(Grid& grid) {
        const std::size_t count = widths_.size();
        std::vector<std::size_t> words(count, 0);
        if (header_) {
            for (std::size_t c = 0; c < count; ++c) words[c] = LongestWord(headings_[c]);
        }
        for (std::size_t r = 0; r < grid.rows.size(); ++r) {
            grid.columns.Map(*grid.rows[r]);
            const std::vector<const MetaObject*>& cells = grid.columns.Cells();
            for (std::size_t c = 0; c < count; ++c) {
                line_.clear();
                AppendShown(line_, cells[c], scratch_);
                words[c] = std::max(words[c], LongestWord(line_));
            }
        }
        for (std::size_t c = 0; c < count; ++c) words[c] = std::min(words[c], widths_[c]);
        return words;
    }

    // Blanks owed before the next cell; dropped at the end of a line, so no line ends in blanks.
    void Gap() {
        if (pending_ > 0) out_.PutRepeat(' ', pending_);
        pending_ = 0;
    }
    void EndLine() {
        out_.Put('\n');
        pending_ = 0;
    }

    // A cell already in shown form.
    void Cell(std::size_t column, const std::string& text) {
        std::size_t w = DisplayWidth(text);
        if (w > 0) {
            Gap();
            out_.Put(text);
        }
        pending_ += widths_[column] - w + kGap;
    }

    void Cell(std::size_t column, const MetaObject* value) {
        std::size_t w;
        if (value != nullptr && value->GetType() == MetaObj::MetaTypeString) {
            // Escaped once, measured and written from the same text.
            const std::string& text = static_cast<const MetaString*>(value)->GetValue();
            const std::string* shown = &text;
            if (quarn::util::NeedsEscape(text.data(), text.size())) {
                scratch_.clear();
                quarn::util::EscapeTo(scratch_, text.data(), text.size());
                shown = &scratch_;
            }
            w = value->HasValue() ? DisplayWidth(*shown) : 0;
            if (w > 0) {
                Gap();
                out_.Put(*shown);
            }
        } else {
            w = TextWidth(value, scratch_);
            if (w > 0) {
                Gap();
                PutText(out_, value, scratch_);
            }
        }
        pending_ += widths_[column] - w + kGap;
    }

    // One row whose cells (lines_, in shown form) wrap inside their columns: as many lines as
    // its tallest cell needs.
    void WrappedRow(std::size_t count) {
        segments_.clear();
        for (std::size_t c = 0; c < count; ++c) segments_.emplace_back(lines_[c], widths_[c]);
        pieces_.assign(count, Piece());
        while (true) {
            bool any = false;
            for (std::size_t c = 0; c < count; ++c) {
                Piece& piece = pieces_[c];
                piece.size = 0;
                if (!piece.done && !segments_[c].Next(&piece.data, &piece.size)) piece.done = true;
                any = any || !piece.done;
            }
            if (!any) break;
            for (std::size_t c = 0; c < count; ++c) {
                const Piece& piece = pieces_[c];
                std::size_t w = piece.done ? 0 : DisplayWidth(piece.data, piece.size);
                if (w > 0) {
                    Gap();
                    out_.Put(piece.data, piece.size);
                }
                pending_ += widths_[c] - std::min(w, widths_[c]) + kGap;
            }
            EndLine();
        }
    }

    struct Piece {
        const char* data = nullptr;
        std::size_t size = 0;
        bool done = false;
    };

    const FormatParams& params_;
    std::size_t terminalWidth_;
    Writer& out_;
    std::size_t pending_;
    bool header_ = true;
    bool wrap_ = false;
    std::vector<std::size_t> widths_;
    std::vector<std::string> headings_;
    std::vector<std::string> lines_;  // a wrapped row's cells
    std::vector<Segments> segments_;
    std::vector<Piece> pieces_;
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

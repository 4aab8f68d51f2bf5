#include <simhost/domains/Advanced.h>

#include "util/Text.h"

#include <simhost/Events.h>

#include <algorithm>
#include <cstdio>

#include <unordered_set>

namespace simhost {
namespace advanced {
namespace {

using nlohmann::json;
using nlohmann::ordered_json;

// The storage names of the two collections (items of the generic store).
const char kOptions[] = "advanced.options";
const char kBranches[] = "advanced.branches";
constexpr std::size_t kMaxComponents = 8;
constexpr std::size_t kMaxComponent = 63;
constexpr std::size_t kMaxBranches = 100000;
constexpr std::size_t kMaxOptions = 1000000;
constexpr std::size_t kMaxReadError = 4096;

bool IsNameCharacter(char c) {
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') ||
           c == '_' || c == '.' || c == '-';
}

std::string KindText(int kind) {
    if (kind == kInteger) return "integer";
    if (kind == kString) return "string";
    return std::to_string(kind);
}

int ParseKind(const json& value, const Location& at) {
    if (value.is_string()) {
        if (value == "integer") return kInteger;
        if (value == "string") return kString;
    } else if (value.is_number_integer()) {
        std::int64_t kind = value.get<std::int64_t>();
        if (kind >= 2 && kind <= kMaxKind) return static_cast<int>(kind);
    }
    at.Fail("expected \"integer\", \"string\" or a kind from 2 to 255");
}

std::uint32_t ReadUint32(ObjectReader& reader, const char* name) {
    return static_cast<std::uint32_t>(reader.Integer(name, 0, UINT32_MAX));
}

// The first byte of value that the option does not accept, or npos.
std::size_t FirstRefused(const Option& option, const std::string& value) {
    for (std::size_t i = 0; i < value.size(); ++i) {
        unsigned char c = static_cast<unsigned char>(value[i]);
        bool accepted = option.valid_characters.empty()
                            ? c >= 0x20 && c != 0x7F
                            : option.valid_characters.find(value[i]) != std::string::npos;
        if (!accepted) return i;
    }
    return std::string::npos;
}

std::string CharacterText(char c) {
    unsigned char byte = static_cast<unsigned char>(c);
    if (byte < 0x20 || byte == 0x7F) {
        char hex[8];
        std::snprintf(hex, sizeof hex, "0x%02x", byte);
        return std::string("the control character ") + hex;
    }
    return "the character " + quarn::util::Quote(std::string(1, c));
}

std::string AcceptedText(const Option& option) {
    if (option.valid_characters.empty()) return "printable characters only";
    return "only the characters " + quarn::util::Quote(option.valid_characters, 200);
}

HostError Refusal(const char* event, std::vector<std::string> args) {
    Event record{event, std::move(args)};
    return HostError(FormatEvent(record), HostError::Code::kFailed, record);
}

std::string RangeOf(const Option& option) {
    return std::to_string(option.min) + " to " + std::to_string(option.max);
}

// ---- the stored form ---------------------------------------------------------------------------
//
// A stored option is a JSON array of its members by position (no member names to parse or look
// up): listing a large tree decodes every option, so this is where a listing spends its time.
// It is read straight into an Option, without building a document. The members, in order: path,
// kind, description, value, default, min, max, text, text default, valid characters, user,
// typed, read error.

std::string Encode(const Option& option) {
    json stored = json::array({option.path, option.kind, option.description, option.value,
                               option.default_value, option.min, option.max, option.text,
                               option.text_default, option.valid_characters, option.user,
                               option.typed, option.read_error});
    return stored.dump(-1, ' ', false, json::error_handler_t::strict);
}

// Reads the stored array back. It reads only what Encode writes (JSON text as the host wrote
// it: strings with the escapes nlohmann writes, unsigned integers, true and false); anything
// else makes it fail, and the state counts as damaged.
class StoredReader {
public:
    explicit StoredReader(const std::string& text)
        : at_(text.data()), end_(text.data() + text.size()) {}

    bool Read(Option& option) {
        std::uint64_t kind = 0, value = 0, def = 0, min = 0, max = 0;
        bool ok = Take('[') && String(option.path) && Take(',') && Unsigned(kind, kMaxKind) &&
                  Take(',') && String(option.description) && Take(',') &&
                  Unsigned(value, UINT32_MAX) && Take(',') && Unsigned(def, UINT32_MAX) &&
                  Take(',') && Unsigned(min, UINT32_MAX) && Take(',') && Unsigned(max, UINT32_MAX) &&
                  Take(',') && String(option.text) && Take(',') && String(option.text_default) &&
                  Take(',') && String(option.valid_characters) && Take(',') && Bool(option.user) &&
                  Take(',') && Bool(option.typed) && Take(',') && String(option.read_error) &&
                  Take(']') && at_ == end_;
        option.kind = static_cast<int>(kind);
        option.value = static_cast<std::uint32_t>(value);
        option.default_value = static_cast<std::uint32_t>(def);
        option.min = static_cast<std::uint32_t>(min);
        option.max = static_cast<std::uint32_t>(max);
        return ok;
    }

private:
    bool Take(char c) {
        if (at_ == end_ || *at_ != c) return false;
        ++at_;
        return true;
    }
    bool Unsigned(std::uint64_t& out, std::uint64_t max) {
        if (at_ == end_ || *at_ < '0' || *at_ > '9') return false;
        out = 0;
        while (at_ != end_ && *at_ >= '0' && *at_ <= '9') {
            out = out * 10 + static_cast<unsigned>(*at_++ - '0');
            if (out > max) return false;
        }
        return true;
    }
    bool Bool(bool& out) {
        static const char kTrue[] = "true", kFalse[] = "false";
        if (end_ - at_ >= 4 && std::equal(kTrue, kTrue + 4, at_)) {
            at_ += 4;
            return out = true, true;
        }
        if (end_ - at_ >= 5 && std::equal(kFalse, kFalse + 5, at_)) {
            at_ += 5;
            return out = false, true;
        }
        return false;
    }
    bool Hex4(unsigned& out) {
        if (end_ - at_ < 4) return false;
        out = 0;
        for (int i = 0; i < 4; ++i) {
            char c = *at_++;
            unsigned digit = c >= '0' && c <= '9'   ? static_cast<unsigned>(c - '0')
                             : c >= 'a' && c <= 'f' ? static_cast<unsigned>(c - 'a' + 10)
                             : c >= 'A' && c <= 'F' ? static_cast<unsigned>(c - 'A' + 10)
                                                    : 16u;
            if (digit == 16) return false;
            out = out * 16 + digit;
        }
        return true;
    }
    void Utf8(unsigned code, std::string& out) {
        if (code < 0x80) {
            out += static_cast<char>(code);
        } else if (code < 0x800) {
            out += static_cast<char>(0xC0 | (code >> 6));
            out += static_cast<char>(0x80 | (code & 0x3F));
        } else if (code < 0x10000) {
            out += static_cast<char>(0xE0 | (code >> 12));
            out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
            out += static_cast<char>(0x80 | (code & 0x3F));
        } else {
            out += static_cast<char>(0xF0 | (code >> 18));
            out += static_cast<char>(0x80 | ((code >> 12) & 0x3F));
            out += static_cast<char>(0x80 | ((code >> 6) & 0x3F));
            out += static_cast<char>(0x80 | (code & 0x3F));
        }
    }
    bool Escape(std::string& out) {
        if (at_ == end_) return false;
        switch (char c = *at_++) {
        case '"': case '\\': case '/': out += c; return true;
        case 'b': out += '\b'; return true;
        case 'f': out += '\f'; return true;
        case 'n': out += '\n'; return true;
        case 'r': out += '\r'; return true;
        case 't': out += '\t'; return true;
        case 'u': {
            unsigned code = 0, low = 0;
            if (!Hex4(code)) return false;
            if (code >= 0xD800 && code < 0xDC00) {
                if (!Take('\\') || !Take('u') || !Hex4(low) || low < 0xDC00 || low >= 0xE000) return false;
                code = 0x10000 + ((code - 0xD800) << 10) + (low - 0xDC00);
            } else if (code >= 0xDC00 && code < 0xE000) {
                return false;
            }
            Utf8(code, out);
            return true;
        }
        default: return false;
        }
    }
    bool String(std::string& out) {
        if (!Take('"')) return false;
        out.clear();
        for (;;) {
            const char* run = at_;
            while (at_ != end_ && *at_ != '"' && *at_ != '\\') ++at_;
            out.append(run, at_);
            if (at_ == end_) return false;
            if (*at_++ == '"') return true;
            if (!Escape(out)) return false;
        }
    }

    const char* at_;
    const char* end_;
};

// The stored option, or a damaged-state error when it cannot be read back.
Option Decode(const std::string& text) {
    Option option;
    if (!StoredReader(text).Read(option) || !IsOptionPath(option.path))
        throw HostDamaged("The simulated host's state is damaged: an advanced option cannot be "
                          "read; recreate the host with 'quarnhost init --force'");
    return option;
}

// Items are keyed by their depth and path ("2:/Net/TcpMss"): the direct children of a branch
// are then exactly the keys that start with the child depth and the branch's path, one range of
// the key index, so listing a branch never reads its sub-branches' items.
std::string KeyOf(const std::string& path) {
    std::size_t depth = 0;
    for (char c : path) depth += c == '/';
    return std::to_string(depth) + ":" + path;
}
std::string ChildPrefix(const std::string& branch) {
    std::string key = KeyOf(branch + "/x");
    key.pop_back();
    return key;
}

}  // namespace

bool IsOptionPath(const std::string& text) {
    if (text.size() < 2 || text[0] != '/') return false;
    std::size_t components = 0, length = 0;
    for (std::size_t i = 1; i <= text.size(); ++i) {
        if (i == text.size() || text[i] == '/') {
            if (length == 0 || length > kMaxComponent) return false;
            ++components;
            length = 0;
        } else if (!IsNameCharacter(text[i])) {
            return false;
        } else {
            ++length;
        }
    }
    return components <= kMaxComponents;
}

std::string ParentOf(const std::string& path) { return path.substr(0, path.rfind('/')); }

Option ParseOption(const json& value, const Location& at) {
    ObjectReader reader(value, at);
    Option option;
    option.path = reader.Text("path", 1024, false);
    if (!IsOptionPath(option.path))
        reader.At("path").Fail("expected a path of 1 to 8 components of 1 to 63 characters "
                               "A-Z a-z 0-9 _ . -, each after a '/'");
    option.kind = ParseKind(*reader.Member("type"), reader.At("type"));
    if (reader.Member("description", false))
        option.description = reader.Text("description", kMaxDescription);
    if (option.kind == kInteger) {
        if (reader.Member("min", false)) option.min = ReadUint32(reader, "min");
        if (reader.Member("max", false)) option.max = ReadUint32(reader, "max");
        if (reader.Member("default", false)) option.default_value = ReadUint32(reader, "default");
        option.value = option.default_value;
        if (reader.Member("value", false)) option.value = ReadUint32(reader, "value");
    } else {
        if (option.kind == kString) {
            if (reader.Member("valid_characters", false))
                option.valid_characters = reader.Text("valid_characters", 256);
            if (reader.Member("default", false))
                option.text_default = reader.Text("default", kMaxStringValue);
        }
        option.text = option.text_default;
        if (reader.Member("value", false)) option.text = reader.Text("value", kMaxStringValue);
    }
    if (reader.Member("user", false)) {
        if (!reader.Member("user")->is_boolean()) reader.At("user").Fail("expected true or false");
        option.user = reader.Member("user")->get<bool>();
    }
    if (reader.Member("typed", false)) {
        if (!reader.Member("typed")->is_boolean()) reader.At("typed").Fail("expected true or false");
        option.typed = reader.Member("typed")->get<bool>();
    }
    if (reader.Member("read_error", false))
        option.read_error = reader.Text("read_error", kMaxReadError);
    reader.Done();
    std::string problem = CheckOption(option);
    if (!problem.empty()) at.Fail(problem);
    return option;
}

ordered_json OptionJson(const Option& option) {
    ordered_json out = ordered_json::object();
    out["path"] = option.path;
    if (option.kind == kInteger || option.kind == kString)
        out["type"] = KindText(option.kind);
    else
        out["type"] = option.kind;
    out["description"] = option.description;
    if (option.kind == kInteger) {
        out["value"] = option.value;
        out["default"] = option.default_value;
        out["min"] = option.min;
        out["max"] = option.max;
    } else {
        out["value"] = option.text;
        if (option.kind == kString) {
            out["default"] = option.text_default;
            out["valid_characters"] = option.valid_characters;
        }
    }
    if (option.user) out["user"] = true;
    if (!option.typed) out["typed"] = false;
    if (!option.read_error.empty()) out["read_error"] = option.read_error;
    return out;
}

std::string CheckOption(const Option& option) {
    if (option.kind == kInteger) {
        if (option.min > option.max)
            return "min " + std::to_string(option.min) + " is above max " + std::to_string(option.max);
        if (option.default_value < option.min || option.default_value > option.max)
            return "default " + std::to_string(option.default_value) + " is outside " + RangeOf(option);
        if (option.value < option.min || option.value > option.max)
            return "value " + std::to_string(option.value) + " is outside " + RangeOf(option);
        return "";
    }
    if (option.kind != kString) return "";
    for (const std::string* text : {&option.text_default, &option.text}) {
        const char* what = text == &option.text ? "value" : "default";
        if (text->size() > kMaxStringValue)
            return std::string(what) + " is longer than " + std::to_string(kMaxStringValue) + " bytes";
        std::size_t refused = FirstRefused(option, *text);
        if (refused != std::string::npos)
            return std::string(what) + " " + quarn::util::Quote(*text) + " holds " +
                   CharacterText((*text)[refused]) + ", which the option does not accept";
    }
    return "";
}

void CheckIntegerValue(const Option& option, std::uint64_t value) {
    if (value >= option.min && value <= option.max) return;
    throw Refusal("quill.adv.option.out-of-range",
                  {option.path, std::to_string(value), std::to_string(option.min),
                   std::to_string(option.max)});
}

void CheckStringValue(const Option& option, const std::string& value) {
    if (value.size() > kMaxStringValue)
        throw Refusal("quill.adv.option.too-long",
                      {option.path, std::to_string(value.size()), std::to_string(kMaxStringValue)});
    std::size_t refused = FirstRefused(option, value);
    if (refused == std::string::npos) return;
    throw Refusal("quill.adv.option.bad-character",
                  {option.path, quarn::util::Quote(value), CharacterText(value[refused]),
                   AcceptedText(option)});
}

HostError ReadError(const Option& option) {
    return Refusal("quill.adv.option.unreadable", {option.path, option.read_error});
}

HostError OptionGone(const std::string& path) { return Refusal("quill.adv.option.gone", {path}); }

// ---- the stored tree -------------------------------------------------------------------------

std::optional<Option> FindOption(Db& db, const std::string& path) {
    std::optional<std::string> text = store::FindItem(db, kOptions, KeyOf(path));
    if (!text) return std::nullopt;
    return Decode(*text);
}

bool BranchExists(Db& db, const std::string& path) {
    return store::FindItem(db, kBranches, KeyOf(path)).has_value();
}

void ForEachOptionIn(Db& db, const std::string& branch, const std::function<void(Option&&)>& fn) {
    store::ForEachItemWithPrefix(db, kOptions, ChildPrefix(branch),
                                 [&](const std::string&, const std::string& text) { fn(Decode(text)); });
}

void ForEachBranchIn(Db& db, const std::string& branch,
                     const std::function<void(const std::string&)>& fn) {
    const std::string prefix = ChildPrefix(branch);
    const std::size_t mark = prefix.find(':') + 1;
    store::ForEachItemWithPrefix(db, kBranches, prefix,
                                 [&](const std::string& key, const std::string&) { fn(key.substr(mark)); });
}

void PutOption(Db& db, const Option& option) {
    std::string problem = CheckOption(option);
    if (!problem.empty()) throw HostError("advanced option " + option.path + ": " + problem);
    store::PutItem(db, kOptions, KeyOf(option.path), Encode(option));
}

// ---- the domain ------------------------------------------------------------------------------

namespace {

class TreeSection : public Section {
public:
    TreeSection(std::vector<std::string> branches, std::vector<Option> options)
        : branches_(std::move(branches)), options_(std::move(options)) {}

    ordered_json ToJson() const override {
        ordered_json out = ordered_json::object();
        out["branches"] = branches_;
        ordered_json options = ordered_json::array();
        for (const Option& option : options_) options.push_back(OptionJson(option));
        out["options"] = std::move(options);
        return out;
    }

    void Write(WriteContext& context) const override {
        for (const std::string& branch : branches_)
            store::PutItem(context.db, kBranches, KeyOf(branch), json{{"path", branch}}.dump());
        for (const Option& option : options_)
            store::PutItem(context.db, kOptions, KeyOf(option.path), Encode(option));
    }

private:
    std::vector<std::string> branches_;
    std::vector<Option> options_;
};

std::vector<std::string> ParseBranches(const json& value, const Location& at) {
    if (!value.is_array()) at.Fail("expected an array");
    if (value.size() > kMaxBranches)
        at.Fail("expected at most " + std::to_string(kMaxBranches) + " items");
    std::vector<std::string> branches;
    branches.reserve(value.size());
    for (std::size_t i = 0; i < value.size(); ++i) {
        const json& item = value[i];
        if (!item.is_string() || !IsOptionPath(item.get_ref<const std::string&>()))
            at.Index(i).Fail("expected a path of 1 to 8 components of 1 to 63 characters "
                             "A-Z a-z 0-9 _ . -, each after a '/'");
        branches.push_back(item.get<std::string>());
    }
    return branches;
}

std::vector<Option> ParseOptions(const json& value, const Location& at) {
    if (!value.is_array()) at.Fail("expected an array");
    if (value.size() > kMaxOptions)
        at.Fail("expected at most " + std::to_string(kMaxOptions) + " items");
    std::vector<Option> options;
    options.reserve(value.size());
    for (std::size_t i = 0; i < value.size(); ++i) options.push_back(ParseOption(value[i], at.Index(i)));
    return options;
}

// Every branch but a top-level one, and every option, lives in a listed branch; no path twice.
void CheckTree(const std::vector<std::string>& branches, const std::vector<Option>& options,
               const Location& at) {
    std::unordered_set<std::string> known;
    known.reserve(branches.size());
    for (std::size_t i = 0; i < branches.size(); ++i)
        if (!known.insert(branches[i]).second)
            at.Member("branches").Index(i).Fail("'" + branches[i] + "' appears twice");
    for (std::size_t i = 0; i < branches.size(); ++i) {
        std::string parent = ParentOf(branches[i]);
        if (!parent.empty() && !known.count(parent))
            at.Member("branches").Index(i).Fail("its parent branch '" + parent + "' is not listed");
    }
    std::unordered_set<std::string> paths;
    paths.reserve(options.size());
    for (std::size_t i = 0; i < options.size(); ++i) {
        const std::string& path = options[i].path;
        Location item = at.Member("options").Index(i);
        if (known.count(path)) item.Fail("'" + path + "' is a branch");
        if (!paths.insert(path).second) item.Fail("'" + path + "' appears twice");
        std::string parent = ParentOf(path);
        if (!parent.empty() && !known.count(parent))
            item.Fail("its branch '" + parent + "' is not listed");
    }
}

class TreeDomain : public Domain {
public:
    const char* Name() const override { return Tree::kSection; }
    std::string Shape() const override { return "advanced:3:depth-keyed branches,positional options"; }

    std::unique_ptr<Section> Parse(const json* value, const Location& at) const override {
        const DefaultTree& defaults = Defaults();
        if (!value) return std::make_unique<TreeSection>(defaults.branches, defaults.options);
        ObjectReader reader(*value, at);
        std::vector<std::string> branches = defaults.branches;
        std::vector<Option> options = defaults.options;
        if (const json* member = reader.Member("branches", false))
            branches = ParseBranches(*member, reader.At("branches"));
        if (const json* member = reader.Member("options", false))
            options = ParseOptions(*member, reader.At("options"));
        reader.Done();
        CheckTree(branches, options, at);
        return std::make_unique<TreeSection>(std::move(branches), std::move(options));
    }

    std::unique_ptr<Section> Read(Db& db, const std::string&) const override {
        std::vector<std::string> branches;
        std::vector<Option> options;
        store::ForEachItem(db, kBranches, [&](const std::string& key, const std::string&) {
            branches.push_back(key.substr(key.find(':') + 1));
        });
        store::ForEachItem(db, kOptions, [&](const std::string&, const std::string& text) {
            options.push_back(Decode(text));
        });
        return std::make_unique<TreeSection>(std::move(branches), std::move(options));
    }
};

}  // namespace

const Domain& Tree::TheDomain() {
    static const TreeDomain domain;
    return domain;
}

}  // namespace advanced
}  // namespace simhost

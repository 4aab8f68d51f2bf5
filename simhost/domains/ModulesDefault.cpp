// Expands Modules.def, the compact description of the default host's modules and log levels,
// into the defaults of the "modules" and "log_levels" sections. Signature data is derived from
// the module's name and version, so every signed module has its own digest and fingerprint.
#include <simhost/domains/Modules.h>

#include <cstdint>
#include <cstdio>
#include <string>

namespace simhost {
namespace modules {
namespace {

enum State { LOADED, IDLE, OFF, FORCED };
enum Signer { PLATFORM, PARTNER, COMMUNITY, UNSIGNED };
enum class Row { kCoreLog, kModule, kParam, kOptions, kLog };

struct Entry {
    Row row;
    std::uint32_t name;
    std::uint32_t a;  // module: license; param: type; options: the string
    std::uint32_t b;  // module: version; param: description
    std::uint32_t c;  // module: build
    int state;        // module: State; log: current level
    int signer;       // module: Signer; log: default level
    std::uint32_t provides;
    std::uint32_t needs;
};

// The rows, their texts held as offsets (TextTable.inc).
#define LEVEL_ROW(row, name, current, def) \
    TEXT(name_, #name) ENTRY(row, AT(name_), 0, 0, 0, current, def, 0, 0)
#define CORE_LOG(...) LEVEL_ROW(Row::kCoreLog, __VA_ARGS__)
#define LOG(...) LEVEL_ROW(Row::kLog, __VA_ARGS__)
#define MODULE(name, license, version, build, state, signer, provides, needs)               \
    TEXT(name_, #name) TEXT(a_, license) TEXT(b_, version) TEXT(c_, build)                 \
    TEXT(provides_, provides) TEXT(needs_, needs)                                          \
    ENTRY(Row::kModule, AT(name_), AT(a_), AT(b_), AT(c_), state, signer, AT(provides_), \
          AT(needs_))
#define PARAM(name, type, doc)                                 \
    TEXT(name_, #name) TEXT(a_, #type) TEXT(b_, doc)           \
    ENTRY(Row::kParam, AT(name_), AT(a_), AT(b_), 0, 0, 0, 0, 0)
#define OPTIONS(text) TEXT(a_, text) ENTRY(Row::kOptions, 0, AT(a_), 0, 0, 0, 0, 0, 0)
#define SIMHOST_TEXT_TABLE "Modules.def"
#include "TextTable.inc"
#undef LEVEL_ROW
#undef CORE_LOG
#undef LOG
#undef MODULE
#undef PARAM
#undef OPTIONS

// A 64-bit FNV-1a hash, stirred, as the seed of the derived signature bytes.
std::uint64_t Hash(const std::string& text, std::uint64_t seed) {
    std::uint64_t h = 1469598103934665603ULL ^ seed;
    for (unsigned char c : text) {
        h ^= c;
        h *= 1099511628211ULL;
    }
    return h;
}

std::string HexBytes(const std::string& text, std::uint64_t seed, int bytes, bool colons) {
    std::string out;
    std::uint64_t h = Hash(text, seed);
    for (int i = 0; i < bytes; ++i) {
        if (i % 8 == 0) h = Hash(text + std::to_string(i), h);
        char hex[4];
        std::snprintf(hex, sizeof hex, colons ? "%02X" : "%02x", static_cast<unsigned>((h >> (8 * (i % 8))) & 0xff));
        if (colons && i) out += ':';
        out += hex;
    }
    return out;
}

Namespace ParseNamespace(const std::string& text) {
    Namespace ns;
    std::size_t at = text.find('@');
    ns.name = text.substr(0, at);
    while (at != std::string::npos) {
        std::size_t comma = text.find(',', at + 1);
        ns.versions.push_back(text.substr(at + 1, comma == std::string::npos ? std::string::npos : comma - at - 1));
        at = comma;
    }
    return ns;
}

std::vector<Namespace> ParseRequires(const std::string& text) {
    std::vector<Namespace> list;
    std::size_t at = 0;
    while (at < text.size()) {
        std::size_t semi = text.find(';', at);
        list.push_back(ParseNamespace(text.substr(at, semi == std::string::npos ? std::string::npos : semi - at)));
        if (semi == std::string::npos) break;
        at = semi + 1;
    }
    return list;
}

Module MakeModule(const Entry& e) {
    Module m;
    m.name = Text(e.name);
    m.file = "/usr/lib/norlith/modules/" + m.name + ".nmod";
    m.license = Text(e.a);
    m.version = Text(e.b);
    m.file_version = m.version + "-" + Text(e.c);
    const std::string signed_text = m.name + "@" + m.file_version;
    switch (e.signer) {
    case PLATFORM:
        m.signed_status = "Signed by platform key";
        m.signature_issuer = "Tarsel Norlith Module Signing CA 2";
        break;
    case PARTNER:
        m.signed_status = "Signed by partner key";
        m.signature_issuer = "Tarsel Partner Module Signing CA";
        break;
    case COMMUNITY:
        m.signed_status = "Signed by community key";
        m.signature_issuer = "Norlith Community Packages CA";
        break;
    default:
        m.signed_status = "Unsigned";
        break;
    }
    if (e.signer != UNSIGNED) {
        m.signature_digest = HexBytes(signed_text, 0x5167, 32, false);
        m.signature_fingerprint = HexBytes(signed_text, 0xf19e, 20, true);
    }
    if (*Text(e.provides)) m.provides = ParseNamespace(Text(e.provides));
    m.requires_ = ParseRequires(Text(e.needs));
    m.enabled = e.state == LOADED || e.state == IDLE;
    m.loaded = e.state == LOADED || e.state == FORCED;
    return m;
}

struct Expanded {
    std::vector<Module> modules;
    std::vector<LogLevel> levels;
};

Expanded Expand() {
    Expanded out;
    for (const Entry& e : kEntries) {
        switch (e.row) {
        case Row::kCoreLog:
        case Row::kLog: {
            LogLevel level;
            level.module = e.row == Row::kLog ? out.modules.back().name : "";
            level.name = Text(e.name);
            level.current = e.state;
            level.default_level = e.signer;
            out.levels.push_back(level);
            break;
        }
        case Row::kModule:
            out.modules.push_back(MakeModule(e));
            break;
        case Row::kParam:
            out.modules.back().parameters.push_back({Text(e.name), Text(e.a), Text(e.b)});
            break;
        case Row::kOptions:
            out.modules.back().options = Text(e.a);
            break;
        }
    }
    for (Module& m : out.modules)
        if (m.loaded) m.loaded_options = m.options;
    return out;
}

const Expanded& Defaults() {
    static const Expanded expanded = Expand();
    return expanded;
}

}  // namespace

std::vector<Module> Module::Default() { return Defaults().modules; }
std::vector<LogLevel> LogLevel::Default() { return Defaults().levels; }

}  // namespace modules
}  // namespace simhost

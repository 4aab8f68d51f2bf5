// The kernel modules domain: every loadable module the host knows, with its file, license,
// versions, signature, the namespace it provides and those it requires, the parameters it
// declares, the option string stored for its next load, and whether it is loaded (now) and
// enabled (kept for later boots). Beside it: option strings stored for names the host does not
// know as modules (aliases), and the log levels of the kernel core and of modules.
//
// Scenario section "modules" (default: the ~120 modules of Modules.def): an array of
//   {"name": module name (required, the key), "file": path, "license": text, "version": text,
//    "file_version": text, "signed_status": text, "signature_issuer": text,
//    "signature_digest": text, "signature_fingerprint": text,
//    "provides": {"name": namespace, "versions": [text, ...]},
//    "requires": [{"name": namespace, "versions": [text, ...]}, ...],
//    "parameters": [{"name": parameter name, "type": a parameter type, "description": text}],
//    "options": the stored option string (default ""), "loaded_options": the options of the
//    load in effect (default ""), "loaded": bool (default false), "enabled": bool (default true)}
// Section "module_aliases": [{"name": module name (the key), "options": option string}].
// Section "log_levels": [{"module": "" (the kernel core) or a module name, "name": level name,
//   "current": 0..31, "default": 0..31}]; the key is module + ":" + name.
//
// Names: a module name is 1..64 characters A-Z a-z 0-9 _ - and . (IsModuleName); a parameter
// or log level name 1..64 characters A-Z a-z 0-9 and _. Parameter types: "int" (32-bit signed),
// "uint" (32-bit unsigned), "bool" (0 1 y n Y N true false), "string" (at most 255 bytes) and
// "int array" / "uint array" (1 to 32 comma-separated elements).
//
// The option string: blank-separated name=value pairs (blanks are spaces and tabs, any number of
// them, also before the first pair and after the last); each name appears once; a value is 1 to
// 255 bytes without blanks or control characters. At most 4096 bytes; "" (or only blanks) means
// no options.
//
// At a reboot (Boot): the enabled modules are the loaded ones, each loaded with its stored
// option string; log levels return to their defaults.
#pragma once

#include <simhost/Db.h>
#include <simhost/Export.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace simhost {
namespace modules {

constexpr std::size_t kMaxName = 64;
constexpr std::size_t kMaxOptionString = 4096;
constexpr std::size_t kMaxValue = 255;
constexpr std::size_t kMaxArray = 32;
constexpr std::int32_t kMaxLogLevel = 31;

SIMHOST_API bool IsModuleName(const std::string& text);
SIMHOST_API bool IsParameterName(const std::string& text);
SIMHOST_API bool IsParameterType(const std::string& text);
SIMHOST_API const std::vector<std::string>& ParameterTypes();

struct Namespace {
    std::string name;
    std::vector<std::string> versions;
};

template <class V>
void Describe(V& v, Namespace& s) {
    v("name", s.name, Text(64));
    v("versions", s.versions, MaxItems(16), Each(Text(32, false)));
}

struct Parameter {
    std::string name;
    std::string type = "int";
    std::string description;
};

template <class V>
void Describe(V& v, Parameter& s) {
    v("name", s.name, Required(),
      Pattern{IsParameterName, "expected 1 to 64 characters A-Z a-z 0-9 _"});
    v("type", s.type, Pattern{IsParameterType, "expected int, uint, bool, string, int array or uint array"});
    v("description", s.description, Text(1024));
}

// The option string parsed: pairs in their order.
typedef std::vector<std::pair<std::string, std::string>> Pairs;

// Parses an option string. Returns "" and fills pairs when it is well-formed, else the problem
// ("expected name=value pairs separated by blanks, found 'x'"). Parameters are not looked at.
SIMHOST_API std::string ParseOptions(const std::string& text, Pairs& pairs);
// The pairs of a stored string, skipping what does not parse (strings stored unchecked).
SIMHOST_API Pairs LenientPairs(const std::string& text);
// "" when value suits the parameter type, else what the type accepts.
SIMHOST_API std::string CheckValue(const std::string& type, const std::string& value);

struct Module {
    static constexpr char kSection[] = "modules";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::string name;
    std::string file;
    std::string license;
    std::string version;
    std::string file_version;
    std::string signed_status;
    std::string signature_issuer;
    std::string signature_digest;
    std::string signature_fingerprint;
    Namespace provides;
    std::vector<Namespace> requires_;
    std::vector<Parameter> parameters;
    std::string options;
    std::string loaded_options;
    bool loaded = false;
    bool enabled = true;

    std::string Key() const { return name; }
    SIMHOST_API static std::vector<Module> Default();
    // The enabled modules are the loaded ones, each with the options stored for it.
    static bool Boot(Module& module) {
        module.loaded = module.enabled;
        module.loaded_options = module.loaded ? module.options : std::string();
        return true;
    }
    SIMHOST_API std::string Check() const;
    // The declared parameter of that name, if any.
    SIMHOST_API const Parameter* FindParameter(const std::string& name) const;
};

template <class V>
void Describe(V& v, Module& s) {
    v("name", s.name, Required(),
      Pattern{IsModuleName, "expected 1 to 64 characters A-Z a-z 0-9 _ - ."});
    v("file", s.file, Text(1024));
    v("license", s.license, Text(128));
    v("version", s.version, Text(128));
    v("file_version", s.file_version, Text(128));
    v("signed_status", s.signed_status, Text(128));
    v("signature_issuer", s.signature_issuer, Text(256));
    v("signature_digest", s.signature_digest, Text(256));
    v("signature_fingerprint", s.signature_fingerprint, Text(256));
    v("provides", s.provides);
    v("requires", s.requires_, MaxItems(64));
    v("parameters", s.parameters, MaxItems(256));
    v("options", s.options, Text(kMaxOptionString));
    v("loaded_options", s.loaded_options, Text(kMaxOptionString));
    v("loaded", s.loaded);
    v("enabled", s.enabled);
}

// An option string kept for a name the host does not know as a module (stored with --force).
struct Alias {
    static constexpr char kSection[] = "module_aliases";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::string name;
    std::string options;

    std::string Key() const { return name; }
    static std::vector<Alias> Default() { return {}; }
};

template <class V>
void Describe(V& v, Alias& s) {
    v("name", s.name, Required(),
      Pattern{IsModuleName, "expected 1 to 64 characters A-Z a-z 0-9 _ - ."});
    v("options", s.options, Text(kMaxOptionString));
}

// One log level of the kernel core (module "") or of a module.
struct LogLevel {
    static constexpr char kSection[] = "log_levels";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::string module;
    std::string name;
    std::int32_t current = 0;
    std::int32_t default_level = 0;

    std::string Key() const { return module + ":" + name; }
    SIMHOST_API static std::vector<LogLevel> Default();
    // Levels set since the last boot do not survive it.
    static bool Boot(LogLevel& level) {
        level.current = level.default_level;
        return true;
    }
};

SIMHOST_API bool IsModuleOrCore(const std::string& text);

template <class V>
void Describe(V& v, LogLevel& s) {
    v("module", s.module, Pattern{IsModuleOrCore, "expected \"\" (the kernel core) or a module name"});
    v("name", s.name, Required(),
      Pattern{IsParameterName, "expected 1 to 64 characters A-Z a-z 0-9 _"});
    v("current", s.current, Range(0, kMaxLogLevel));
    v("default", s.default_level, Range(0, kMaxLogLevel));
}

// ---- the host's rules, as the host-control library applies them ----------------------------

// A name as messages show it: in single quotes, control characters escaped, cut after 64.
SIMHOST_API std::string QuoteName(const std::string& name);

// Refuses (HostError) a name that cannot name a module: empty, too long, "/" or control
// characters, or other characters a module name does not hold.
SIMHOST_API void CheckName(const std::string& name);
// The error for a name the host does not know as a module, naming the nearest known ones.
SIMHOST_API HostError Unknown(Db& db, const std::string& name);
// Refuses an option string that is malformed, names a parameter the module does not declare,
// or gives a value its type does not accept.
SIMHOST_API void CheckOptionsFor(const Module& module, const std::string& text);
// Refuses an option string that is malformed (for names the host does not know).
SIMHOST_API void CheckOptionsSyntax(const std::string& name, const std::string& text);
// The log level of module ("" the core) and name; refuses an unknown name, naming near ones.
SIMHOST_API LogLevel FindLogLevel(Db& db, const std::string& module, const std::string& name);
// Refuses a level outside 0..kMaxLogLevel.
SIMHOST_API void CheckLevel(const std::string& name, std::uint64_t level);

}  // namespace modules
}  // namespace simhost

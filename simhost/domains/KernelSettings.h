// The kernel settings domain: the host kernel's boot-time settings, each with a type, a
// description, a default, a configured value (used from the next boot) and a runtime value (what
// the running kernel uses; absent for settings the kernel does not report).
//
// Scenario section "kernel_settings" (default: a few dozen settings of every type): an array of
//   {"name": 1..64 characters A-Z a-z 0-9 _ (key), "type": 0..5, "description": text of at most
//    1024 bytes, "default": value, "configured": value, "runtime": value or null}
// Types: 0 string (at most 255 bytes, no control characters), 1 bool (TRUE or FALSE in any case),
// 2 uint32, 3 uint8, 4 uint16, 5 uint64 (unsigned numbers written in decimal, in hexadecimal after
// 0x or in octal after a leading 0, within the type's range). The default and the configured
// value follow the type; the runtime value is what the kernel reports (any text of at most 255
// bytes). At a reboot every setting that has a runtime value takes its configured value as the
// runtime value.
//
// Other domains read a setting with Find(db, name) inside their Call, e.g. whether the host
// creates a dump file by itself at boot: IsTrue(Find(db, "autoCreateDumpFile")->configured)
// (the configured value applies from the next boot; `runtime` is the current boot's).
#pragma once

#include <simhost/Db.h>
#include <simhost/Export.h>
#include <simhost/Mapping.h>
#include <simhost/State.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace simhost {
namespace kernel_settings {

enum Type : int { kString = 0, kBool = 1, kUint32 = 2, kUint8 = 3, kUint16 = 4, kUint64 = 5 };
constexpr int kMaxType = kUint64;
constexpr std::size_t kMaxValue = 255;

SIMHOST_API bool IsSettingName(const std::string& text);
// The type's name as the library shows it ("string", "bool", "uint32", "uint8", "uint16",
// "uint64"); "unknown" for any other value.
SIMHOST_API std::string TypeName(int type);
// "" when value is acceptable for the type, else what is expected ("expected TRUE or FALSE").
SIMHOST_API std::string CheckValue(int type, const std::string& value);
// A boolean setting's value is true when it begins with TRUE in any case.
SIMHOST_API bool IsTrue(const std::string& value);

struct Setting {
    static constexpr char kSection[] = "kernel_settings";
    static constexpr StateKind kKind = StateKind::kCollection;

    std::string name;
    std::int32_t type = kString;
    std::string description;
    std::string default_value;
    std::string configured;
    std::optional<std::string> runtime;

    std::string Key() const { return name; }
    SIMHOST_API static std::vector<Setting> Default();
    // The next boot runs with the configured value.
    static bool Boot(Setting& setting) {
        if (setting.runtime) setting.runtime = setting.configured;
        return true;
    }
    std::string Check() const {
        std::string problem = CheckValue(type, default_value);
        if (!problem.empty()) return "default: " + problem;
        problem = CheckValue(type, configured);
        if (!problem.empty()) return "configured: " + problem;
        if (runtime && runtime->size() > kMaxValue)
            return "runtime: expected null or a string of at most 255 bytes";
        return "";
    }
};

template <class V>
void Describe(V& v, Setting& s) {
    v("name", s.name, Required(),
      Pattern{IsSettingName, "expected 1 to 64 characters A-Z a-z 0-9 _"});
    v("type", s.type, Required(), Range(0, kMaxType));
    v("description", s.description, Text(1024));
    v("default", s.default_value, Text(kMaxValue));
    v("configured", s.configured, Text(kMaxValue));
    v("runtime", s.runtime);
}

// The setting of that name, if any.
SIMHOST_API std::optional<Setting> Find(Db& db, const std::string& name);
// The error for a name the host does not know, naming the nearest known ones.
SIMHOST_API HostError Unknown(Db& db, const std::string& name);
// The error for a value the setting's type does not accept, naming both and what is accepted.
SIMHOST_API HostError Refused(const Setting& setting, const std::string& value);

}  // namespace kernel_settings
}  // namespace simhost

// libFuzzer target: scenario parsing and validation. Any input must either be refused with a
// HostError (kScenario) or be accepted, in which case its export text must parse again to the same text.
#include <simhost/Error.h>
#include <simhost/Scenario.h>

#include <cstddef>
#include <cstdint>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::string text(reinterpret_cast<const char*>(data), size);
    try {
        std::string once = simhost::ScenarioText(simhost::ParseScenario(text));
        std::string twice = simhost::ScenarioText(simhost::ParseScenario(once));
        if (once != twice) __builtin_trap();
    } catch (const simhost::HostError&) {
    }
    return 0;
}

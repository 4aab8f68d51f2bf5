#include <simhost/domains/KernelSettings.h>

#include "util/Text.h"

#include <cstdint>
#include <limits>
#include <strings.h>

namespace simhost {
namespace kernel_settings {
namespace {

// An unsigned number as the kernel reads one: decimal, hexadecimal after 0x, octal after a
// leading 0; the whole text, no sign, no blanks. False when it is not one or exceeds max.
bool ParseUnsigned(const std::string& text, std::uint64_t max, std::uint64_t* value) {
    std::size_t at = 0;
    unsigned base = 10;
    if (text.size() > 2 && text[0] == '0' && (text[1] == 'x' || text[1] == 'X')) {
        base = 16;
        at = 2;
    } else if (text.size() > 1 && text[0] == '0') {
        base = 8;
        at = 1;
    }
    if (at >= text.size()) return false;
    std::uint64_t number = 0;
    for (; at < text.size(); ++at) {
        char c = text[at];
        unsigned digit;
        if (c >= '0' && c <= '9')
            digit = static_cast<unsigned>(c - '0');
        else if (c >= 'a' && c <= 'f')
            digit = static_cast<unsigned>(c - 'a' + 10);
        else if (c >= 'A' && c <= 'F')
            digit = static_cast<unsigned>(c - 'A' + 10);
        else
            return false;
        if (digit >= base) return false;
        if (number > (max - digit) / base) return false;
        number = number * base + digit;
    }
    *value = number;
    return true;
}

std::string NumberExpected(std::uint64_t max) {
    return "expected an unsigned integer from 0 to " + std::to_string(max) +
           " (decimal, hexadecimal after 0x, octal after a leading 0)";
}

Setting Make(const char* name, int type, const char* def, const char* configured,
             const char* runtime, const char* description) {
    Setting setting;
    setting.name = name;
    setting.type = type;
    setting.default_value = def;
    setting.configured = configured;
    if (runtime) setting.runtime = std::string(runtime);
    setting.description = description;
    return setting;
}

}  // namespace

bool IsSettingName(const std::string& text) {
    if (text.empty() || text.size() > 64) return false;
    for (char c : text)
        if (!((c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '_'))
            return false;
    return true;
}

std::string TypeName(int type) {
    switch (type) {
    case kString: return "string";
    case kBool: return "bool";
    case kUint32: return "uint32";
    case kUint8: return "uint8";
    case kUint16: return "uint16";
    case kUint64: return "uint64";
    default: return "unknown";
    }
}

std::string CheckValue(int type, const std::string& value) {
    std::uint64_t number = 0;
    switch (type) {
    case kString:
        if (value.size() > kMaxValue) return "expected at most 255 bytes";
        for (char c : value)
            if (static_cast<unsigned char>(c) < 0x20 || c == 0x7F)
                return "expected text without control characters";
        if (!quarn::util::IsValidUtf8(value)) return "expected UTF-8 text";
        return "";
    case kBool:
        if (strcasecmp(value.c_str(), "true") == 0 || strcasecmp(value.c_str(), "false") == 0)
            return "";
        return "expected TRUE or FALSE (in any case)";
    case kUint32:
        return ParseUnsigned(value, UINT32_MAX, &number) ? "" : NumberExpected(UINT32_MAX);
    case kUint8:
        return ParseUnsigned(value, UINT8_MAX, &number) ? "" : NumberExpected(UINT8_MAX);
    case kUint16:
        return ParseUnsigned(value, UINT16_MAX, &number) ? "" : NumberExpected(UINT16_MAX);
    case kUint64:
        return ParseUnsigned(value, UINT64_MAX, &number) ? "" : NumberExpected(UINT64_MAX);
    default:
        return "the setting's type " + std::to_string(type) + " is unknown";
    }
}

bool IsTrue(const std::string& value) { return strncasecmp(value.c_str(), "TRUE", 4) == 0; }

std::vector<Setting> Setting::Default() {
    // In the order the library lists them; a null runtime value is one the kernel does not report.
    return {
        Make("allowLegacyBootMedia", kBool, "TRUE", "TRUE", nullptr, "Let the boot loader start from media formatted for legacy firmware."),
        Make("autoCreateDumpFile", kBool, "TRUE", "TRUE", "TRUE", "Create a dump file on a local datastore at boot when no dump target is configured."),
        Make("bootDelaySec", kUint32, "0", "0", nullptr, "Seconds the boot loader waits before it starts the kernel."),
        Make("bootMenuTimeoutSec", kUint8, "5", "5", nullptr, "Seconds the boot menu waits for a key."),
        Make("clearMemoryOnReboot", kBool, "FALSE", "FALSE", "FALSE", "Clear all memory before the host restarts."),
        Make("consoleBaudRate", kUint32, "115200", "115200", "115200", "Speed, in bits per second, of the serial console."),
        Make("consoleDevice", kString, "vga", "vga", "vga", "Device the kernel console is shown on: vga, com1 or com2."),
        Make("debugLogToSerial", kBool, "FALSE", "FALSE", "FALSE", "Copy every kernel log line to the debug serial port."),
        Make("debugModuleList", kString, "", "", "", "Comma-separated modules loaded with debugging enabled."),
        Make("dumpFileDatastore", kString, "", "", nullptr, "Datastore on which an automatic dump file is created; empty picks the largest."),
        Make("dumpFileSizeMB", kUint32, "0", "2048", "2048", "Size, in MiB, of an automatically created dump file; 0 sizes it from the host's memory."),
        Make("dumpPartitionOffset", kUint64, "0", "0", "0", "Byte offset of the dump partition on its disk; 0 uses the partition table."),
        Make("enableHugeKernelPages", kBool, "TRUE", "TRUE", "TRUE", "Map kernel memory with huge pages."),
        Make("enableTpmMeasurement", kBool, "TRUE", "TRUE", "TRUE", "Measure every boot module into the trusted platform module."),
        Make("hardwareWatchdog", kBool, "TRUE", "TRUE", "TRUE", "Arm the hardware watchdog while the kernel runs."),
        Make("heapSizeLimitMB", kUint32, "0", "0", "0", "Upper limit, in MiB, of the kernel heap; 0 sizes it from the host's memory."),
        Make("ignoreHeadlessFlag", kBool, "FALSE", "FALSE", "FALSE", "Start a local console even when the firmware reports no display."),
        Make("kernelCmdlineExtra", kString, "", "", nullptr, "Options appended to the kernel command line by the boot loader."),
        Make("lockdownShell", kBool, "FALSE", "FALSE", "FALSE", "Refuse local shell logins, including from the console."),
        Make("logBufferPages", kUint32, "512", "512", "512", "Pages of memory kept for the kernel log."),
        Make("logLevel", kUint8, "3", "3", "3", "Least important kernel log level written: 0 emergencies only, 7 everything."),
        Make("logPort", kString, "none", "com1", "com1", "Serial port the kernel log is copied to, or none."),
        Make("maxInterruptVectors", kUint32, "4096", "4096", "4096", "Interrupt vectors the kernel reserves."),
        Make("maxIoQueues", kUint16, "256", "256", "256", "I/O queues each storage adapter may create."),
        Make("maxPcpus", kUint32, "4096", "4096", nullptr, "Most physical CPUs the kernel brings up."),
        Make("memReserveMB", kUint32, "256", "256", "256", "Memory, in MiB, kept back from virtual machines for the kernel."),
        Make("memoryCeilingBytes", kUint64, "0", "0", "0", "Highest physical address the kernel uses, in bytes; 0 uses all memory."),
        Make("mtuOverride", kUint16, "0", "0", "0", "MTU forced on every uplink at boot; 0 keeps each adapter's own."),
        Make("netBootRetry", kBool, "TRUE", "TRUE", nullptr, "Retry a failed network boot instead of falling back to local disks."),
        Make("numaMaxNodes", kUint8, "64", "64", "64", "Most NUMA nodes the kernel recognises."),
        Make("pciSegmentMax", kUint16, "16", "16", "16", "PCI segments the kernel scans."),
        Make("powerPolicyAtBoot", kString, "balanced", "balanced", "balanced", "Power policy in effect until the power manager starts."),
        Make("preferSerialConsole", kBool, "FALSE", "FALSE", "FALSE", "Show the kernel console on the serial port rather than the display."),
        Make("serialPortIndex", kUint8, "1", "1", "1", "Serial port used by the serial console: 1 or 2."),
        Make("skipPciHotplugScan", kBool, "FALSE", "FALSE", "FALSE", "Skip the scan of hot-plug PCI slots at boot."),
        Make("smtThreadsPerCore", kUint8, "2", "2", "2", "Hardware threads used on each core; 1 turns simultaneous multithreading off."),
        Make("strictPageZeroing", kBool, "FALSE", "TRUE", "FALSE", "Clear every page before it is handed to a virtual machine."),
        Make("timerSource", kString, "auto", "auto", "tsc", "Clock source of the kernel timers: auto, tsc, hpet or pmtimer."),
        Make("verboseBoot", kBool, "FALSE", "TRUE", "TRUE", "Show every boot step on the console instead of the progress screen."),
        Make("vgaTextRows", kUint16, "25", "50", "25", "Text rows of the VGA console."),
        Make("watchdogTimeoutSec", kUint32, "60", "0x3c", "0x3c", "Seconds without a heartbeat before the watchdog resets the host."),
    };
}

std::optional<Setting> Find(Db& db, const std::string& name) { return Items<Setting>(db).Find(name); }

HostError Unknown(Db& db, const std::string& name) {
    std::vector<std::string> names;
    Items<Setting>(db).ForEach([&](Setting setting) { names.push_back(std::move(setting.name)); });
    std::vector<std::string> nearest = quarn::util::NearestNames(name, names);
    std::string text = "Unknown kernel setting " + quarn::util::Quote(name);
    if (!nearest.empty()) {
        text += " (nearest:";
        for (std::size_t i = 0; i < nearest.size(); ++i) text += (i ? ", " : " ") + nearest[i];
        text += ")";
    }
    return HostError(text);
}

HostError Refused(const Setting& setting, const std::string& value) {
    return HostError("Invalid value " + quarn::util::Quote(value) + " for kernel setting '" +
                     setting.name + "' of type " + TypeName(setting.type) + ": " +
                     CheckValue(setting.type, value));
}

}  // namespace kernel_settings
}  // namespace simhost

#include <simhost/Time.h>

#include <cstdio>
#include <ctime>

namespace simhost {
namespace {

constexpr char kSeconds[] = "dddd-dd-ddTdd:dd:ddZ";
constexpr char kMillis[] = "dddd-dd-ddTdd:dd:dd.dddZ";

bool Matches(const std::string& text, const char* pattern) {
    std::size_t size = std::char_traits<char>::length(pattern);
    if (text.size() != size) return false;
    for (std::size_t i = 0; i < size; ++i) {
        if (pattern[i] == 'd' ? text[i] < '0' || text[i] > '9' : text[i] != pattern[i]) return false;
    }
    return true;
}

int Number(const std::string& text, std::size_t at, std::size_t width) {
    int value = 0;
    for (std::size_t i = 0; i < width; ++i) value = value * 10 + (text[at + i] - '0');
    return value;
}

bool IsLeap(int year) { return (year % 4 == 0 && year % 100 != 0) || year % 400 == 0; }

int DaysIn(int year, int month) {
    static const int kDays[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    return month == 2 && IsLeap(year) ? 29 : kDays[month - 1];
}

}  // namespace

std::int64_t MachineNowMicros() {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    return static_cast<std::int64_t>(now.tv_sec) * 1000000 + now.tv_nsec / 1000;
}

std::string FormatUtc(std::int64_t micros, bool with_millis) {
    std::int64_t seconds = micros / 1000000;
    std::int64_t rest = micros % 1000000;
    if (rest < 0) {
        rest += 1000000;
        --seconds;
    }
    time_t whole = static_cast<time_t>(seconds);
    std::tm parts{};
    gmtime_r(&whole, &parts);
    char text[64];
    if (with_millis)
        std::snprintf(text, sizeof text, "%04d-%02d-%02dT%02d:%02d:%02d.%03dZ",
                      parts.tm_year + 1900, parts.tm_mon + 1, parts.tm_mday, parts.tm_hour,
                      parts.tm_min, parts.tm_sec, static_cast<int>(rest / 1000));
    else
        std::snprintf(text, sizeof text, "%04d-%02d-%02dT%02d:%02d:%02dZ", parts.tm_year + 1900,
                      parts.tm_mon + 1, parts.tm_mday, parts.tm_hour, parts.tm_min, parts.tm_sec);
    return text;
}

std::optional<std::int64_t> ParseUtc(const std::string& text) {
    bool millis = Matches(text, kMillis);
    if (!millis && !Matches(text, kSeconds)) return std::nullopt;
    int year = Number(text, 0, 4), month = Number(text, 5, 2), day = Number(text, 8, 2);
    int hour = Number(text, 11, 2), minute = Number(text, 14, 2), second = Number(text, 17, 2);
    if (month < 1 || month > 12 || day < 1 || day > DaysIn(year, month) || hour > 23 ||
        minute > 59 || second > 59)
        return std::nullopt;
    std::tm parts{};
    parts.tm_year = year - 1900;
    parts.tm_mon = month - 1;
    parts.tm_mday = day;
    parts.tm_hour = hour;
    parts.tm_min = minute;
    parts.tm_sec = second;
    std::int64_t seconds = static_cast<std::int64_t>(timegm(&parts));
    return seconds * 1000000 + (millis ? Number(text, 20, 3) * 1000 : 0);
}

std::string UtcNow() { return FormatUtc(MachineNowMicros(), true); }

bool IsUtcMillis(const std::string& text) { return Matches(text, kMillis) && ParseUtc(text); }
bool IsUtcSeconds(const std::string& text) { return Matches(text, kSeconds) && ParseUtc(text); }

}  // namespace simhost

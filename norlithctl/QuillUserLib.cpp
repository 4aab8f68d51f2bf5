#include <norlithctl/QuillUserLib.h>

#include <simhost/Call.h>
#include <simhost/Kernel.h>
#include <simhost/Time.h>
#include <simhost/domains/Logs.h>

#include <atomic>
#include <cstdarg>
#include <cstdio>
#include <cstring>

namespace {

// Whether the library is open (between Init and Close) in this process.
std::atomic<bool> g_open{false};

// A format may name the event it posts: "@&!*@*@(ID)" before the message's own format. Splits
// it into the id ("" when it names none) and the rest.
const char kEventMarker[] = "@&!*@*@(";

std::string SplitEvent(const char*& format) {
    const std::size_t marker = sizeof kEventMarker - 1;
    if (std::strncmp(format, kEventMarker, marker) != 0) return "";
    const char* close = std::strchr(format + marker, ')');
    if (!close) return "";
    std::string id(format + marker, close);
    format = close + 1;
    return id;
}

// Runs one call; every failure becomes -1, since nothing may cross the C boundary.
template <class Body>
int Guard(Body&& body) {
    try {
        body();
        return 0;
    } catch (...) {
        return -1;
    }
}

}  // namespace

extern "C" int QuillUserLib_Init(void) {
    return Guard([] {
        simhost::Call call(simhost::Op::QuillUserLib_Init);
        g_open = true;
    });
}

extern "C" int QuillUserLib_AddQuill(const char* format, ...) {
    if (!format) return -1;
    const std::string event = SplitEvent(format);
    std::string text;
    va_list args;
    va_start(args, format);
    va_list copy;
    va_copy(copy, args);
    int size = std::vsnprintf(nullptr, 0, format, copy);
    va_end(copy);
    if (size >= 0) {
        text.resize(static_cast<std::size_t>(size) + 1);
        std::vsnprintf(text.data(), text.size(), format, args);
        text.resize(static_cast<std::size_t>(size));
    }
    va_end(args);
    if (size < 0) return -1;
    return Guard([&] {
        simhost::Args args;
        if (!event.empty()) args.Add("event", event);
        simhost::Call call(simhost::Op::QuillUserLib_AddQuill, args.Add("message", text));
        if (!g_open) throw simhost::HostError("the event library is not open");
        simhost::observations::Entry entry;
        entry.time = simhost::FormatUtc(simhost::kernel::HostNowMicros(call), true);
        entry.event = event;
        entry.message = text;
        call.Change([&](simhost::Db& db) { simhost::Items<simhost::observations::Entry>(db).Append(entry); });
    });
}

extern "C" void QuillUserLib_Close(void) {
    Guard([] { simhost::Call call(simhost::Op::QuillUserLib_Close); });
    g_open = false;
}

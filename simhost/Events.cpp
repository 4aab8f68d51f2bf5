#include <simhost/Events.h>

#include <cstring>

namespace simhost {
namespace {

const EventInfo kEvents[] = {
#define EVENT(Id, id, text) {id, text},
#include <simhost/Registry.def>
};

const EventInfo* Find(const std::string& id) {
    for (const EventInfo& info : kEvents)
        if (id == info.id) return &info;
    return nullptr;
}

// The number of arguments a text uses: one more than its highest {N}.
std::size_t ArgumentCount(const char* text) {
    std::size_t count = 0;
    for (const char* p = std::strchr(text, '{'); p; p = std::strchr(p + 1, '{')) {
        std::size_t index = 0;
        const char* q = p + 1;
        if (*q < '0' || *q > '9') continue;
        while (*q >= '0' && *q <= '9') index = index * 10 + static_cast<std::size_t>(*q++ - '0');
        if (*q == '}' && index + 1 > count) count = index + 1;
    }
    return count;
}

}  // namespace

const std::vector<EventInfo>& EventCatalog() {
    static const std::vector<EventInfo> all(std::begin(kEvents), std::end(kEvents));
    return all;
}

std::string CheckEvent(const Event& event) {
    const EventInfo* info = Find(event.id);
    if (!info) {
        std::string known;
        for (const EventInfo& entry : kEvents) known += (known.empty() ? "" : ", ") + std::string(entry.id);
        return "unknown event id '" + event.id + "' (known: " + known + ")";
    }
    std::size_t expected = ArgumentCount(info->text);
    if (event.args.size() != expected)
        return "event '" + event.id + "' takes " + std::to_string(expected) + " argument" +
               (expected == 1 ? "" : "s") + ", not " + std::to_string(event.args.size());
    return "";
}

std::string FormatEvent(const Event& event) {
    const EventInfo* info = Find(event.id);
    if (!info) {
        std::string text = event.id + "(";
        for (std::size_t i = 0; i < event.args.size(); ++i) text += (i ? ", " : "") + event.args[i];
        return text + ")";
    }
    std::string text;
    for (const char* p = info->text; *p;) {
        if (*p == '{' && p[1] >= '0' && p[1] <= '9') {
            const char* q = p + 1;
            std::size_t index = 0;
            while (*q >= '0' && *q <= '9') index = index * 10 + static_cast<std::size_t>(*q++ - '0');
            if (*q == '}') {
                if (index < event.args.size()) text += event.args[index];
                p = q + 1;
                continue;
            }
        }
        text += *p++;
    }
    return text;
}

}  // namespace simhost

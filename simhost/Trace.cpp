#include <simhost/Trace.h>

#include <atomic>
#include <mutex>

namespace simhost {
namespace trace {
namespace {

std::atomic<bool> g_enabled{false};
std::atomic<bool> g_arguments{false};
std::mutex g_mutex;
std::vector<TraceEntry>& Entries() {
    static std::vector<TraceEntry> entries;
    return entries;
}

}  // namespace

void Enable(bool with_arguments) {
    std::lock_guard<std::mutex> lock(g_mutex);
    Entries().clear();
    g_arguments = with_arguments;
    g_enabled = true;
}

void Disable() { g_enabled = false; }

bool Enabled() { return g_enabled.load(std::memory_order_relaxed); }

bool WithArguments() { return g_arguments.load(std::memory_order_relaxed); }

std::vector<TraceEntry> Take() {
    std::lock_guard<std::mutex> lock(g_mutex);
    std::vector<TraceEntry> taken;
    taken.swap(Entries());
    return taken;
}

std::vector<std::string> TakeOperations() {
    std::vector<std::string> names;
    for (TraceEntry& entry : Take()) names.push_back(std::move(entry.operation));
    return names;
}

void Record(const std::string& operation, const std::string& arguments_json) {
    std::lock_guard<std::mutex> lock(g_mutex);
    if (g_enabled) Entries().push_back({operation, arguments_json});
}

}  // namespace trace
}  // namespace simhost

#include <simhost/Operations.h>

#include <simhost/Events.h>

#include <util/Text.h>

#include <algorithm>

namespace simhost {
namespace {

const OperationInfo kOperations[] = {
#define OPERATION(Id, name, doc) {Op::Id, name, doc},
#include <simhost/Registry.def>
};

// The class part of a qualified name ("NorlithCtl::System::SystemInfoImpl"), the service of
// an operation of the host management tool ("hostsvc" of "hostsvc/maintenance_mode_enter"), or
// "" for the event library's free functions.
std::string ClassOf(const std::string& name) {
    std::string::size_type colons = name.rfind("::");
    if (colons != std::string::npos) return name.substr(0, colons);
    std::string::size_type slash = name.find('/');
    return slash == std::string::npos ? "" : name.substr(0, slash);
}

std::string SectionTitle(const std::string& owner) {
    if (owner.empty()) return "Event library";
    if (owner.find("::") == std::string::npos)
        return "Host management tool (`/bin/kelp-cmd`), service `" + owner + "`";
    return "`" + owner + "`";
}

}  // namespace

const std::vector<OperationInfo>& Operations() {
    static const std::vector<OperationInfo> all(std::begin(kOperations), std::end(kOperations));
    return all;
}

const char* OperationName(Op op) { return kOperations[static_cast<std::size_t>(op)].name; }

std::optional<Op> FindOperation(const std::string& name) {
    for (const OperationInfo& info : kOperations)
        if (name == info.name) return info.op;
    return std::nullopt;
}

const std::vector<std::string>& KnownOperations() {
    static const std::vector<std::string> names = [] {
        std::vector<std::string> sorted;
        for (const OperationInfo& info : kOperations) sorted.push_back(info.name);
        std::sort(sorted.begin(), sorted.end());
        sorted.erase(std::unique(sorted.begin(), sorted.end()), sorted.end());
        return sorted;
    }();
    return names;
}

bool IsKnownOperation(const std::string& name) {
    const auto& names = KnownOperations();
    return std::binary_search(names.begin(), names.end(), name);
}

std::vector<std::string> NearestOperations(const std::string& name, std::size_t count) {
    // A name given without its namespaces (e.g. "GetSystemUuid") is compared with the known
    // names' tails too, so that it still finds its qualified form.
    quarn::util::NearestOptions options;
    options.limited = false;
    options.nearestOnly = false;
    options.tails = true;
    options.ignoreCase = false;
    options.count = count;
    return quarn::util::NearestNames(name, KnownOperations(), options);
}

std::string UnknownOperationText(const std::string& name) {
    std::string hint;
    for (const std::string& near : NearestOperations(name)) hint += (hint.empty() ? "" : ", ") + near;
    return "unknown operation '" + name + "'" + (hint.empty() ? "" : " (nearest: " + hint + ")");
}

std::string OperationsMarkdown() {
    std::string text =
        "# Host operations\n\n"
        "Every operation the host-control and event libraries serve. Each can be made to fail\n"
        "with `quarnhost fault add NAME MESSAGE`; the journal and the call trace name them so.\n"
        "This page is generated from simhost/Registry.def by `quarnhost operations`; a test keeps it\n"
        "current.\n";
    // One section per class, in the order classes first appear; a class's operations together
    // even when the registry declares them in several places.
    std::vector<std::string> owners;
    for (const OperationInfo& info : kOperations) {
        std::string owner = ClassOf(info.name);
        if (std::find(owners.begin(), owners.end(), owner) == owners.end()) owners.push_back(owner);
    }
    for (const std::string& owner : owners) {
        text += "\n## " + SectionTitle(owner) + "\n\n| operation | what it does |\n|---|---|\n";
        for (const OperationInfo& info : kOperations)
            if (ClassOf(info.name) == owner)
                text += std::string("| `") + info.name + "` | " + info.doc + " |\n";
    }
    text +=
        "\n# Events\n\n"
        "The event catalog: the events a host error's event record (its `QuillMessage`) may name,\n"
        "with the text `GetMessage(1)` forms from them. A fault may carry one: `quarnhost fault add\n"
        "NAME MESSAGE --event ID [--arg TEXT]...`.\n\n| event | text |\n|---|---|\n";
    for (const EventInfo& event : EventCatalog())
        text += std::string("| `") + event.id + "` | " + event.text + " |\n";
    return text;
}

}  // namespace simhost

#include <simhost/Operations.h>

#include <simhost/Domain.h>
#include <simhost/Records.h>

#include <algorithm>
#include <numeric>

namespace simhost {
namespace {

// Operations that belong to no single domain: the objects' constructors and the event library's
// session calls. Domains and the kernel information reader list their own.
const char* const kCoreOperations[] = {
    "NorlithCtl::System::SystemInfoImpl::SystemInfoImpl",
    "QuillUserLib_Init",
    "QuillUserLib_Close",
};

std::vector<std::string> Collect() {
    std::vector<std::string> names(std::begin(kCoreOperations), std::end(kCoreOperations));
    for (const std::string& name : SysinfoOperationNames()) names.push_back(name);
    for (const Domain* domain : Domains())
        for (const std::string& name : domain->OperationNames()) names.push_back(name);
    std::sort(names.begin(), names.end());
    names.erase(std::unique(names.begin(), names.end()), names.end());
    return names;
}

std::size_t EditDistance(const std::string& a, const std::string& b) {
    std::vector<std::size_t> row(b.size() + 1);
    std::iota(row.begin(), row.end(), 0);
    for (std::size_t i = 1; i <= a.size(); ++i) {
        std::size_t diagonal = row[0];
        row[0] = i;
        for (std::size_t j = 1; j <= b.size(); ++j) {
            std::size_t up = row[j];
            row[j] = std::min({row[j] + 1, row[j - 1] + 1, diagonal + (a[i - 1] != b[j - 1])});
            diagonal = up;
        }
    }
    return row[b.size()];
}

}  // namespace

const std::vector<std::string>& KnownOperations() {
    static const std::vector<std::string> names = Collect();
    return names;
}

bool IsKnownOperation(const std::string& name) {
    const auto& names = KnownOperations();
    return std::binary_search(names.begin(), names.end(), name);
}

std::vector<std::string> NearestOperations(const std::string& name, std::size_t count) {
    std::vector<std::pair<std::size_t, std::string>> scored;
    for (const std::string& known : KnownOperations()) {
        // A name given without its namespaces (e.g. "GetSystemUuid") is compared with the
        // known names' same-length tails, so that it still finds its qualified form.
        std::size_t distance = EditDistance(name, known);
        if (known.size() > name.size())
            distance = std::min(distance,
                                EditDistance(name, known.substr(known.size() - name.size())) + 1);
        scored.emplace_back(distance, known);
    }
    std::stable_sort(scored.begin(), scored.end(),
                     [](const auto& a, const auto& b) { return a.first < b.first; });
    std::vector<std::string> nearest;
    for (std::size_t i = 0; i < scored.size() && i < count; ++i) nearest.push_back(scored[i].second);
    return nearest;
}

}  // namespace simhost

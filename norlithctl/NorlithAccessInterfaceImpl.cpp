#include <norlithctl/NorlithAccessInterfaceImpl.h>

#include "HostCall.h"

#include <simhost/domains/Secpolicy.h>

#include <unordered_map>
#include <vector>

namespace NorlithCtl {
namespace Security {

using simhost::Args;
using simhost::Call;
using simhost::HostError;
using simhost::Op;
using simhost::secpolicy::SecurityDomain;

// The labels of every domain id, read at the first GetLabel: a process list asks for one label
// per world, and the domains do not change while one command runs.
struct NorlithAccessInterfaceImpl::Labels {
    bool loaded = false;
    std::unordered_map<std::uint32_t, std::string> names;
};

namespace {

// The named domain; refuses a name the host does not have, suggesting near ones.
SecurityDomain FindDomain(Call& call, const std::string& name) {
    std::optional<SecurityDomain> found = call.Items<SecurityDomain>().Find(name);
    if (found) return *found;
    std::vector<std::string> names;
    call.Items<SecurityDomain>().ForEach([&](const SecurityDomain& d) { names.push_back(d.name); });
    throw HostError(simhost::secpolicy::UnknownDomainText(name, names));
}

void CheckLevel(const std::string& level) {
    std::string problem = simhost::secpolicy::LevelProblem(level);
    if (!problem.empty()) throw HostError(problem);
}

}  // namespace

NorlithAccessInterfaceImpl::NorlithAccessInterfaceImpl() : labels_(new Labels) {
    norlithctl::HostCall([] { Call call(Op::AccessInterface_New); });
}

NorlithAccessInterfaceImpl::~NorlithAccessInterfaceImpl() {}

std::string NorlithAccessInterfaceImpl::GetLabel(std::uint32_t id, int labelType) {
    return norlithctl::HostCall([&] {
        Call call(Op::AccessInterface_GetLabel, Args().Add("id", id).Add("label_type", labelType));
        if (labelType != 0)
            throw HostError("Unknown label type " + std::to_string(labelType) +
                            "; label type 0 (the security domain's name) is the only one");
        if (!labels_->loaded) {
            // The first domain with an id gives its label.
            call.Items<SecurityDomain>().ForEach(
                [&](const SecurityDomain& d) { labels_->names.emplace(d.id, d.name); });
            labels_->loaded = true;
        }
        auto found = labels_->names.find(id);
        if (found == labels_->names.end())
            throw HostError("Security domain id " + std::to_string(id) +
                            " has no label: no security domain of the host has that id");
        return found->second;
    });
}

std::map<std::string, long long> NorlithAccessInterfaceImpl::GetKeywordsMap(int keywordType) {
    return norlithctl::HostCall([&] {
        Call call(Op::AccessInterface_GetKeywordsMap, Args().Add("keyword_type", keywordType));
        if (keywordType != 0)
            throw HostError("Unknown keyword type " + std::to_string(keywordType) +
                            "; keyword type 0 (the security domains) is the only one");
        std::map<std::string, long long> keywords;
        call.Items<SecurityDomain>().ForEach(
            [&](const SecurityDomain& d) { keywords.emplace(d.name, d.id); });
        return keywords;
    });
}

std::string NorlithAccessInterfaceImpl::GetStatus(std::string domainName) {
    return norlithctl::HostCall([&] {
        Call call(Op::AccessInterface_GetStatus, Args().Add("domain", domainName));
        return FindDomain(call, domainName).Current();
    });
}

void NorlithAccessInterfaceImpl::Enable(std::string level) {
    norlithctl::HostCall([&] {
        Call call(Op::AccessInterface_Enable, Args().Add("level", level));
        CheckLevel(level);
        call.Change([&](simhost::Db& db) {
            simhost::Items<SecurityDomain> domains(db);
            for (SecurityDomain domain : domains.All()) {
                domain.level = level;
                domains.Put(domain);
            }
        });
    });
}

void NorlithAccessInterfaceImpl::EnableDomain(std::string domainName, std::string level) {
    norlithctl::HostCall([&] {
        Call call(Op::AccessInterface_EnableDomain,
                  Args().Add("domain", domainName).Add("level", level));
        SecurityDomain domain = FindDomain(call, domainName);
        CheckLevel(level);
        domain.level = level;
        call.Change([&](simhost::Db& db) { simhost::Items<SecurityDomain>(db).Put(domain); });
    });
}

}  // namespace Security
}  // namespace NorlithCtl

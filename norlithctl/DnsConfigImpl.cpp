#include <norlithctl/DnsConfigImpl.h>

#include "HostCall.h"

#include <simhost/domains/Dns.h>

namespace NorlithCtl {
namespace Network {

using simhost::Args;
using simhost::Call;
using simhost::Op;
using simhost::dns::DnsConfig;

struct DnsConfigImpl::Staging {
    simhost::Staged<DnsConfig> staged;

    // The configuration as SaveConfig would leave it.
    DnsConfig View(Call& call) const { return staged.View(call.db()); }

    // Checks value with problem(), then stages or applies change under call.
    template <class Change>
    void Set(Call& call, const std::string& problem, const char* member,
             const std::string& value, bool applyNow, Change change) {
        if (!problem.empty()) throw simhost::HostError(problem);
        if (applyNow)
            call.Update<DnsConfig>(change);
        else
            staged.Set(member, value, change);
    }
};

namespace {

Args SetArgs(const char* member, const std::string& value, bool applyNow) {
    return Args().Add(member, value).Add("apply_now", applyNow);
}

// A fully qualified name split at its first dot: the host name and the domain.
std::pair<std::string, std::string> SplitFqdn(const std::string& fqdn) {
    std::string::size_type dot = fqdn.find('.');
    return {fqdn.substr(0, dot), dot == std::string::npos ? "" : fqdn.substr(dot + 1)};
}

}  // namespace

DnsConfigImpl::DnsConfigImpl(const std::string& stackName) : staging_(new Staging) {
    norlithctl::HostCall([&] {
        Call call(Op::DnsConfigImpl_New, Args().Add("stack", stackName));
        if (stackName != simhost::dns::kDefaultStack)
            throw simhost::HostError("Unknown network stack '" + stackName +
                                     "'; the host has one network stack, '" +
                                     simhost::dns::kDefaultStack + "'");
    });
}

DnsConfigImpl::~DnsConfigImpl() {}

std::string DnsConfigImpl::GetHostname() {
    return norlithctl::HostCall([&] {
        Call call(Op::DnsConfigImpl_GetHostname);
        return staging_->View(call).host_name;
    });
}

std::string DnsConfigImpl::GetDomain() {
    return norlithctl::HostCall([&] {
        Call call(Op::DnsConfigImpl_GetDomain);
        return staging_->View(call).domain;
    });
}

std::string DnsConfigImpl::GetFqdn() {
    return norlithctl::HostCall([&] {
        Call call(Op::DnsConfigImpl_GetFqdn);
        return staging_->View(call).Fqdn();
    });
}

void DnsConfigImpl::SetHostname(const std::string& hostName, bool applyNow) {
    norlithctl::HostCall([&] {
        Call call(Op::DnsConfigImpl_SetHostname, SetArgs("host_name", hostName, applyNow));
        staging_->Set(call, simhost::dns::HostNameProblem(hostName), "host_name", hostName,
                      applyNow, [hostName](DnsConfig& c) { c.host_name = hostName; });
    });
}

void DnsConfigImpl::SetDomain(const std::string& domain, bool applyNow) {
    norlithctl::HostCall([&] {
        Call call(Op::DnsConfigImpl_SetDomain, SetArgs("domain", domain, applyNow));
        staging_->Set(call, simhost::dns::DomainProblem(domain), "domain", domain, applyNow,
                      [domain](DnsConfig& c) { c.domain = domain; });
    });
}

void DnsConfigImpl::SetFqdn(const std::string& fqdn, bool applyNow) {
    norlithctl::HostCall([&] {
        Call call(Op::DnsConfigImpl_SetFqdn, SetArgs("fqdn", fqdn, applyNow));
        const std::pair<std::string, std::string> parts = SplitFqdn(fqdn);
        staging_->Set(call, simhost::dns::FqdnProblem(fqdn), "fqdn", fqdn, applyNow,
                      [parts](DnsConfig& c) {
                          c.host_name = parts.first;
                          c.domain = parts.second;
                      });
    });
}

void DnsConfigImpl::SaveConfig() {
    norlithctl::HostCall([&] {
        Call call(Op::DnsConfigImpl_SaveConfig);
        if (staging_->staged.Empty()) return;
        staging_->staged.Commit(call);
    });
}

}  // namespace Network
}  // namespace NorlithCtl

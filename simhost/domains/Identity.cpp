#include <simhost/domains/Identity.h>

#include <algorithm>
#include <cctype>
#include <cstring>

namespace simhost {
namespace identity {
namespace {

bool IsHex(char c) { return std::isxdigit(static_cast<unsigned char>(c)) != 0; }

bool IsUuid(const std::string& text) {
    if (text.size() != 36) return false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        bool dash = i == 8 || i == 13 || i == 18 || i == 23;
        if (dash ? text[i] != '-' : !IsHex(text[i])) return false;
    }
    return true;
}

bool IsMacOrEmpty(const std::string& text) {
    if (text.empty()) return true;
    if (text.size() != 17) return false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (i % 3 == 2 ? text[i] != ':' : !IsHex(text[i])) return false;
    }
    return true;
}

bool IsFsUuidOrEmpty(const std::string& text) {
    if (text.size() > kBootFsUuidMax) return false;
    for (char c : text)
        if (!IsHex(c) && c != '-') return false;
    return true;
}

// The rules of every member, shared by scenario validation and Check().
struct Rule {
    const char* member;
    std::string Identity::*field;
    std::size_t max_bytes;
    bool allow_empty;
    bool (*format)(const std::string&);
    const char* format_text;
};

const Rule kRules[] = {
    {"product", &Identity::product, kProductMax, false, nullptr, nullptr},
    {"version", &Identity::version, kVersionMax, true, nullptr, nullptr},
    {"build", &Identity::build, kBuildMax, true, nullptr, nullptr},
    {"update", &Identity::update, kUpdateMax, true, nullptr, nullptr},
    {"system_uuid", &Identity::system_uuid, 36, false, IsUuid,
     "expected a UUID of the form xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx"},
    {"boot_nic_mac", &Identity::boot_nic_mac, 17, true, IsMacOrEmpty,
     "expected \"\" or a MAC address of the form xx:xx:xx:xx:xx:xx"},
    {"boot_fs_uuid", &Identity::boot_fs_uuid, kBootFsUuidMax, true, IsFsUuidOrEmpty,
     "expected \"\" or at most 63 hexadecimal digits and '-'"},
    {"stateless_boot_nic_mac", &Identity::stateless_boot_nic_mac, 17, true, IsMacOrEmpty,
     "expected \"\" or a MAC address of the form xx:xx:xx:xx:xx:xx"},
};

std::string CheckMember(const Rule& rule, const std::string& value) {
    if (rule.format && !rule.format(value)) return rule.format_text;
    return CheckText(value, rule.max_bytes, rule.allow_empty);
}

class IdentitySection : public Section {
public:
    explicit IdentitySection(Identity identity) : identity_(std::move(identity)) {}

    nlohmann::ordered_json ToJson() const override {
        nlohmann::ordered_json section = nlohmann::ordered_json::object();
        for (const Rule& rule : kRules) section[rule.member] = identity_.*rule.field;
        return section;
    }

    void Write(Db& db) const override {
        Query insert = db.Cached(
            "INSERT INTO identity(id, product, version, build, update_level, system_uuid, "
            "boot_nic_mac, boot_fs_uuid, stateless_boot_nic_mac) "
            "VALUES (1, ?1, ?2, ?3, ?4, ?5, ?6, ?7, ?8)");
        int index = 1;
        for (const Rule& rule : kRules) insert->Bind(index++, identity_.*rule.field);
        insert->Run();
    }

private:
    Identity identity_;
};

class IdentityDomain : public Domain {
public:
    std::string Name() const override { return "identity"; }

    std::string Schema() const override {
        return "CREATE TABLE identity ("
               " id INTEGER PRIMARY KEY CHECK (id = 1),"
               " product TEXT NOT NULL, version TEXT NOT NULL, build TEXT NOT NULL,"
               " update_level TEXT NOT NULL, system_uuid TEXT NOT NULL,"
               " boot_nic_mac TEXT NOT NULL, boot_fs_uuid TEXT NOT NULL,"
               " stateless_boot_nic_mac TEXT NOT NULL);";
    }

    std::vector<std::string> OperationNames() const override {
        return {
            "NorlithCtl::System::SystemInfoImpl::GetSystemUuid",
            "NorlithCtl::System::SystemInfoImpl::GetBootNicMacAddress",
            "NorlithCtl::System::SystemInfoImpl::GetBootFsUUID",
            "NorlithCtl::System::SystemInfoImpl::GetStatelessBootNicMacAddress",
        };
    }

    std::unique_ptr<Section> Parse(const nlohmann::json* value, const Location& at) const override {
        if (!value) Location().Fail("missing member '" + Name() + "'");
        ObjectReader reader(*value, at);
        Identity identity;
        for (const Rule& rule : kRules) {
            const nlohmann::json* member = reader.Member(rule.member);
            if (!member->is_string())
                reader.At(rule.member)
                    .Fail(rule.format ? rule.format_text
                                      : "expected a string of at most " +
                                            std::to_string(rule.max_bytes) + " bytes");
            std::string text = member->get<std::string>();
            std::string problem = CheckMember(rule, text);
            if (!problem.empty()) reader.At(rule.member).Fail(problem);
            identity.*rule.field = std::move(text);
        }
        reader.Done();
        return std::make_unique<IdentitySection>(std::move(identity));
    }

    std::unique_ptr<Section> Read(Db& db) const override {
        return std::make_unique<IdentitySection>(identity::Read(db));
    }
};

}  // namespace

std::array<unsigned char, kProductVersionSize> EncodeProductVersion(const Identity& identity) {
    std::array<unsigned char, kProductVersionSize> record{};
    auto put = [&record](std::size_t offset, std::size_t max, const std::string& text) {
        // The limits leave room for the terminating NUL, which the zero fill provides.
        std::memcpy(record.data() + offset, text.data(), std::min(text.size(), max));
    };
    put(kProductOffset, kProductMax, identity.product);
    put(kVersionOffset, kVersionMax, identity.version);
    put(kBuildOffset, kBuildMax, identity.build);
    put(kUpdateOffset, kUpdateMax, identity.update);
    return record;
}

std::string Check(const Identity& identity) {
    for (const Rule& rule : kRules) {
        std::string problem = CheckMember(rule, identity.*rule.field);
        if (!problem.empty()) return std::string(rule.member) + ": " + problem;
    }
    return "";
}

Identity Read(Db& db) {
    Query select = db.Cached(
        "SELECT product, version, build, update_level, system_uuid, boot_nic_mac, boot_fs_uuid, "
        "stateless_boot_nic_mac FROM identity WHERE id = 1");
    if (!select->Step()) throw HostError("simulated host: the identity is missing");
    Identity identity;
    int column = 0;
    for (const Rule& rule : kRules) identity.*rule.field = select->Text(column++);
    return identity;
}

const Domain& TheDomain() {
    static const IdentityDomain domain;
    return domain;
}

}  // namespace identity
}  // namespace simhost

// The SNMP agent's configuration file, /etc/tarsel/snmp.xml under the host's root/: reading it
// without blocking on odd files, parsing it with pugixml, and writing it atomically.
#include "SnmpConfig.h"

#include <simhost/Error.h>

#include <pugixml.hpp>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <sstream>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace norlithctl {
namespace snmp {
namespace {

using simhost::HostError;

// Far beyond any configuration the rules allow; a larger file is not one.
constexpr std::size_t kMaxFileSize = 1 << 20;

const std::string kWhere = std::string("The SNMP agent configuration ") + kConfigPath;

class Fd {
public:
    explicit Fd(int fd) : fd_(fd) {}
    ~Fd() { close(fd_); }
    Fd(const Fd&) = delete;
    Fd& operator=(const Fd&) = delete;

private:
    int fd_;
};

// The file's bytes; a problem that makes it unusable as a configuration (not a regular file,
// too large) goes to *malformed. Returns false when the file does not exist.
bool ReadBytes(const simhost::RootFs& fs, std::string* content, std::string* malformed) {
    int fd = -1;
    // Non-blocking, so that a FIFO put in the file's place cannot stall the reader.
    int error = fs.Open(kConfigPath, O_RDONLY | O_NOFOLLOW | O_NONBLOCK, 0, &fd);
    if (error == ENOENT) return false;
    if (error == ELOOP) {
        *malformed = "it is a symbolic link, not a regular file";
        return true;
    }
    if (error) throw HostError(kWhere + " cannot be read: " + std::strerror(error));
    Fd file(fd);
    struct stat info {};
    if (fstat(fd, &info) != 0) throw HostError(kWhere + " cannot be read: " + std::strerror(errno));
    if (!S_ISREG(info.st_mode)) {
        *malformed = "it is not a regular file";
        return true;
    }
    if (static_cast<std::size_t>(info.st_size) > kMaxFileSize) {
        *malformed = "it is larger than 1 MiB";
        return true;
    }
    std::string data;
    char buffer[65536];
    for (;;) {
        ssize_t got = read(fd, buffer, sizeof buffer);
        if (got < 0 && errno == EINTR) continue;
        if (got < 0) throw HostError(kWhere + " cannot be read: " + std::strerror(errno));
        if (got == 0) break;
        data.append(buffer, static_cast<std::size_t>(got));
        if (data.size() > kMaxFileSize) {
            *malformed = "it is larger than 1 MiB";
            return true;
        }
    }
    content->swap(data);
    return true;
}

std::size_t LineOf(const std::string& text, std::ptrdiff_t offset) {
    if (offset < 0) return 0;
    std::size_t end = std::min(static_cast<std::size_t>(offset), text.size());
    return 1 + static_cast<std::size_t>(std::count(text.begin(), text.begin() + static_cast<std::ptrdiff_t>(end), '\n'));
}

// Reads elements and attributes of the document, refusing anything unexpected with its line.
class Reader {
public:
    explicit Reader(const std::string& text) : text_(text) {}

    [[noreturn]] void Fail(const pugi::xml_node& node, const std::string& problem) const {
        throw HostError(kWhere + " is not a valid agent configuration (line " +
                        std::to_string(LineOf(text_, node.offset_debug())) + "): " + problem +
                        "; repair it or restore the factory configuration with 'system snmp set --reset'");
    }

    std::string Text(const pugi::xml_node& element) const {
        for (const pugi::xml_node& child : element.children())
            if (child.type() == pugi::node_element) Fail(child, "<" + std::string(element.name()) + "> holds text only");
        return element.text().get();
    }

    bool Bool(const pugi::xml_node& element) const {
        std::string text = Text(element);
        if (text == "true") return true;
        if (text == "false") return false;
        Fail(element, "<" + std::string(element.name()) + "> is true or false, not '" + text + "'");
    }

    unsigned Port(const std::string& text, const pugi::xml_node& at, unsigned low) const {
        char* end = nullptr;
        errno = 0;
        unsigned long value = std::strtoul(text.c_str(), &end, 10);
        if (text.empty() || *end || errno || text[0] == '-' || value < low || value > 65535)
            Fail(at, "the port '" + text + "' is not a number from " + std::to_string(low) + " to 65535");
        return static_cast<unsigned>(value);
    }

    // The attributes of an item element, each at most once and none unknown.
    std::map<std::string, std::string> Attributes(const pugi::xml_node& element,
                                                  std::initializer_list<const char*> known) const {
        std::map<std::string, std::string> values;
        for (const pugi::xml_attribute& attribute : element.attributes()) {
            std::string name = attribute.name();
            if (std::find_if(known.begin(), known.end(), [&](const char* k) { return name == k; }) == known.end())
                Fail(element, "<" + std::string(element.name()) + "> has no attribute '" + name + "'");
            values[name] = attribute.value();
        }
        return values;
    }

    // The child elements of a list element, each named item.
    std::vector<pugi::xml_node> Items(const pugi::xml_node& list, const char* item) const {
        std::vector<pugi::xml_node> items;
        for (const pugi::xml_node& child : list.children()) {
            if (child.type() == pugi::node_comment) continue;
            if (child.type() != pugi::node_element || std::strcmp(child.name(), item) != 0)
                Fail(list, "<" + std::string(list.name()) + "> holds <" + item + "> elements only");
            items.push_back(child);
        }
        return items;
    }

    void Check(const pugi::xml_node& at, const std::string& problem) const {
        if (!problem.empty()) Fail(at, problem);
    }

private:
    const std::string& text_;
};

void ReadTargets(const Reader& reader, const pugi::xml_node& list, AgentConfig& config) {
    for (const pugi::xml_node& node : reader.Items(list, "target")) {
        auto values = reader.Attributes(node, {"host", "port", "community"});
        TrapTarget target{values["host"], reader.Port(values.count("port") ? values["port"] : "162", node, 1),
                          values["community"]};
        reader.Check(node, CheckTargetItem(target));
        config.targets.push_back(target);
    }
}

void ReadUsers(const Reader& reader, const pugi::xml_node& list, AgentConfig& config) {
    for (const pugi::xml_node& node : reader.Items(list, "user")) {
        auto values = reader.Attributes(node, {"name", "authHash", "privHash", "model"});
        User user{values["name"], values["authHash"], values["privHash"], values["model"]};
        reader.Check(node, CheckUserItem(user));
        config.users.push_back(user);
    }
}

void ReadRemoteUsers(const Reader& reader, const pugi::xml_node& list, AgentConfig& config) {
    for (const pugi::xml_node& node : reader.Items(list, "remoteUser")) {
        auto values = reader.Attributes(
            node, {"name", "authProtocol", "authHash", "privProtocol", "privHash", "engineId"});
        RemoteUser user{values["name"],         values["authProtocol"], values["authHash"],
                        values["privProtocol"], values["privHash"],     values["engineId"]};
        reader.Check(node, CheckRemoteUserItem(user));
        config.remote_users.push_back(user);
    }
}

void ReadV3Targets(const Reader& reader, const pugi::xml_node& list, AgentConfig& config) {
    for (const pugi::xml_node& node : reader.Items(list, "target")) {
        auto values = reader.Attributes(node, {"host", "port", "user", "securityLevel", "type"});
        V3Target target{values["host"], reader.Port(values.count("port") ? values["port"] : "162", node, 1),
                        values["user"], values["securityLevel"], values["type"]};
        reader.Check(node, CheckV3TargetItem(target));
        config.v3_targets.push_back(target);
    }
}

void ReadOptions(const Reader& reader, const pugi::xml_node& list, AgentConfig& config) {
    for (const pugi::xml_node& node : reader.Items(list, "option")) {
        auto values = reader.Attributes(node, {"name"});
        if (values["name"].empty()) reader.Fail(node, "<option> needs a name");
        if (!config.options.emplace(values["name"], reader.Text(node)).second)
            reader.Fail(node, "the option " + values["name"] + " is given twice");
    }
}

void ReadList(const Reader& reader, const pugi::xml_node& list, const char* item,
              std::vector<std::string>& out) {
    for (const pugi::xml_node& node : reader.Items(list, item)) out.push_back(reader.Text(node));
}

AgentConfig ReadDocument(const std::string& text, const pugi::xml_document& document) {
    Reader reader(text);
    pugi::xml_node root = document.document_element();
    if (std::strcmp(root.name(), "snmpAgent") != 0)
        reader.Fail(root, "the document element is <" + std::string(root.name()) + ">, not <snmpAgent>");
    // An element that is left out keeps its factory value.
    AgentConfig config = FactoryConfig();
    bool options_given = false;
    std::map<std::string, int> seen;
    for (const pugi::xml_node& node : root.children()) {
        if (node.type() == pugi::node_comment) continue;
        if (node.type() != pugi::node_element) reader.Fail(root, "<snmpAgent> holds elements only");
        const std::string name = node.name();
        if (seen[name]++) reader.Fail(node, "<" + name + "> is given twice");
        if (name == "enable") {
            config.enabled = reader.Bool(node);
        } else if (name == "port") {
            config.port = reader.Port(reader.Text(node), node, 0);
        } else if (name == "largeStorage") {
            config.large_storage = reader.Bool(node);
        } else if (name == "communities") {
            ReadList(reader, node, "community", config.communities);
            try {
                if (!config.communities.empty()) config.communities = ParseCommunities(config.communities);
            } catch (const HostError& error) {
                reader.Fail(node, error.what());
            }
        } else if (name == "trapTargets") {
            ReadTargets(reader, node, config);
        } else if (name == "users") {
            ReadUsers(reader, node, config);
        } else if (name == "remoteUsers") {
            ReadRemoteUsers(reader, node, config);
        } else if (name == "v3Targets") {
            ReadV3Targets(reader, node, config);
        } else if (name == "options") {
            if (!options_given) config.options.clear();
            options_given = true;
            ReadOptions(reader, node, config);
        } else {
            reader.Fail(node, "unknown element <" + name + ">");
        }
    }
    if (config.targets.size() > 3 || config.users.size() > 5 || config.remote_users.size() > 5 ||
        config.v3_targets.size() > 3)
        reader.Fail(root, "it holds more targets or users than the agent allows (3 trap targets, 5 users, "
                          "5 remote users, 3 SNMPv3 targets)");
    return config;
}

// Parses text; false with *problem when it is not well-formed XML.
bool Parse(const std::string& text, pugi::xml_document& document, std::string* problem) {
    pugi::xml_parse_result result =
        document.load_buffer(text.data(), text.size(), pugi::parse_default | pugi::parse_comments,
                             pugi::encoding_utf8);
    if (result) {
        if (document.document_element()) return true;
        *problem = "it holds no element";
        return false;
    }
    *problem = "line " + std::to_string(LineOf(text, result.offset)) + ": " + result.description();
    return false;
}

void AddItem(pugi::xml_node list, const char* name,
             std::initializer_list<std::pair<const char*, std::string>> attributes) {
    pugi::xml_node item = list.append_child(name);
    for (const auto& [key, value] : attributes)
        if (!value.empty()) item.append_attribute(key) = value.c_str();
}

void AddText(pugi::xml_node parent, const char* name, const std::string& text) {
    parent.append_child(name).text() = text.c_str();
}

}  // namespace

ConfigFile ReadConfigFile(const std::string& root, bool interpret) {
    simhost::RootFs fs(root);
    if (fs.Error()) throw HostError("Cannot open the host's files at '" + root + "': " + std::strerror(fs.Error()));
    ConfigFile file;
    std::string text;
    if (!ReadBytes(fs, &text, &file.problem)) {
        file.config = FactoryConfig();
        return file;
    }
    pugi::xml_document document;
    if (!file.problem.empty() || !Parse(text, document, &file.problem)) {
        file.state = ConfigFile::State::kMalformed;
        return file;
    }
    file.state = ConfigFile::State::kWellFormed;
    if (interpret) file.config = ReadDocument(text, document);
    return file;
}

AgentConfig LoadConfig(const std::string& root) {
    ConfigFile file = ReadConfigFile(root);
    if (file.state == ConfigFile::State::kMalformed)
        throw HostError(kWhere + " is not well-formed XML (" + file.problem +
                        "); repair it or restore the factory configuration with 'system snmp set --reset'");
    return file.config;
}

AgentConfig FromXml(const std::string& text) {
    pugi::xml_document document;
    std::string problem;
    if (!Parse(text, document, &problem)) throw HostError(kWhere + " is not well-formed XML (" + problem + ")");
    return ReadDocument(text, document);
}

std::string ToXml(const AgentConfig& config) {
    pugi::xml_document document;
    pugi::xml_node declaration = document.append_child(pugi::node_declaration);
    declaration.append_attribute("version") = "1.0";
    declaration.append_attribute("encoding") = "UTF-8";
    document.append_child(pugi::node_comment)
        .set_value(" The SNMP agent of this host. Change it with 'system snmp set'; see docs/host/snmp.md. ");
    pugi::xml_node root = document.append_child("snmpAgent");
    AddText(root, "enable", config.enabled ? "true" : "false");
    AddText(root, "port", std::to_string(config.port));
    AddText(root, "largeStorage", config.large_storage ? "true" : "false");
    pugi::xml_node communities = root.append_child("communities");
    for (const std::string& community : config.communities) AddText(communities, "community", community);
    pugi::xml_node targets = root.append_child("trapTargets");
    for (const TrapTarget& t : config.targets)
        AddItem(targets, "target", {{"host", t.host}, {"port", std::to_string(t.port)}, {"community", t.community}});
    pugi::xml_node users = root.append_child("users");
    for (const User& u : config.users)
        AddItem(users, "user", {{"name", u.name}, {"authHash", u.auth_hash}, {"privHash", u.priv_hash}, {"model", u.model}});
    pugi::xml_node remote = root.append_child("remoteUsers");
    for (const RemoteUser& u : config.remote_users)
        AddItem(remote, "remoteUser",
                {{"name", u.name}, {"authProtocol", u.auth_protocol}, {"authHash", u.auth_hash},
                 {"privProtocol", u.priv_protocol}, {"privHash", u.priv_hash}, {"engineId", u.engine_id}});
    pugi::xml_node v3 = root.append_child("v3Targets");
    for (const V3Target& t : config.v3_targets)
        AddItem(v3, "target", {{"host", t.host}, {"port", std::to_string(t.port)}, {"user", t.user},
                               {"securityLevel", t.level}, {"type", t.type}});
    pugi::xml_node options = root.append_child("options");
    for (const auto& [name, value] : config.options) {
        pugi::xml_node option = options.append_child("option");
        option.append_attribute("name") = name.c_str();
        option.text() = value.c_str();
    }
    std::ostringstream out;
    document.save(out, "  ", pugi::format_indent, pugi::encoding_utf8);
    return out.str();
}

void WriteConfig(const std::string& root, const AgentConfig& config) {
    simhost::RootFs fs(root);
    int error = fs.Error();
    if (!error) error = fs.MakeDirectories("/etc/tarsel", 0755);
    if (!error) error = fs.WriteFileAtomic(kConfigPath, ToXml(config), 0644);
    if (error) throw HostError(kWhere + " cannot be written: " + std::strerror(error));
}

}  // namespace snmp
}  // namespace norlithctl

// The host name and welcome message commands against a throw-away simulated host: results, the
// order of host calls, the option conflicts, the step-by-step handling of the host name set
// (an error beside the result true), and what the host layer refuses.
#include "Harness.h"

#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <string>
#include <vector>

namespace {

using plugintest::Outcome;
using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;

const std::string kDns = "NorlithCtl::Network::DnsConfigImpl::";
const std::string kDnsNew = kDns + "DnsConfigImpl";
const std::string kSystemInfoNew = "NorlithCtl::System::SystemInfoImpl::SystemInfoImpl";
const std::string kGetWelcome = "NorlithCtl::System::SystemInfoImpl::GetWelcomeMessage";
const std::string kSetWelcome = "NorlithCtl::System::SystemInfoImpl::SetWelcomeMessage";

void HostAndDomain(Kitbase::CallSpec::Input& input) {
    input.SetString("host", "esx-lab-3");
    input.SetString("domain", "corp.example.org");
}

// Every step of the host name set reports its own failure and the next step still runs, so a
// failure leaves the error beside the result true; only building the object escapes.
REGISTER_FAULT_CASE(plugintest::FaultCase("HostnameGet", "system hostname get")
                        .On(kDnsNew, Outcome::Escapes()));
REGISTER_FAULT_CASE(plugintest::FaultCase("HostnameSet", "system hostname set")
                        .Input(HostAndDomain)
                        .On(kDnsNew, Outcome::Escapes())
                        .On(kDns + "SetHostname", Outcome::Reported({"{message}"}, true))
                        .On(kDns + "SetDomain", Outcome::Reported({"{message}"}, true))
                        .On(kDns + "SaveConfig", Outcome::Reported({"{message}"}, true)));
REGISTER_FAULT_CASE(plugintest::FaultCase("HostnameSetFqdn", "system hostname set")
                        .Input([](Kitbase::CallSpec::Input& in) { in.SetString("fqdn", "a.b.c"); })
                        .On(kDnsNew, Outcome::Escapes())
                        .On(kDns + "SetFqdn", Outcome::Reported({"{message}"}, true))
                        .On(kDns + "SaveConfig", Outcome::Reported({"{message}"}, true)));
REGISTER_FAULT_CASE(plugintest::FaultCase("WelcomeMessageGet", "system welcomemsg get")
                        .On(kSystemInfoNew, Outcome::Escapes()));
REGISTER_FAULT_CASE(plugintest::FaultCase("WelcomeMessageSet", "system welcomemsg set")
                        .Input([](Kitbase::CallSpec::Input& in) { in.SetString("message", "Hi\n"); })
                        .On(kSystemInfoNew, Outcome::Escapes()));

class NamesTest : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    plugintest::Run Run(const std::string& path,
                        std::vector<std::pair<std::string, std::string>> strings = {}) {
        plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
        for (const auto& [name, value] : strings) input->SetString(name, value);
        simhost::trace::Take();
        plugintest::Run run = plugintest::Execute(plugintest::FindCommand(path), input);
        EXPECT_FALSE(run.escaped) << run.exception;
        EXPECT_EQ(run.leaked, 0);
        return run;
    }
    // Host name, domain and FQDN as the get command shows them.
    std::vector<std::string> Names() {
        plugintest::Run run = Run("system hostname get");
        std::vector<std::string> names;
        auto result = boost::dynamic_pointer_cast<MetaStruct>(run.output->GetResult());
        if (!result) return names;
        EXPECT_EQ(result->GetName(), "FullyQualifiedHostName");
        for (const MetaStruct::Field& field : result->GetFields())
            names.push_back(field.first + "=" +
                            boost::dynamic_pointer_cast<MetaString>(field.second)->GetValue());
        return names;
    }
    static bool IsTrue(const plugintest::Run& run) {
        auto result = boost::dynamic_pointer_cast<MetaBool>(run.output->GetResult());
        return result && result->GetValue() && run.output->IsComplete();
    }
    std::size_t JournalSize() { return host_.host().Journal().size(); }

    simhost::TempHost host_;
};

TEST_F(NamesTest, GetShowsTheDefaultNamesInTemplateOrderAskingInThatOrder) {
    EXPECT_EQ(Names(), (std::vector<std::string>{"Host Name=qhost-07",
                                                 "Domain Name=lab.corvane.net",
                                                 "Fully Qualified Domain Name=qhost-07.lab.corvane.net"}));
    Run("system hostname get");
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kDnsNew, kDns + "GetHostname", kDns + "GetDomain",
                                        kDns + "GetFqdn"}));
}

TEST_F(NamesTest, AHostWithoutDomainHasItsHostNameAsFqdn) {
    host_.host().Init(R"({"format": 1, "dns": {"host_name": "solo", "domain": ""}})", true);
    EXPECT_EQ(Names(), (std::vector<std::string>{"Host Name=solo", "Domain Name=",
                                                 "Fully Qualified Domain Name=solo"}));
}

TEST_F(NamesTest, OptionConflictsAreRefusedBeforeAnyChange) {
    plugintest::Run none = Run("system hostname set");
    EXPECT_EQ(none.output->GetErrors(),
              (std::vector<std::string>{"You must specify at least one of: --host, --domain, --fqdn"}));
    EXPECT_FALSE(none.output->GetResult());
    // No parameter at all is reported before a conflict could be.
    for (const char* other : {"host", "domain"}) {
        plugintest::Run both = Run("system hostname set", {{"fqdn", "a.b.c"}, {other, "x"}});
        EXPECT_EQ(both.output->GetErrors(),
                  (std::vector<std::string>{"You may not specify --host or --domain with --fqdn"}));
        EXPECT_FALSE(both.output->GetResult());
        EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kDnsNew}));
    }
    EXPECT_EQ(JournalSize(), 0u);
}

TEST_F(NamesTest, HostThenDomainAreStagedAndSavedOnce) {
    plugintest::Run run = Run("system hostname set", {{"domain", "corp.example.org"}, {"host", "esx-lab-3"}});
    EXPECT_TRUE(run.output->GetErrors().empty());
    EXPECT_TRUE(IsTrue(run));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kDnsNew, kDns + "SetHostname", kDns + "SetDomain",
                                        kDns + "SaveConfig"}));
    auto journal = host_.host().Journal();
    ASSERT_EQ(journal.size(), 1u);
    EXPECT_EQ(journal[0].operation, kDns + "SaveConfig");
    EXPECT_EQ(journal[0].arguments, R"({"host_name":"esx-lab-3","domain":"corp.example.org"})");
    EXPECT_EQ(Names(), (std::vector<std::string>{"Host Name=esx-lab-3",
                                                 "Domain Name=corp.example.org",
                                                 "Fully Qualified Domain Name=esx-lab-3.corp.example.org"}));
}

TEST_F(NamesTest, FqdnSetsTheHostNameAndTheDomain) {
    plugintest::Run run = Run("system hostname set", {{"fqdn", "build-02.dc1.example.net"}});
    EXPECT_TRUE(IsTrue(run));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kDnsNew, kDns + "SetFqdn", kDns + "SaveConfig"}));
    EXPECT_EQ(Names(), (std::vector<std::string>{"Host Name=build-02", "Domain Name=dc1.example.net",
                                                 "Fully Qualified Domain Name=build-02.dc1.example.net"}));
}

TEST_F(NamesTest, AFailedHostNameStillLetsTheDomainBeSavedAndReportsBoth) {
    host_.host().AddFault(kDns + "SetHostname", "host name is locked", 1);
    plugintest::Run run = Run("system hostname set", {{"host", "esx-lab-3"}, {"domain", "corp.example.org"}});
    EXPECT_EQ(run.output->GetErrors(), (std::vector<std::string>{"host name is locked"}));
    EXPECT_TRUE(IsTrue(run));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kDnsNew, kDns + "SetHostname", kDns + "SetDomain",
                                        kDns + "SaveConfig"}));
    EXPECT_EQ(Names()[0], "Host Name=qhost-07");
    EXPECT_EQ(Names()[1], "Domain Name=corp.example.org");
}

TEST_F(NamesTest, SeveralFailuresAreReportedInStepOrder) {
    host_.host().AddFault(kDns + "SetDomain", "domain refused", 1);
    host_.host().AddFault(kDns + "SaveConfig", "save failed", 1);
    plugintest::Run run = Run("system hostname set", {{"host", "bad_name"}, {"domain", "x.org"}});
    ASSERT_EQ(run.output->GetErrors().size(), 3u);
    EXPECT_EQ(run.output->GetErrors()[0].rfind("Invalid host name 'bad_name': it contains '_'", 0), 0u)
        << run.output->GetErrors()[0];
    EXPECT_EQ(run.output->GetErrors()[1], "domain refused");
    EXPECT_EQ(run.output->GetErrors()[2], "save failed");
    EXPECT_TRUE(IsTrue(run));
    EXPECT_EQ(Names()[0], "Host Name=qhost-07");
}

TEST_F(NamesTest, BadNamesAreRefusedByTheHostLayerAndChangeNothing) {
    struct Case {
        const char* option;
        std::string value;
        std::string message_start;
    };
    const std::vector<Case> cases = {
        {"host", "", "Invalid host name '': it is empty; a host name is 1 to 63 letters"},
        {"host", "web01.lab", "Invalid host name 'web01.lab': it contains a dot"},
        {"host", std::string(64, 'a'), "Invalid host name '" + std::string(64, 'a') + "': it is 64 characters long"},
        {"host", "-edge", "Invalid host name '-edge': it starts with '-'"},
        {"domain", "", "Invalid domain name '': it is empty"},
        {"domain", "lab..net", "Invalid domain name 'lab..net': it has an empty label"},
        {"fqdn", "single", "Invalid fully qualified domain name 'single': it has no domain part"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.option) + "=" + c.value);
        plugintest::Run run = Run("system hostname set", {{c.option, c.value}});
        ASSERT_EQ(run.output->GetErrors().size(), 1u);
        EXPECT_EQ(run.output->GetErrors()[0].rfind(c.message_start, 0), 0u) << run.output->GetErrors()[0];
        EXPECT_TRUE(IsTrue(run));  // the save step still ran, with nothing staged
    }
    EXPECT_EQ(JournalSize(), 0u);
    EXPECT_EQ(Names()[2], "Fully Qualified Domain Name=qhost-07.lab.corvane.net");
}

TEST_F(NamesTest, WelcomeMessageRoundTripsByteForByte) {
    const std::string banner = "  Lab host B4\r\n\tAsk before rebooting  \n\n\xc3\xa9t\xc3\xa9 2025 ";
    plugintest::Run set = Run("system welcomemsg set", {{"message", banner}});
    EXPECT_TRUE(IsTrue(set));
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kSystemInfoNew, kSetWelcome}));
    plugintest::Run get = Run("system welcomemsg get");
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kSystemInfoNew, kGetWelcome}));
    auto text = boost::dynamic_pointer_cast<MetaString>(get.output->GetResult());
    ASSERT_TRUE(text);
    EXPECT_EQ(text->GetValue(), banner);
    EXPECT_TRUE(get.output->IsComplete());
}

TEST_F(NamesTest, AnEmptyStoredMessageIsAnEmptyText) {
    host_.host().Init(R"({"format": 1, "console": {"welcome_message": ""}})", true);
    auto text = boost::dynamic_pointer_cast<MetaString>(Run("system welcomemsg get").output->GetResult());
    ASSERT_TRUE(text);
    EXPECT_TRUE(text->HasValue());
    EXPECT_EQ(text->GetValue(), "");
}

TEST_F(NamesTest, BadWelcomeMessagesAreRefusedAndTheOldOneKept) {
    const std::vector<std::pair<std::string, std::string>> cases = {
        {"", "The welcome message is empty; a welcome message is UTF-8 text of 1 to 4096 bytes"},
        {std::string(4097, 'x'), "The welcome message is 4097 bytes long; "},
        {"caf\xe9", "The welcome message is not valid UTF-8 (byte 4 is not part of a UTF-8 character)"},
        {"bell\x07", "The welcome message contains the control character \\x07 at byte 5"},
    };
    for (const auto& [message, start] : cases) {
        plugintest::Run run = Run("system welcomemsg set", {{"message", message}});
        ASSERT_EQ(run.output->GetErrors().size(), 1u);
        EXPECT_EQ(run.output->GetErrors()[0].rfind(start, 0), 0u) << run.output->GetErrors()[0];
        EXPECT_FALSE(run.output->GetResult());
    }
    EXPECT_EQ(JournalSize(), 0u);
    // The limit itself is accepted.
    EXPECT_TRUE(IsTrue(Run("system welcomemsg set", {{"message", std::string(4096, 'y')}})));
}

TEST(NamesSpecs, ParametersAndResultShapes) {
    auto set = plugintest::FindCommand("system hostname set");
    const auto parameters = set->GetInputSpec()->GetParameters();
    ASSERT_EQ(parameters.size(), 3u);
    const char* names[] = {"host", "domain", "fqdn"};
    const char* shorts[] = {"H", "d", "f"};
    for (int i = 0; i < 3; ++i) {
        EXPECT_EQ(parameters[i]->GetName(), names[i]);
        EXPECT_EQ(parameters[i]->GetShortName(), shorts[i]);
        EXPECT_FALSE(parameters[i]->IsRequired());
        EXPECT_TRUE(parameters[i]->GetConstraints().empty());
    }
    auto message = plugintest::FindCommand("system welcomemsg set")->GetInputSpec()->GetParameters();
    ASSERT_EQ(message.size(), 1u);
    EXPECT_TRUE(message[0]->IsRequired());
    EXPECT_EQ(message[0]->GetShortName(), "m");
    for (const char* path : {"system hostname set", "system welcomemsg set"})
        EXPECT_TRUE(boost::dynamic_pointer_cast<MetaBool>(
            plugintest::FindCommand(path)->GetOutputSpec()->GetResultTemplate()));
}

}  // namespace

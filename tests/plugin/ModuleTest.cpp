// The module commands against throw-away hosts: module get and the namespaces GetModuleInfo
// shows, list with its filters, load (disabled modules, --force, unknown and empty names),
// set and the next boot, the parameters list and set (stored strings, refusals, aliases), with
// the call order of each and the host unchanged after every refusal.
#include "Harness.h"
#include "module/GetModuleInfo.h"
#include "module/ModuleGet.h"

#include <norlithctl/Env.h>
#include <norlithctl/ModuleImpl.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <csignal>
#include <functional>
#include <string>
#include <vector>

namespace {

using namespace TarselCli::System;
using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaList;
using Kitbase::MetaObj::MetaString;
using Kitbase::MetaObj::MetaStruct;
using nlohmann::json;

const std::string kModuleNew = "NorlithCtl::System::ModuleImpl::ModuleImpl";
const std::string kIsValid = "NorlithCtl::System::ModuleImpl::IsValidName";
const std::string kInfoNew = "NorlithCtl::System::SystemInfoImpl::SystemInfoImpl";

const json kHost = {
    {"format", 1},
    {"modules",
     {{{"name", "nic_a"}, {"file", "/usr/lib/norlith/modules/nic_a.nmod"}, {"license", "Kavrin"},
       {"version", "3.1.0"}, {"file_version", "3.1.0-1.4"}, {"signed_status", "Signed by partner key"},
       {"signature_issuer", "Partner CA"}, {"signature_digest", "ab12"}, {"signature_fingerprint", "AB:12"},
       {"provides", {{"name", "nic_api"}, {"versions", {"2.0", "1.0"}}}},
       {"requires", {{{"name", "net_api"}, {"versions", {"5.0", "4.6"}}}, {{"name", "pci_api"}, {"versions", json::array()}}}},
       {"parameters", {{{"name", "rss"}, {"type", "uint"}, {"description", "Receive queues."}},
                       {{"name", "lro"}, {"type", "bool"}, {"description", "Coalesce segments."}},
                       {{"name", "itr"}, {"type", "uint array"}, {"description", "Throttle."}}}},
       {"options", "rss=4 stale=1"}, {"loaded_options", "rss=4"}, {"loaded", true}, {"enabled", true}},
      {{"name", "stor_b"}, {"provides", {{"name", "stor_api"}, {"versions", json::array()}}},
       {"loaded", false}, {"enabled", true}},
      {{"name", "old_c"}, {"loaded", false}, {"enabled", false}},
      {{"name", "dbg_d"}, {"loaded", true}, {"enabled", false}}}}};

REGISTER_FAULT_CASE(plugintest::FaultCase("ModuleGet", "system module get").Input([](CallSpec::Input& in) {
    in.SetString("module", "stor_nvme_pci");
}));
REGISTER_FAULT_CASE(plugintest::FaultCase("ModuleList", "system module list").Input([](CallSpec::Input& in) {
    in.SetBool("loaded", true);
}));
REGISTER_FAULT_CASE(plugintest::FaultCase("ModuleLoad", "system module load").Input([](CallSpec::Input& in) {
    in.SetString("module", "vmm_replica");
}));
REGISTER_FAULT_CASE(plugintest::FaultCase("ModuleSet", "system module set").Input([](CallSpec::Input& in) {
    in.SetString("module", "fs_iso");
    in.SetBool("enabled", false);
}));
REGISTER_FAULT_CASE(plugintest::FaultCase("ModuleParametersList", "system module parameters list")
                        .Input([](CallSpec::Input& in) { in.SetString("module", "stor_nvme_pci"); }));
REGISTER_FAULT_CASE(plugintest::FaultCase("ModuleParametersSet", "system module parameters set")
                        .Input([](CallSpec::Input& in) {
                            in.SetString("module", "stor_nvme_pci");
                            in.SetString("parameter-string", "ioQueues=8 pollMode=y");
                        }));

class ModuleCommands : public ::testing::Test {
protected:
    void SetUp() override { simhost::trace::Enable(); }
    void TearDown() override { simhost::trace::Disable(); }

    plugintest::Run Run(const std::string& path, std::function<void(CallSpec::Input&)> fill = {}) {
        InputPtr input = CallSpec::Input::New();
        if (fill) fill(*input);
        simhost::trace::Take();
        plugintest::Run run = plugintest::Execute(plugintest::FindCommand(path), input);
        EXPECT_FALSE(run.escaped) << run.exception;
        EXPECT_EQ(run.leaked, 0);
        return run;
    }
    // The single error of a refused run; it sets no result.
    std::string Refusal(const plugintest::Run& run) {
        EXPECT_FALSE(run.output->GetResult());
        EXPECT_FALSE(run.output->IsComplete());
        return run.output->GetErrors().size() == 1 ? run.output->GetErrors().front() : "(errors: " +
               std::to_string(run.output->GetErrors().size()) + ")";
    }
    void ExpectTrue(const plugintest::Run& run) {
        ASSERT_TRUE(run.output->GetErrors().empty()) << run.output->GetErrors().front();
        auto result = boost::dynamic_pointer_cast<MetaBool>(run.output->GetResult());
        ASSERT_TRUE(result);
        EXPECT_TRUE(result->GetValue());
        EXPECT_TRUE(run.output->IsComplete());
    }
    // Rows of a list result as "name loaded enabled" (1/0).
    std::vector<std::string> Listed(std::function<void(CallSpec::Input&)> fill = {}) {
        plugintest::Run run = Run("system module list", fill);
        std::vector<std::string> rows;
        auto list = boost::dynamic_pointer_cast<MetaList>(run.output->GetResult());
        if (!list) return rows;
        for (const auto& element : list->GetElements()) {
            auto row = boost::dynamic_pointer_cast<MetaStruct>(element);
            EXPECT_EQ(row->GetName(), "Module");
            rows.push_back(boost::dynamic_pointer_cast<MetaString>(row->GetField("Name"))->GetValue() + " " +
                           (boost::dynamic_pointer_cast<MetaBool>(row->GetField("Is Loaded"))->GetValue() ? "1" : "0") +
                           (boost::dynamic_pointer_cast<MetaBool>(row->GetField("Is Enabled"))->GetValue() ? "1" : "0"));
        }
        return rows;
    }
    json Module(const std::string& name) {
        const json exported = json::parse(host_.host().Export());
        for (const json& m : exported["modules"])
            if (m["name"] == name) return m;
        return json();
    }
    std::string Text(const boost::shared_ptr<MetaStruct>& row, const std::string& field) {
        auto value = boost::dynamic_pointer_cast<MetaString>(row->GetField(field));
        return value ? value->GetValue() : "(not a string)";
    }

    simhost::TempHost host_{kHost.dump()};
};

TEST_F(ModuleCommands, GetShowsTheModuleAndOnlyTheFirstProvidedVersion) {
    plugintest::Run run = Run("system module get", [](CallSpec::Input& in) { in.SetString("module", "nic_a"); });
    auto details = boost::dynamic_pointer_cast<MetaStruct>(run.output->GetResult());
    ASSERT_TRUE(details);
    EXPECT_EQ(details->GetName(), "ModuleDetails");
    std::vector<std::string> names;
    for (const auto& field : details->GetFields()) names.push_back(field.first);
    EXPECT_EQ(names, (std::vector<std::string>{"Module", "Module File", "License", "Version", "File Version",
                                               "Provided Namespaces", "Required Namespaces", "Signed Status",
                                               "Signature Issuer", "Signature Digest", "Signature FingerPrint"}));
    EXPECT_EQ(Text(details, "Module"), "nic_a");
    EXPECT_EQ(Text(details, "Module File"), "/usr/lib/norlith/modules/nic_a.nmod");
    EXPECT_EQ(Text(details, "License"), "Kavrin");
    EXPECT_EQ(Text(details, "File Version"), "3.1.0-1.4");
    EXPECT_EQ(Text(details, "Signature FingerPrint"), "AB:12");
    EXPECT_EQ(Text(details, "Provided Namespaces"), "nic_api@2.0");
    std::vector<std::string> required;
    for (const auto& value :
         boost::dynamic_pointer_cast<MetaList>(details->GetField("Required Namespaces"))->GetElements())
        required.push_back(boost::dynamic_pointer_cast<MetaString>(value)->GetValue());
    // The namespace without versions adds nothing.
    EXPECT_EQ(required, (std::vector<std::string>{"net_api@5.0", "net_api@4.6"}));
    EXPECT_EQ(simhost::trace::TakeOperations(), (std::vector<std::string>{kModuleNew, kIsValid}));
}

TEST_F(ModuleCommands, GetOfAModuleWithoutProvidedVersionsAndOfUnknownNames) {
    NorlithCtl::System::ModuleImpl stor("stor_b");
    StructPtr details = GetModuleInfo(stor, ModuleGet::New()->GetOutputStructure());
    EXPECT_EQ(Text(details, "Provided Namespaces"), "");
    EXPECT_TRUE(boost::dynamic_pointer_cast<MetaList>(details->GetField("Required Namespaces"))->GetElements().empty());

    for (const std::string name : {"nic_b", "", "a/b", "nic\x01"}) {
        plugintest::Run run = Run("system module get", [&](CallSpec::Input& in) { in.SetString("module", name); });
        EXPECT_EQ(Refusal(run), "unknown module '" + name + "'");
    }
}

TEST_F(ModuleCommands, ListFiltersOnEitherStateOrBoth) {
    EXPECT_EQ(Listed(), (std::vector<std::string>{"nic_a 11", "stor_b 01", "old_c 00", "dbg_d 10"}));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kInfoNew, "NorlithCtl::System::SystemInfoImpl::GetModules"}));
    EXPECT_EQ(Listed([](CallSpec::Input& in) { in.SetBool("loaded", false); }),
              (std::vector<std::string>{"stor_b 01", "old_c 00"}));
    EXPECT_EQ(Listed([](CallSpec::Input& in) {
                  in.SetBool("loaded", true);
                  in.SetBool("enabled", false);
              }),
              (std::vector<std::string>{"dbg_d 10"}));
    EXPECT_EQ(Listed([](CallSpec::Input& in) { in.SetBool("enabled", true); }),
              (std::vector<std::string>{"nic_a 11", "stor_b 01"}));
}

TEST_F(ModuleCommands, LoadRefusesDisabledModulesUnlessForced) {
    const std::string before = host_.host().Export();
    plugintest::Run run = Run("system module load", [](CallSpec::Input& in) { in.SetString("module", "old_c"); });
    EXPECT_EQ(Refusal(run), "module 'old_c' is disabled, use --force to load.");
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kModuleNew, kIsValid, "NorlithCtl::System::ModuleImpl::GetEnabled"}));
    run = Run("system module load", [](CallSpec::Input& in) { in.SetString("module", "nic_b"); });
    EXPECT_EQ(Refusal(run), "unknown module 'nic_b'");
    run = Run("system module load", [](CallSpec::Input& in) { in.SetString("module", ""); });
    EXPECT_EQ(Refusal(run), "Module name cannot be empty.");
    EXPECT_EQ(host_.host().Export(), before);

    ExpectTrue(Run("system module load", [](CallSpec::Input& in) {
        in.SetString("module", "old_c");
        in.SetFlag("force");
    }));
    EXPECT_EQ(Module("old_c")["loaded"], true);
    EXPECT_EQ(Module("old_c")["enabled"], false);
    ExpectTrue(Run("system module load", [](CallSpec::Input& in) { in.SetString("module", "stor_b"); }));
    EXPECT_EQ(host_.host().Journal().back().operation, "NorlithCtl::System::ModuleImpl::Load");
    EXPECT_EQ(json::parse(host_.host().Journal().back().arguments),
              json::parse(R"({"name": "stor_b", "options": "", "force": false})"));
    // Loading twice is the host's refusal.
    run = Run("system module load", [](CallSpec::Input& in) { in.SetString("module", "stor_b"); });
    EXPECT_EQ(Refusal(run), "Module 'stor_b' is already loaded; options stored now apply at its next load");
}

TEST_F(ModuleCommands, ForcedLoadOfAnUnknownNameReachesTheHost) {
    plugintest::Run run = Run("system module load", [](CallSpec::Input& in) {
        in.SetString("module", "nic_b");
        in.SetFlag("force");
    });
    EXPECT_EQ(Refusal(run), "Module 'nic_b' is not known to the host (did you mean 'nic_a'?); 'system "
                            "module list' shows the host's modules");
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kModuleNew, kIsValid, "NorlithCtl::System::ModuleImpl::GetEnabled",
                                        "NorlithCtl::System::ModuleImpl::Load"}));
}

TEST_F(ModuleCommands, SetChangesTheNextBootOnly) {
    ExpectTrue(Run("system module set", [](CallSpec::Input& in) {
        in.SetString("module", "nic_a");
        in.SetBool("enabled", false);
    }));
    ExpectTrue(Run("system module set", [](CallSpec::Input& in) {
        in.SetString("module", "old_c");
        in.SetBool("enabled", true);
    }));
    EXPECT_EQ(Listed(), (std::vector<std::string>{"nic_a 10", "stor_b 01", "old_c 01", "dbg_d 10"}));
    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    // After the reboot the enabled modules are the loaded ones.
    EXPECT_EQ(Listed(), (std::vector<std::string>{"nic_a 00", "stor_b 11", "old_c 11", "dbg_d 00"}));
}

TEST_F(ModuleCommands, SetChecksNamesAndForceSkipsOnlyTheKnownNameCheck) {
    const std::string before = host_.host().Export();
    plugintest::Run run = Run("system module set", [](CallSpec::Input& in) {
        in.SetString("module", "");
        in.SetBool("enabled", true);
        in.SetFlag("force");
    });
    EXPECT_EQ(Refusal(run), "Module name cannot be empty.");
    EXPECT_TRUE(simhost::trace::TakeOperations().empty());
    run = Run("system module set", [](CallSpec::Input& in) {
        in.SetString("module", "nic_b");
        in.SetBool("enabled", true);
    });
    EXPECT_EQ(Refusal(run), "unknown module 'nic_b'");
    run = Run("system module set", [](CallSpec::Input& in) {
        in.SetString("module", "a/b");
        in.SetBool("enabled", true);
        in.SetFlag("force");
    });
    EXPECT_EQ(Refusal(run), "Module name 'a/b' is not valid: a module name holds no '/'; give the name, "
                            "not the module's file path");
    EXPECT_EQ(host_.host().Export(), before);
}

TEST_F(ModuleCommands, ParametersListShowsDeclaredParametersWithStoredValues) {
    plugintest::Run run = Run("system module parameters list", [](CallSpec::Input& in) { in.SetString("module", "nic_a"); });
    std::vector<std::string> rows;
    auto list = boost::dynamic_pointer_cast<MetaList>(run.output->GetResult());
    ASSERT_TRUE(list);
    for (const auto& element : list->GetElements()) {
        auto row = boost::dynamic_pointer_cast<MetaStruct>(element);
        EXPECT_EQ(row->GetName(), "ModuleParameter");
        rows.push_back(Text(row, "Name") + "|" + Text(row, "Type") + "|" + Text(row, "Value") + "|" +
                       Text(row, "Description"));
    }
    // "stale" is stored but not declared: not shown.
    EXPECT_EQ(rows, (std::vector<std::string>{"rss|uint|4|Receive queues.", "lro|bool||Coalesce segments.",
                                              "itr|uint array||Throttle."}));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kModuleNew, "NorlithCtl::System::ModuleImpl::GetParameters",
                                        "NorlithCtl::System::ModuleImpl::GetOptions", kIsValid}));
    run = Run("system module parameters list", [](CallSpec::Input& in) { in.SetString("module", "nic_b"); });
    EXPECT_EQ(Refusal(run), "unknown module 'nic_b'");
}

TEST_F(ModuleCommands, ParametersSetStoresTheStringUnchanged) {
    for (const std::string text : {" lro=y  itr=1,2 ", ""}) {
        ExpectTrue(Run("system module parameters set", [&](CallSpec::Input& in) {
            in.SetString("module", "nic_a");
            in.SetString("parameter-string", text);
        }));
        EXPECT_EQ(Module("nic_a")["options"], text);
        EXPECT_EQ(json::parse(host_.host().Journal().back().arguments),
                  json({{"name", "nic_a"}, {"options", text}, {"merge", false}}));
    }
    // Stored for the next load: what runs now keeps the options it was loaded with.
    EXPECT_EQ(Module("nic_a")["loaded_options"], "rss=4");
}

TEST_F(ModuleCommands, ParametersSetRefusalsChangeNothing) {
    const std::string before = host_.host().Export();
    const std::vector<std::pair<std::string, std::string>> cases = {
        {"rss=4 lro", "Option string for module 'nic_a' refused: expected name=value pairs separated by blanks, found 'lro'"},
        {"speed=10", "Option string for module 'nic_a' refused: module 'nic_a' declares no parameter 'speed'; "
                     "'system module parameters list' shows its parameters"},
        {"lro=maybe", "Option string for module 'nic_a' refused: value 'maybe' of parameter 'lro' (bool) is not "
                      "one of 0, 1, y, n, Y, N, true, false"},
        {"rss=1 rss=2", "Option string for module 'nic_a' refused: parameter 'rss' is given twice"},
    };
    for (const auto& c : cases) {
        plugintest::Run run = Run("system module parameters set", [&](CallSpec::Input& in) {
            in.SetString("module", "nic_a");
            in.SetString("parameter-string", c.first);
        });
        EXPECT_EQ(Refusal(run), c.second);
    }
    plugintest::Run run = Run("system module parameters set", [](CallSpec::Input& in) {
        in.SetString("module", "");
        in.SetString("parameter-string", "x=1");
        in.SetFlag("force");
    });
    EXPECT_EQ(Refusal(run), "Module name cannot be empty.");
    run = Run("system module parameters set", [](CallSpec::Input& in) {
        in.SetString("module", "nic_b");
        in.SetString("parameter-string", "x=1");
    });
    EXPECT_EQ(Refusal(run), "unknown module 'nic_b'");
    EXPECT_EQ(host_.host().Export(), before);
}

TEST_F(ModuleCommands, ForcedParametersForAnUnknownNameAreStoredUnchecked) {
    ExpectTrue(Run("system module parameters set", [](CallSpec::Input& in) {
        in.SetString("module", "nic_alias");
        in.SetString("parameter-string", "whatever here=1");
        in.SetFlag("force");
    }));
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kModuleNew, kIsValid, "NorlithCtl::System::ModuleImpl::SetOptionString"}));
    EXPECT_EQ(json::parse(host_.host().Export())["module_aliases"],
              json::parse(R"([{"name": "nic_alias", "options": "whatever here=1"}])"));
}

}  // namespace

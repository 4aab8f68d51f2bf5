// The host-control and event libraries through their public headers: results, faults, the
// journal and the call trace.
#include "TestSupport.h"

#include <norlithctl/QuillUserLib.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/Records.h>
#include <norlithctl/Sysinfo.h>
#include <norlithctl/SystemInfoImpl.h>

#include <simhost/Call.h>
#include <simhost/Host.h>

#include <gtest/gtest.h>

namespace {

using NorlithCtl::System::SystemInfoImpl;
using NorlithCtl::Util::Sysinfo;
using Ravel::Lib::RavelException;

const std::string kInfo = "NorlithCtl::System::SystemInfoImpl::";
const std::string kSysinfo = "NorlithCtl::Util::Sysinfo::";
const int kVersionNode = NorlithCtl::Util::Records::ProductVersion::kNode;

// The message of the RavelException body throws, or "" when it returns.
template <class Body>
std::string Failure(Body&& body) {
    try {
        body();
    } catch (const RavelException& error) {
        return error.GetMessage(0);
    }
    return "";
}

class ApiTest : public ::testing::Test {
protected:
    void TearDown() override {
        simhost::trace::Disable();
        simhost::trace::Take();
    }
    simhost::TempHost host_;
};

TEST_F(ApiTest, SystemInfoReturnsTheStoredIdentity) {
    SystemInfoImpl info;
    EXPECT_EQ(info.GetSystemUuid(), "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c");
    EXPECT_EQ(info.GetBootNicMacAddress(), "00:50:56:a1:2b:3c");
    EXPECT_EQ(info.GetBootFsUUID(), "6523a1f4-5e2d9b70-7c41-0050569a2b3c");
    EXPECT_EQ(info.GetStatelessBootNicMacAddress(), "");

    host_.host().Init(testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json")), true);
    EXPECT_EQ(info.GetSystemUuid(), "4c4c4544-0042-3510-8057-b7c04f4e3232");
    EXPECT_EQ(info.GetBootNicMacAddress(), "");
    EXPECT_EQ(info.GetBootFsUUID(), "");
}

TEST_F(ApiTest, FaultsFireOnceNTimesOrAlways) {
    SystemInfoImpl info;
    host_.host().AddFault(kInfo + "GetSystemUuid", "once", 1);
    host_.host().AddFault(kInfo + "GetBootFsUUID", "twice", 2);
    host_.host().AddFault(kInfo + "GetBootNicMacAddress", "always");

    EXPECT_EQ(Failure([&] { info.GetSystemUuid(); }), "once");
    EXPECT_EQ(Failure([&] { info.GetSystemUuid(); }), "");
    EXPECT_EQ(Failure([&] { info.GetBootFsUUID(); }), "twice");
    EXPECT_EQ(Failure([&] { info.GetBootFsUUID(); }), "twice");
    EXPECT_EQ(Failure([&] { info.GetBootFsUUID(); }), "");
    for (int i = 0; i < 3; ++i)
        EXPECT_EQ(Failure([&] { info.GetBootNicMacAddress(); }), "always");
    EXPECT_EQ(Failure([&] { info.GetStatelessBootNicMacAddress(); }), "");

    auto faults = host_.host().Faults();
    ASSERT_EQ(faults.size(), 1u);
    EXPECT_EQ(faults[0].operation, kInfo + "GetBootNicMacAddress");
    EXPECT_FALSE(faults[0].remaining.has_value());
    host_.host().ClearFaults();
    EXPECT_EQ(Failure([&] { info.GetBootNicMacAddress(); }), "");
}

TEST_F(ApiTest, ConstructorsFault) {
    host_.host().AddFault(kInfo + "SystemInfoImpl", "no system info", 1);
    host_.host().AddFault(kSysinfo + "Sysinfo", "no kernel info", 1);
    EXPECT_EQ(Failure([] { SystemInfoImpl info; }), "no system info");
    EXPECT_EQ(Failure([] { Sysinfo node(kVersionNode); }), "no kernel info");
    EXPECT_EQ(Failure([] { SystemInfoImpl info; }), "");
    EXPECT_EQ(Failure([] { Sysinfo node(kVersionNode); }), "");
}

TEST_F(ApiTest, AddingAFaultRefusesWhatCannotBeRaised) {
    try {
        host_.host().AddFault("SystemInfoImpl::GetSystemUUID", "x");
        FAIL() << "accepted an unknown operation";
    } catch (const simhost::HostError& error) {
        std::string message = error.what();
        EXPECT_NE(message.find("unknown operation 'SystemInfoImpl::GetSystemUUID'"),
                  std::string::npos);
        EXPECT_NE(message.find(kInfo + "GetSystemUuid"), std::string::npos) << message;
    }
    EXPECT_THROW(host_.host().AddFault(kInfo + "GetSystemUuid", "x", 0), simhost::HostError);
    EXPECT_THROW(host_.host().AddFault(kInfo + "GetSystemUuid", "x", simhost::kMaxFaultTimes + 1),
                 simhost::HostError);
    EXPECT_THROW(host_.host().AddFault(kInfo + "GetSystemUuid", "bad \xff utf-8"),
                 simhost::HostError);
    EXPECT_TRUE(host_.host().Faults().empty());
    // A second fault on an operation replaces the first.
    host_.host().AddFault(kInfo + "GetSystemUuid", "first", 5);
    host_.host().AddFault(kInfo + "GetSystemUuid", "second");
    ASSERT_EQ(host_.host().Faults().size(), 1u);
    EXPECT_EQ(host_.host().Faults()[0].message, "second");
}

TEST_F(ApiTest, RavelExceptionFormsItsMessage) {
    RavelException plain("Unable to open");
    EXPECT_EQ(plain.GetMessage(0), "Unable to open");
    EXPECT_EQ(plain.GetMessage(1), "Unable to open");
    EXPECT_STREQ(plain.what(), "Unable to open");
    // Form 1 is the text of the event record: the catalog's text with the arguments filled in.
    RavelException detailed("Unable to open", Ravel::Lib::QuillMessage("quill.host.operation.failed",
                                                                       {"open /etc/x", "busy"}));
    EXPECT_EQ(detailed.GetMessage(0), "Unable to open");
    EXPECT_EQ(detailed.GetMessage(1), "The operation open /etc/x failed: busy");
    RavelException unknown("Unable to open", Ravel::Lib::QuillMessage("quill.io.open", {"/etc/x"}));
    EXPECT_EQ(unknown.GetMessage(1), "quill.io.open(/etc/x)");
    // A fault with an event hands it on.
    host_.host().AddFault(kInfo + "GetSystemUuid", "plain text", 1,
                          simhost::Event{"quill.host.unavailable", {"maintenance"}});
    try {
        SystemInfoImpl().GetSystemUuid();
        FAIL();
    } catch (const RavelException& error) {
        EXPECT_EQ(error.GetMessage(0), "plain text");
        EXPECT_EQ(error.GetMessage(1), "The host is not available: maintenance");
    }
    // Thrown inside the library, it is caught by its type and as std::exception.
    host_.host().AddFault(kInfo + "GetBootFsUUID", "boom");
    SystemInfoImpl info;
    try {
        info.GetBootFsUUID();
        FAIL();
    } catch (const std::exception& error) {
        EXPECT_STREQ(error.what(), "boom");
        EXPECT_NE(dynamic_cast<const RavelException*>(&error), nullptr);
    }
}

TEST_F(ApiTest, JournalRecordsChangesAndFaultsButNotReads) {
    SystemInfoImpl info;
    info.GetSystemUuid();
    info.GetBootFsUUID();
    EXPECT_TRUE(host_.host().Journal().empty());

    ASSERT_EQ(QuillUserLib_Init(), 0);
    ASSERT_EQ(QuillUserLib_AddQuill("%s went %s", "vmnic0", "down"), 0);
    host_.host().AddFault(kSysinfo + "Get", "node busy", 1);
    char record[312];
    Sysinfo node(kVersionNode);
    EXPECT_EQ(Failure([&] { node.Get(record, sizeof record); }), "node busy");
    QuillUserLib_Close();

    auto journal = host_.host().Journal();
    ASSERT_EQ(journal.size(), 2u);
    EXPECT_EQ(journal[0].kind, "change");
    EXPECT_EQ(journal[0].operation, "QuillUserLib_AddQuill");
    EXPECT_EQ(journal[0].arguments, R"({"message":"vmnic0 went down"})");
    EXPECT_EQ(journal[1].kind, "fault");
    EXPECT_EQ(journal[1].operation, kSysinfo + "Get");
    EXPECT_EQ(journal[1].arguments, R"({"node":1238,"instance":[],"size":312})");
    EXPECT_LT(journal[0].sequence, journal[1].sequence);
    EXPECT_EQ(journal[0].time.size(), 24u);
    EXPECT_EQ(journal[0].time.back(), 'Z');

    host_.host().ClearJournal();
    EXPECT_TRUE(host_.host().Journal().empty());
}

TEST_F(ApiTest, SecretArgumentsNeverReachTheJournal) {
    {
        simhost::Call call(simhost::Op::SystemInfoImpl_New,
                           simhost::Args().Add("user", "root").Secret("password"));
        call.Change([](simhost::Db&) {});
    }
    auto journal = host_.host().Journal();
    ASSERT_EQ(journal.size(), 1u);
    EXPECT_EQ(journal[0].arguments, R"({"user":"root","password":"***"})");
}

TEST_F(ApiTest, TraceListsEveryCallInOrder) {
    host_.host().AddFault(kInfo + "GetBootFsUUID", "fails but is traced", 1);
    simhost::trace::Enable();
    {
        SystemInfoImpl info;
        info.GetSystemUuid();
        Failure([&] { info.GetBootFsUUID(); });
        Sysinfo node(kVersionNode);
        char record[312];
        node.Get(record, sizeof record);
    }
    EXPECT_EQ(simhost::trace::TakeOperations(),
              (std::vector<std::string>{kInfo + "SystemInfoImpl", kInfo + "GetSystemUuid",
                                        kInfo + "GetBootFsUUID", kSysinfo + "Sysinfo",
                                        kSysinfo + "Get"}));
    EXPECT_TRUE(simhost::trace::Take().empty());

    simhost::trace::Enable(true);
    QuillUserLib_AddQuill("not open");
    auto entries = simhost::trace::Take();
    ASSERT_EQ(entries.size(), 1u);
    EXPECT_EQ(entries[0].arguments, R"({"message":"not open"})");

    simhost::trace::Disable();
    SystemInfoImpl().GetSystemUuid();
    EXPECT_TRUE(simhost::trace::Take().empty());
}

TEST_F(ApiTest, EveryOperationTheLibrariesCallIsRegistered) {
    simhost::trace::Enable();
    {
        SystemInfoImpl info;
        info.GetSystemUuid();
        info.GetBootNicMacAddress();
        info.GetBootFsUUID();
        info.GetStatelessBootNicMacAddress();
        Sysinfo node(kVersionNode);
        char record[312];
        node.Get(record, sizeof record);
        std::vector<std::string> names;
        Failure([&] { node.List(names); });
        Failure([&] { node.AddInstancePath("x"); });
        node.ResetInstance();
        QuillUserLib_Init();
        QuillUserLib_AddQuill("registered");
        QuillUserLib_Close();
    }
    auto names = simhost::trace::TakeOperations();
    EXPECT_EQ(names.size(), 13u);
    for (const std::string& name : names) EXPECT_TRUE(simhost::IsKnownOperation(name)) << name;
}

TEST_F(ApiTest, EventLibraryPostsToTheObservationLog) {
    EXPECT_EQ(QuillUserLib_AddQuill("before init"), -1);
    ASSERT_EQ(QuillUserLib_Init(), 0);
    EXPECT_EQ(QuillUserLib_AddQuill("Host is %s for %d s", "rebooting", 30), 0);
    EXPECT_EQ(QuillUserLib_AddQuill("%s", ""), -1);
    EXPECT_EQ(QuillUserLib_AddQuill("%s", std::string(4097, 'x').c_str()), -1);
    EXPECT_EQ(QuillUserLib_AddQuill("%s", std::string(4096, 'y').c_str()), 0);
    EXPECT_EQ(QuillUserLib_AddQuill("bad \xc3"), -1);
    EXPECT_EQ(QuillUserLib_AddQuill(nullptr), -1);
    host_.host().AddFault("QuillUserLib_AddQuill", "log full", 1);
    EXPECT_EQ(QuillUserLib_AddQuill("refused by the fault"), -1);
    QuillUserLib_Close();
    EXPECT_EQ(QuillUserLib_AddQuill("after close"), -1);

    host_.host().AddFault("QuillUserLib_Init", "no log");
    EXPECT_EQ(QuillUserLib_Init(), -1);

    auto observations = nlohmann::json::parse(host_.host().Export())["observations"];
    ASSERT_EQ(observations.size(), 3u);
    EXPECT_EQ(observations[1]["message"], "Host is rebooting for 30 s");
    EXPECT_EQ(observations[2]["message"], std::string(4096, 'y'));
}

}  // namespace

namespace {

// docs/operations.md is generated from the registry; it must say what this build serves.
TEST(OperationList, TheDocsListEveryOperationAndEvent) {
    const std::string path = std::string(SCENARIO_DIR) + "/../docs/operations.md";
    const char* update = std::getenv("QUARN_UPDATE_GOLDEN");
    if (update && std::string(update) == "1") testsupport::WriteFile(path, simhost::OperationsMarkdown());
    EXPECT_EQ(testsupport::ReadFile(path), simhost::OperationsMarkdown())
        << "docs/operations.md is out of date; QUARN_UPDATE_GOLDEN=1 rewrites it";
    for (const simhost::OperationInfo& info : simhost::Operations())
        EXPECT_EQ(simhost::FindOperation(info.name), info.op) << info.name << " is declared twice";
}

}  // namespace

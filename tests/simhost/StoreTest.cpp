// The host store: where a host lives, first use, reopening, and refusing state it cannot use.
#include "TestSupport.h"

#include <norlithctl/QuillUserLib.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/SystemInfoImpl.h>

#include <simhost/Db.h>
#include <simhost/Host.h>
#include <simhost/Store.h>

#include <gtest/gtest.h>

#include <csignal>
#include <filesystem>
#include <functional>

#include <unistd.h>

namespace {

using testsupport::EnvOverride;
using testsupport::TempDir;

std::string UuidOf(const std::string& state) {
    EnvOverride env("QUARN_HOST_STATE", state);
    return NorlithCtl::System::SystemInfoImpl().GetSystemUuid();
}

std::string ThrownBy(const std::function<void()>& body) {
    try {
        body();
    } catch (const Ravel::Lib::RavelException& error) {
        return error.GetMessage(0);
    } catch (const simhost::HostError& error) {
        return error.what();
    }
    return "(nothing thrown)";
}

class StoreTest : public ::testing::Test {
protected:
    void TearDown() override { simhost::CloseHost(); }
};

TEST_F(StoreTest, StateDirectoryFollowsTheEnvironmentInOrder) {
    EnvOverride state("QUARN_HOST_STATE", "/srv/hosts/a");
    EnvOverride xdg("XDG_STATE_HOME", "/xdg");
    EnvOverride home("HOME", "/home/u");
    EXPECT_EQ(simhost::StateDirFromEnvironment(), "/srv/hosts/a");
    {
        EnvOverride empty("QUARN_HOST_STATE", std::string());
        EXPECT_EQ(simhost::StateDirFromEnvironment(), "/xdg/quarncli/host");
    }
    EnvOverride no_state("QUARN_HOST_STATE", std::nullopt);
    EXPECT_EQ(simhost::StateDirFromEnvironment(), "/xdg/quarncli/host");
    {
        // A relative XDG_STATE_HOME is ignored, as the base directory rules require.
        EnvOverride relative("XDG_STATE_HOME", "state");
        EXPECT_EQ(simhost::StateDirFromEnvironment(), "/home/u/.local/state/quarncli/host");
    }
    EnvOverride no_xdg("XDG_STATE_HOME", std::nullopt);
    EXPECT_EQ(simhost::StateDirFromEnvironment(), "/home/u/.local/state/quarncli/host");
    EnvOverride no_home("HOME", std::nullopt);
    EXPECT_THROW(simhost::StateDirFromEnvironment(), simhost::HostError);
    EXPECT_NE(ThrownBy([] { NorlithCtl::System::SystemInfoImpl info; }).find("Cannot locate"),
              std::string::npos);
}

TEST_F(StoreTest, FirstUseAtTheDefaultLocationCreatesTheDefaultHost) {
    TempDir home;
    EnvOverride state("QUARN_HOST_STATE", std::nullopt);
    EnvOverride xdg("XDG_STATE_HOME", std::nullopt);
    EnvOverride env("HOME", home.Path());
    std::string dir = home / ".local/state/quarncli/host";
    EXPECT_EQ(NorlithCtl::System::SystemInfoImpl().GetBootNicMacAddress(), "00:50:56:a1:2b:3c");
    EXPECT_TRUE(std::filesystem::is_regular_file(dir + "/host.db"));
    EXPECT_TRUE(std::filesystem::is_directory(dir + "/root"));
    EXPECT_FALSE(std::filesystem::exists(dir + "/host.db.new"));
    EXPECT_EQ(simhost::Host(dir).Export(), simhost::DefaultScenario());
}

TEST_F(StoreTest, NextOperationFollowsQuarnHostStateToAnotherHost) {
    TempDir dir;
    simhost::Host(dir / "a").Init();
    simhost::Host(dir / "b").Init(testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json")));
    EXPECT_EQ(UuidOf(dir / "a"), "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c");
    EXPECT_EQ(UuidOf(dir / "b"), "4c4c4544-0042-3510-8057-b7c04f4e3232");
    EXPECT_EQ(UuidOf(dir / "a"), "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c");
}

TEST_F(StoreTest, ChangesPersistAcrossConnections) {
    simhost::TempHost host;
    ASSERT_EQ(QuillUserLib_Init(), 0);
    ASSERT_EQ(QuillUserLib_AddQuill("disk %d replaced", 3), 0);
    QuillUserLib_Close();
    simhost::CloseHost();
    EXPECT_NE(host.host().Export().find("\"message\": \"disk 3 replaced\""), std::string::npos);
}

TEST_F(StoreTest, UnusableStateDirectoriesAreRefusedWithoutCreatingAnything) {
    TempDir dir;
    testsupport::WriteFile(dir / "file", "x");
    std::string under_file = dir / "file/host";
    std::string message = ThrownBy([&] { UuidOf(under_file); });
    EXPECT_EQ(message.rfind("Cannot open the simulated host at '" + under_file + "': ", 0), 0u)
        << message;
    EXPECT_EQ(testsupport::ReadFile(dir / "file"), "x");

    // The database path taken by a directory.
    std::filesystem::create_directories(dir / "taken/host.db");
    message = ThrownBy([&] { UuidOf(dir / "taken"); });
    EXPECT_EQ(message.rfind("Cannot open the simulated host at '" + dir / "taken" + "'", 0), 0u)
        << message;
}

TEST_F(StoreTest, CorruptOrForeignDatabasesAreRefusedAndLeftAlone) {
    TempDir dir;
    std::filesystem::create_directories(dir / "corrupt");
    std::string garbage(8192, '\x5a');
    testsupport::WriteFile(dir / "corrupt/host.db", garbage);
    std::string message = ThrownBy([&] { UuidOf(dir / "corrupt"); });
    EXPECT_EQ(message.rfind("Cannot open the simulated host at '" + dir / "corrupt" + "': ", 0), 0u);
    EXPECT_NE(message.find("not a database"), std::string::npos) << message;
    EXPECT_EQ(testsupport::ReadFile(dir / "corrupt/host.db"), garbage);
    EXPECT_THROW(simhost::Host(dir / "corrupt").Init(simhost::DefaultScenario(), true),
                 simhost::HostError);
    EXPECT_EQ(testsupport::ReadFile(dir / "corrupt/host.db"), garbage);

    std::filesystem::create_directories(dir / "foreign");
    {
        simhost::Db foreign(dir / "foreign/host.db", simhost::Db::Mode::Create);
        foreign.Exec("CREATE TABLE accounts(name TEXT); INSERT INTO accounts VALUES ('x');");
    }
    message = ThrownBy([&] { UuidOf(dir / "foreign"); });
    EXPECT_NE(message.find("is not a simulated host database"), std::string::npos) << message;
    EXPECT_THROW(simhost::Host(dir / "foreign").Init(simhost::DefaultScenario(), true),
                 simhost::HostError);
    simhost::Db foreign(dir / "foreign/host.db", simhost::Db::Mode::ReadOnly);
    EXPECT_EQ(foreign.QueryInt("SELECT count(*) FROM accounts"), 1);
}

TEST_F(StoreTest, OtherSchemaVersionIsRefusedUntilReplaced) {
    TempDir dir;
    simhost::Host host(dir / "h");
    host.Init();
    {
        simhost::Db db(simhost::DatabasePath(host.Dir()), simhost::Db::Mode::ReadWrite);
        db.Exec("PRAGMA user_version=7; DROP TABLE observations;");
    }
    std::string message = ThrownBy([&] { UuidOf(host.Dir()); });
    EXPECT_NE(message.find("schema version 7"), std::string::npos) << message;
    EXPECT_NE(message.find("quarnhost init --force"), std::string::npos) << message;
    host.Init(simhost::DefaultScenario(), true);
    EXPECT_EQ(host.Export(), simhost::DefaultScenario());
}

TEST_F(StoreTest, AProcessKilledInsideAWriteLeavesTheLastCommittedState) {
    simhost::TempHost host;
    std::string before = host.host().Export();
    std::string path = simhost::DatabasePath(host.Dir());
    int pid = testsupport::ForkChild(
        [](void* context) {
            simhost::Db db(*static_cast<std::string*>(context), simhost::Db::Mode::ReadWrite);
            db.Exec("BEGIN IMMEDIATE; DELETE FROM identity;"
                    "INSERT INTO observations(time, message) VALUES ('x', 'half');");
            raise(SIGKILL);
            return 0;
        },
        &path);
    EXPECT_EQ(testsupport::WaitChild(pid), 128 + SIGKILL);
    simhost::CloseHost();
    EXPECT_EQ(host.host().Export(), before);
    ASSERT_EQ(QuillUserLib_Init(), 0);
    EXPECT_EQ(QuillUserLib_AddQuill("after the crash"), 0);  // the host is writable again
    QuillUserLib_Close();
}

TEST_F(StoreTest, InitRefusesAnExistingHostUnlessReplacing) {
    TempDir dir;
    simhost::Host host(dir / "h");
    EXPECT_FALSE(host.Exists());
    host.Init(testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json")));
    EXPECT_TRUE(host.Exists());
    EXPECT_THROW(host.Init(), simhost::HostExists);
    EXPECT_EQ(UuidOf(host.Dir()), "4c4c4544-0042-3510-8057-b7c04f4e3232");
    host.AddFault("QuillUserLib_Init", "down");
    host.Init(simhost::DefaultScenario(), true);
    EXPECT_EQ(UuidOf(host.Dir()), "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c");
    EXPECT_TRUE(host.Faults().empty());
    EXPECT_TRUE(host.Journal().empty());
}

TEST_F(StoreTest, TempHostPointsTheEnvironmentAtAFreshHostAndCleansUp) {
    EnvOverride state("QUARN_HOST_STATE", "/nonexistent/elsewhere");
    std::string dir;
    {
        simhost::TempHost host(testsupport::ReadFile(simtest::ScenarioFile("stateless.json")));
        dir = host.Dir();
        EXPECT_EQ(simhost::StateDirFromEnvironment(), dir);
        EXPECT_EQ(NorlithCtl::System::SystemInfoImpl().GetStatelessBootNicMacAddress(),
                  "00:50:56:9e:10:02");
    }
    EXPECT_EQ(simhost::StateDirFromEnvironment(), "/nonexistent/elsewhere");
    EXPECT_FALSE(std::filesystem::exists(dir));
    EXPECT_THROW(simhost::TempHost("{}"), simhost::ScenarioError);
}

}  // namespace

// The host store: where a host lives, first use, reopening, and refusing state it cannot use.
#include "TestSupport.h"

#include <norlithctl/QuillUserLib.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/SystemInfoImpl.h>

#include <simhost/Db.h>
#include <simhost/Host.h>
#include <simhost/domains/Files.h>
#include <simhost/Store.h>

#include <gtest/gtest.h>

#include <csignal>
#include <filesystem>
#include <functional>
#include <stdexcept>

#include <sys/resource.h>
#include <sys/stat.h>
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

// Every file directly in dir, by name, with its bytes (directories as "<dir>").
std::map<std::string, std::string> Snapshot(const std::string& dir) {
    std::map<std::string, std::string> files;
    for (const auto& entry : std::filesystem::directory_iterator(dir))
        files[entry.path().filename().string()] =
            entry.is_regular_file() ? testsupport::ReadFile(entry.path().string()) : "<dir>";
    return files;
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
    EXPECT_TRUE(simtest::Holds(simhost::Host(dir).Export(), simhost::DefaultScenario()));
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
// A host keeps a rollback journal, so a process that only reads leaves nothing beside the file.
TEST_F(StoreTest, AHostIsReadWithoutJournalOrWalFiles) {
    TempDir dir;
    simhost::Host host(dir / "h");
    host.Init();
    std::string uuid = UuidOf(host.Dir());
    host.ClearJournal();  // a write
    EXPECT_EQ(UuidOf(host.Dir()), uuid);
    auto files = Snapshot(host.Dir());  // the process's connection still open
    for (const char* suffix : {"-journal", "-wal", "-shm"})
        EXPECT_EQ(files.count(std::string("host.db") + suffix), 0u) << suffix;
}

// A writer killed in the middle of a change, after some of it reached the file, leaves a hot
// journal: the next process, even one that only reads, sees the last committed state.
TEST_F(StoreTest, AChangeCutShortByAKilledWriterIsRolledBackByTheNextReader) {
    TempDir dir;
    simhost::Host host(dir / "h");
    host.Init();
    std::string before = host.Export();
    simhost::CloseHost();
    std::string path = simhost::DatabasePath(host.Dir());
    int pid = testsupport::ForkChild(
        [](void* context) {
            simhost::Db db(*static_cast<std::string*>(context), simhost::Db::Mode::ReadWrite);
            // A page cache of one page spills the change into the file before any commit.
            db.Exec("PRAGMA cache_size=1; BEGIN IMMEDIATE; DELETE FROM items;"
                    "CREATE TABLE scratch(x);"
                    "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 500)"
                    " INSERT INTO scratch SELECT randomblob(900) FROM n;");
            raise(SIGKILL);
            return 0;
        },
        &path);
    ASSERT_EQ(testsupport::WaitChild(pid), 128 + SIGKILL);
    struct stat info {};
    ASSERT_EQ(stat((path + "-journal").c_str(), &info), 0);
    ASSERT_GT(info.st_size, 0);

    EXPECT_FALSE(UuidOf(host.Dir()).empty());
    EXPECT_EQ(host.Export(), before);
    EXPECT_TRUE(stat((path + "-journal").c_str(), &info) != 0 || info.st_size == 0);
    simhost::Db db(path, simhost::Db::Mode::ReadOnly);
    EXPECT_EQ(db.QueryInt("SELECT count(*) FROM sqlite_schema WHERE name = 'scratch'"), 0);
}

// A host made by an earlier build is in WAL mode. A process whose tool wrote to it while it
// read (maintenance mode's kelp-cmd) closes last: it empties the WAL, so later processes do not
// read the tool's changes from it again.
TEST_F(StoreTest, AWalHostIsLeftWithAnEmptyWalByItsLastConnection) {
    TempDir dir;
    simhost::Host host(dir / "h");
    host.Init();
    const std::string path = simhost::DatabasePath(host.Dir());
    {
        simhost::Db db(path, simhost::Db::Mode::ReadWrite);
        db.Exec("PRAGMA journal_mode=WAL");
    }
    auto walBytes = [&] {
        struct stat info {};
        return stat((path + "-wal").c_str(), &info) == 0 ? info.st_size : 0;  // absent: empty
    };
    EXPECT_EQ(walBytes(), 0);
    {
        simhost::Db reader(path, simhost::Db::Mode::ReadOnly);
        reader.Exec("SELECT count(*) FROM items");
        {
            simhost::Db writer(path, simhost::Db::Mode::ReadWrite);
            writer.Exec("CREATE TABLE scratch(x); INSERT INTO scratch VALUES (1); DROP TABLE scratch;");
        }
        EXPECT_GT(walBytes(), 0) << "the writer could not empty it while another connection was open";
    }
    EXPECT_EQ(walBytes(), 0);
    EXPECT_TRUE(simtest::Holds(host.Export(), simhost::DefaultScenario()));
}

TEST_F(StoreTest, OtherSchemaVersionIsRefusedUntilReplaced) {
    TempDir dir;
    simhost::Host host(dir / "h");
    host.Init();
    {
        simhost::Db db(simhost::DatabasePath(host.Dir()), simhost::Db::Mode::ReadWrite);
        db.Exec("PRAGMA user_version=7; DROP TABLE items;");
    }
    std::string message = ThrownBy([&] { UuidOf(host.Dir()); });
    EXPECT_NE(message.find("schema version 7"), std::string::npos) << message;
    EXPECT_NE(message.find("quarnhost init --force"), std::string::npos) << message;
    host.Init(simhost::DefaultScenario(), true);
    EXPECT_TRUE(simtest::Holds(host.Export(), simhost::DefaultScenario()));
}

TEST_F(StoreTest, AProcessKilledInsideAWriteLeavesTheLastCommittedState) {
    simhost::TempHost host;
    std::string before = host.host().Export();
    std::string path = simhost::DatabasePath(host.Dir());
    int pid = testsupport::ForkChild(
        [](void* context) {
            simhost::Db db(*static_cast<std::string*>(context), simhost::Db::Mode::ReadWrite);
            db.Exec("BEGIN IMMEDIATE; DELETE FROM state WHERE domain = 'identity';"
                    "INSERT INTO items(domain, key, value) VALUES ('observations', 'x', '{}');");
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
    try {
        host.Init();
        ADD_FAILURE() << "replaced an existing host";
    } catch (const simhost::HostError& error) {
        EXPECT_EQ(error.code(), simhost::HostError::Code::kExists);
    }
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
    EXPECT_THROW(simhost::TempHost("{}"), simhost::HostError);
}

TEST_F(StoreTest, ARefusedReplacementLeavesDatabaseAndRootAsTheyWere) {
    TempDir dir;
    simhost::Host host(dir / "h");
    host.Init(testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json")));
    host.AddFault("QuillUserLib_Init", "down");
    simhost::CloseHost();
    // root/ that is not a directory: the replacement used to be committed before root/ failed.
    std::filesystem::remove_all(host.Root());
    testsupport::WriteFile(host.Root(), "not a directory");
    auto before = Snapshot(host.Dir());
    std::string message = ThrownBy([&] { host.Init(simhost::DefaultScenario(), true); });
    EXPECT_EQ(message, "Cannot open the simulated host at '" + host.Dir() + "': '" + host.Root() +
                           "' is not a directory");
    EXPECT_EQ(Snapshot(host.Dir()), before);
    std::filesystem::remove(host.Root());
    std::filesystem::create_directory(host.Root());
    EXPECT_EQ(UuidOf(host.Dir()), "4c4c4544-0042-3510-8057-b7c04f4e3232");
    EXPECT_EQ(host.Faults().size(), 1u);
}

// Replaces the host in dir by a larger one with no file allowed past 32 KiB: room enough to open
// the host (its WAL index takes 32 KiB), too little for the new state's WAL frames, so that the
// commit fails. Returns 0 when the replacement failed so.
int ReplaceWithLittleRoom(void* context) {
    const std::string& dir = *static_cast<std::string*>(context);
    nlohmann::json scenario = nlohmann::json::parse(simhost::DefaultScenario());
    scenario["files"] = nlohmann::json::array();  // the default host's files would pass the limit
    for (int i = 0; i < 2000; ++i)
        scenario["observations"].push_back(
            {{"time", "2024-03-18T09:12:44.000Z"}, {"message", "observation " + std::to_string(i)}});
    signal(SIGXFSZ, SIG_IGN);  // a write past the limit fails with EFBIG instead of killing us
    rlimit limit{32768, 32768};
    if (setrlimit(RLIMIT_FSIZE, &limit) != 0) return 3;
    try {
        simhost::Host(dir).Init(scenario.dump(), true);
    } catch (const simhost::HostError& error) {
        return std::string(error.what()).find("cannot write") != std::string::npos ? 0 : 2;
    }
    return 1;
}

TEST_F(StoreTest, AReplacementThatCannotBeWrittenLeavesDatabaseAndRootAsTheyWere) {
    simhost::TempHost host(testsupport::ReadFile(simtest::ScenarioFile("stateless.json")));
    host.host().AddFault("QuillUserLib_Init", "down");
    testsupport::WriteFile(host.host().Root() + "/kept", "the previous host's file");
    std::string before = host.host().Export();
    simhost::CloseHost();
    std::string dir = host.Dir();
    EXPECT_EQ(testsupport::WaitChild(testsupport::ForkChild(ReplaceWithLittleRoom, &dir)), 0);
    EXPECT_EQ(host.host().Export(), before);
    EXPECT_EQ(testsupport::ReadFile(host.host().Root() + "/kept"), "the previous host's file");
    EXPECT_FALSE(std::filesystem::exists(host.Dir() + "/root.new"));
}

TEST_F(StoreTest, AReplacementSwitchesRootWithTheDatabase) {
    simhost::TempHost host;
    testsupport::WriteFile(host.host().Root() + "/old", "x");
    // A staging directory left by a process killed while replacing.
    std::filesystem::create_directories(host.Dir() + "/root.new/stale");
    host.host().Init(testsupport::ReadFile(simtest::ScenarioFile("stateless.json")), true);
    EXPECT_TRUE(std::filesystem::is_directory(host.host().Root()));
    // root/ holds the new host's files only: the default ones, not the old host's.
    EXPECT_FALSE(std::filesystem::exists(host.host().Root() + "/old"));
    EXPECT_FALSE(std::filesystem::exists(host.host().Root() + "/stale"));
    EXPECT_TRUE(std::filesystem::exists(host.host().Root() + std::string(simhost::files::kDefaultFiles[0].path)));
    EXPECT_TRUE(std::filesystem::exists(host.host().Root() + "/bin/kelp-cmd"));  // the image
    EXPECT_FALSE(std::filesystem::exists(host.Dir() + "/root.new"));
    EXPECT_TRUE(simtest::Holds(host.host().Export(), testsupport::ReadFile(simtest::ScenarioFile("stateless.json"))));
}

TEST_F(StoreTest, SymbolicLinksInTheStateDirectoryAreRefused) {
    TempDir dir;
    simhost::Host real(dir / "real");
    real.Init();
    simhost::CloseHost();
    auto untouched = Snapshot(real.Dir());
    auto expect_refused = [&](const std::string& state, const std::string& link) {
        std::string message = ThrownBy([&] { UuidOf(state); });
        EXPECT_EQ(message, "Cannot open the simulated host at '" + state + "': '" + link +
                               "' is a symbolic link");
        simhost::CloseHost();
    };
    std::filesystem::create_directory(dir / "db");
    std::filesystem::create_symlink(simhost::DatabasePath(real.Dir()), dir / "db/host.db");
    expect_refused(dir / "db", dir / "db/host.db");
    EXPECT_THROW(simhost::Host(dir / "db").Init(simhost::DefaultScenario(), true), simhost::HostError);

    std::filesystem::create_directory(dir / "lock");
    std::filesystem::create_symlink(dir / "elsewhere.lock", dir / "lock/host.lock");
    EXPECT_EQ(ThrownBy([&] { simhost::Host(dir / "lock").Init(); }),
              "Cannot open the simulated host at '" + dir / "lock" + "': '" + dir / "lock/host.lock" +
                  "' is a symbolic link");
    EXPECT_FALSE(std::filesystem::exists(dir / "elsewhere.lock"));

    // A copy of the host's database with an empty root/ (the root's files play no part here).
    auto copy_host = [&](const std::string& to) {
        std::filesystem::create_directories(to + "/root");
        std::filesystem::copy_file(simhost::DatabasePath(real.Dir()), simhost::DatabasePath(to));
    };
    copy_host(dir / "root");
    std::filesystem::remove_all(dir / "root/root");
    std::filesystem::create_directory_symlink(dir / "real/root", dir / "root/root");
    expect_refused(dir / "root", dir / "root/root");

    for (const char* suffix : {"-journal", "-wal", "-shm"}) {
        std::string state = dir / (std::string("companion") + suffix);
        copy_host(state);
        std::string link = simhost::DatabasePath(state) + suffix;
        std::filesystem::create_symlink(dir / "elsewhere", link);
        expect_refused(state, link);
        EXPECT_FALSE(std::filesystem::exists(dir / "elsewhere")) << suffix;
    }
    EXPECT_EQ(Snapshot(real.Dir()), untouched);

    // The state directory itself may be reached through a link.
    std::filesystem::create_directory_symlink(real.Dir(), dir / "alias");
    EXPECT_EQ(UuidOf(dir / "alias"), "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c");
}

TEST_F(StoreTest, AStateDirectoryIsCreatedPrivateToItsOwner) {
    TempDir dir;
    simhost::Host(dir / "a/b/host").Init();
    for (const char* path : {"a", "a/b", "a/b/host"}) {
        struct stat info {};
        ASSERT_EQ(stat((dir / path).c_str(), &info), 0);
        EXPECT_EQ(info.st_mode & 07777, 0700u) << path;
    }
    // An existing directory keeps its mode.
    std::filesystem::create_directory(dir / "shared");
    chmod((dir / "shared").c_str(), 0755);
    simhost::Host(dir / "shared").Init();
    struct stat info {};
    ASSERT_EQ(stat((dir / "shared").c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 07777, 0755u);
}

TEST_F(StoreTest, AForeignDatabaseIsNeverWrittenNorGivenCompanionFiles) {
    TempDir dir;
    std::string wal_state = dir / "wal";
    std::filesystem::create_directory(wal_state);
    // A WAL database whose last transaction is still in its WAL: closing a connection to it
    // would checkpoint that transaction into the file.
    std::string path = simhost::DatabasePath(wal_state);
    int pid = testsupport::ForkChild(
        [](void* context) {
            simhost::Db db(*static_cast<std::string*>(context), simhost::Db::Mode::Create);
            db.Exec("PRAGMA journal_mode=WAL; CREATE TABLE accounts(name TEXT);"
                    "INSERT INTO accounts VALUES ('x');");
            raise(SIGKILL);
            return 0;
        },
        &path);
    EXPECT_EQ(testsupport::WaitChild(pid), 128 + SIGKILL);
    auto before = Snapshot(wal_state);
    ASSERT_EQ(before.count("host.db-wal"), 1u);
    EXPECT_NE(ThrownBy([&] { UuidOf(wal_state); }).find("is not a simulated host database"),
              std::string::npos);
    EXPECT_THROW(simhost::Host(wal_state).Init(simhost::DefaultScenario(), true), simhost::HostError);
    before.emplace("host.lock", "");  // taken by init, the only file it adds
    EXPECT_EQ(Snapshot(wal_state), before);

    // A database in rollback mode gets no journal, WAL or shared-memory file either.
    std::string plain = dir / "plain";
    std::filesystem::create_directory(plain);
    {
        simhost::Db db(simhost::DatabasePath(plain), simhost::Db::Mode::Create);
        db.Exec("CREATE TABLE accounts(name TEXT)");
    }
    auto plain_before = Snapshot(plain);
    EXPECT_NE(ThrownBy([&] { UuidOf(plain); }).find("is not a simulated host database"),
              std::string::npos);
    EXPECT_EQ(Snapshot(plain), plain_before);
}

TEST_F(StoreTest, AConnectionIsReadOnlyUntilItsFirstWrite) {
    simhost::TempHost host;
    {
        simhost::Session session = simhost::Session::Open(host.Dir());
        simhost::Db& db = session.db();
        EXPECT_TRUE(db.ReadOnly());
        EXPECT_EQ(db.QueryInt("SELECT count(*) FROM faults"), 0);
        {
            // A statement still stepping would be finalised under its user's feet.
            simhost::Query alive = db.Cached("SELECT operation FROM faults");
            EXPECT_THROW(simhost::WriteTxn txn(db), std::logic_error);
        }
        {
            simhost::ReadTxn snapshot(db);
            EXPECT_THROW(simhost::WriteTxn txn(db), std::logic_error);
        }
        EXPECT_TRUE(db.ReadOnly());
        {
            simhost::WriteTxn txn(db);
            db.Cached("INSERT INTO faults(operation, message) VALUES ('QuillUserLib_Init', 'x')")->Run();
            txn.Commit();
        }
        EXPECT_FALSE(db.ReadOnly());
        EXPECT_EQ(db.QueryInt("SELECT count(*) FROM faults"), 1);  // statements prepared anew
    }
    // A fault consumed by a call upgrades the process's connection too.
    simhost::CloseHost();
    host.host().AddFault("NorlithCtl::System::SystemInfoImpl::GetSystemUuid", "once", 1);
    simhost::CloseHost();
    EXPECT_EQ(ThrownBy([&] { UuidOf(host.Dir()); }), "once");
    EXPECT_EQ(UuidOf(host.Dir()), "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c");
    ASSERT_EQ(host.host().Faults().size(), 1u);
    EXPECT_EQ(host.host().Faults()[0].operation, "QuillUserLib_Init");
}

TEST_F(StoreTest, FirstUseSaysWhereItCreatedTheHostOnce) {
    TempDir dir;
    std::string state = dir / "typo";
    ::testing::internal::CaptureStderr();
    UuidOf(state);
    simhost::CloseHost();
    UuidOf(state);
    std::string said = ::testing::internal::GetCapturedStderr();
    EXPECT_EQ(said, std::string(program_invocation_short_name) + ": created a new simulated host at '" +
                        state + "' from the default scenario\n");
    ::testing::internal::CaptureStderr();
    simhost::Host(dir / "explicit").Init();
    EXPECT_EQ(::testing::internal::GetCapturedStderr(), "");
}

}  // namespace

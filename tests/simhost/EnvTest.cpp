// The operating-system seam on the simulated host: the host's clock (offset, UTC), sleeps that a
// host setting shortens, host files confined to root/, mounts checked as a kernel checks them,
// reboot and power-off through a signal to process 1, the system log, and faults as errno.
#include "TestSupport.h"

#include <norlithctl/Env.h>
#include <simhost/Host.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <syslog.h>

#include <sys/time.h>
#include <unistd.h>

namespace {

using NorlithCtl::Os::Env;

nlohmann::json Section(simhost::TempHost& host, const char* name) {
    return nlohmann::json::parse(host.host().Export())[name];
}

class EnvTest : public ::testing::Test {
protected:
    Env* env_ = Env::Default();
    simhost::TempHost host_{R"({"format": 1, "files": [{"path": "/etc/motd", "text": "hi"},
                                                       {"path": "/mnt/data", "type": "directory"}]})"};
    std::string Root() { return host_.host().Root(); }
};

TEST_F(EnvTest, TheHostClockMovesWithoutTouchingTheMachines) {
    time_t machine = time(nullptr);
    time_t host = env_->Time(nullptr);
    EXPECT_LE(std::abs(host - machine), 2);
    timeval ahead{machine + 86400 * 400, 250000};
    ASSERT_EQ(env_->SetTimeOfDay(&ahead, nullptr), 0);
    time_t later = 0;
    EXPECT_LE(std::abs(env_->Time(&later) - (machine + 86400 * 400)), 2);
    EXPECT_EQ(later, env_->Time(nullptr));
    EXPECT_LE(std::abs(time(nullptr) - machine), 2) << "the machine's clock must not move";
    std::int64_t offset = Section(host_, "clock")["offset_us"];
    EXPECT_NEAR(static_cast<double>(offset), 86400.0 * 400 * 1e6, 3e6);

    timeval bad{machine, 1000000};
    EXPECT_EQ(env_->SetTimeOfDay(&bad, nullptr), -1);
    EXPECT_EQ(errno, EINVAL);
}

TEST_F(EnvTest, TheHostsZoneIsUtcWhateverTheMachinesIs) {
    testsupport::EnvOverride zone("TZ", "Pacific/Chatham");
    tzset();
    time_t when = 1700000000;  // 2023-11-14T22:13:20Z
    tm parts{};
    ASSERT_NE(env_->LocalTime(&when, &parts), nullptr);
    EXPECT_EQ(parts.tm_hour, 22);
    EXPECT_EQ(parts.tm_min, 13);
    parts.tm_mday += 17;  // normalised like mktime: into the next month
    EXPECT_EQ(env_->MakeTime(&parts), when + 17 * 86400);
    EXPECT_EQ(parts.tm_mon, 11);
    EXPECT_EQ(parts.tm_mday, 1);
}

TEST_F(EnvTest, SleepsLastTheShareTheHostSets) {
    host_.host().Init(R"({"format": 1, "simulation": {"sleep_percent": 0}})", true);
    timespec long_sleep{3600, 0};
    EXPECT_EQ(env_->NanoSleep(&long_sleep, nullptr), 0);  // returns at once at 0 %

    // An interrupted sleep reports what is left of it in the host's time.
    host_.host().Init(R"({"format": 1, "simulation": {"sleep_percent": 50}})", true);
    struct sigaction action {};
    action.sa_handler = [](int) {};
    struct sigaction previous {};
    sigaction(SIGALRM, &action, &previous);
    itimerval timer{{0, 0}, {0, 100000}};
    setitimer(ITIMER_REAL, &timer, nullptr);
    timespec request{2, 0}, remaining{};
    EXPECT_EQ(env_->NanoSleep(&request, &remaining), -1);
    EXPECT_EQ(errno, EINTR);
    sigaction(SIGALRM, &previous, nullptr);
    EXPECT_EQ(remaining.tv_sec, 1);  // 0.9 s of 1 s of machine time left: 1.8 s of the host's

    timespec invalid{1, 1000000000};
    EXPECT_EQ(env_->NanoSleep(&invalid, nullptr), -1);
    EXPECT_EQ(errno, EINVAL);
}

TEST_F(EnvTest, UnlinkRemovesHostFilesAndNothingOutsideRoot) {
    ASSERT_EQ(env_->Unlink("/etc/motd"), 0);
    EXPECT_FALSE(std::filesystem::exists(Root() + "/etc/motd"));
    EXPECT_EQ(env_->Unlink("/etc/motd"), -1);
    EXPECT_EQ(errno, ENOENT);
    EXPECT_EQ(env_->Unlink("/mnt/data"), -1);
    EXPECT_EQ(errno, EISDIR);
    EXPECT_EQ(host_.host().Journal().back().operation, "NorlithCtl::Os::Env::Unlink");

    // Neither ".." nor a symbolic link leads out of root/.
    testsupport::TempDir outside;
    testsupport::WriteFile(outside / "precious", "keep");
    std::filesystem::create_directory_symlink(outside.Path(), Root() + "/escape");
    std::string dots = "/../../../../../../../.." + outside.Path() + "/precious";
    EXPECT_EQ(env_->Unlink(dots.c_str()), -1);
    EXPECT_EQ(env_->Unlink("/escape/precious"), -1);
    std::filesystem::create_symlink(outside / "precious", Root() + "/link");
    EXPECT_EQ(env_->Unlink("/link"), 0);  // removes the link itself
    EXPECT_EQ(testsupport::ReadFile(outside / "precious"), "keep");
}

TEST_F(EnvTest, MountsAreCheckedAndRecordedAsAKernelWould) {
    EXPECT_EQ(env_->Mount("", "/mnt/data", "tmpfs", 0, "size=8m"), 0);
    nlohmann::json mounts = Section(host_, "mounts");
    ASSERT_EQ(mounts.size(), 1u);
    EXPECT_EQ(mounts[0]["target"], "/mnt/data");
    EXPECT_EQ(mounts[0]["options"], "size=8m");
    struct Case {
        const char* target;
        const char* type;
        int error;
    } refused[] = {
        {"/mnt/data", "tmpfs", EBUSY},          // already a mount point
        {"/mnt/../mnt/./data/", "tmpfs", EBUSY}, // the same directory, spelled otherwise
        {"/mnt/missing", "tmpfs", ENOENT},
        {"/etc/motd", "tmpfs", ENOTDIR},
        {"relative", "tmpfs", ENOENT},
        {"/mnt", "nosuchfs", ENODEV},
        {"/", "tmpfs", EBUSY},
    };
    for (const Case& c : refused) {
        SCOPED_TRACE(c.target);
        errno = 0;
        EXPECT_EQ(env_->Mount("", c.target, c.type, 0, ""), -1);
        EXPECT_EQ(errno, c.error);
    }
    EXPECT_EQ(Section(host_, "mounts").size(), 1u);
    EXPECT_EQ(env_->Umount("/mnt/data/"), 0);
    EXPECT_EQ(env_->Umount("/mnt/data"), -1);
    EXPECT_EQ(errno, EINVAL);
    EXPECT_TRUE(Section(host_, "mounts").empty());
}

TEST_F(EnvTest, ASignalToProcessOneRebootsTheHostIntoItsNextBootState) {
    ASSERT_EQ(env_->Mount("", "/mnt/data", "tmpfs", 0, ""), 0);
    nlohmann::json before = Section(host_, "boot");
    ASSERT_EQ(env_->Kill(1, SIGTERM), 0);
    nlohmann::json after = Section(host_, "boot");
    EXPECT_EQ(after["boot_count"], before["boot_count"].get<int>() + 1);
    EXPECT_EQ(after["last_request"], "reboot");
    EXPECT_GE(after["booted_at"].get<std::string>(), before["booted_at"].get<std::string>());
    EXPECT_TRUE(Section(host_, "mounts").empty()) << "a mount made at run time is gone after a reboot";
    ASSERT_EQ(env_->Kill(1, SIGUSR2), 0);
    EXPECT_EQ(Section(host_, "boot")["last_request"], "poweroff");
    EXPECT_EQ(Section(host_, "boot")["boot_count"], before["boot_count"].get<int>() + 2);
    nlohmann::json log = Section(host_, "syslog");
    ASSERT_GE(log.size(), 4u);
    EXPECT_EQ(log[0]["priority"], LOG_CRIT);
    EXPECT_NE(log[0]["message"].get<std::string>().find("reboot requested by signal 15"), std::string::npos);

    EXPECT_EQ(env_->Kill(1, 0), 0);
    EXPECT_EQ(env_->Kill(1, SIGHUP), 0);  // logged and ignored
    EXPECT_EQ(Section(host_, "boot")["boot_count"], before["boot_count"].get<int>() + 2);
    EXPECT_EQ(env_->Kill(2, SIGTERM), -1);
    EXPECT_EQ(errno, ESRCH);
    EXPECT_EQ(env_->Kill(1, 99), -1);
    EXPECT_EQ(errno, EINVAL);
}

TEST_F(EnvTest, TheSystemLogKeepsTextAsData) {
    env_->Syslog(LOG_CRIT, "Reason for reboot: <100%s %n done>");
    nlohmann::json log = Section(host_, "syslog");
    ASSERT_EQ(log.size(), 1u);
    EXPECT_EQ(log[0]["message"], "Reason for reboot: <100%s %n done>");
    EXPECT_EQ(log[0]["priority"], 2);
}

TEST_F(EnvTest, FaultsFailCallsWithTheErrnoTheyName) {
    host_.host().AddFault("NorlithCtl::Os::Env::Unlink", "EACCES: denied by policy", 1);
    host_.host().AddFault("NorlithCtl::Os::Env::Mount", "the mount table is locked", 1);
    host_.host().AddFault("NorlithCtl::Os::Env::Time", "ETIMEDOUT", 1);
    EXPECT_EQ(env_->Unlink("/etc/motd"), -1);
    EXPECT_EQ(errno, EACCES);
    EXPECT_TRUE(std::filesystem::exists(Root() + "/etc/motd"));
    EXPECT_EQ(env_->Mount("", "/mnt/data", "tmpfs", 0, ""), -1);
    EXPECT_EQ(errno, EIO);
    time_t untouched = 7;
    EXPECT_EQ(env_->Time(&untouched), static_cast<time_t>(-1));
    EXPECT_EQ(errno, ETIMEDOUT);
    EXPECT_EQ(untouched, 7);
}

// A test that needs one different call overrides just that one; the rest still reach the host.
TEST_F(EnvTest, AWrapperReplacesOneCallAndForwardsTheRest) {
    struct InstantSleep : NorlithCtl::Os::EnvWrapper {
        using EnvWrapper::EnvWrapper;
        int NanoSleep(const timespec* request, timespec*) override {
            slept += request->tv_sec;
            return 0;
        }
        long slept = 0;
    } instant(Env::Default());
    Env* previous = Env::SetDefault(&instant);
    EXPECT_EQ(Env::Default(), &instant);
    timespec hour{3600, 0};
    EXPECT_EQ(Env::Default()->NanoSleep(&hour, nullptr), 0);
    EXPECT_EQ(instant.slept, 3600);
    simhost::trace::Enable();
    EXPECT_EQ(Env::Default()->Unlink("/etc/motd"), 0);
    EXPECT_EQ(simhost::trace::TakeOperations(), std::vector<std::string>{"NorlithCtl::Os::Env::Unlink"});
    simhost::trace::Disable();
    Env::SetDefault(previous == NorlithCtl::Os::SimulatedEnv() ? nullptr : previous);
    EXPECT_EQ(Env::Default(), NorlithCtl::Os::SimulatedEnv());
}

}  // namespace

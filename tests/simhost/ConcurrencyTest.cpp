// The store under concurrent processes: first use, counted faults, writers and replacement.
#include "TestSupport.h"

#include <norlithctl/QuillUserLib.h>
#include <norlithctl/RavelException.h>
#include <norlithctl/SystemInfoImpl.h>

#include <simhost/Host.h>
#include <simhost/Store.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <atomic>
#include <set>
#include <thread>

#include <unistd.h>

namespace {

const std::string kGetUuid = "NorlithCtl::System::SystemInfoImpl::GetSystemUuid";

// Children started together: each blocks until Release() closes the pipe they wait on.
class StartingLine {
public:
    StartingLine() {
        if (pipe(fds_) != 0) throw std::runtime_error("pipe failed");
    }
    StartingLine(const StartingLine&) = delete;
    StartingLine& operator=(const StartingLine&) = delete;
    ~StartingLine() {
        Release();
        if (fds_[0] >= 0) close(fds_[0]);
    }
    void Wait() {
        close(fds_[1]);
        char byte;
        while (read(fds_[0], &byte, 1) > 0) {
        }
    }
    void Release() {
        if (fds_[1] >= 0) close(fds_[1]);
        fds_[1] = -1;
    }

private:
    int fds_[2] = {-1, -1};
};

struct Race {
    StartingLine* line;
    int rounds;
};

std::vector<int> StartChildren(int count, int (*body)(void*), Race& race) {
    std::vector<int> pids;
    for (int i = 0; i < count; ++i) pids.push_back(testsupport::ForkChild(body, &race));
    race.line->Release();
    return pids;
}

class ConcurrencyTest : public ::testing::Test {
protected:
    void TearDown() override { simhost::CloseHost(); }
};

TEST_F(ConcurrencyTest, ConcurrentFirstUseCreatesOneWholeHost) {
    testsupport::TempDir dir;
    testsupport::EnvOverride env("QUARN_HOST_STATE", dir / "fresh");
    StartingLine line;
    Race race{&line, 1};
    auto pids = StartChildren(
        6,
        [](void* context) {
            static_cast<Race*>(context)->line->Wait();
            NorlithCtl::System::SystemInfoImpl info;
            return info.GetSystemUuid() == "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c" ? 0 : 1;
        },
        race);
    for (int pid : pids) EXPECT_EQ(testsupport::WaitChild(pid), 0);
    std::set<std::string> files;
    for (const auto& entry : std::filesystem::directory_iterator(dir / "fresh"))
        files.insert(entry.path().filename().string());
    EXPECT_EQ(files.count("host.db.new"), 0u);
    EXPECT_EQ(files.count("root"), 1u);
    EXPECT_TRUE(simtest::Holds(simhost::Host(dir / "fresh").Export(), simhost::DefaultScenario()));
}

TEST_F(ConcurrencyTest, CountedFaultFiresExactlyNTimesAcrossProcesses) {
    simhost::TempHost host;
    host.host().AddFault(kGetUuid, "uuid unavailable", 7);
    StartingLine line;
    Race race{&line, 10};
    auto pids = StartChildren(
        4,
        [](void* context) {
            Race* race = static_cast<Race*>(context);
            race->line->Wait();
            int failures = 0;
            NorlithCtl::System::SystemInfoImpl info;
            for (int i = 0; i < race->rounds; ++i) {
                try {
                    info.GetSystemUuid();
                } catch (const Ravel::Lib::RavelException& error) {
                    if (error.GetMessage(0) != "uuid unavailable") return 100;
                    ++failures;
                }
            }
            return failures;
        },
        race);
    int failures = 0;
    for (int pid : pids) {
        int status = testsupport::WaitChild(pid);
        ASSERT_LT(status, 100);
        failures += status;
    }
    EXPECT_EQ(failures, 7);
    EXPECT_TRUE(host.host().Faults().empty());
    int journaled = 0;
    for (const auto& entry : host.host().Journal())
        journaled += entry.kind == "fault" && entry.operation == kGetUuid;
    EXPECT_EQ(journaled, 7);
}

TEST_F(ConcurrencyTest, ConcurrentWritersLoseNoUpdate) {
    simhost::TempHost host;
    StartingLine line;
    Race race{&line, 25};
    auto pids = StartChildren(
        4,
        [](void* context) {
            Race* race = static_cast<Race*>(context);
            race->line->Wait();
            if (QuillUserLib_Init() != 0) return 1;
            for (int i = 0; i < race->rounds; ++i)
                if (QuillUserLib_AddQuill("pid %d entry %d", static_cast<int>(getpid()), i) != 0)
                    return 2;
            QuillUserLib_Close();
            return 0;
        },
        race);
    for (int pid : pids) EXPECT_EQ(testsupport::WaitChild(pid), 0);
    auto journal = host.host().Journal();
    ASSERT_EQ(journal.size(), 100u);
    for (std::size_t i = 1; i < journal.size(); ++i)
        EXPECT_LT(journal[i - 1].sequence, journal[i].sequence);
    auto exported = nlohmann::json::parse(host.host().Export());
    EXPECT_EQ(exported["observations"].size(), 101u);  // the default scenario's entry and ours
}

TEST_F(ConcurrencyTest, ReadersNeverSeeAHalfReplacedHost) {
    testsupport::TempDir dir;
    simhost::Host host(dir / "h");
    std::string first = testsupport::ReadFile(simtest::ScenarioFile("no-netboot.json"));
    std::string second = testsupport::ReadFile(simtest::ScenarioFile("stateless.json"));
    host.Init(first);
    struct Context {
        StartingLine line;
        std::string dir, first, second;
    } context;
    context.dir = host.Dir();
    context.first = first;
    context.second = second;
    std::vector<int> pids;
    for (int i = 0; i < 2; ++i)
        pids.push_back(testsupport::ForkChild(
            [](void* raw) {
                Context* context = static_cast<Context*>(raw);
                context->line.Wait();
                for (int round = 0; round < 20; ++round) {
                    std::string text = simhost::Host(context->dir).Export();
                    if (!simtest::Holds(text, context->first) && !simtest::Holds(text, context->second))
                        return 1;
                }
                return 0;
            },
            &context));
    context.line.Release();
    for (int round = 0; round < 8; ++round)
        simtest::RunQuarnhost({"--state", host.Dir(), "init", "--force", "--scenario",
                               simtest::ScenarioFile(round % 2 ? "no-netboot.json" : "stateless.json")});
    for (int pid : pids) EXPECT_EQ(testsupport::WaitChild(pid), 0);
}

TEST_F(ConcurrencyTest, ThreadsShareTheProcessConnectionSafely) {
    simhost::TempHost host;
    host.host().AddFault(kGetUuid, "counted", 5);
    ASSERT_EQ(QuillUserLib_Init(), 0);
    std::atomic<int> failures{0}, wrong{0};
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t)
        threads.emplace_back([&, t] {
            for (int i = 0; i < 20; ++i) {
                try {
                    if (NorlithCtl::System::SystemInfoImpl().GetSystemUuid() !=
                        "6523a1f4-8c1e-4d2b-9f3a-0050569a2b3c")
                        ++wrong;
                } catch (const Ravel::Lib::RavelException&) {
                    ++failures;
                }
                if (QuillUserLib_AddQuill("thread %d entry %d", t, i) != 0) ++wrong;
            }
        });
    for (auto& thread : threads) thread.join();
    QuillUserLib_Close();
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(failures, 5);
    EXPECT_EQ(nlohmann::json::parse(host.host().Export())["observations"].size(), 81u);
}

}  // namespace

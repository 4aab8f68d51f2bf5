// The exported command runner, called as a user of the plug-in calls it: looked up in the
// loaded libsystem.so. Large outputs and unread input finish without blocking, each stream
// keeps at most its capacity, the wait status comes back raw, and many calls leave no
// descriptor, no zombie and no pipe of another call behind.
#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <dirent.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <string>
#include <sys/wait.h>
#include <thread>
#include <vector>

namespace {

typedef int (*RunCommandFn)(char const*, char const**, char*, int*, char*, int*, char const*, int);

const char kSymbol[] = "_ZN9TarselCli6System10RunCommandEPKcPS2_PcPiS4_S5_S2_i";

class RunCommandTest : public ::testing::Test {
protected:
    static void SetUpTestSuite() {
        module_ = dlopen(SYSTEM_PLUGIN, RTLD_NOW | RTLD_LOCAL);
        ASSERT_NE(module_, nullptr) << dlerror();
        run_ = reinterpret_cast<RunCommandFn>(dlsym(module_, kSymbol));
        ASSERT_NE(run_, nullptr) << "the plug-in does not export RunCommand";
    }
    static void TearDownTestSuite() {
        if (module_) dlclose(module_);
        module_ = nullptr;
    }

    // What one call returned and stored.
    struct Result {
        int status = 0;
        int out_count = 0;
        int err_count = 0;
        std::string out, err;
    };
    // Runs argv (argv[0] is the path) with buffers of the given capacities.
    static Result Run(std::vector<std::string> argv, int out_capacity = 4096, int err_capacity = 4096,
                      const std::string* input = nullptr) {
        std::vector<const char*> args;
        for (const std::string& arg : argv) args.push_back(arg.c_str());
        args.push_back(nullptr);
        std::vector<char> out(static_cast<std::size_t>(std::max(out_capacity, 1)));
        std::vector<char> err(static_cast<std::size_t>(std::max(err_capacity, 1)));
        Result result;
        result.out_count = out_capacity;
        result.err_count = err_capacity;
        result.status = run_(args[0], args.data(), out.data(), &result.out_count, err.data(),
                             &result.err_count, input ? input->data() : nullptr,
                             input ? static_cast<int>(input->size()) : 0);
        if (result.out_count > 0) result.out.assign(out.data(), static_cast<std::size_t>(result.out_count));
        if (result.err_count > 0) result.err.assign(err.data(), static_cast<std::size_t>(result.err_count));
        return result;
    }
    static std::vector<std::string> Sh(const std::string& script) { return {"/bin/sh", "-c", script}; }

    static void* module_;
    static RunCommandFn run_;
};

void* RunCommandTest::module_ = nullptr;
RunCommandFn RunCommandTest::run_ = nullptr;

int OpenDescriptors() {
    int count = 0;
    DIR* dir = opendir("/proc/self/fd");
    while (dirent* entry = readdir(dir))
        if (entry->d_name[0] != '.') ++count;
    closedir(dir);
    return count;
}

TEST_F(RunCommandTest, CapturesBothStreamsAndReturnsTheRawWaitStatus) {
    Result result = Run(Sh("printf 'out put'; printf 'err' >&2; exit 3"));
    EXPECT_TRUE(WIFEXITED(result.status));
    EXPECT_EQ(WEXITSTATUS(result.status), 3);
    EXPECT_EQ(result.out, "out put");
    EXPECT_EQ(result.out_count, 7);
    EXPECT_EQ(result.err, "err");

    Result quiet = Run({"/bin/true"});
    EXPECT_EQ(quiet.status, 0);
    EXPECT_EQ(quiet.out_count, 0);
    EXPECT_EQ(quiet.err_count, 0);

    Result killed = Run(Sh("kill -9 $$"));
    EXPECT_TRUE(WIFSIGNALED(killed.status));
    EXPECT_EQ(WTERMSIG(killed.status), SIGKILL);

    // argv goes to the program as given, its first entry included; the path is not searched.
    Result args = Run({"/bin/sh", "-c", "printf '%s|%s' \"$0\" \"$1\"", "zero", "one two"});
    EXPECT_EQ(args.out, "zero|one two");
    EXPECT_EQ(Run({"true"}).status, 1 << 8);
}

TEST_F(RunCommandTest, AProgramThatCannotStartEndsWithExitCodeOne) {
    Result missing = Run({"/nonexistent/program"});
    EXPECT_TRUE(WIFEXITED(missing.status));
    EXPECT_EQ(WEXITSTATUS(missing.status), 1);
    EXPECT_EQ(missing.err_count, 0);
    EXPECT_EQ(missing.out_count, 0);
    EXPECT_EQ(Run({"/etc/hostname"}).status, 1 << 8) << "not executable";
}

TEST_F(RunCommandTest, EachStreamKeepsAtMostItsCapacity) {
    const std::string text = "0123456789";
    for (int capacity : {0, 1, 9, 10, 11, 4096}) {
        Result result = Run(Sh("printf 0123456789; printf 0123456789 >&2"), capacity, capacity);
        const int kept = std::min(capacity, 10);
        EXPECT_EQ(result.out_count, kept) << capacity;
        EXPECT_EQ(result.err_count, kept) << capacity;
        EXPECT_EQ(result.out, text.substr(0, static_cast<std::size_t>(kept)));
        EXPECT_EQ(result.err, text.substr(0, static_cast<std::size_t>(kept)));
        EXPECT_EQ(result.status, 0);
    }
}

// Megabytes on both streams, a program that echoes its input back, and input that is never
// read: none of them blocks the caller or the program.
TEST_F(RunCommandTest, TenMebibytesEachWayFinishWithoutBlocking) {
    const int kTen = 10 << 20;
    Result both = Run(Sh("head -c 10485760 /dev/zero | tr '\\0' a; head -c 10485760 /dev/zero | tr '\\0' b >&2"),
                      kTen, kTen);
    EXPECT_EQ(both.status, 0);
    EXPECT_EQ(both.out_count, kTen);
    EXPECT_EQ(both.err_count, kTen);
    EXPECT_EQ(std::count(both.out.begin(), both.out.end(), 'a'), kTen);
    EXPECT_EQ(std::count(both.err.begin(), both.err.end(), 'b'), kTen);

    std::string input(static_cast<std::size_t>(kTen), '\0');
    for (std::size_t i = 0; i < input.size(); ++i) input[i] = static_cast<char>('a' + i % 26);
    Result echoed = Run({"/bin/cat"}, kTen, 16, &input);
    EXPECT_EQ(echoed.status, 0);
    EXPECT_EQ(echoed.out_count, kTen);
    EXPECT_TRUE(echoed.out == input);

    // Unread input, and a program that reads a little and leaves: no SIGPIPE ends this process.
    Result unread = Run({"/bin/echo", "done"}, 64, 64, &input);
    EXPECT_EQ(unread.status, 0);
    EXPECT_EQ(unread.out, "done\n");
    Result head = Run({"/usr/bin/head", "-c", "5"}, 64, 64, &input);
    EXPECT_EQ(head.status, 0);
    EXPECT_EQ(head.out, "abcde");

    // Output larger than the capacity is read to its end and dropped, so the program finishes.
    Result dropped = Run(Sh("head -c 10485760 /dev/zero; head -c 10485760 /dev/zero >&2; exit 7"), 3, 0);
    EXPECT_EQ(WEXITSTATUS(dropped.status), 7);
    EXPECT_EQ(dropped.out_count, 3);
    EXPECT_EQ(dropped.err_count, 0);
}

TEST_F(RunCommandTest, NullBuffersAreNotCollectedAndTheirCountsLeftAlone) {
    const char* argv[] = {"/bin/sh", "-c", "head -c 1048576 /dev/zero; printf oops >&2", nullptr};
    char err[16];
    int out_len = 12345, err_len = sizeof err;
    EXPECT_EQ(run_(argv[0], argv, nullptr, &out_len, err, &err_len, nullptr, 0), 0);
    EXPECT_EQ(out_len, 12345);
    EXPECT_EQ(std::string(err, static_cast<std::size_t>(err_len)), "oops");

    char out[16];
    out_len = sizeof out;
    err_len = 777;
    const char* cat[] = {"/bin/cat", nullptr};
    // A null input: the program sees end of file at once.
    EXPECT_EQ(run_(cat[0], cat, out, &out_len, nullptr, &err_len, nullptr, 5), 0);
    EXPECT_EQ(out_len, 0);
    EXPECT_EQ(err_len, 777);
    // An input of zero bytes likewise.
    out_len = sizeof out;
    EXPECT_EQ(run_(cat[0], cat, out, &out_len, nullptr, nullptr, "xyz", 0), 0);
    EXPECT_EQ(out_len, 0);
    out_len = sizeof out;
    EXPECT_EQ(run_(cat[0], cat, out, &out_len, nullptr, nullptr, "xyz", 2), 0);
    EXPECT_EQ(std::string(out, static_cast<std::size_t>(out_len)), "xy");
}

// A program sees its three standard streams and what the caller itself leaves open across exec,
// nothing more, also while other calls run at the same time in other threads (their pipes are
// close-on-exec).
TEST_F(RunCommandTest, TheProgramInheritsNoOtherCallsPipes) {
    std::vector<int> inherited;
    for (int fd = 3; fd < 1024; ++fd) {
        int flags = fcntl(fd, F_GETFD);
        if (flags >= 0 && !(flags & FD_CLOEXEC)) inherited.push_back(fd);
    }
    int listing_fd = 3;  // the directory ls reads: the lowest number free in the program
    while (std::find(inherited.begin(), inherited.end(), listing_fd) != inherited.end()) ++listing_fd;
    inherited.push_back(listing_fd);
    std::vector<std::string> names = {"0", "1", "2"};
    for (int fd : inherited) names.push_back(std::to_string(fd));
    std::sort(names.begin(), names.end());  // as ls sorts them
    std::string expected;
    for (const std::string& name : names) expected += name + "\n";

    std::vector<std::thread> threads;
    std::vector<std::string> listings(4);
    for (std::size_t t = 0; t < listings.size(); ++t)
        threads.emplace_back([&, t] {
            for (int i = 0; i < 25; ++i) {
                Result result = Run({"/bin/ls", "/proc/self/fd"});
                if (result.out != expected) listings[t] = result.out;
            }
        });
    for (std::thread& thread : threads) thread.join();
    for (const std::string& listing : listings)
        EXPECT_EQ(listing, "") << "expected:\n" << expected << "got:\n" << listing;
}

TEST_F(RunCommandTest, AThousandCallsLeaveNoDescriptorAndNoZombie) {
    const int before = OpenDescriptors();
    int failures = 0;
    for (int i = 0; i < 1000; ++i) failures += Run({"/bin/true"}, 8, 8).status != 0;
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(OpenDescriptors(), before);
    errno = 0;
    EXPECT_EQ(waitpid(-1, nullptr, WNOHANG), -1) << "a child was left to be waited for";
    EXPECT_EQ(errno, ECHILD);
}

// A descendant that keeps the output open after the program ended does not hold the caller.
TEST_F(RunCommandTest, ADescendantHoldingTheOutputDoesNotHoldTheCaller) {
    Result result = Run(Sh("sleep 600 & echo $!"));
    EXPECT_EQ(result.status, 0);
    const int pid = std::atoi(result.out.c_str());
    ASSERT_GT(pid, 1);
    EXPECT_EQ(kill(pid, SIGKILL), 0);
}

}  // namespace

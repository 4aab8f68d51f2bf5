// The command executor: programs of the host's /bin run with the host's state, their status
// comes back as the result, and their error output goes to the host's system log when quiet.
#include "TestSupport.h"

#include <norlithctl/RavelException.h>
#include <norlithctl/Util.h>
#include <simhost/Host.h>

#include <gtest/gtest.h>

#include <cerrno>
#include <filesystem>

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace {

using NorlithCtl::Util::NorlithCtl_Exec;

class ExecTest : public ::testing::Test {
protected:
    void SetUp() override {
        std::filesystem::create_directories(host_.host().Root() + "/bin");
        for (const char* program : {"true", "false", "ls", "printenv", "sleep"})
            std::filesystem::copy_file(std::string("/bin/") + program,
                                       host_.host().Root() + "/bin/" + program);
        testsupport::WriteFile(host_.host().Root() + "/bin/notes", "not a program");
    }
    nlohmann::json Syslog() { return nlohmann::json::parse(host_.host().Export())["syslog"]; }

    simhost::TempHost host_;
};

TEST_F(ExecTest, TheResultIsZeroExactlyWhenTheProgramSucceeded) {
    EXPECT_EQ(NorlithCtl_Exec("/bin/true", false, true, false), 0);
    EXPECT_EQ(NorlithCtl_Exec("/bin/false", false, true, false), 1);
    EXPECT_EQ(NorlithCtl_Exec("  /bin/ls \t /  ", false, true, false), 0);  // blanks separate
    EXPECT_EQ(NorlithCtl_Exec("/bin/missing", false, true, false), 127);
    EXPECT_EQ(NorlithCtl_Exec("/bin/notes", false, true, false), 126);
    EXPECT_EQ(NorlithCtl_Exec("", false, true, false), 127);
    // Program paths are the host's: the machine's own programs are out of reach.
    EXPECT_EQ(NorlithCtl_Exec("/usr/bin/env", false, true, false), 127);
    EXPECT_EQ(NorlithCtl_Exec("/bin/../../../../usr/bin/env", false, true, false), 127);
}

TEST_F(ExecTest, TheProgramActsOnThisHost) {
    EXPECT_EQ(NorlithCtl_Exec("/bin/printenv QUARN_HOST_STATE", false, true, false), 0);
    // Its standard output, when not quiet, is the caller's.
    testsupport::TempDir dir;
    int file = open((dir / "out").c_str(), O_WRONLY | O_CREAT, 0600);
    int saved = dup(1);
    dup2(file, 1);
    int status = NorlithCtl_Exec("/bin/printenv QUARN_HOST_STATE", false, false, false);
    dup2(saved, 1);
    close(saved);
    close(file);
    EXPECT_EQ(status, 0);
    EXPECT_EQ(testsupport::ReadFile(dir / "out"),
              std::filesystem::canonical(host_.Dir()).string() + "\n");
}

TEST_F(ExecTest, QuietErrorsAndTracedCommandLinesGoToTheHostsSystemLog) {
    EXPECT_EQ(NorlithCtl_Exec("/bin/ls /no-such-entry", false, true, true), 2);
    nlohmann::json log = Syslog();
    ASSERT_EQ(log.size(), 2u);
    EXPECT_EQ(log[0]["message"], "exec: /bin/ls /no-such-entry");
    EXPECT_NE(log[1]["message"].get<std::string>().find("/bin/ls: "), std::string::npos);
    EXPECT_NE(log[1]["message"].get<std::string>().find("no-such-entry"), std::string::npos);
    EXPECT_EQ(NorlithCtl_Exec("/bin/missing", false, true, false), 127);
    EXPECT_EQ(Syslog().back()["message"], "exec: cannot run '/bin/missing': no such program");
}

TEST_F(ExecTest, InTheBackgroundItReturnsAtOnceAndLeavesNoChildBehind) {
    EXPECT_EQ(NorlithCtl_Exec("/bin/sleep 1", true, true, false), 0);
    EXPECT_EQ(waitpid(-1, nullptr, WNOHANG), -1);
    EXPECT_EQ(errno, ECHILD);
}

TEST_F(ExecTest, AFaultIsAnExceptionAndNothingRuns) {
    host_.host().AddFault("NorlithCtl::Util::NorlithCtl_Exec", "executor unavailable", 1);
    try {
        NorlithCtl_Exec("/bin/true", false, true, true);
        FAIL() << "no exception";
    } catch (const Ravel::Lib::RavelException& error) {
        EXPECT_EQ(error.GetMessage(0), "executor unavailable");
    }
    EXPECT_TRUE(Syslog().empty());
}

}  // namespace

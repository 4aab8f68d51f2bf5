// The fixture the end-to-end tests share: a throw-away host in a temporary directory, and
// quarncli and quarnhost run as processes against it.
#pragma once

#include "support/Files.h"
#include "support/Process.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace e2e {

using Result = testsupport::ProcessResult;

class HostFixture : public ::testing::Test {
protected:
    // quarncli on this host, with args after --host-state.
    Result Cli(std::vector<std::string> args) {
        args.insert(args.begin(), {"--host-state", state_});
        return testsupport::RunProgram(QUARNCLI, args);
    }
    // The same with the json formatter.
    Result Json(std::vector<std::string> args) {
        args.insert(args.begin(), {"--formatter", "json"});
        return Cli(args);
    }
    // quarnhost on this host.
    Result Host(std::vector<std::string> args) {
        args.insert(args.begin(), {"--state", state_});
        return testsupport::RunProgram(QUARNHOST, args);
    }

    testsupport::TempDir dir_;
    const std::string state_ = dir_ / "host";
};

}  // namespace e2e

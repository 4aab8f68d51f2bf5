// The time and uptime commands against throw-away simulated hosts: the ISO text of the host's
// clock in UTC whatever the machine's zone, setting the clock field by field (each field's
// bounds, the order of the checks, the carries into the next unit, values that do not fit 32
// bits), the clock the commands set being the host's and never the machine's, and the uptime
// counted from the host's last boot.
#include "Harness.h"

#include <norlithctl/Env.h>
#include <simhost/Host.h>
#include <simhost/Time.h>
#include <simhost/Trace.h>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <ctime>
#include <functional>
#include <optional>
#include <regex>
#include <string>
#include <vector>

namespace {

using nlohmann::json;
using plugintest::Outcome;
using Kitbase::MetaObj::MetaBool;
using Kitbase::MetaObj::MetaInt;
using Kitbase::MetaObj::MetaString;

REGISTER_FAULT_CASE(plugintest::FaultCase("TimeGetSystem", "system time get")
                        .On("NorlithCtl::Os::Env::Time", Outcome::Ignored()));
REGISTER_FAULT_CASE(plugintest::FaultCase("TimeSetSystem", "system time set")
                        .Input([](Kitbase::CallSpec::Input& in) {
                            in.SetInt("year", 2031);
                            in.SetInt("month", 7);
                            in.SetInt("day", 14);
                            in.SetInt("hour", 9);
                            in.SetInt("min", 30);
                            in.SetInt("sec", 0);
                        })
                        .On("NorlithCtl::Os::Env::Time", Outcome::Ignored())
                        .On("NorlithCtl::Os::Env::SetTimeOfDay",
                            Outcome::Reported({"Unable to set time: Input/output error"})));
REGISTER_FAULT_CASE(plugintest::FaultCase("TimeGetUptime", "system stats uptime get")
                        .Prefix("Unable to get system uptime: ")
                        .On("Ravel::AdvStats::ServerStats::ServerStats", Outcome::Escapes()));

// 2001-04-30T10:20:30Z, a Monday at the end of a 30-day month.
const time_t kApril30 = 988626030;

// The seam with a clock stopped at a given time, recording what the command sets (and passing
// it on to the host, so the host's clock follows).
struct StoppedClock : NorlithCtl::Os::EnvWrapper {
    explicit StoppedClock(time_t at) : EnvWrapper(NorlithCtl::Os::SimulatedEnv()), now(at) {
        previous = NorlithCtl::Os::Env::SetDefault(this);
    }
    ~StoppedClock() override { NorlithCtl::Os::Env::SetDefault(previous); }
    time_t Time(time_t* result) override {
        if (result) *result = now;
        return now;
    }
    int SetTimeOfDay(const struct timeval* tv, const struct timezone* tz) override {
        set.push_back(tv->tv_sec);
        EXPECT_EQ(tv->tv_usec, 0);
        EXPECT_EQ(tz, nullptr);
        return EnvWrapper::SetTimeOfDay(tv, tz);
    }

    time_t now;
    std::vector<time_t> set;
    NorlithCtl::Os::Env* previous;
};

time_t Utc(int year, int month, int day, int hour, int minute, int second) {
    std::tm parts{};
    parts.tm_year = year - 1900;
    parts.tm_mon = month - 1;
    parts.tm_mday = day;
    parts.tm_hour = hour;
    parts.tm_min = minute;
    parts.tm_sec = second;
    return timegm(&parts);
}

typedef std::vector<std::pair<std::string, long long>> Fields;

class TimeTest : public ::testing::Test {
protected:
    plugintest::Run Run(const std::string& path, const Fields& fields = {}) {
        plugintest::InputPtr input = Kitbase::CallSpec::Input::New();
        for (const auto& field : fields) input->SetInt(field.first, field.second);
        plugintest::Run run = plugintest::Execute(plugintest::FindCommand(path), input);
        EXPECT_FALSE(run.escaped) << run.exception;
        EXPECT_EQ(run.leaked, 0);
        return run;
    }
    std::string Now() {
        auto text = boost::dynamic_pointer_cast<MetaString>(Run("system time get").output->GetResult());
        return text ? text->GetValue() : "<none>";
    }
    // The one error of a set, or "" when it succeeded with true.
    std::string Set(const Fields& fields) {
        plugintest::Run run = Run("system time set", fields);
        if (!run.output->GetErrors().empty()) {
            EXPECT_FALSE(run.output->GetResult());
            EXPECT_EQ(run.output->GetErrors().size(), 1u);
            return run.output->GetErrors().front();
        }
        auto value = boost::dynamic_pointer_cast<MetaBool>(run.output->GetResult());
        EXPECT_TRUE(value && value->GetValue() && run.output->IsComplete());
        return "";
    }
    long long Uptime() {
        plugintest::Run run = Run("system stats uptime get");
        auto value = boost::dynamic_pointer_cast<MetaInt>(run.output->GetResult());
        EXPECT_TRUE(value) << (run.output->GetErrors().empty() ? "" : run.output->GetErrors().front());
        return value ? value->GetValue() : -1;
    }

    simhost::TempHost host_;
};

TEST_F(TimeTest, GetShowsTheHostsClockInUtcWhateverTheMachinesZone) {
    {
        StoppedClock clock(Utc(2000, 2, 29, 7, 5, 9));
        EXPECT_EQ(Now(), "2000-02-29T07:05:09Z");
        clock.now = 0;
        EXPECT_EQ(Now(), "1970-01-01T00:00:00Z");
    }
    const char* saved = std::getenv("TZ");
    std::string zone = saved ? saved : "";
    setenv("TZ", "America/Argentina/Buenos_Aires", 1);
    tzset();
    {
        StoppedClock clock(kApril30);
        EXPECT_EQ(Now(), "2001-04-30T10:20:30Z");
    }
    const std::string now = Now();
    if (saved)
        setenv("TZ", zone.c_str(), 1);
    else
        unsetenv("TZ");
    tzset();
    EXPECT_TRUE(std::regex_match(now, std::regex(R"(\d{4}-\d\d-\d\dT\d\d:\d\d:\d\dZ)"))) << now;
    // The host's clock runs with the machine's: a fresh host reads today's date.
    EXPECT_EQ(now.substr(0, 10), simhost::UtcNow().substr(0, 10));
}

TEST_F(TimeTest, SetWithoutAFieldIsRefused) {
    StoppedClock clock(kApril30);
    EXPECT_EQ(Set({}), "You must specify one of year, month, day, hour, minute or second");
    EXPECT_TRUE(clock.set.empty());
}

TEST_F(TimeTest, EachFieldIsCheckedAtItsBoundsAndARefusalLeavesTheClockAlone) {
    StoppedClock clock(kApril30);
    const std::vector<std::pair<Fields, std::string>> refused = {
        {{{"year", 1969}}, "Year must be > 1970"},
        {{{"year", -2024}}, "Year must be > 1970"},
        {{{"month", 0}}, "Month must be between 1 and 12"},
        {{{"month", 13}}, "Month must be between 1 and 12"},
        {{{"day", 0}}, "Invalid day"},
        {{{"day", 32}}, "Invalid day"},
        {{{"hour", -1}}, "Invalid hour"},
        {{{"hour", 25}}, "Invalid hour"},
        {{{"min", -1}}, "Invalid minute"},
        {{{"min", 61}}, "Invalid minute"},
        {{{"sec", -1}}, "Invalid second"},
        {{{"sec", 61}}, "Invalid second"},
        // The first refused field stops the command: the later ones are not even read.
        {{{"year", 1969}, {"month", 13}, {"sec", 99}}, "Year must be > 1970"},
        {{{"month", 12}, {"day", 0}, {"hour", 25}}, "Invalid day"},
    };
    for (const auto& c : refused) EXPECT_EQ(Set(c.first), c.second) << c.second;
    EXPECT_TRUE(clock.set.empty());

    EXPECT_EQ(Set({{"year", 1970}, {"month", 1}, {"day", 1}, {"hour", 0}, {"min", 0}, {"sec", 0}}), "");
    EXPECT_EQ(Set({{"year", 2038}, {"month", 12}, {"day", 31}, {"hour", 23}, {"min", 59}, {"sec", 59}}), "");
    EXPECT_EQ(clock.set, (std::vector<time_t>{0, Utc(2038, 12, 31, 23, 59, 59)}));
}

// Fields the user leaves out keep the values of the moment the command started; values past a
// unit's end are carried into the next one.
TEST_F(TimeTest, MissingFieldsKeepTheCurrentTimeAndOverflowsCarry) {
    StoppedClock clock(kApril30);
    const std::vector<std::pair<Fields, time_t>> cases = {
        {{{"hour", 4}}, Utc(2001, 4, 30, 4, 20, 30)},
        {{{"year", 2024}, {"month", 2}}, Utc(2024, 2, 29, 10, 20, 30) + 86400},  // Feb 30 = Mar 1
        {{{"day", 31}}, Utc(2001, 5, 1, 10, 20, 30)},
        {{{"year", 2023}, {"month", 2}, {"day", 30}}, Utc(2023, 3, 2, 10, 20, 30)},
        {{{"hour", 24}}, Utc(2001, 5, 1, 0, 20, 30)},
        {{{"min", 60}}, Utc(2001, 4, 30, 11, 0, 30)},
        {{{"sec", 60}}, Utc(2001, 4, 30, 10, 21, 0)},
        {{{"month", 12}, {"day", 31}, {"hour", 24}, {"min", 60}, {"sec", 60}}, Utc(2002, 1, 1, 1, 1, 0)},
    };
    for (const auto& c : cases) {
        clock.set.clear();
        EXPECT_EQ(Set(c.first), "");
        EXPECT_EQ(clock.set, (std::vector<time_t>{c.second})) << c.first.front().first;
    }
}

// A value that does not fit a 32-bit integer is refused with its field's message, not taken by
// its low 32 bits (4294969296 would be 2000, 4294967297 would be 1, -4294967296 would be 0).
TEST_F(TimeTest, ValuesBeyondThirtyTwoBitsAreRefusedNotTruncated) {
    StoppedClock clock(kApril30);
    EXPECT_EQ(Set({{"year", 4294969296LL}}), "Year must be > 1970");
    EXPECT_EQ(Set({{"month", 4294967297LL}}), "Month must be between 1 and 12");
    EXPECT_EQ(Set({{"day", 4294967311LL}}), "Invalid day");
    EXPECT_EQ(Set({{"hour", 4294967297LL}}), "Invalid hour");
    EXPECT_EQ(Set({{"min", -4294967296LL}}), "Invalid minute");
    EXPECT_EQ(Set({{"sec", 9223372036854775807LL}}), "Invalid second");
    EXPECT_EQ(Set({{"sec", -9223372036854775807LL - 1}}), "Invalid second");
    EXPECT_TRUE(clock.set.empty());
}

// The host's clock, not the machine's: the host reads what was set and keeps running from there,
// while the machine's clock is untouched. A time beyond the host clock's range is refused by the
// host with EINVAL.
TEST_F(TimeTest, SetMovesTheHostsClockOnlyAndItKeepsRunning) {
    const time_t machine_before = time(nullptr);
    EXPECT_EQ(Set({{"year", 2031}, {"month", 7}, {"day", 14}, {"hour", 9}, {"min", 30}, {"sec", 0}}), "");
    const std::string now = Now();
    EXPECT_GE(now, "2031-07-14T09:30:00Z");
    EXPECT_LT(now, "2031-07-14T09:31:00Z");
    EXPECT_LT(std::labs(time(nullptr) - machine_before), 60) << "the machine's clock must not move";
    const long long offset = json::parse(host_.host().Export())["clock"]["offset_us"];
    EXPECT_NEAR(static_cast<double>(offset), (Utc(2031, 7, 14, 9, 30, 0) - machine_before) * 1e6, 60e6);
    EXPECT_EQ(host_.host().Journal().back().operation, "NorlithCtl::Os::Env::SetTimeOfDay");

    EXPECT_EQ(Set({{"year", 9999}}), "Unable to set time: Invalid argument");
    EXPECT_EQ(Set({{"year", 2147483647}, {"month", 12}, {"day", 31}, {"hour", 24}}),
              "Unable to set time: Invalid argument");
    EXPECT_EQ(json::parse(host_.host().Export())["clock"]["offset_us"], offset);
}

// A broken-down time that has no time_t (mktime gives -1) is refused before the clock is set.
TEST_F(TimeTest, ATimeWithoutASecondsCountIsInvalid) {
    struct NoTime : StoppedClock {
        NoTime() : StoppedClock(kApril30) {}
        time_t MakeTime(struct tm*) override { return static_cast<time_t>(-1); }
    } clock;
    EXPECT_EQ(Set({{"hour", 1}}), "Invalid time");
    EXPECT_TRUE(clock.set.empty());
}

TEST_F(TimeTest, UptimeCountsFromTheLastBootInMicrosecondsAndRestartsAtAReboot) {
    // The default host has been up 2 days, 3 hours and 17 minutes.
    const long long up = ((2 * 24 + 3) * 60 + 17) * 60LL * 1000000;
    long long uptime = Uptime();
    EXPECT_GE(uptime, up);
    EXPECT_LT(uptime, up + 60LL * 1000000);

    host_.host().Init(R"({"format": 1, "boot": {"booted_at": "2020-02-29T12:00:00Z"}})", true);
    const long long since = (simhost::MachineNowMicros() - *simhost::ParseUtc("2020-02-29T12:00:00Z"));
    EXPECT_NEAR(static_cast<double>(Uptime()), static_cast<double>(since), 60e6);

    // Setting the host's time does not change how long it has been up.
    EXPECT_EQ(Set({{"year", 1999 + 40}}), "");
    EXPECT_NEAR(static_cast<double>(Uptime()), static_cast<double>(since), 60e6);

    ASSERT_EQ(NorlithCtl::Os::Env::Default()->Kill(1, SIGTERM), 0);
    uptime = Uptime();
    EXPECT_GE(uptime, 0);
    EXPECT_LT(uptime, 60LL * 1000000);
}

}  // namespace

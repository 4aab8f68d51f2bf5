#include <simhost/Host.h>

#include <simhost/State.h>
#include <simhost/Scenario.h>
#include <simhost/Store.h>

#include <cstdlib>
#include <filesystem>

#include <cerrno>

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

namespace simhost {

// Generated at build time from scenarios/default.json.
extern const char kDefaultScenarioText[];
extern const std::size_t kDefaultScenarioSize;

const std::string& DefaultScenario() {
    static const std::string text(kDefaultScenarioText, kDefaultScenarioSize);
    return text;
}

Host Host::FromEnvironment() { return Host(StateDirFromEnvironment()); }

std::string Host::Root() const { return RootPath(dir_); }

bool Host::Exists() const { return access(DatabasePath(dir_).c_str(), F_OK) == 0; }

void Host::Init(const std::string& scenario_text, bool replace) {
    Scenario scenario = ParseScenario(scenario_text);
    InitHost(dir_, scenario, replace ? InitMode::Replace : InitMode::CreateOnly);
}

void Host::Check() {
    Session session = Session::Open(dir_);
    CheckIntegrity(session.db());
}

namespace {

// A shared lock on DIR/host.lock for as long as it lives: a host is created or replaced under
// the exclusive one, so a reader holding it sees root/ whole, never one being switched or
// removed. Without a lock file (no host was ever made there) it holds nothing.
class ReaderLock {
public:
    explicit ReaderLock(const std::string& dir)
        : fd_(open((dir + "/host.lock").c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW)) {
        if (fd_ >= 0)
            while (flock(fd_, LOCK_SH) != 0 && errno == EINTR) {
            }
    }
    ~ReaderLock() {
        if (fd_ >= 0) close(fd_);
    }
    ReaderLock(const ReaderLock&) = delete;
    ReaderLock& operator=(const ReaderLock&) = delete;

private:
    int fd_;
};

}  // namespace

std::string Host::Export() {
    Session session = Session::Open(dir_);
    ReaderLock files(dir_);  // the database snapshot and root/ of one and the same host
    ReadTxn snapshot(session.db());
    Scenario scenario;
    for (const Domain* domain : Domains())
        scenario.sections.push_back(domain->Read(session.db(), RootPath(dir_)));
    scenario.faults = ReadFaults(session.db());
    return ScenarioText(scenario);
}

namespace {

// Runs change(db) on the host in dir in one write transaction.
template <class Change>
void WriteHost(const std::string& dir, Change change) {
    Session session = Session::Open(dir);
    WriteTxn txn(session.db());
    change(session.db());
    txn.Commit();
}

}  // namespace

void Host::AddFault(const std::string& operation, const std::string& message,
                    std::optional<std::int64_t> times, Event event) {
    Fault fault{operation, message, times, std::move(event)};
    std::string problem = CheckFault(fault);
    if (!problem.empty()) throw HostError(problem);
    WriteHost(dir_, [&](Db& db) { StoreFault(db, fault); });
}

std::vector<Fault> Host::Faults() {
    Session session = Session::Open(dir_);
    return ReadFaults(session.db());
}

void Host::ClearFaults() { WriteHost(dir_, DeleteFaults); }

void Host::ClearFault(const std::string& operation) {
    if (!IsKnownOperation(operation)) throw HostError("unknown operation '" + operation + "'");
    bool removed = false;
    WriteHost(dir_, [&](Db& db) { removed = DeleteFault(db, operation); });
    if (!removed) throw HostError("no fault is set on '" + operation + "'");
}

std::vector<JournalEntry> Host::Journal(std::optional<std::int64_t> last) {
    Session session = Session::Open(dir_);
    return ReadJournal(session.db(), last);
}

void Host::ClearJournal() { WriteHost(dir_, DeleteJournal); }

namespace {

// The last `last` items of a log (all of them without a limit).
template <class Entry>
std::vector<Entry> LastEntries(const std::string& dir, std::optional<std::int64_t> last) {
    Session session = Session::Open(dir);
    std::vector<Entry> entries = Items<Entry>(session.db()).All();
    if (last && *last >= 0 && static_cast<std::size_t>(*last) < entries.size())
        entries.erase(entries.begin(), entries.end() - static_cast<std::ptrdiff_t>(*last));
    return entries;
}

}  // namespace

std::vector<syslog::Entry> Host::SystemLog(std::optional<std::int64_t> last) {
    return LastEntries<syslog::Entry>(dir_, last);
}

std::vector<observations::Entry> Host::ObservationLog(std::optional<std::int64_t> last) {
    return LastEntries<observations::Entry>(dir_, last);
}

namespace {

std::string MakeTempDir() {
    const char* tmp = std::getenv("TMPDIR");
    std::string pattern = std::string(tmp && *tmp ? tmp : "/tmp") + "/simhost-XXXXXX";
    if (!mkdtemp(pattern.data())) throw HostError("cannot create a temporary directory");
    return pattern;
}

std::optional<std::string> Environment(const char* name) {
    const char* value = std::getenv(name);
    if (!value) return std::nullopt;
    return std::string(value);
}

}  // namespace

TempHost::TempHost(const std::string& scenario_text)
    : base_(MakeTempDir()), saved_env_(Environment("QUARN_HOST_STATE")), host_(base_ + "/host") {
    try {
        host_.Init(scenario_text);
    } catch (...) {
        std::error_code ignored;
        std::filesystem::remove_all(base_, ignored);
        throw;
    }
    setenv("QUARN_HOST_STATE", host_.Dir().c_str(), 1);
}

TempHost::~TempHost() {
    CloseHost();
    if (saved_env_)
        setenv("QUARN_HOST_STATE", saved_env_->c_str(), 1);
    else
        unsetenv("QUARN_HOST_STATE");
    std::error_code ignored;
    std::filesystem::remove_all(base_, ignored);
}

}  // namespace simhost

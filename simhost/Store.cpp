#include <simhost/Store.h>

#include <simhost/State.h>
#include <simhost/Host.h>

#include <sqlite3.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <vector>

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

namespace simhost {
namespace {

// "QNHS": marks a database as a simulated host, whatever its schema version.
constexpr std::int32_t kApplicationId = 0x514E4853;

// Tables that belong to no domain: faults and the journal.
const char* const kCoreSchema =
    "CREATE TABLE faults ("
    " operation TEXT PRIMARY KEY, message TEXT NOT NULL, remaining INTEGER,"
    " event TEXT NOT NULL DEFAULT '') WITHOUT ROWID;"
    "CREATE TABLE journal ("
    " sequence INTEGER PRIMARY KEY AUTOINCREMENT, time TEXT NOT NULL, kind TEXT NOT NULL,"
    " operation TEXT NOT NULL, arguments TEXT NOT NULL);";

const std::string& FullSchema() {
    static const std::string schema = [] {
        return std::string(kCoreSchema) + store::Schema();
    }();
    return schema;
}

struct Connection {
    std::string dir;
    pid_t pid;
    std::unique_ptr<Db> db;
};

std::recursive_mutex& Mutex() {
    static std::recursive_mutex mutex;
    return mutex;
}

std::unique_ptr<Connection>& Current() {
    static std::unique_ptr<Connection> current;
    return current;
}

// Connections inherited across fork(): the child must neither use nor close them (closing could
// disturb the parent's WAL files), so they are kept, unused, until the process ends.
std::vector<std::unique_ptr<Connection>>& Inherited() {
    static std::vector<std::unique_ptr<Connection>> inherited;
    return inherited;
}

[[noreturn]] void CannotOpen(const std::string& dir, const std::string& reason) {
    throw HostError("Cannot open the simulated host at '" + dir + "': " + reason);
}

bool FileExists(const std::string& path) { return access(path.c_str(), F_OK) == 0; }

void MakeDirectory(const std::string& dir, const std::string& path) {
    std::error_code error;
    std::filesystem::create_directories(path, error);
    if (error) CannotOpen(dir, "cannot create '" + path + "': " + error.message());
}

// An exclusive lock on DIR/host.lock, held while a host is created or replaced.
class CreationLock {
public:
    explicit CreationLock(const std::string& dir) {
        std::string path = dir + "/host.lock";
        fd_ = open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0644);
        if (fd_ < 0) CannotOpen(dir, "cannot open '" + path + "': " + std::strerror(errno));
        while (flock(fd_, LOCK_EX) != 0) {
            if (errno != EINTR) {
                int error = errno;
                close(fd_);
                CannotOpen(dir, "cannot lock '" + path + "': " + std::strerror(error));
            }
        }
    }
    ~CreationLock() { close(fd_); }
    CreationLock(const CreationLock&) = delete;
    CreationLock& operator=(const CreationLock&) = delete;

private:
    int fd_ = -1;
};

std::unique_ptr<Db> OpenDatabase(const std::string& dir, bool any_schema) {
    std::string path = DatabasePath(dir);
    std::unique_ptr<Db> db;
    try {
        db = std::make_unique<Db>(path);
    } catch (const HostError& error) {
        CannotOpen(dir, error.what());
    }
    sqlite3_busy_timeout(db->Handle(), 10000);
    // Keep the WAL file between processes: no file creation and removal per invocation.
    int persist = 1;
    sqlite3_file_control(db->Handle(), "main", SQLITE_FCNTL_PERSIST_WAL, &persist);
    std::int64_t application_id = 0;
    std::int64_t version = 0;
    try {
        application_id = db->QueryInt("PRAGMA application_id");
        version = db->QueryInt("PRAGMA user_version");
    } catch (const HostError&) {
        CannotOpen(dir, "'" + path + "': " + sqlite3_errmsg(db->Handle()));
    }
    if (application_id != kApplicationId)
        CannotOpen(dir, "'" + path + "' is not a simulated host database");
    if (!any_schema && version != SchemaVersion())
        CannotOpen(dir, "its database has schema version " + std::to_string(version) +
                            " but this build uses " + std::to_string(SchemaVersion()) +
                            "; recreate it with 'quarnhost init --force'");
    // WAL with NORMAL keeps every committed transaction across a killed process.
    db->Exec("PRAGMA synchronous=NORMAL");
    return db;
}

void WriteState(Db& db, const Scenario& scenario, const std::string& root) {
    WriteContext context{db, root};
    for (const auto& section : scenario.sections) section->Write(context);
    for (const Fault& fault : scenario.faults) StoreFault(db, fault);
}

void SyncDirectory(const std::string& dir) {
    int fd = open(dir.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (fd >= 0) {
        fsync(fd);
        close(fd);
    }
}

// A fresh, empty directory beside root/ that a new state's files are written into before it
// takes root/'s place.
std::string PrepareRoot(const std::string& dir) {
    std::string staged = RootPath(dir) + ".new";
    std::error_code ignored;
    std::filesystem::remove_all(staged, ignored);
    MakeDirectory(dir, staged);
    return staged;
}

// Puts the staged root in root/'s place; the previous root/ is removed.
void SwapRoot(const std::string& dir, const std::string& staged) {
    std::string root = RootPath(dir);
    std::string old = root + ".old";
    std::error_code ignored;
    std::filesystem::remove_all(old, ignored);
    if (std::rename(root.c_str(), old.c_str()) != 0 && errno != ENOENT)
        CannotOpen(dir, "cannot replace '" + root + "': " + std::strerror(errno));
    if (std::rename(staged.c_str(), root.c_str()) != 0) {
        int error = errno;
        std::rename(old.c_str(), root.c_str());
        CannotOpen(dir, "cannot replace '" + root + "': " + std::strerror(error));
    }
    std::filesystem::remove_all(old, ignored);
}

// Builds the host under a temporary name and renames it into place; the caller holds the
// creation lock and has seen that no host.db exists.
void CreateNew(const std::string& dir, const Scenario& scenario) {
    std::string path = DatabasePath(dir);
    std::string temporary = path + ".new";
    for (const char* suffix : {"", "-journal", "-wal", "-shm"}) std::remove((temporary + suffix).c_str());
    std::string staged_root = PrepareRoot(dir);
    try {
        Db db(temporary, true);
        db.Exec("PRAGMA application_id=" + std::to_string(kApplicationId) + ";" +
                "PRAGMA user_version=" + std::to_string(SchemaVersion()) + ";" +
                "PRAGMA journal_mode=WAL;");
        WriteTxn txn(db);
        db.Exec(FullSchema());
        WriteState(db, scenario, staged_root);
        txn.Commit();
    } catch (const HostError& error) {
        std::remove(temporary.c_str());
        std::error_code ignored;
        std::filesystem::remove_all(staged_root, ignored);
        CannotOpen(dir, error.what());
    }
    // WAL files left by a host that was removed would be replayed into the new one.
    std::remove((path + "-wal").c_str());
    std::remove((path + "-shm").c_str());
    SwapRoot(dir, staged_root);
    if (std::rename(temporary.c_str(), path.c_str()) != 0) {
        int error = errno;
        std::remove(temporary.c_str());
        CannotOpen(dir, "cannot rename '" + temporary + "': " + std::strerror(error));
    }
    SyncDirectory(dir);
}

// Replaces an existing host's whole state, schema included, in one write transaction.
void ReplaceExisting(const std::string& dir, const Scenario& scenario) {
    std::unique_ptr<Db> db = OpenDatabase(dir, true);
    std::string staged_root = PrepareRoot(dir);
    try {
    WriteTxn txn(*db);
    std::vector<std::pair<std::string, std::string>> objects;
    {
        Query select = db->Cached(
            "SELECT type, name FROM sqlite_master WHERE type IN ('table', 'view', 'trigger') "
            "AND name NOT LIKE 'sqlite_%'");
        while (select->Step()) objects.emplace_back(select->Text(0), select->Text(1));
    }
    for (const auto& [type, name] : objects) {
        if (type == "table")
            db->Exec("DROP TABLE IF EXISTS \"" + name + "\"");
        else if (type == "view")
            db->Exec("DROP VIEW IF EXISTS \"" + name + "\"");
        else
            db->Exec("DROP TRIGGER IF EXISTS \"" + name + "\"");
    }
    db->Exec("DELETE FROM sqlite_sequence");
    db->Exec(FullSchema());
    WriteState(*db, scenario, staged_root);
    db->Exec("PRAGMA user_version=" + std::to_string(SchemaVersion()));
    txn.Commit();
    } catch (...) {
        std::error_code ignored;
        std::filesystem::remove_all(staged_root, ignored);
        throw;
    }
    SwapRoot(dir, staged_root);
}

}  // namespace

std::string StateDirFromEnvironment() {
    const char* state = std::getenv("QUARN_HOST_STATE");
    if (state && *state) return state;
    const char* xdg = std::getenv("XDG_STATE_HOME");
    if (xdg && xdg[0] == '/') return std::string(xdg) + "/quarncli/host";
    const char* home = std::getenv("HOME");
    if (home && *home) return std::string(home) + "/.local/state/quarncli/host";
    throw HostError(
        "Cannot locate the simulated host: none of QUARN_HOST_STATE, XDG_STATE_HOME and HOME is set");
}

std::string DatabasePath(const std::string& dir) { return dir + "/host.db"; }

std::string RootPath(const std::string& dir) { return dir + "/root"; }

std::int32_t SchemaVersion() {
    static const std::int32_t version = [] {
        std::uint32_t hash = 2166136261u;  // FNV-1a
        std::string shape = FullSchema();
        for (const Domain* domain : Domains()) shape += std::string(domain->Name()) + domain->Shape();
        for (unsigned char c : shape) hash = (hash ^ c) * 16777619u;
        return static_cast<std::int32_t>((hash & 0x7FFFFFFFu) | 1u);
    }();
    return version;
}

bool InitHost(const std::string& dir, const Scenario& scenario, InitMode mode) {
    std::lock_guard<std::recursive_mutex> guard(Mutex());
    MakeDirectory(dir, dir);
    CreationLock lock(dir);
    if (!FileExists(DatabasePath(dir))) {
        CreateNew(dir, scenario);
        return true;
    }
    if (mode == InitMode::OpenOrCreate) return false;
    if (mode == InitMode::CreateOnly)
        throw HostExists("A simulated host already exists at '" + dir + "'");
    CloseHost();
    ReplaceExisting(dir, scenario);
    return true;
}

Session Session::Open(const std::string& dir) {
    std::unique_lock<std::recursive_mutex> lock(Mutex());
    auto& current = Current();
    if (current && current->pid != getpid()) Inherited().push_back(std::move(current));
    if (!current || current->dir != dir) {
        current.reset();
        if (!FileExists(DatabasePath(dir)))
            InitHost(dir, ParseScenario(DefaultScenario()), InitMode::OpenOrCreate);
        current = std::make_unique<Connection>(Connection{dir, getpid(), OpenDatabase(dir, false)});
    }
    return Session(std::move(lock), current->db.get(), &current->dir);
}

Session Session::OpenCurrent() { return Open(StateDirFromEnvironment()); }

void CloseHost() {
    std::lock_guard<std::recursive_mutex> lock(Mutex());
    auto& current = Current();
    if (current && current->pid != getpid()) Inherited().push_back(std::move(current));
    current.reset();
}

}  // namespace simhost

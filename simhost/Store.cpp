#include <simhost/Store.h>

#include <simhost/State.h>
#include <simhost/Host.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <vector>

#include <errno.h>
#include <fcntl.h>
#include <stdio.h>
#include <sys/stat.h>
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

// Refusals inside the store carry their reason only; the public entry points add the host's
// directory (InContext).
[[noreturn]] void Refuse(const std::string& reason) { throw HostError(reason); }

// Runs body, turning its refusals into "Cannot open the simulated host at 'DIR': REASON" (a
// damaged database stays HostDamaged; HostExists has its own text).
template <class Body>
auto InContext(const std::string& dir, Body body) {
    std::string prefix = "Cannot open the simulated host at '" + dir + "': ";
    try {
        return body();
    } catch (const HostError& error) {
        if (error.code() == HostError::Code::kExists) throw;
        throw HostError(prefix + error.what(), error.code() == HostError::Code::kDamaged
                                                   ? HostError::Code::kDamaged
                                                   : HostError::Code::kFailed);
    }
}

std::string Quoted(const std::string& path) { return "'" + path + "'"; }

// What is at path, its symbolic link not followed.
enum class Entry { Missing, Directory, File, Link, Other };

Entry Inspect(const std::string& path) {
    struct stat info {};
    if (lstat(path.c_str(), &info) != 0) {
        if (errno == ENOENT) return Entry::Missing;
        Refuse("cannot inspect " + Quoted(path) + ": " + std::strerror(errno));
    }
    if (S_ISLNK(info.st_mode)) return Entry::Link;
    if (S_ISDIR(info.st_mode)) return Entry::Directory;
    return S_ISREG(info.st_mode) ? Entry::File : Entry::Other;
}

// DIR/root, when present, must be a directory of its own: the host's files never lead out of it.
void CheckRoot(const std::string& dir) {
    std::string root = RootPath(dir);
    Entry entry = Inspect(root);
    if (entry == Entry::Link) Refuse(Quoted(root) + " is a symbolic link");
    if (entry != Entry::Missing && entry != Entry::Directory)
        Refuse(Quoted(root) + " is not a directory");
}

// Creates dir and its missing parents, each private to its owner (the host's state is nobody
// else's business). An existing directory is left as it is.
void MakeStateDir(const std::string& dir) {
    struct stat info {};
    if (stat(dir.c_str(), &info) == 0 && S_ISDIR(info.st_mode)) return;
    for (std::size_t next = dir.find('/', 1);; next = dir.find('/', next + 1)) {
        std::string prefix = dir.substr(0, next);
        if (mkdir(prefix.c_str(), 0700) != 0 && errno != EEXIST)
            Refuse("cannot create " + Quoted(prefix) + ": " + std::strerror(errno));
        if (next == std::string::npos) break;
    }
    if (stat(dir.c_str(), &info) != 0 || !S_ISDIR(info.st_mode))
        Refuse(Quoted(dir) + " is not a directory");
}

// A file descriptor closed on every path.
class Fd {
public:
    explicit Fd(int fd) : fd_(fd) {}
    ~Fd() {
        if (fd_ >= 0) close(fd_);
    }
    Fd(const Fd&) = delete;
    Fd& operator=(const Fd&) = delete;
    int get() const { return fd_; }

private:
    int fd_;
};

// An exclusive lock on DIR/host.lock, held while a host is created or replaced.
class CreationLock {
public:
    explicit CreationLock(const std::string& dir)
        : fd_(open((dir + "/host.lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600)) {
        std::string path = dir + "/host.lock";
        if (fd_.get() < 0) {
            if (errno == ELOOP) Refuse(Quoted(path) + " is a symbolic link");
            Refuse("cannot open " + Quoted(path) + ": " + std::strerror(errno));
        }
        struct stat info {};
        if (fstat(fd_.get(), &info) != 0 || !S_ISREG(info.st_mode))
            Refuse(Quoted(path) + " is not a regular file");
        while (flock(fd_.get(), LOCK_EX) != 0)
            if (errno != EINTR)
                Refuse("cannot lock " + Quoted(path) + ": " + std::strerror(errno));
    }
    CreationLock(const CreationLock&) = delete;
    CreationLock& operator=(const CreationLock&) = delete;

private:
    Fd fd_;  // closing it releases the lock
};

// Refuses DIR/host.db unless it is a regular file that starts with a SQLite header carrying our
// application id, reading it without SQLite: SQLite would write into a foreign database it
// opens (rolling back a hot journal, checkpointing a WAL when the connection closes) and leave
// -wal and -shm files beside it. Its journal, -wal and -shm files must not be symbolic links
// either.
void CheckDatabaseFile(const std::string& dir) {
    std::string path = DatabasePath(dir);
    Fd fd(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
    if (fd.get() < 0) {
        if (errno == ELOOP) Refuse(Quoted(path) + " is a symbolic link");
        Refuse("cannot open " + Quoted(path) + ": " + std::strerror(errno));
    }
    struct stat info {};
    if (fstat(fd.get(), &info) != 0 || !S_ISREG(info.st_mode))
        Refuse(Quoted(path) + " is not a regular file");
    unsigned char header[100];
    ssize_t size;
    do {
        size = pread(fd.get(), header, sizeof header, 0);
    } while (size < 0 && errno == EINTR);
    if (size < 0) Refuse("cannot read " + Quoted(path) + ": " + std::strerror(errno));
    // An empty file would be taken by SQLite for a new, empty database: not a host either.
    if (size == 0) Refuse(Quoted(path) + " is not a simulated host database");
    static const char kMagic[] = "SQLite format 3";  // with its NUL: 16 bytes
    if (size < static_cast<ssize_t>(sizeof header) || std::memcmp(header, kMagic, sizeof kMagic) != 0)
        Refuse(Quoted(path) + ": file is not a database");
    std::uint32_t id = (std::uint32_t{header[68]} << 24) | (std::uint32_t{header[69]} << 16) |
                       (std::uint32_t{header[70]} << 8) | std::uint32_t{header[71]};
    if (id != static_cast<std::uint32_t>(kApplicationId))
        Refuse(Quoted(path) + " is not a simulated host database");
    for (const char* suffix : {"-journal", "-wal", "-shm"})
        if (Inspect(path + suffix) == Entry::Link)
            Refuse(Quoted(path + suffix) + " is a symbolic link");
}

// dir with every symbolic link resolved, so that SQLite can refuse links below it.
std::string ResolvedDir(const std::string& dir) {
    std::unique_ptr<char, decltype(&std::free)> resolved(realpath(dir.c_str(), nullptr), &std::free);
    if (!resolved) Refuse("cannot resolve " + Quoted(dir) + ": " + std::strerror(errno));
    return resolved.get();
}

std::unique_ptr<Db> OpenDatabase(const std::string& dir, bool any_schema, Db::Mode mode) {
    CheckDatabaseFile(dir);
    auto db = std::make_unique<Db>(DatabasePath(ResolvedDir(dir)), mode, true, DatabasePath(dir));
    std::int64_t version = db->QueryInt("PRAGMA user_version");
    if (!any_schema && version != SchemaVersion())
        Refuse("its database has schema version " + std::to_string(version) +
                            " but this build uses " + std::to_string(SchemaVersion()) +
                            "; recreate it with 'quarnhost init --force'");
    return db;
}

// Stores the scenario's state into an empty host: the database (inside the caller's write
// transaction) and the files it puts under root/ (into the staged root).
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

void RemoveTree(const std::string& path) {
    std::error_code ignored;
    std::filesystem::remove_all(path, ignored);
}

// The next root/ of a host being created or replaced, prepared as DIR/root.new and then
// switched with DIR/root in one rename. Whatever is left at DIR/root.new on destruction (the
// staged root when it was never installed or was taken back, the previous root once installed)
// is removed.
class StagedRoot {
public:
    explicit StagedRoot(const std::string& dir) : root_(RootPath(dir)), staged_(root_ + ".new") {
        RemoveTree(staged_);  // left by a process killed while replacing a host
        if (mkdir(staged_.c_str(), 0755) != 0)
            Refuse("cannot create " + Quoted(staged_) + ": " + std::strerror(errno));
    }
    ~StagedRoot() { RemoveTree(staged_); }
    StagedRoot(const StagedRoot&) = delete;
    StagedRoot& operator=(const StagedRoot&) = delete;

    const std::string& Path() const { return staged_; }

    // Puts the staged root in place of DIR/root, atomically; the previous root, if any, is then
    // at Path().
    void Install() {
        bool existed = Inspect(root_) != Entry::Missing;
        unsigned flags = existed ? RENAME_EXCHANGE : RENAME_NOREPLACE;
        if (renameat2(AT_FDCWD, staged_.c_str(), AT_FDCWD, root_.c_str(), flags) != 0)
            Refuse("cannot replace " + Quoted(root_) + ": " + std::strerror(errno));
        installed_ = existed ? Installed::Exchanged : Installed::Moved;
    }

    // Takes an installed root back, restoring the previous one (best effort: this runs on a
    // failure path already).
    void Undo() {
        if (installed_ == Installed::Exchanged)
            renameat2(AT_FDCWD, staged_.c_str(), AT_FDCWD, root_.c_str(), RENAME_EXCHANGE);
        else if (installed_ == Installed::Moved)
            renameat2(AT_FDCWD, root_.c_str(), AT_FDCWD, staged_.c_str(), RENAME_NOREPLACE);
        installed_ = Installed::No;
    }

private:
    enum class Installed { No, Moved, Exchanged };
    std::string root_, staged_;
    Installed installed_ = Installed::No;
};

// Builds a complete host database at path (removing any previous file there), its files going
// to the staged root.
void BuildDatabase(const std::string& path, const Scenario& scenario, const StagedRoot& root) {
    for (const char* suffix : {"", "-journal", "-wal", "-shm"}) std::remove((path + suffix).c_str());
    Db db(path, Db::Mode::Create);
    db.Exec("PRAGMA application_id=" + std::to_string(kApplicationId) + ";" +
            "PRAGMA user_version=" + std::to_string(SchemaVersion()));
    WriteTxn txn(db);
    db.Exec(FullSchema());
    WriteState(db, scenario, root.Path());
    txn.Commit();
}

// Builds the host under temporary names and switches it into place; the caller holds the
// creation lock. Used when no host.db exists, and to replace a damaged one.
void CreateNew(const std::string& dir, const Scenario& scenario) {
    std::string path = DatabasePath(dir);
    std::string temporary = path + ".new";
    StagedRoot root(dir);
    try {
        BuildDatabase(temporary, scenario, root);
    } catch (const HostError&) {
        std::remove(temporary.c_str());
        throw;
    }
    // WAL files left by a previous database would be replayed into the new one.
    std::remove((path + "-wal").c_str());
    std::remove((path + "-shm").c_str());
    root.Install();
    if (std::rename(temporary.c_str(), path.c_str()) != 0) {
        int error = errno;
        root.Undo();
        std::remove(temporary.c_str());
        Refuse("cannot rename " + Quoted(temporary) + ": " + std::strerror(error));
    }
    SyncDirectory(dir);
}

// Empties the database's schema inside the caller's transaction.
void DropEverything(Db& db) {
    std::vector<std::pair<std::string, std::string>> objects;
    {
        Query select = db.Cached(
            "SELECT type, name FROM sqlite_master WHERE type IN ('table', 'view', 'trigger') "
            "AND name NOT LIKE 'sqlite_%'");
        while (select->Step()) objects.emplace_back(select->Text(0), select->Text(1));
    }
    for (const auto& [type, name] : objects) {
        if (type == "table")
            db.Exec("DROP TABLE IF EXISTS \"" + name + "\"");
        else if (type == "view")
            db.Exec("DROP VIEW IF EXISTS \"" + name + "\"");
        else
            db.Exec("DROP TRIGGER IF EXISTS \"" + name + "\"");
    }
    db.Exec("DELETE FROM sqlite_sequence");
}

// Replaces an existing host's whole state, schema included, in one write transaction, and its
// root/ with it; a damaged database is rebuilt instead.
void ReplaceExisting(const std::string& dir, const Scenario& scenario) {
    std::unique_ptr<Db> db;
    try {
        db = OpenDatabase(dir, true, Db::Mode::ReadWrite);
        CheckIntegrity(*db);
    } catch (const HostError& error) {
        if (error.code() != HostError::Code::kDamaged) throw;
        db.reset();
        CreateNew(dir, scenario);
        return;
    }
    StagedRoot root(dir);
    WriteTxn txn(*db);
    DropEverything(*db);
    db->Exec(FullSchema());
    WriteState(*db, scenario, root.Path());
    db->Exec("PRAGMA user_version=" + std::to_string(SchemaVersion()));
    // The last step that can fail is the commit, and it is the only one that cannot be taken
    // back: the root switch comes just before it and is undone when the commit fails.
    root.Install();
    try {
        txn.Commit();
    } catch (...) {
        root.Undo();
        throw;
    }
}

// Says where a host was created on first use, so that a mistyped state directory is noticed.
void AnnounceCreation(const std::string& dir) {
    std::fprintf(stderr, "%s: created a new simulated host at '%s' from the default scenario\n",
                 program_invocation_short_name, dir.c_str());
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

namespace {
std::int32_t given_schema_version = 0;
}

void UseSchemaVersion(std::int32_t version) { given_schema_version = version; }

std::int32_t SchemaVersion() {
    return given_schema_version != 0 ? given_schema_version : DerivedSchemaVersion();
}

// Deriving it visits every domain's description, touching code all over the library: a tenth
// of a short read's start-up, which is why quarncli takes the value derived at build time.
std::int32_t DerivedSchemaVersion() {
    static const std::int32_t version = [] {
        std::uint32_t hash = 2166136261u;  // FNV-1a
        std::string shape = FullSchema();
        for (const Domain* domain : Domains()) shape += std::string(domain->Name()) + domain->Shape();
        for (unsigned char c : shape) hash = (hash ^ c) * 16777619u;
        return static_cast<std::int32_t>((hash & 0x7FFFFFFFu) | 1u);
    }();
    return version;
}

namespace {

// InitHost without the directory in its messages; the caller holds Mutex().
bool InitHostHere(const std::string& dir, const Scenario& scenario, InitMode mode) {
    MakeStateDir(dir);
    CreationLock lock(dir);
    CheckRoot(dir);
    Entry database = Inspect(DatabasePath(dir));
    if (database == Entry::Link) Refuse(Quoted(DatabasePath(dir)) + " is a symbolic link");
    if (database == Entry::Missing) {
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

}  // namespace

bool InitHost(const std::string& dir, const Scenario& scenario, InitMode mode) {
    std::lock_guard<std::recursive_mutex> guard(Mutex());
    return InContext(dir, [&] { return InitHostHere(dir, scenario, mode); });
}

void CheckIntegrity(Db& db) {
    Query check = db.Cached("PRAGMA quick_check(1)");
    std::string result = check->Step() ? check->Text(0) : "no result from the integrity check";
    // The first problem, without the line that names the schema ("*** in database main ***").
    if (result.rfind("***", 0) == 0 && result.find('\n') != std::string::npos)
        result.erase(0, result.find('\n') + 1);
    if (result != "ok") db.Damaged(result);
}

Session Session::Open(const std::string& dir) {
    std::unique_lock<std::recursive_mutex> lock(Mutex());
    auto& current = Current();
    if (current && current->pid != getpid()) Inherited().push_back(std::move(current));
    if (!current || current->dir != dir) {
        current.reset();
        InContext(dir, [&] {
            if (Inspect(DatabasePath(dir)) == Entry::Missing &&
                InitHostHere(dir, ParseScenario(DefaultScenario()), InitMode::OpenOrCreate))
                AnnounceCreation(dir);
            CheckRoot(dir);
            current = std::make_unique<Connection>(
                Connection{dir, getpid(), OpenDatabase(dir, false, Db::Mode::ReadOnly)});
        });
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

// The least a process shaped like quarncli does, as a reference for bench/latency.sh: it carries
// the C++ runtime and exports it (as quarncli does for its plug-ins), opens the plug-in file it is
// given with lazy binding, and reads one value of a host database with SQLite, read-only. What
// quarncli costs above it is the framework, the plug-in's registration and the host layer.
//   bench_startup_floor HOST_DB [PLUGIN]
#include <sqlite3.h>

#include <dlfcn.h>

#include <cstdio>
#include <string>

int main(int argc, char** argv) {
    if (argc < 2) {
        std::fprintf(stderr, "usage: bench_startup_floor HOST_DB [PLUGIN]\n");
        return 2;
    }
    if (argc > 2 && !dlopen(argv[2], RTLD_LAZY)) {
        std::fprintf(stderr, "bench_startup_floor: %s\n", dlerror());
        return 1;
    }
    sqlite3* db = nullptr;
    if (sqlite3_open_v2(argv[1], &db, SQLITE_OPEN_READONLY, nullptr) != SQLITE_OK) {
        std::fprintf(stderr, "bench_startup_floor: cannot open %s\n", argv[1]);
        sqlite3_close(db);
        return 1;
    }
    sqlite3_stmt* read = nullptr;
    std::string value;
    const char* sql = "SELECT value FROM state LIMIT 1";
    if (sqlite3_prepare_v2(db, sql, -1, &read, nullptr) == SQLITE_OK && sqlite3_step(read) == SQLITE_ROW)
        value = reinterpret_cast<const char*>(sqlite3_column_text(read, 0));
    sqlite3_finalize(read);
    sqlite3_close(db);
    std::printf("%zu bytes\n", value.size());
    return value.empty() ? 1 : 0;
}

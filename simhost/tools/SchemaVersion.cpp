// Prints the schema version this build of the host library derives, as a header for programs
// that start often (cli/CMakeLists.txt): they then need not derive it at every start.
#include <simhost/Store.h>

#include <cstdio>

int main() {
    std::printf("// Generated at build time by simhost_schema_version.\n"
                "#pragma once\n"
                "#define QUARN_SCHEMA_VERSION %ld\n",
                static_cast<long>(simhost::DerivedSchemaVersion()));
    return std::ferror(stdout) ? 1 : 0;
}

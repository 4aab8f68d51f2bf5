// quarncli: the administration command line. All of its work is in kitbase_cli.
#include "cli/Cli.h"

#include <simhost/Store.h>

#include <SchemaVersion.h>

int main(int argc, char** argv) {
    // A command runs in a process of its own: the host schema version derived when this program
    // was built spares each run deriving it again.
    simhost::UseSchemaVersion(QUARN_SCHEMA_VERSION);
    return Kitbase::Cli::Main(argc, argv);
}

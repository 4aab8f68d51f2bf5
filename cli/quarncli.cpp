// quarncli: the administration command line. All of its work is in kitbase_cli.
#include "cli/Cli.h"

int main(int argc, char** argv) { return Kitbase::Cli::Main(argc, argv); }

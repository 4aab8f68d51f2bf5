// quarnhost: administers a simulated host; its logic lives in simhost_cli.
#include <simhost/cli/Quarnhost.h>

int main(int argc, char** argv) { return simhost::QuarnhostMain(argc, argv); }

// kelp-cmd: the host management tool of the simulated host (simhost/kelp/KelpCmd.h).
#include <simhost/kelp/KelpCmd.h>

#include <iostream>

int main(int argc, char** argv) { return simhost::kelp::Main(argc, argv, std::cout, std::cerr); }

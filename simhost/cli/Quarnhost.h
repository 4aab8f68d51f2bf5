// quarnhost: the administration program of the simulated host (create, export, faults, journal).
//
// QuarnhostMain is the whole program; cli/quarnhost.cpp only calls it. Results go to standard
// output; every refusal is one line on standard error. Exit status: 0 success, 1 failure (the
// host cannot be opened, a scenario is refused, a host exists), 2 usage error.
#pragma once

namespace simhost {

int QuarnhostMain(int argc, char** argv);

}  // namespace simhost

// quarnhost: the administration program of the simulated host (create, export, faults, journal).
//
// QuarnhostMain is the whole program; cli/quarnhost.cpp only calls it. Results go to standard
// output; every refusal is one line on standard error, "quarnhost: REASON". Exit status: 0
// success; 1 failure (the host cannot be located, opened or is damaged, a scenario is refused,
// a host exists, the output cannot be written); 2 usage error (with a pointer to the relevant
// --help).
#pragma once

namespace simhost {

int QuarnhostMain(int argc, char** argv);

}  // namespace simhost

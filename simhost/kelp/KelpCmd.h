// The host management tool of the simulated host, the program a host has as /bin/kelp-cmd: the
// host's services and administrators run it to act on the host (the maintenance-mode commands
// run it through NorlithCtl::Util::NorlithCtl_Exec).
//
//   kelp-cmd OPERATION [TIMEOUT]
//
//   hostsvc/maintenance_mode_enter [TIMEOUT]   puts the host in maintenance mode
//   hostsvc/maintenance_mode_exit [TIMEOUT]    takes it out of maintenance mode
//
// It acts on the host of QUARN_HOST_STATE (as every program of the host does; NorlithCtl_Exec
// sets it). A transition shows as "entering" or "exiting" while it takes the time the host
// needs (domain "maintenance": enter_seconds, exit_seconds; sleeps last the host's
// sleep_percent of it), then becomes "enabled" or "disabled". TIMEOUT is the most seconds the
// operation may take: a host that needs longer makes it give up after TIMEOUT seconds, with the
// state as it was before. 0 means no limit; without TIMEOUT the limit is 60 seconds; a negative
// or malformed TIMEOUT is a usage error. Asking for the state the host is already in succeeds
// and changes nothing. Each operation is a host operation of its own name (faultable,
// journaled).
//
// Exit statuses: 0 done; 1 failed (timed out, overtaken by another transition, a fault, a host
// that cannot be used), with one line on standard error; 2 a usage error.
#pragma once

#include <ostream>

namespace simhost {
namespace kelp {

// Runs the tool with argv[1..argc-1]; reports on out and err; returns the exit status.
int Main(int argc, char** argv, std::ostream& out, std::ostream& err);

}  // namespace kelp
}  // namespace simhost

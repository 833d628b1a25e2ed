// The unit as a whole: sets its surroundings up, keeps its service processes running and takes everything down again.
#pragma once

#include <string>

namespace bt::sim {

enum ExitCode { kExitDone = 0, kExitFailed = 1, kExitUsage = 2, kExitDomainTaken = 3 };

struct UnitOptions {
    std::string scenario_file; // absolute
    std::string root; // absolute
    int ready_fd = -1; // receives "ready\n" once; -1 for standard output
};

// Runs until SIGTERM or SIGINT. Returns the exit code.
int run_unit(const UnitOptions& options);

} // namespace bt::sim

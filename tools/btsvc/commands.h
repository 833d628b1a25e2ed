// The commands of btsvc: each adds itself to the command line and says what to run when it is chosen.
#pragma once

#include "btsvc/failure.h"
#include "btsvc/output.h"

#include <CLI/CLI.hpp>

#include <functional>

namespace bt::client {

struct Command {
    CLI::App* line;
    std::function<ExitCode(Output&)> run;
};

Command add_devices(CLI::App& program);
Command add_listen(CLI::App& program);
Command add_call(CLI::App& program);
Command add_status(CLI::App& program);

} // namespace bt::client

// btsvc: the command-line client of the Bluetooth service.
#include "btsvc/commands.h"
#include "btsvc/unit.h"

#include <csignal>
#include <cstdio>
#include <exception>
#include <string>
#include <vector>

#include <fcntl.h>
#include <unistd.h>

namespace {

using namespace bt::client;

constexpr const char* kDescription =
    "Calls the Bluetooth service of a unit, shows its events and looks after its state.";

constexpr const char* kFooter = R"(Examples:
  btsvc devices
  btsvc listen --all-connection --count 3 --timeout 30
  btsvc call CON_search 0 --wait
  btsvc --domain bench status --json

Environment: BT_PLATFORM_DOMAIN names the domain ("default" when unset), BT_SERVICE_ROOT the folder in front of the
unit's absolute paths.

Exit codes: 0 done; 1 the call was refused or its answer was negative; 2 usage; 3 no unit in the domain, or its
platform layer is unusable; 4 timed out; 5 the output could not be written; 6 interrupted by a signal.)";

// A standard descriptor that is closed would be taken by the next file or shared object opened, and output would go
// there. The stand-in cannot be written, so that output fails as it should.
void occupy_standard_descriptors()
{
    for (int fd = STDIN_FILENO; fd <= STDERR_FILENO; ++fd)
        if (::fcntl(fd, F_GETFD) < 0) ::open("/dev/null", O_RDONLY);
}

std::string failure_text(const CLI::App* program, const CLI::Error& error)
{
    const std::vector<std::string> unknown = program->remaining();
    const bool no_command = program->get_subcommands().empty() && !unknown.empty();
    return "btsvc: " + (no_command ? "\"" + unknown.front() + "\" is no command" : std::string(error.what())) +
           "; see `btsvc --help`\n";
}

void describe_global_options(CLI::App& line)
{
    line.footer(line.get_footer() +
                "\n\n--json, --domain NAME and --root DIR may stand before or behind the command; see "
                "`btsvc --help`.");
}

struct GlobalOptions {
    bool json = false;
    std::string domain;
    std::string root;
};

ExitCode run(CLI::App& program, const std::vector<Command>& commands, const GlobalOptions& options, int argc,
             char** argv)
{
    try {
        program.parse(argc, argv);
        select_unit(options.domain, options.root);
        Output output(options.json);
        for (const Command& command : commands)
            if (command.line->parsed()) return command.run(output);
        return kUsage;
    } catch (const CLI::ParseError& error) {
        return program.exit(error) == 0 ? kDone : kUsage;
    } catch (const Failure& failure) {
        if (*failure.what() != '\0') std::fprintf(stderr, "btsvc: %s\n", failure.what());
        return failure.code();
    } catch (const std::exception& error) {
        std::fprintf(stderr, "btsvc: %s\n", error.what());
        return kNoUnit;
    }
}

} // namespace

int main(int argc, char** argv)
{
    occupy_standard_descriptors();
    std::signal(SIGPIPE, SIG_IGN);

    CLI::App program(kDescription, "btsvc");
    program.footer(kFooter);
    program.require_subcommand(1);
    program.failure_message(failure_text);
    program.set_version_flag("--version", BTSVC_VERSION);

    GlobalOptions options;
    program.add_flag("--json", options.json, "Print one JSON object per line");
    program.add_option("--domain", options.domain, "Domain of the unit")->type_name("NAME");
    program.add_option("--root", options.root, "Folder in front of the unit's absolute paths")->type_name("DIR");

    const std::vector<Command> commands{add_devices(program), add_listen(program), add_call(program),
                                        add_status(program)};
    for (const Command& command : commands)
        describe_global_options(*command.line->fallthrough());
    return run(program, commands, options, argc, argv);
}

// btsvc-sim: a simulated Bluetooth unit on a desk.
#include "sim/json_reader.h"
#include "sim/service_process.h"
#include "sim/supervisor.h"

#include <CLI/CLI.hpp>
#include <fmt/format.h>

#include <cstdlib>
#include <filesystem>
#include <unistd.h>

namespace {

using namespace bt::sim;

struct Arguments {
    std::string scenario;
    std::string domain;
    std::string root;
    std::string service;
    int ready_fd = -1;
    bool check_only = false;
};

void describe(CLI::App& app, Arguments& arguments)
{
    app.add_option("-s,--scenario", arguments.scenario, "scenario file (JSON)")->required();
    app.add_option("-d,--domain", arguments.domain, "name under which the unit lives (BT_PLATFORM_DOMAIN)");
    app.add_option("-r,--root", arguments.root, "folder in front of the unit's absolute paths (BT_SERVICE_ROOT)");
    app.add_option("--ready-fd", arguments.ready_fd, "descriptor that receives \"ready\" instead of standard output");
    app.add_flag("--check", arguments.check_only, "check the scenario file and end");
    app.add_flag("--foreground", "stay in the foreground, which is what always happens");
    app.add_option("--service", arguments.service, "run one service process")->group("");
    app.footer("Ends on SIGTERM and Ctrl-C.\n"
               "Exit codes: 0 ended as told, 1 failed, 2 wrong arguments or scenario, 3 a unit runs in the domain.");
}

std::string root_folder(const Arguments& arguments, const std::string& domain)
{
    const char* const given = std::getenv("BT_SERVICE_ROOT");
    const std::string root = !arguments.root.empty() ? arguments.root
                             : given != nullptr && given[0] != 0
                                 ? given
                                 : fmt::format("/tmp/btsvc-sim-{}/{}", getuid(), domain);
    return std::filesystem::absolute(root).lexically_normal().string();
}

// Domain and root reach the service processes, and the platform layer of this one, through the environment.
UnitOptions prepare(const Arguments& arguments)
{
    const char* const given = std::getenv("BT_PLATFORM_DOMAIN");
    const std::string domain = !arguments.domain.empty() ? arguments.domain : given != nullptr ? given : "default";
    UnitOptions options;
    options.scenario_file = std::filesystem::absolute(arguments.scenario).string();
    options.root = root_folder(arguments, domain);
    options.ready_fd = arguments.ready_fd;
    setenv("BT_PLATFORM_DOMAIN", domain.c_str(), 1);
    setenv("BT_SERVICE_ROOT", options.root.c_str(), 1);
    return options;
}

int run(const Arguments& arguments)
{
    const Scenario scenario = load_scenario(arguments.scenario);
    if (arguments.check_only) return kExitDone;
    if (arguments.service.empty()) return run_unit(prepare(arguments));

    const Service* const service = find_service(arguments.service);
    if (service == nullptr) {
        fmt::print(stderr, "btsvc-sim: no service \"{}\"\n", arguments.service);
        return kExitUsage;
    }
    return run_service_process(*service, scenario, arguments.ready_fd);
}

} // namespace

int main(int argc, char** argv)
{
    CLI::App app{"Runs a simulated Bluetooth unit: the service's processes, and the phones of a scenario.",
                 "btsvc-sim"};
    Arguments arguments;
    describe(app, arguments);
    try {
        app.parse(argc, argv);
        return run(arguments);
    } catch (const CLI::ParseError& error) {
        return app.exit(error) == 0 ? kExitDone : kExitUsage;
    } catch (const ScenarioError& error) {
        fmt::print(stderr, "btsvc-sim: {}\n", error.what());
        return kExitUsage;
    } catch (const std::exception& error) {
        fmt::print(stderr, "btsvc-sim: {}\n", error.what());
        return kExitFailed;
    }
}

// btsvc listen: the events of a unit as they come.
#include "btsvc/commands.h"
#include "btsvc/event_line.h"
#include "btsvc/listener.h"
#include "btsvc/words.h"
#include "catalogue/rows.h"

#include <bt_service/bt_types.h>

#include <fmt/format.h>

#include <algorithm>
#include <limits>
#include <memory>

namespace bt::client {
namespace {

struct Options {
    std::vector<std::string> events;
    bool all_connection = false;
    uint64_t count = 0; // 0: no limit
    double timeout = 0; // 0: no limit
};

constexpr const char* kFooter =
    R"(Events are given by name, with or without BT_SIM_EVENT_, or by id; names are those of bt_sim/events.h. The listener is
deregistered when the command ends, by SIGINT and SIGTERM too.

Exit codes: 0 all that was asked for was printed, or a listener without --count was stopped by its --timeout or a
signal; 4 the time was over before --count events had come; 6 a signal came before --count events had come.

Examples:
  btsvc listen --all-connection
  btsvc listen CON_SEARCH 0xAC91 --count 1 --timeout 30 --json)";

uint32_t event_id(const std::string& word)
{
    if (const catalogue::Row* row = catalogue::find_event(word)) return row->id;
    if (word.empty() || word.find_first_not_of("0123456789") == 0)
        throw Failure(kUsage, fmt::format("\"{}\" is no event; give an id, or a name of bt_sim/events.h", word));
    return static_cast<uint32_t>(parse_integer(word, 0, std::numeric_limits<uint16_t>::max()));
}

std::vector<uint32_t> wanted_events(const Options& options)
{
    std::vector<uint32_t> ids;
    for (const std::string& word : options.events)
        ids.push_back(event_id(word));
    if (options.all_connection)
        for (const catalogue::Row& row : catalogue::events())
            if (row.process == PNO_BT_CON) ids.push_back(row.id);
    if (ids.empty()) throw Failure(kUsage, "no event named; give events, or --all-connection");

    std::sort(ids.begin(), ids.end());
    ids.erase(std::unique(ids.begin(), ids.end()), ids.end()); // an id registered twice would arrive twice
    return ids;
}

ExitCode run_listen(const Options& options, Output& output)
{
    const std::vector<uint32_t> ids = wanted_events(options);
    catch_stop_signals();
    Listener listener(ids);

    const auto until = time_limit(options.timeout);
    for (uint64_t seen = 0; options.count == 0 || seen < options.count; ++seen) {
        const std::optional<BtMessage> event = listener.next(until);
        if (!event) {
            if (options.count == 0) return kDone;
            return stop_requested() ? kInterrupted : kTimedOut;
        }
        print_event(*event, output);
    }
    return kDone;
}

} // namespace

Command add_listen(CLI::App& program)
{
    const auto options = std::make_shared<Options>();
    CLI::App* line = program.add_subcommand("listen", "Print events as they come");
    line->footer(kFooter);
    line->add_option("events", options->events, "Names or ids of events")->type_name("EVENT");
    line->add_flag("--all-connection", options->all_connection, "All events of the connection service");
    line->add_option("--count", options->count, "End after N events")
        ->type_name("N")
        ->check(CLI::Range(uint64_t{1}, uint64_t{1000000000}).description(""));
    line->add_option("--timeout", options->timeout, "End after so many seconds")
        ->type_name("SECONDS")
        ->check(CLI::Range(kShortestTimeout, kLongestTimeout).description(""));
    return {line, [options](Output& output) { return run_listen(*options, output); }};
}

} // namespace bt::client

// btsvc call: any request or query by its exported name.
#include "btsvc/calls.h"
#include "btsvc/commands.h"
#include "btsvc/event_line.h"
#include "btsvc/listener.h"
#include "btsvc/unit.h"
#include "catalogue/decode.h"
#include "catalogue/print.h"

#include <bt_service/bt_types.h>

#include <fmt/format.h>

#include <algorithm>
#include <memory>

namespace bt::client {
namespace {

using catalogue::Decoded;
using catalogue::Row;
using catalogue::Value;

struct Options {
    std::vector<std::string> words; // the name, then the arguments
    bool list = false;
    bool wait = false;
    double timeout = 10;
};

constexpr const char* kFooter = R"(Arguments are given in the function's order:
  number     decimal or 0x..., checked against the argument's range
  address    AA:BB:CC:DD:EE:FF
  bytes[n]   pairs of hexadecimal digits, or text:...; up to n, the rest is zero
  u32[n]     up to n numbers separated by commas, the rest is zero
  null       a null pointer, for an address, a block or a list

--wait waits for the event that answers the request and prints it. Exit code 1 means that the function refused, that
the request was not posted, or that the answer's result is not 0; 4 that no answer came in time.

Examples:
  btsvc call --list
  btsvc call CON_requestConnection 00:11:22:33:44:55 0 --wait --timeout 30
  btsvc call BT_SRV_CON_getConnectionMode 00:11:22:33:44:55
  btsvc call CON_authenticatePasskey 0 00:11:22:33:44:55 text:123456)";

std::string full_name(const Call& call)
{
    return std::string("BT_SRV_") + call.name;
}

ExitCode run_list(Output& output)
{
    for (const Call& call : all_calls()) {
        const Row* request = catalogue::find_request(call.name);
        if (output.json()) {
            nlohmann::ordered_json line{{"type", "function"}, {"name", full_name(call)}, {"arguments", call.arguments}};
            if (request != nullptr) line["request"] = catalogue::id_text(request->id);
            output.object(line);
        } else {
            output.line(fmt::format("{}  {} {}", request ? catalogue::id_text(request->id) : "query ", full_name(call),
                                    usage_text(catalogue::parse_layout(call.arguments))));
        }
    }
    return kDone;
}

const char* meaning_of(int32_t result)
{
    switch (result) {
    case BT_FAILED:
        return "failed, not posted or not found";
    case BT_BAD_ARGUMENT:
        return "bad argument or unknown device";
    case BT_NO_SEMAPHORE:
        return "lock not available";
    case BT_NOT_POSTED:
        return "message layer unusable";
    case 1:
        return "no such process";
    case 2:
        return "its queue is full";
    case 4:
        return "its queue could not be had in time";
    default:
        return "code of the platform";
    }
}

std::string members_text(const nlohmann::ordered_json& members)
{
    std::string text;
    for (const auto& [name, value] : members.items())
        text += fmt::format(" {}={}", name, value.dump(-1, ' ', true, nlohmann::json::error_handler_t::replace));
    return text;
}

// Prints what came back; true when the call did what it was asked.
bool report_call(const Call& call, int32_t result, const nlohmann::ordered_json& answer, Output& output)
{
    const bool counts = call.result == Call::Result::count;
    const bool succeeded = counts ? result >= 0 : result == BT_OK;
    if (output.json()) {
        nlohmann::ordered_json line{{"type", "call"}, {"name", full_name(call)}, {"result", result}};
        line.update(answer);
        output.object(line);
    } else {
        const std::string why = succeeded ? "" : fmt::format(" ({})", meaning_of(result));
        output.line(fmt::format("{} = {}{}{}", full_name(call), result, why, members_text(answer)));
    }
    return succeeded;
}

const Value* field_named(const Decoded& message, const char* name)
{
    const auto found = std::find_if(message.values.begin(), message.values.end(),
                                    [name](const Value& value) { return value.field->name == name; });
    return found == message.values.end() ? nullptr : &*found;
}

// An answer that names another device belongs to somebody else's request.
bool concerns(const Decoded& event, const BtDevAddress* asked)
{
    const Value* address = field_named(event, "address");
    if (asked == nullptr || address == nullptr) return true;

    const auto all = [address](uint8_t byte) {
        return std::all_of(address->bytes.begin(), address->bytes.begin() + 6, [byte](uint8_t b) { return b == byte; });
    };
    return all(0x00) || all(0xFF) || std::equal(asked->address, asked->address + 6, address->bytes.begin());
}

ExitCode await_answer(Listener& listener, uint16_t answer, const BtDevAddress* asked, double timeout, Output& output)
{
    const Deadline until = time_limit(timeout);
    while (const std::optional<BtMessage> event = listener.next(until)) {
        const Decoded decoded = catalogue::decode(*event);
        if (decoded.id != answer || !concerns(decoded, asked)) continue;
        print_event(*event, output);
        const Value* result = field_named(decoded, "result");
        return result != nullptr && result->numbers.front() == BT_OK ? kDone : kRefused;
    }
    if (stop_requested()) return kInterrupted;
    throw Failure(kTimedOut, fmt::format("no answer (event {}) within {} s; is the service alive? see `btsvc status`",
                                         catalogue::id_text(answer), timeout));
}

const BtDevAddress* address_argument(const catalogue::Layout& layout, const Arguments& arguments)
{
    for (size_t i = 0; i < layout.size(); ++i)
        if (layout[i].type == catalogue::Type::addr) return arguments.record<BtDevAddress>(i);
    return nullptr;
}

ExitCode run_call(const Options& options, Output& output)
{
    if (options.list) return run_list(output);
    if (options.words.empty()) throw Failure(kUsage, "no function named; `btsvc call --list` shows them");

    const Call call = find_call(options.words.front());
    const catalogue::Layout layout = catalogue::parse_layout(call.arguments);
    const Arguments arguments(layout, {options.words.begin() + 1, options.words.end()});
    const Row* request = catalogue::find_request(call.name);
    if (options.wait && request == nullptr)
        throw Failure(kUsage, fmt::format("{} is a query: it answers at once, without --wait", full_name(call)));

    if (request != nullptr)
        require_process(request->process);
    else
        require_domain();

    std::unique_ptr<Listener> listener;
    const uint16_t answer_id = request ? catalogue::answer_to(request->id) : uint16_t{0};
    if (options.wait) {
        catch_stop_signals();
        listener =
            std::make_unique<Listener>(std::vector<uint32_t>{answer_id}); // before the request: answers are quick
    }

    nlohmann::ordered_json answer = nlohmann::ordered_json::object();
    const int32_t result = call.make(arguments, answer);
    if (!report_call(call, result, answer, output)) return kRefused;
    if (!listener) return kDone;
    return await_answer(*listener, answer_id, address_argument(layout, arguments), options.timeout, output);
}

} // namespace

Command add_call(CLI::App& program)
{
    const auto options = std::make_shared<Options>();
    CLI::App* line = program.add_subcommand("call", "Call a request or query by its exported name");
    line->footer(kFooter);
    line->add_option("function", options->words, "Name, with or without BT_SRV_, and its arguments")
        ->type_name("NAME ARG");
    line->add_flag("--list", options->list, "List the functions with their arguments");
    line->add_flag("--wait", options->wait, "Wait for the answer and print it");
    line->add_option("--timeout", options->timeout, "Seconds to wait for the answer")
        ->type_name("SECONDS")
        ->check(CLI::Range(kShortestTimeout, kLongestTimeout).description(""))
        ->capture_default_str();
    return {line, [options](Output& output) { return run_call(*options, output); }};
}

} // namespace bt::client

// btsvc devices: the registered devices.
#include "btsvc/commands.h"
#include "btsvc/device_record.h"
#include "btsvc/table.h"
#include "btsvc/unit.h"

#include <bt_service/bt_connection_store.h>

#include <fmt/format.h>

#include <algorithm>
#include <cstdio>
#include <memory>

namespace bt::client {
namespace {

ExitCode run_devices(Output& output)
{
    require_connection_area();
    // One copy of the whole list, so that the words of a slot belong to its record.
    const auto list = std::make_unique<BtConRegDevListInfo>();
    const int32_t result = bt_con_getRegisteredDeviceListInfo(list.get(), 1);
    if (result != 0)
        throw Failure(kNoUnit, fmt::format("the registered devices could not be read (result {}): {}; `btsvc status` "
                                           "shows who holds the lock",
                                           result, bt_host_error()));

    Table table("device", {{"slot", "slot"},
                           {"address", "address"},
                           {"class", "class"},
                           {"connected_profiles", "connected"},
                           {"mode", "mode"},
                           {"role", "role"},
                           {"attribute", "attribute"},
                           {"name", "name"}});
    const int32_t count = std::clamp<int32_t>(list->device_num, 0, BT_CON_DEVICE_MAX);
    for (int32_t slot = 0; slot < count; ++slot) {
        nlohmann::ordered_json record{{"slot", slot}};
        record.update(device_json(list->device[slot]));
        record["mode"] = list->connection_mode[slot];
        record["role"] = list->local_role[slot];
        record["attribute"] = list->device_attribute[slot];
        table.add(std::move(record));
    }
    table.print(output, "", "no device is registered");
    if (!process_alive(PNO_BT_CON))
        std::fputs("btsvc: note: no live connection process keeps this list; see `btsvc status`\n", stderr);
    return kDone;
}

} // namespace

Command add_devices(CLI::App& program)
{
    CLI::App* line = program.add_subcommand("devices", "List the registered devices");
    line->footer("\"connected\" lists the numbers of the profiles that are connected.\n\n"
                 "Examples:\n  btsvc devices\n  btsvc devices --json | jq -r .address");
    return {line, run_devices};
}

} // namespace bt::client

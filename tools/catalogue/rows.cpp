#include "catalogue/rows.h"

#include <bt_service/bt_types.h>
#include <bt_sim/events.h>

#include <unordered_map>
#include <unordered_set>

namespace bt::catalogue {
namespace {

constexpr std::string_view kRequestPrefix = "BT_SRV_";
constexpr std::string_view kEventPrefix = "BT_SIM_EVENT_";

std::vector<Row> request_rows()
{
    std::vector<Row> rows;
    const auto add = [&rows](uint16_t process, const char* name, uint16_t id, const char* fields) {
        rows.push_back({Kind::request, std::string(kRequestPrefix) + name, id, process, parse_layout(fields)});
    };
#define BT_REQUEST(channel, name, id, fields) add(PNO_BT_##channel, #name, id, fields);
#include "wire/requests.def"
#undef BT_REQUEST
    return rows;
}

uint16_t asked_process(uint16_t event_id)
{
    for (const uint32_t mark : {BT_SIM_EVENT_ANSWER, BT_SIM_EVENT_UNSOLICITED})
        for (const Row& request : requests())
            if ((request.id | mark) == event_id) return request.process;
    // An event of its own still lies in the block of its profile's requests.
    for (const Row& request : requests())
        if ((request.id & 0xF000) == (event_id & 0xF000)) return request.process;
    return 0;
}

std::vector<Row> event_rows()
{
    std::vector<Row> rows;
    const auto add = [&rows](const char* name, uint16_t id, const char* fields) {
        rows.push_back({Kind::event, name, id, asked_process(id), parse_layout(fields)});
    };
#define BT_ADD_EVENT(name, id, fields) add(#name, id, fields);
    BT_SIM_EVENTS(BT_ADD_EVENT)
#undef BT_ADD_EVENT

    std::unordered_set<uint16_t> listed;
    for (const Row& row : rows)
        listed.insert(row.id);
    for (const Row& request : requests()) {
        const uint16_t id = answer_to(request.id);
        if (!listed.insert(id).second) continue;
        rows.push_back({Kind::event, request.name.substr(kRequestPrefix.size()) + ".answer", id, request.process,
                        parse_layout("result:u32")});
    }
    return rows;
}

const Row* find_named(const std::vector<Row>& rows, std::string_view name, std::string_view prefix)
{
    const auto bare = [prefix](std::string_view text) {
        return text.substr(0, prefix.size()) == prefix ? text.substr(prefix.size()) : text;
    };
    for (const Row& row : rows)
        if (bare(row.name) == bare(name)) return &row;
    return nullptr;
}

} // namespace

const std::vector<Row>& requests()
{
    static const std::vector<Row> rows = request_rows();
    return rows;
}

const std::vector<Row>& events()
{
    static const std::vector<Row> rows = event_rows();
    return rows;
}

const Row* find(uint16_t id)
{
    static const std::unordered_map<uint16_t, const Row*> by_id = [] {
        std::unordered_map<uint16_t, const Row*> index;
        for (const std::vector<Row>* rows : {&requests(), &events()})
            for (const Row& row : *rows)
                index.emplace(row.id, &row); // keeps the first
        return index;
    }();
    const auto found = by_id.find(id);
    return found == by_id.end() ? nullptr : found->second;
}

const Row* find_request(std::string_view name)
{
    return find_named(requests(), name, kRequestPrefix);
}

const Row* find_event(std::string_view name)
{
    return find_named(events(), name, kEventPrefix);
}

uint16_t answer_to(uint16_t request_id)
{
    return request_id | uint16_t{BT_SIM_EVENT_ANSWER};
}

} // namespace bt::catalogue

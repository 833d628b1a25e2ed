#include "store_support.h"

#include <climits>

using namespace store;

namespace {

// Found devices, each with its letter as name and class.
Bytes found(const std::string& letters)
{
    Bytes infos;
    for (const char letter : letters)
        infos = infos + device_info(letter, static_cast<uint8_t>(letter));
    return infos;
}

const std::string kAllButLast = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcde";
const Bytes kFull = search_list(found(kAllButLast + "f"));

Row report(const std::string& what, const Bytes& info, const Bytes& before, const Bytes& after)
{
    return change(what, before, after, [=](At) { return bt_con_addSearchdevlist(Given(info)); });
}

} // namespace

TEST(StoreSearchList, AddAndClear)
{
    const Bytes x = device_info('X', 0x11), again_a = device_info('A', 0x77), again_last = device_info('f', 0x77),
                nine = device_info('9', 9), none = search_list({}),
                refreshed_last = search_list(found(kAllButLast) + again_last);
    Bytes padded = search_list(found("A")), refreshed = search_list(again_a);
    for (Bytes* list : {&padded, &refreshed})
        put(*list, 4 + 262, {0x12, 0x34});
    const Call clear = [](At) { return bt_con_delSearchdevlist(); };
    run_rows({report("first", found("A"), none, search_list(found("A"))),
              report("second", found("B"), search_list(found("A")), search_list(found("AB"))),
              report("again", again_a, search_list(found("AB")), search_list(again_a + found("B"))),
              report("again, padding stays", again_a, padded, refreshed),
              report("unchanged", found("A"), search_list(found("AB")), {}),
              report("into the last entry", found("f"), search_list(found(kAllButLast)), kFull),
              report("one too many", nine, kFull, {}),
              report("again in a full list", again_last, kFull, refreshed_last),
              report("negative count is an empty list", x, with_count(INT32_MIN, none), search_list(x)),
              report("count too large is a full list", nine, with_count(33, kFull), {}),
              report("again, count too large", again_last, with_count(INT32_MAX, kFull), refreshed_last),
              refused("null", -2, [](At) { return bt_con_addSearchdevlist(nullptr); }),
              refused("no device", -2, [](At) { return bt_con_addSearchdevlist(Given(device_info('-', 1))); }),
              change("clear", search_list(found("AB")), none, clear, 0, Locking::kAccessor),
              change("clear what was never set", Bytes(8580, 0x5A), none, clear, 0, Locking::kAccessor)},
             {kSearch, 8580, none, {{kSearch, 32}}});
}

TEST(StoreSearchList, LooksUpInACallersList)
{
    const Bytes two = search_list(found("AB"));
    const struct {
        Bytes list;
        char letter;
        int32_t result, index;
    } rows[] = {{two, 'B', 1, 1},
                {two, 'X', 0, 77},
                {search_list({}), '-', 0, 77},
                {kFull, 'f', 1, 31},
                {with_count(0, two), 'A', 0, 77},
                {with_count(-1, two), 'A', 0, 77},
                {with_count(33, kFull), '9', 0, 77},
                {with_count(INT32_MAX, kFull), 'f', 1, 31}};
    for (const auto& row : rows) {
        int32_t index = 77;
        EXPECT_EQ(bt_con_SerchDevInfo(Given(row.list), Given(device_info(row.letter, 0)), &index), row.result);
        EXPECT_EQ(index, row.index);
        EXPECT_EQ(bt_con_SerchDevInfo(nullptr, Given(device_info(row.letter, 0)), &index), 0);
        EXPECT_EQ(bt_con_SerchDevInfo(Given(row.list), nullptr, &index), 0);
    }
}

TEST(StoreSearchList, CopyLeavesThePadding)
{
    const Given to(Bytes(268, 0x33));
    bt_con_setDevInfo(to, Given(device_info('A', 0x44)));
    bt_con_setDevInfo(to, nullptr);
    bt_con_setDevInfo(nullptr, to);
    EXPECT_EQ(difference(to.bytes(), Bytes(256, 0x44) + address('A') + Bytes(2, 0x33) + Bytes(4, 0x44)), "");
}

TEST(StoreSettings, OneWordIsReadOrWritten)
{
    const Bytes four = words({10, 11, 12, 13});
    const auto get = [](uint32_t vtype, uint32_t value) {
        return answer(
            "read " + std::to_string(vtype), [=](At to) { return bt_con_getSettingStatusVtype(to, vtype); },
            words({value}) + Bytes(4, 0xA5), 0, Locking::kReported);
    };
    const auto set = [&](uint32_t value, uint32_t vtype, const Bytes& after) {
        return change("write " + std::to_string(vtype), four, after,
                      [=](At) { return bt_con_setSettingStatusVtype(value, vtype); });
    };
    std::vector<Row> rows = {get(0, 10),
                             get(3, 13),
                             set(1, 2, words({10, 11, 1, 13})),
                             set(UINT32_MAX, 3, words({10, 11, 12, UINT32_MAX})),
                             set(11, 1, four),
                             refused("read into nothing", -2, nulled(get(0, 0).call))};
    for (const uint32_t vtype : {4u, 0x80000000u, UINT32_MAX}) {
        rows.push_back(refused("read none", -2, get(vtype, 0).call));
        rows.push_back(refused("write none", -2, set(1, vtype, four).call));
    }
    run_rows(rows, {27728, 16, four, {}});
}

// The search device list and the connect settings.
#include "store_support.h"

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

Row report(const Bytes& info, const Bytes& before, const Bytes& after)
{
    return change(CALL(bt_con_addSearchdevlist(Given(info))), before, after);
}

} // namespace

TEST(StoreSearchList, AddAndClear)
{
    const Bytes x = device_info('X', 0x11), again_a = device_info('A', 0x77), again_last = device_info('f', 0x77),
                nine = device_info('9', 9), none = search_list({}), ab = search_list(found("AB")),
                refreshed_last = search_list(found(kAllButLast) + again_last);
    Bytes padded = search_list(found("A")), refreshed = search_list(again_a);
    for (Bytes* list : {&padded, &refreshed})
        put(*list, 4 + 262, {0x12, 0x34});
    run_rows({kSearch, 8580, none, {{kSearch, 32}}},
             {report(found("A"), none, search_list(found("A"))), report(found("B"), search_list(found("A")), ab),
              report(again_a, ab, search_list(again_a + found("B"))),
              report(again_a, padded, refreshed), // the padding stays
              report(found("f"), search_list(found(kAllButLast)), kFull), report(nine, kFull, {}),
              report(again_last, kFull, refreshed_last), report(x, with_count(INT32_MIN, none), search_list(x)),
              report(nine, with_count(33, kFull), {}), report(again_last, with_count(INT32_MAX, kFull), refreshed_last),
              refused(-2, CALL(bt_con_addSearchdevlist(nullptr))),
              refused(-2, CALL(bt_con_addSearchdevlist(Given(device_info('-', 1))))),
              change(CALL(bt_con_delSearchdevlist()), ab, none, 0, Locking::kAccessor),
              change(CALL(bt_con_delSearchdevlist()), Bytes(8580, 0x5A), none, 0, Locking::kAccessor)});
}

TEST(StoreSearchList, ACallersListIsSearchedAndCopied)
{
    const Bytes two = search_list(found("AB"));
    const struct {
        Bytes list;
        char letter;
        int32_t result, index;
    } rows[] = {{two, 'B', 1, 1},
                {two, 'X', 0, 77},
                {search_list({}), '-', 0, 77},
                {with_count(-1, two), 'A', 0, 77},
                {with_count(33, kFull), '9', 0, 77},
                {with_count(INT32_MAX, kFull), 'f', 1, 31}};
    int32_t index = 77;
    for (const auto& row : rows) {
        index = 77;
        EXPECT_EQ(bt_con_SerchDevInfo(Given(row.list), Given(device_info(row.letter, 0)), &index), row.result);
        EXPECT_EQ(index, row.index);
    }
    EXPECT_EQ(bt_con_SerchDevInfo(nullptr, Given(found("A")), &index), 0);
    EXPECT_EQ(bt_con_SerchDevInfo(Given(two), nullptr, &index), 0);

    const Given to(Bytes(268, 0x33));
    bt_con_setDevInfo(to, Given(device_info('A', 0x44)));
    bt_con_setDevInfo(to, nullptr);
    bt_con_setDevInfo(nullptr, to);
    EXPECT_EQ(difference(to.bytes(), Bytes(256, 0x44) + address('A') + Bytes(2, 0x33) + Bytes(4, 0x44)), "");
}

TEST(StoreSettings, OneWordIsReadOrWritten)
{
    const Bytes four = words({10, 11, 12, 13});
    const auto set = [&](uint32_t value, uint32_t vtype, const Bytes& after) {
        return change(CALL(bt_con_setSettingStatusVtype(value, vtype)), four, after);
    };
    run_rows({27728, 16, four}, {answer(CALL(bt_con_getSettingStatusVtype(out, 0)), word(10), 0, Locking::kReported),
                                 answer(CALL(bt_con_getSettingStatusVtype(out, 3)), word(13), 0, Locking::kReported),
                                 refused(-2, CALL(bt_con_getSettingStatusVtype(out, 4))),
                                 refused(-2, CALL(bt_con_getSettingStatusVtype(out, UINT32_MAX))),
                                 refused(-2, CALL(bt_con_getSettingStatusVtype(nullptr, 0))),
                                 set(1, 2, words({10, 11, 1, 13})), set(UINT32_MAX, 3, words({10, 11, 12, UINT32_MAX})),
                                 set(11, 1, four), refused(-2, CALL(bt_con_setSettingStatusVtype(1, 4))),
                                 refused(-2, CALL(bt_con_setSettingStatusVtype(1, UINT32_MAX)))});
}

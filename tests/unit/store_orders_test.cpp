// The registered order list, the order lists by profile, and the two shifts that both are made of.
#include "store_support.h"

using namespace store;

namespace {

const Bytes kFull = order_list(kSeventeen);

std::string without(std::string letters, const std::string& letter)
{
    const size_t at = letters.find(letter);
    return at == std::string::npos ? letters : letters.erase(at, 1);
}

Row find(const std::string& letter, uint32_t position)
{
    return answer(CALL(bt_con_SearshOrderListAddr(dev(letter), out)), word(position), 0, Locking::kNone,
                  word(UINT32_MAX));
}

Bytes slot_of(char letter)
{
    return address(letter) + Bytes(2, 0xA5);
}

} // namespace

TEST(StoreOrders, DevicesJoinAndLeave)
{
    std::vector<Row> registered, connected;
    for (const std::string& before : {std::string(), std::string("ABC"), kSixteen, kSeventeen})
        for (const std::string letter : {"A", "C", "Q", "X"}) {
            const std::string others = without(before, letter);
            const bool joins = others == before && before.size() < 17, refused = others == before && !joins;
            const uint32_t profile = letter == "C" ? 7 : letter == "X" ? 3 : 0;
            const auto orders = [=](const std::string& letters) { return profile_orders(profile, letters); };
            const Bytes list = order_list(before), after = order_list(joins ? before + letter : before);
            registered.push_back(change(CALL(bt_con_addOrderList(dev(letter))), list, after, refused ? -1 : 0));
            registered.push_back(change(CALL(bt_con_delOrderList(dev(letter))), list, order_list(others)));
            connected.push_back(change(CALL(bt_con_addConnectOrder(dev(letter), profile)), orders(before),
                                       orders(letter + others.substr(0, 16))));
            connected.push_back(
                change(CALL(bt_con_delConnectOrder(dev(letter), profile)), orders(before), orders(others)));
        }
    run_rows({kOrder, 140, order_list("AB"), {{kOrder, 17}}}, registered);
    run_rows({kProfileOrders, 1120, profile_orders(0, "BA"), {{kProfileOrders, 17}}}, connected);
}

TEST(StoreOrders, RegisteredList)
{
    const Bytes none = order_list("", false);
    run_rows({kOrder, 140, order_list("AB"), {{kOrder, 17}}},
             {change(CALL(bt_con_addOrderList(dev("X"))), with_count(-1, order_list("")), order_list("X")),
              change(CALL(bt_con_addOrderList(dev("X"))), with_count(18, kFull), {}, -1),
              change(CALL(bt_con_delOrderList(dev("Q"))), with_count(INT32_MAX, kFull), order_list(kSixteen)),
              change(CALL(bt_con_initOrderList()), order_list("ABC", false), none),
              change(CALL(bt_con_initOrderList()), none, none),
              change(CALL(bt_con_initOrderList()), with_count(-9, none), none),
              refused(-2, CALL(bt_con_addOrderList(nullptr))),
              refused(-2, CALL(bt_con_addOrderList(dev("-")))),
              refused(-2, CALL(bt_con_delOrderList(nullptr))),
              answer(CALL(bt_con_getoneOrderList(out, 0)), slot_of('A')),
              answer(CALL(bt_con_getoneOrderList(out, 1)), slot_of('B')),
              answer(CALL(bt_con_getoneOrderList(out, 16)), slot_of('-')),
              refused(-1, CALL(bt_con_getoneOrderList(out, 17))),
              refused(-1, CALL(bt_con_getoneOrderList(out, -1))),
              refused(-1, CALL(bt_con_getoneOrderList(out, 0))).on(order_list("")),
              refused(-1, CALL(bt_con_getoneOrderList(out, 0))).on(with_count(-2, kFull)),
              refused(-2, CALL(bt_con_getoneOrderList(nullptr, 0))),
              answer(CALL(bt_con_getallOrderList(out)), order_list("AB")),
              answer(CALL(bt_con_getallOrderList(out)), kFull).on(with_count(18, kFull)),
              answer(CALL(bt_con_getallOrderList(out)), order_list("")).on(with_count(INT32_MIN, order_list(""))),
              refused(-2, CALL(bt_con_getallOrderList(nullptr))),
              find("B", 1),
              find("X", UINT32_MAX),
              find("Q", 16).on(with_count(99, kFull)),
              find("A", UINT32_MAX).on(with_count(-1, kFull)),
              refused(-2, CALL(bt_con_SearshOrderListAddr(dev("A"), nullptr)))});
    EXPECT_EQ(bt_con_SearshOrderListAddr(nullptr, Given(Bytes(4))), -2);
}

TEST(StoreOrders, ProfileLists)
{
    Bytes none;
    for (int profile = 0; profile < 8; ++profile)
        none = none + order_list("", false);
    const Bytes of_7 = profile_orders(7, "BA"), full = profile_orders(0, kSeventeen), empty = profile_orders(0, "");
    run_rows({kProfileOrders, 1120, profile_orders(0, "BA"), {{kProfileOrders, 17}, {kProfileOrders + 980, 17}}},
             {change(CALL(bt_con_addConnectOrder(dev("X"), 0)), with_count(-1, empty), profile_orders(0, "X")),
              change(CALL(bt_con_addConnectOrder(dev("X"), 0)), with_count(INT32_MAX, full),
                     profile_orders(0, "X" + kSixteen)),
              change(CALL(bt_con_delConnectOrder(dev("Q"), 0)), with_count(18, full), profile_orders(0, kSixteen)),
              change(CALL(bt_con_initConnectOrderList()), profile_orders(5, "ABC", false), none),
              change(CALL(bt_con_initConnectOrderList()), none, none),
              refused(-2, CALL(bt_con_addConnectOrder(nullptr, 0))),
              refused(-2, CALL(bt_con_addConnectOrder(dev("-"), 0))),
              refused(-2, CALL(bt_con_addConnectOrder(dev("X"), 8))),
              refused(-2, CALL(bt_con_addConnectOrder(dev("X"), UINT32_MAX))),
              refused(-2, CALL(bt_con_delConnectOrder(nullptr, 0))),
              refused(-2, CALL(bt_con_delConnectOrder(dev("A"), 8))),
              answer(CALL(bt_con_getoneConnectOrder(out, 0, 0)), slot_of('B')),
              answer(CALL(bt_con_getoneConnectOrder(out, 7, 1)), slot_of('A')).on(of_7),
              answer(CALL(bt_con_getoneConnectOrder(out, 0, 16)), slot_of('-')),
              refused(-1, CALL(bt_con_getoneConnectOrder(out, 0, 17))),
              refused(-1, CALL(bt_con_getoneConnectOrder(out, 0, -1))),
              refused(-1, CALL(bt_con_getoneConnectOrder(out, 0, 0))).on(empty),
              refused(-1, CALL(bt_con_getoneConnectOrder(out, 0, 0))).on(with_count(-1, full)),
              refused(-1, CALL(bt_con_getoneConnectOrder(nullptr, 0, 0))),
              refused(-2, CALL(bt_con_getoneConnectOrder(out, 8, 0))),
              answer(CALL(bt_con_getallConnectOrder(out, 0)), order_list("BA")),
              answer(CALL(bt_con_getallConnectOrder(out, 7)), order_list("BA")).on(of_7),
              answer(CALL(bt_con_getallConnectOrder(out, 0)), kFull).on(with_count(18, full)),
              answer(CALL(bt_con_getallConnectOrder(out, 0)), order_list("")).on(with_count(-1, empty)),
              refused(-2, CALL(bt_con_getallConnectOrder(nullptr, 0))),
              refused(-2, CALL(bt_con_getallConnectOrder(out, 8)))});
}

TEST(StoreOrders, Shifts)
{
    const auto up = [](Bytes before, int32_t position, int32_t result, const Bytes& after) {
        const Given list(std::move(before));
        EXPECT_EQ(bt_con_moveupOrderList(list, position), result) << position;
        EXPECT_EQ(difference(list.bytes(), after), "") << position;
    };
    const auto down = [](Bytes before, int32_t to, int32_t from, int32_t insert, int32_t result, const Bytes& after) {
        const Given list(std::move(before));
        EXPECT_EQ(bt_con_movedownOrderList(dev("X"), list, to, from, insert), result) << to << " from " << from;
        EXPECT_EQ(difference(list.bytes(), after), "") << to << " from " << from;
    };
    const Bytes abc = order_list("ABC"), most = order_list(kSixteen);
    up(abc, 1, 0, order_list("AC"));
    up(kFull, 16, 0, most);
    for (const int32_t position : {3, -1, INT32_MIN, INT32_MAX})
        up(abc, position, -1, abc);
    up(order_list(""), 0, -1, order_list(""));
    EXPECT_EQ(bt_con_moveupOrderList(nullptr, 0), -1);

    down(abc, 0, 2, 1, 0, order_list("XABC"));
    down(abc, 1, 2, 1, 0, order_list("AXBC"));
    down(abc, 0, 2, 0, 0, order_list("XAB"));
    down(abc, 0, 2, 2, 0, order_list("XAB"));
    down(abc, 1, 1, 0, 0, order_list("AXC"));
    down(kFull, 0, 16, 1, 0, order_list("X" + kSixteen));
    down(most, 0, 15, 1, 0, order_list("X" + kSixteen));
    const std::pair<int32_t, int32_t> refused_places[] = {{3, 2}, {17, 17}, {0, INT32_MAX}, {-1, 2}, {INT32_MIN, -1}};
    for (const auto& [to, from] : refused_places)
        down(abc, to, from, 1, -1, abc);
    EXPECT_EQ(bt_con_movedownOrderList(nullptr, Given(abc), 0, 1, 0), -1);
    EXPECT_EQ(bt_con_movedownOrderList(dev("X"), nullptr, 0, 1, 0), -1);

    for (const int32_t count : {-1, INT32_MIN})
        up(with_count(count, kFull), 0, -1, with_count(count, kFull));
    for (const int32_t count : {18, INT32_MAX}) {
        up(with_count(count, kFull), 16, 0, most);
        up(with_count(count, kFull), 17, -1, with_count(count, kFull));
        down(with_count(count, kFull), 0, 16, 1, 0, order_list("X" + kSixteen));
        down(with_count(count, kFull), 0, 17, 1, -1, with_count(count, kFull));
    }
    down(with_count(-1, kFull), 0, 16, 1, 0, with_count(1, order_list("X" + kSixteen)));
}

#include "store_support.h"

#include <climits>

using namespace store;

namespace {

const std::string kSixteen = kSeventeen.substr(0, 16);
const Bytes kFull = order_list(kSeventeen);

Row append(const std::string& letter, const std::string& before, const std::string& after, int32_t result = 0)
{
    return change(
        "append " + letter + " to " + before, order_list(before), order_list(after),
        [=](At) { return bt_con_addOrderList(dev(letter)); }, result);
}

Row take(const std::string& letter, const std::string& before, const std::string& after)
{
    return change("remove " + letter + " from " + before, order_list(before), order_list(after),
                  [=](At) { return bt_con_delOrderList(dev(letter)); });
}

Row connect(const std::string& letter, uint32_t profile, const std::string& before, const std::string& after)
{
    return change("connect " + letter + " to " + before, profile_orders(profile, before),
                  profile_orders(profile, after), [=](At) { return bt_con_addConnectOrder(dev(letter), profile); });
}

Row forget(const std::string& letter, uint32_t profile, const std::string& before, const std::string& after)
{
    return change("forget " + letter + " of " + before, profile_orders(profile, before), profile_orders(profile, after),
                  [=](At) { return bt_con_delConnectOrder(dev(letter), profile); });
}

Bytes slot_of(char letter)
{
    return address(letter) + Bytes(2, 0xA5);
}

} // namespace

TEST(StoreOrders, RegisteredList)
{
    const Call empty = [](At) { return bt_con_initOrderList(); };
    const Bytes none = order_list("", false);
    run_rows({append("A", "", "A"),
              append("C", "AB", "ABC"),
              append("B", "ABC", "ABC"),
              append("Q", kSixteen, kSeventeen),
              append("X", kSeventeen, kSeventeen, -1),
              append("Q", kSeventeen, kSeventeen),
              take("A", "ABC", "BC"),
              take("C", "ABC", "AB"),
              take("A", "A", ""),
              take("X", "ABC", "ABC"),
              take("X", "", ""),
              take("A", kSeventeen, kSeventeen.substr(1)),
              append("X", "", "X").on(with_count(-1, order_list(""))),
              change("append to a count too large", with_count(18, kFull), {}, append("X", "", "").call, -1),
              take("Q", "", kSixteen).on(with_count(INT32_MAX, kFull)),
              change("empty", order_list("ABC", false), none, empty),
              change("empty an empty one", none, none, empty),
              change("empty an impossible one", with_count(-9, none), none, empty),
              refused("append null", -2, append("?", "", "").call),
              refused("append no device", -2, append("-", "", "").call),
              refused("remove null", -2, take("?", "", "").call)},
             {kOrder, 140, order_list("ABC"), {{kOrder, 17}}});
}

TEST(StoreOrders, RegisteredListReaders)
{
    const auto one = [](int32_t position) { return [=](At out) { return bt_con_getoneOrderList(out, position); }; };
    const auto find = [](const std::string& letter, uint32_t position) {
        return answer(
            "find " + letter, [=](At out) { return bt_con_SearshOrderListAddr(dev(letter), out); },
            words({position}) + Bytes(4, 0xA5), 0, Locking::kNone, words({UINT32_MAX}) + Bytes(4, 0xA5));
    };
    const Call all = [](At out) { return bt_con_getallOrderList(out); };
    run_rows({answer("first", one(0), slot_of('A')), answer("second", one(1), slot_of('B')),
              answer("behind the used ones", one(5), slot_of('-')), answer("last slot", one(16), slot_of('-')),
              refused("position 17", -1, one(17)), refused("position -1", -1, one(-1)),
              refused("position INT32_MIN", -1, one(INT32_MIN)), refused("empty list", -1, one(0)).on(order_list("")),
              refused("one of a negative count", -1, one(0)).on(with_count(-2, kFull)),
              answer("all", all, order_list("AB")),
              answer("all of a count too large", all, kFull).on(with_count(18, kFull)),
              answer("all of a negative count", all, order_list("")).on(with_count(INT32_MIN, order_list(""))),
              find("B", 1), find("X", UINT32_MAX), find("Q", 16).on(with_count(99, kFull)),
              find("A", UINT32_MAX).on(with_count(-1, kFull)), refused("one, null", -2, nulled(one(0))),
              refused("all, null", -2, nulled(all)), refused("find, null output", -2, nulled(find("A", 0).call))},
             {kOrder, 0, order_list("AB"), {{kOrder, 17}}});
    EXPECT_EQ(bt_con_SearshOrderListAddr(nullptr, Given(Bytes(4))), -2);
}

TEST(StoreOrders, ProfileLists)
{
    Bytes none;
    std::vector<std::pair<size_t, int32_t>> counts;
    for (size_t profile = 0; profile < 8; ++profile) {
        none = none + order_list("", false);
        counts.push_back({kProfileOrders + 140 * profile, 17});
    }
    const Call empty = [](At) { return bt_con_initConnectOrderList(); };
    const Bytes full = profile_orders(0, kSeventeen);
    std::vector<Row> rows = {connect("A", 0, "", "A"),
                             connect("B", 0, "A", "BA"),
                             connect("C", 0, "BA", "CBA"),
                             connect("A", 0, "CBA", "ACB"),
                             connect("A", 0, "ABC", "ABC"),
                             connect("B", 7, "CBA", "BCA"),
                             connect("X", 7, kSeventeen, "X" + kSixteen),
                             connect("Q", 3, kSeventeen, "Q" + kSixteen),
                             connect("X", 4, kSixteen, "X" + kSixteen),
                             forget("C", 0, "CBA", "BA"),
                             forget("A", 7, "CBA", "CB"),
                             forget("A", 2, kSeventeen, kSeventeen.substr(1)),
                             forget("X", 2, "CBA", "CBA"),
                             forget("X", 2, "", ""),
                             connect("X", 0, "", "X").on(with_count(-1, profile_orders(0, ""))),
                             connect("X", 0, "", "X" + kSixteen).on(with_count(INT32_MAX, full)),
                             forget("Q", 0, "", kSixteen).on(with_count(18, full)),
                             change("empty", profile_orders(5, "ABC", false), none, empty),
                             change("empty empty ones", none, none, empty),
                             refused("connect null", -2, connect("?", 0, "", "").call),
                             refused("connect no device", -2, connect("-", 0, "", "").call),
                             refused("forget null", -2, forget("?", 0, "", "").call)};
    for (const uint32_t profile : {8u, 0x80000000u, UINT32_MAX}) {
        rows.push_back(refused("connect on no profile", -2, connect("X", profile, "", "").call));
        rows.push_back(refused("forget on no profile", -2, forget("A", profile, "", "").call));
    }
    run_rows(rows, {kProfileOrders, 1120, profile_orders(0, "A"), counts});
}

TEST(StoreOrders, ProfileListReaders)
{
    const auto one = [](uint32_t profile, int32_t position) {
        return [=](At out) { return bt_con_getoneConnectOrder(out, profile, position); };
    };
    const auto all = [](uint32_t profile) { return [=](At out) { return bt_con_getallConnectOrder(out, profile); }; };
    const Bytes of_7 = profile_orders(7, "BA"), full = profile_orders(0, kSeventeen), none = profile_orders(0, "");
    std::vector<Row> rows = {answer("first of profile 0", one(0, 0), slot_of('B')),
                             answer("second of profile 7", one(7, 1), slot_of('A')).on(of_7),
                             answer("behind the used ones", one(0, 2), slot_of('-')),
                             answer("last slot", one(0, 16), slot_of('-')),
                             answer("all of profile 0", all(0), order_list("BA")),
                             answer("all of profile 7", all(7), order_list("BA")).on(of_7),
                             answer("all of a count too large", all(0), kFull).on(with_count(18, full)),
                             answer("all of a negative count", all(0), order_list("")).on(with_count(-1, none)),
                             refused("position 17", -1, one(0, 17)),
                             refused("position -1", -1, one(0, -1)),
                             refused("empty list", -1, one(0, 0)).on(none),
                             refused("one of a negative count", -1, one(0, 0)).on(with_count(-1, full)),
                             refused("one, null", -1, nulled(one(0, 0))),
                             refused("all, null", -2, nulled(all(0)))};
    for (const uint32_t profile : {8u, 0x80000000u, UINT32_MAX}) {
        rows.push_back(refused("one of no profile", -2, one(profile, 0)));
        rows.push_back(refused("all of no profile", -2, all(profile)));
    }
    run_rows(rows, {kProfileOrders, 0, profile_orders(0, "BA"), {{kProfileOrders, 17}, {kProfileOrders + 980, 17}}});
}

TEST(StoreOrders, ShiftUp)
{
    const struct {
        std::string before;
        int32_t position, result;
        std::string after;
    } rows[] = {{"ABC", 0, 0, "BC"}, {"ABC", 1, 0, "AC"},           {"ABC", 2, 0, "AB"},
                {"A", 0, 0, ""},     {kSeventeen, 16, 0, kSixteen}, {kSeventeen, 0, 0, kSeventeen.substr(1)}};
    for (const auto& row : rows) {
        const Given list(order_list(row.before));
        EXPECT_EQ(bt_con_moveupOrderList(list, row.position), row.result) << row.before << row.position;
        EXPECT_EQ(difference(list.bytes(), order_list(row.after)), "") << row.before << row.position;
    }
    const Given abc(order_list("ABC"));
    for (const int32_t position : {3, 17, -1, INT32_MIN, INT32_MAX})
        EXPECT_EQ(bt_con_moveupOrderList(abc, position), -1);
    EXPECT_EQ(bt_con_moveupOrderList(nullptr, 0), -1);
    EXPECT_EQ(bt_con_moveupOrderList(Given(order_list("")), 0), -1);
    EXPECT_EQ(difference(abc.bytes(), order_list("ABC")), "");
}

TEST(StoreOrders, ShiftDown)
{
    const struct {
        std::string before;
        int32_t to, from, insert;
        std::string after;
    } rows[] = {{"ABC", 0, 2, 1, "XABC"},
                {"ABC", 1, 2, 1, "AXBC"},
                {"ABC", 0, 2, 0, "XAB"},
                {"ABC", 0, 2, 2, "XAB"},
                {"ABC", 0, 1, 0, "XAC"},
                {"ABC", 1, 1, 0, "AXC"},
                {kSeventeen, 0, 16, 1, "X" + kSixteen},
                {kSeventeen, 16, 16, 1, kSixteen + "X"},
                {kSeventeen, 16, 16, 0, kSixteen + "X"},
                {kSixteen, 0, 15, 1, "X" + kSixteen}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.before + " to " + std::to_string(row.to) + " from " + std::to_string(row.from));
        const Given list(order_list(row.before));
        EXPECT_EQ(bt_con_movedownOrderList(dev("X"), list, row.to, row.from, row.insert), 0);
        EXPECT_EQ(difference(list.bytes(), order_list(row.after)), "");
    }
    const Given abc(order_list("ABC"));
    const std::pair<int32_t, int32_t> refused_places[] = {
        {3, 2}, {17, 17}, {0, 17}, {0, INT32_MAX}, {-1, 2}, {-2, -1}, {INT32_MIN, INT32_MIN}};
    for (const auto& [to, from] : refused_places)
        EXPECT_EQ(bt_con_movedownOrderList(dev("X"), abc, to, from, 1), -1) << to << " from " << from;
    EXPECT_EQ(bt_con_movedownOrderList(nullptr, abc, 0, 1, 0), -1);
    EXPECT_EQ(bt_con_movedownOrderList(dev("X"), nullptr, 0, 1, 0), -1);
    EXPECT_EQ(difference(abc.bytes(), order_list("ABC")), "");
}

TEST(StoreOrders, ShiftsStayInsideAListOfImpossibleCount)
{
    for (const int32_t count : {-1, 18, INT32_MIN, INT32_MAX})
        for (const int32_t position : {0, 16, 17, INT32_MAX}) {
            SCOPED_TRACE(std::to_string(count) + ", " + std::to_string(position));
            const Given up(with_count(count, kFull)), down(with_count(count, kFull));
            EXPECT_EQ(bt_con_moveupOrderList(up, position), count > 0 && position < 17 ? 0 : -1);
            EXPECT_EQ(bt_con_movedownOrderList(dev("X"), down, 0, position, 1), position < 17 ? 0 : -1);
            if (count < 0 || position != 16) continue;
            EXPECT_EQ(difference(up.bytes(), order_list(kSixteen)), "");
            EXPECT_EQ(difference(with_count(17, down.bytes()), order_list("X" + kSixteen)), "");
        }
}

#include "store_support.h"

#include <climits>

using namespace store;

namespace {

const std::string kSixteen = kSeventeen.substr(0, 16);

Field field(size_t owned, const std::string& devices)
{
    return {kDevices, owned, device_list(devices), {{kDevices, 17}}};
}

struct Part {
    size_t at, size;
    bool persistent;
};

// In the order of the arguments, the last of them behind two words.
const Part kParts[] = {{0, 256, true},  {264, 4, true},  {268, 108, true}, {376, 12, false},
                       {388, 8, false}, {396, 56, true}, {452, 24, true},  {476, 532, true}};
enum : unsigned { kAll = 0xFF };

// The call that adds a device; a bit of `parts` gives that part as bytes 0x80 + its number, else it is null.
Call add(const std::string& letter, unsigned parts = 0)
{
    return [=](At) {
        Bytes memory[8];
        At part[8] = {nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr};
        for (size_t i = 0; i < 8; ++i) {
            memory[i].assign(kParts[i].size, static_cast<uint8_t>(0x80 + i));
            if ((parts >> i & 1) != 0) part[i] = memory[i].data();
        }
        return bt_con_addRegDev(dev(letter), part[0], part[1], part[2], part[3], part[4], part[5], part[6], 0x11111111,
                                0x22222222, part[7], 0x33333333);
    };
}

// What such a call makes of slot `slot`.
Bytes added(Bytes list, size_t slot, unsigned parts = 0)
{
    for (size_t i = 0; i < 8; ++i)
        if ((parts >> i & 1) != 0)
            put(list, 4 + 1008 * slot + kParts[i].at, Bytes(kParts[i].size, static_cast<uint8_t>(0x80 + i)));
    for (uint32_t i = 0; i < 3; ++i)
        put(list, 17140 + 68 * i + 4 * slot, words({0x11111111 * (i + 1)}));
    return list;
}

Bytes added_new(const std::string& devices, char letter, unsigned parts = 0)
{
    const size_t slot = devices.size();
    Bytes list = with_count(static_cast<int32_t>(slot + 1), device_list(devices));
    put(list, 4 + 1008 * slot + 256, address(letter));
    return added(list, slot, parts);
}

Row quiet(Row row)
{
    row.writes_image = false;
    return row;
}

} // namespace

TEST(StoreDevices, AddAndUpdate)
{
    const Bytes ab = device_list("AB"), full = device_list(kSeventeen);
    std::vector<Row> rows = {
        quiet(change("new, address alone", device_list(""), added_new("", 'A'), add("A"))),
        quiet(change("new behind others", ab, added_new("AB", 'C'), add("C"))),
        quiet(change("new into the last slot", device_list(kSixteen), added_new(kSixteen, 'Q'), add("Q"))),
        quiet(change("all zero is an address", ab, added_new("AB", '0'), add("0"))),
        quiet(change("known, words alone", ab, added(ab, 1), add("B"))),
        quiet(change("known in a full list", full, added(full, 16), add("Q"))),
        quiet(change("known, nothing persistent", ab, added(ab, 0, 0x18), add("A", 0x18))),
        change("known, everything", ab, added(ab, 1, kAll), add("B", kAll)),
        change("new, everything", ab, added_new("AB", 'C', kAll), add("C", kAll)),
        change("known, same name and other words", added(ab, 1, 1), added(ab, 1, 1), add("B", 1)),
        change("eighteenth", full, {}, add("X", kAll), -1),
        refused("no device", -2, add("-")),
        refused("null", -2, add("?", kAll)),
        quiet(change("negative count", with_count(-4, device_list("")), added_new("", 'X'), add("X"))),
        change("count too large", with_count(18, full), {}, add("X"), -1),
        quiet(change("known, count too large", with_count(INT32_MAX, full), added(full, 16), add("Q"))),
    };
    Bytes same_name = ab;
    put(same_name, 4 + 1008, Bytes(256, 0x80));
    rows.push_back(change("known, same name, other words", same_name, added(ab, 1, 1), add("B", 1)));
    for (unsigned i = 0; i < 8; ++i) {
        Row row = change("known, part " + std::to_string(i), ab, added(ab, 1, 1u << i), add("B", 1u << i));
        rows.push_back(kParts[i].persistent ? row : quiet(row));
    }
    run_rows(rows, field(17344, ""));
}

TEST(StoreDevices, Remove)
{
    const auto one = [](const std::string& letter, const std::string& before, const std::string& after) {
        return change("remove " + letter + " from " + before, device_list(before), device_list(after),
                      [=](At) { return bt_con_delRegDev(dev(letter)); });
    };
    const auto several = [](const std::string& letters, int32_t count, const std::string& after) {
        return change("remove " + std::to_string(count) + " of " + letters, device_list("ABC"), device_list(after),
                      [=](At) { return bt_con_delpluralRegDev(dev(letters), count); });
    };
    run_rows({one("A", "ABC", "BC"), one("B", "ABC", "AC"), one("C", "ABC", "AB"), one("A", "A", ""),
              one("A", kSeventeen, kSeventeen.substr(1)), one("Q", kSeventeen, kSixteen),
              one("Q", "", kSixteen).on(with_count(40, device_list(kSeventeen))), several("AB", 2, "C"),
              several("CXA-", 4, "B"), several("AA", 2, "BC"), several("AB", 1, "BC"), several("XY", 2, "ABC"),
              several("A", 0, "ABC"), several("A", -1, "ABC"), several("A", INT32_MIN, "ABC"),
              refused(
                  "unknown", -1, [](At) { return bt_con_delRegDev(dev("X")); }, Locking::kReported),
              refused("no device", -2, [](At) { return bt_con_delRegDev(dev("-")); }),
              refused("null", -2, [](At) { return bt_con_delRegDev(dev("?")); }),
              refused("several, null", -2, [](At) { return bt_con_delpluralRegDev(nullptr, 1); })},
             field(17344, "ABC"));
}

TEST(StoreDevices, ReadOne)
{
    enum : unsigned { kRecord = 1, kIndex = 2, kAttribute = 4, kMode = 8, kRole = 16, kEvery = 31 };
    const auto read = [](const char* letter, unsigned outputs = kEvery) {
        return [=](At out) {
            const auto to = [&](unsigned output, size_t at) {
                return (outputs & output) != 0 ? out + at : At(nullptr);
            };
            return bt_con_getRegDev(dev(letter), to(kRecord, 0), to(kIndex, 1008), to(kAttribute, 1012),
                                    to(kMode, 1016), to(kRole, 1020));
        };
    };
    const auto name = [](const char* letter) {
        return [=](At out) { return bt_con_getRegisterDeviceName(dev(letter), out); };
    };
    const auto index = [](const char* letter) {
        return [=](At) { return bt_con_getRegisterDeviceIndex(dev(letter)); };
    };
    const Bytes known = device_record('B') + words({1, 0x142, 0x242, 0x342});
    const Bytes unknown = Bytes(1008, 0xA5) + words({UINT32_MAX, 0}) + Bytes(8, 0xA5);
    const Bytes not_asked = Bytes(1008, 0xA5) + words({UINT32_MAX}) + Bytes(12, 0xA5);
    const Bytes no_name = words({106, 0}) + Bytes(248, 0);
    run_rows({answer("known", read("B"), known, 0, Locking::kReported, unknown),
              answer("unknown", read("X"), unknown, 0, Locking::kReported, unknown),
              answer("no device", read("-"), not_asked, -2), answer("null", read("?"), not_asked, -2),
              answer("null record", read("B", kEvery - kRecord), not_asked, -2),
              answer("null attribute", read("B", kEvery - kAttribute), not_asked, -2),
              answer("name", name("B"), Bytes(256, 'B'), 0, Locking::kUnlockSpoils, no_name),
              answer("name of an unknown", name("X"), no_name, -1, Locking::kUnlockSpoils, no_name),
              answer("name of no device", name("-"), no_name, -2), refused("name, null", -1, name("?")),
              refused("name, null output", -1, nulled(name("B"))), refused("index", 2, index("C")),
              refused("index of an unknown", -1, index("X")), refused("index, null", -1, index("?")),
              answer(
                  "number", [](At out) { return bt_con_getRegisterDeviceNum(out); }, words({3}) + Bytes(4, 0xA5)),
              refused("number, null", -1, [](At) { return bt_con_getRegisterDeviceNum(nullptr); })},
             field(0, "ABC"));

    attached_process(device_list("B"));
    for (const unsigned missing : {kIndex, kMode, kRole}) { // what the other outputs get is left open
        uint8_t* const out = fake::guarded(1024);
        EXPECT_EQ(read("B", kEvery - missing)(out), -2);
        EXPECT_EQ(Bytes(out, out + 1008), Bytes(1008, 0xA5));
    }
}

TEST(StoreDevices, ImpossibleCountsAreCapped)
{
    const struct {
        int32_t stored, told, index_of_last, index_of_first;
    } rows[] = {{17, 17, 16, 0},        {18, 17, 16, 0}, {INT32_MAX, 17, 16, 0}, {-1, 0, -1, -1},
                {INT32_MIN, 0, -1, -1}, {16, 16, -1, 0}, {1, 1, -1, 0},          {0, 0, -1, -1}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.stored);
        attached_process(with_count(row.stored, device_list(kSeventeen)));
        int32_t count = 77;
        EXPECT_EQ(bt_con_getRegisterDeviceNum(&count), 0);
        EXPECT_EQ(count, row.told);
        EXPECT_EQ(bt_con_getRegisterDeviceIndex(dev("Q")), row.index_of_last);
        EXPECT_EQ(bt_con_getRegisterDeviceIndex(dev("A")), row.index_of_first);
    }
}

TEST(StoreDevices, EmptyAndConnectionReset)
{
    Bytes disconnected = device_list("AB");
    for (size_t entry = 0; entry < 9; ++entry)
        for (const size_t slot : {size_t{0}, size_t{1}})
            put(disconnected, 4 + 1008 * slot + 268 + 12 * entry, words({0}));
    const Call empty = [](At) { return bt_con_initRegDev(); }, reset = [](At) { return bt_con_ConnectInitRegDev(); };
    const Bytes ab = device_list("AB"), none = device_list("");
    run_rows({change("empty", ab, none, empty, 0, Locking::kAccessor),
              change("empty an impossible one", Bytes(17344, 0xFF), none, empty, 0, Locking::kAccessor),
              change("connection reset", ab, disconnected, reset),
              change("connection reset, nothing connected", disconnected, disconnected, reset),
              change("connection reset, no device", none, none, reset)},
             field(17344, ""));
    attached_process();
    EXPECT_EQ(bt_con_initRegDev(), 0);
    EXPECT_EQ(fake::calls().size(), 2u); // nothing to change, so nothing was locked after attaching
}

TEST(StoreDevices, ProfileIndexSelectsItsEntry)
{
    const uint32_t entry_of[] = {0, 1, 3, 4, 5, 6, 7, 8};
    for (uint32_t entry = 0; entry < 9; ++entry)
        for (const uint32_t value : {0u, 1u, 2u, UINT32_MAX})
            for (const uint32_t index : {0u, 1u, 2u, 3u, 4u, 5u, 6u, 7u, 8u, 9u, UINT32_MAX}) {
                Bytes connected(1008), supported(1008);
                put(connected, 268 + 12 * entry, words({value}));
                put(supported, 268 + 12 * entry + 4, words({value}));
                const int32_t want = index < 8 && entry_of[index] == entry && value == 1;
                EXPECT_EQ(bt_con_IsCheckRegDevConnectProfile(Given(connected), index), want) << entry << " " << index;
                EXPECT_EQ(bt_con_IsCheckRegDevSupportProfile(Given(supported), index), want) << entry << " " << index;
                EXPECT_EQ(bt_con_IsCheckRegDevConnectProfile(Given(supported), index), 0);
                EXPECT_EQ(bt_con_IsCheckRegDevSupportProfile(Given(connected), index), 0);
            }
    EXPECT_EQ(bt_con_IsCheckRegDevSupportProfile(nullptr, 0), 0);
    EXPECT_EQ(bt_con_IsCheckRegDevConnectProfile(nullptr, 0), 0);
}

TEST(StoreDevices, FilterMatchesItsFirstCountIndexes)
{
    Bytes supports_3(1008);
    put(supports_3, 268 + 12 * 4 + 4, words({1}));
    const struct {
        Bytes filter;
        int32_t holds_3;
    } rows[] = {{words({1, 3}), 1},          {words({4, 0, 8, 7, 3}), 1},  {words({2, 0, 7, 3}), 0}, {words({0, 3}), 0},
                {words({UINT32_MAX, 3}), 0}, {words({0x80000000u, 3}), 0}, {words({1, 2}), 0}};
    for (const auto& row : rows) {
        EXPECT_EQ(bt_con_IsCheckProfileFilter(Given(row.filter), 3), row.holds_3) << fake::to_hex(row.filter);
        EXPECT_EQ(bt_con_IsCheckRegDevSupportProfile4Filter(Given(supports_3), Given(row.filter)), row.holds_3);
    }
    EXPECT_EQ(bt_con_IsCheckProfileFilter(nullptr, 0), 0);
    EXPECT_EQ(bt_con_IsCheckRegDevSupportProfile4Filter(nullptr, Given(words({1, 3}))), 0);
    EXPECT_EQ(bt_con_IsCheckRegDevSupportProfile4Filter(Given(supports_3), nullptr), 0);
}

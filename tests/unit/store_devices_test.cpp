// The registered device list and the checks of a device's profiles.
#include "store_support.h"

using namespace store;

namespace {

// In the order of the arguments, the last of them behind two words.
const struct {
    size_t at, size;
} kParts[] = {{0, 256}, {264, 4}, {268, 108}, {376, 12}, {388, 8}, {396, 56}, {452, 24}, {476, 532}};
enum : unsigned { kAll = 0xFF, kPersistent = 0xE7 };

// The call that adds a device; a bit of `parts` gives that part as bytes 0x80 + its number, else it is null.
Row add(const std::string& letter, unsigned parts, const Bytes& before, const Bytes& after, int32_t result = 0)
{
    const auto call = [=] {
        Bytes memory[8];
        At part[8] = {nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr};
        for (size_t i = 0; i < 8; ++i) {
            memory[i].assign(kParts[i].size, static_cast<uint8_t>(0x80 + i));
            if ((parts >> i & 1) != 0) part[i] = memory[i].data();
        }
        return bt_con_addRegDev(dev(letter), part[0], part[1], part[2], part[3], part[4], part[5], part[6], 0x11111111,
                                0x22222222, part[7], 0x33333333);
    };
    const Row row =
        change({"add " + letter + " with " + std::to_string(parts), [=](At) { return call(); }}, before, after, result);
    return (parts & kPersistent) != 0 ? row : Row(row).unwritten();
}

// What such a call makes of slot `slot`.
Bytes added(Bytes list, size_t slot, unsigned parts)
{
    for (size_t i = 0; i < 8; ++i)
        if ((parts >> i & 1) != 0)
            put(list, 4 + 1008 * slot + kParts[i].at, Bytes(kParts[i].size, static_cast<uint8_t>(0x80 + i)));
    for (uint32_t i = 0; i < 3; ++i)
        put(list, 17140 + 68 * i + 4 * slot, words({0x11111111 * (i + 1)}));
    return list;
}

Bytes added_new(const std::string& devices, char letter, unsigned parts)
{
    const size_t slot = devices.size();
    Bytes list = with_count(static_cast<int32_t>(slot + 1), device_list(devices));
    put(list, 4 + 1008 * slot + 256, address(letter));
    return added(list, slot, parts);
}

Row remove_one(const std::string& letter, const std::string& before, const std::string& after, int32_t result = 0)
{
    return change(CALL(bt_con_delRegDev(dev(letter))), device_list(before), device_list(after), result);
}

Row remove_several(const std::string& letters, int32_t count, const std::string& after)
{
    return change(CALL(bt_con_delpluralRegDev(dev(letters), count)), device_list("ABC"), device_list(after));
}

} // namespace

TEST(StoreDevices, AddUpdateAndRemove)
{
    const Bytes ab = device_list("AB"), full = device_list(kSeventeen), none = device_list("");
    Bytes same_name = ab, disconnected = ab;
    put(same_name, 4 + 1008, Bytes(256, 0x80));
    for (size_t entry = 0; entry < 9; ++entry)
        for (const size_t slot : {size_t{0}, size_t{1}})
            put(disconnected, 4 + 1008 * slot + 268 + 12 * entry, words({0}));
    std::vector<Row> rows = {
        add("A", 0, none, added_new("", 'A', 0)),
        add("Q", 0, device_list(kSixteen), added_new(kSixteen, 'Q', 0)),
        add("C", kAll, ab, added_new("AB", 'C', kAll)),
        add("0", 0, ab, added_new("AB", '0', 0)), // all zero is an address
        add("Q", 0, full, added(full, 16, 0)),
        add("B", 1, same_name, added(ab, 1, 1)), // the words change
        add("X", kAll, full, full, -1),
        add("X", 0, with_count(-4, none), added_new("", 'X', 0)),
        add("X", 1, with_count(18, full), {}, -1),
        add("Q", 0, with_count(INT32_MAX, full), added(full, 16, 0)),
        add("-", kAll, ab, {}, -2),
        add("?", kAll, ab, {}, -2),
        remove_one("A", "ABC", "BC"),
        remove_one("C", "ABC", "AB"),
        remove_one("A", kSeventeen, kSeventeen.substr(1)),
        remove_one("Q", "", kSixteen).on(with_count(40, full)),
        remove_one("X", "ABC", "ABC", -1),
        refused(-2, CALL(bt_con_delRegDev(dev("-")))),
        refused(-2, CALL(bt_con_delRegDev(nullptr))),
        remove_several("AB", 2, "C"),
        remove_several("CXA-", 4, "B"),
        remove_several("AA", 2, "BC"),
        remove_several("AB", 1, "BC"),
        remove_several("A", 0, "ABC"),
        remove_several("A", INT32_MIN, "ABC"),
        refused(-2, CALL(bt_con_delpluralRegDev(nullptr, 1))),
        change(CALL(bt_con_initRegDev()), ab, none, 0, Locking::kAccessor),
        change(CALL(bt_con_initRegDev()), Bytes(17344, 0xFF), none, 0, Locking::kAccessor),
        change(CALL(bt_con_initRegDev()), none, none, 0, Locking::kNone),
        change(CALL(bt_con_ConnectInitRegDev()), ab, disconnected),
        change(CALL(bt_con_ConnectInitRegDev()), disconnected, disconnected),
    };
    for (Row& row : rows)
        if (row.result == -2) row.locking = Locking::kNone;
    for (unsigned i = 0; i < 8; ++i)
        rows.push_back(add(i % 2 == 0 ? "A" : "B", 1u << i, ab, added(ab, i % 2, 1u << i)));
    run_rows({kDevices, 17344, none, {{kDevices, 17}}}, rows);
}

TEST(StoreDevices, Read)
{
    enum : unsigned { kRecord = 1, kIndex = 2, kAttribute = 4, kMode = 8, kRole = 16, kEvery = 31 };
    const auto read = [](const std::string& letter, unsigned outputs, int32_t result, Bytes left, Bytes failed) {
        const auto call = [=](At out) {
            const auto to = [&](unsigned output, size_t at) { return outputs & output ? out + at : At(nullptr); };
            return bt_con_getRegDev(dev(letter), to(kRecord, 0), to(kIndex, 1008), to(kAttribute, 1012),
                                    to(kMode, 1016), to(kRole, 1020));
        };
        return answer({"read " + letter, call}, std::move(left), result,
                      result == 0 ? Locking::kReported : Locking::kNone, std::move(failed));
    };
    const Bytes known = device_record('B') + words({1, 0x142, 0x242, 0x342});
    const Bytes unknown = Bytes(1008, 0xA5) + words({UINT32_MAX, 0}) + Bytes(8, 0xA5);
    const Bytes not_asked = Bytes(1008, 0xA5) + words({UINT32_MAX}) + Bytes(12, 0xA5);
    const Bytes no_name = words({106, 0}) + Bytes(248, 0), full = device_list(kSeventeen);
    run_rows(
        {kDevices, 0, device_list("ABC"), {{kDevices, 17}}},
        {read("B", kEvery, 0, known, unknown),
         read("X", kEvery, 0, unknown, unknown),
         read("-", kEvery, -2, not_asked, {}),
         read("?", kEvery, -2, not_asked, {}),
         read("B", kEvery - kRecord, -2, not_asked, {}),
         read("B", kEvery - kAttribute, -2, not_asked, {}),
         answer(CALL(bt_con_getRegisterDeviceName(dev("B"), out)), Bytes(256, 'B'), 0, Locking::kUnlockSpoils, no_name),
         answer(CALL(bt_con_getRegisterDeviceName(dev("X"), out)), no_name, -1, Locking::kUnlockSpoils, no_name),
         answer(CALL(bt_con_getRegisterDeviceName(dev("-"), out)), no_name, -2),
         refused(-1, CALL(bt_con_getRegisterDeviceName(nullptr, out))),
         refused(-1, CALL(bt_con_getRegisterDeviceName(dev("B"), nullptr))),
         refused(2, CALL(bt_con_getRegisterDeviceIndex(dev("C")))),
         refused(-1, CALL(bt_con_getRegisterDeviceIndex(dev("X")))),
         refused(-1, CALL(bt_con_getRegisterDeviceIndex(nullptr))),
         refused(16, CALL(bt_con_getRegisterDeviceIndex(dev("Q")))).on(with_count(INT32_MAX, full)),
         refused(-1, CALL(bt_con_getRegisterDeviceIndex(dev("Q")))).on(with_count(16, full)),
         refused(-1, CALL(bt_con_getRegisterDeviceIndex(dev("A")))).on(with_count(-1, full)),
         answer(CALL(bt_con_getRegisterDeviceNum(out)), word(3)),
         answer(CALL(bt_con_getRegisterDeviceNum(out)), word(17)).on(with_count(18, full)),
         answer(CALL(bt_con_getRegisterDeviceNum(out)), word(0)).on(with_count(-1, full)),
         refused(-1, CALL(bt_con_getRegisterDeviceNum(nullptr)))});

    attached_process(device_list("B"));
    for (const unsigned missing : {kIndex, kMode, kRole}) { // what the other outputs get is left open
        uint8_t* const out = fake::guarded(1024);
        EXPECT_EQ(read("B", kEvery - missing, -2, {}, {}).operation.call(out), -2);
        EXPECT_EQ(Bytes(out, out + 1008), Bytes(1008, 0xA5));
    }
}

TEST(StoreDevices, ProfileIndexSelectsItsEntry)
{
    const uint32_t entry_of[] = {0, 1, 3, 4, 5, 6, 7, 8};
    for (uint32_t entry = 0; entry < 9; ++entry)
        for (const uint32_t value : {0u, 1u, 2u, UINT32_MAX})
            for (const uint32_t index : {0u, 1u, 2u, 3u, 4u, 5u, 6u, 7u, 8u, UINT32_MAX}) {
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
    const std::pair<Bytes, int32_t> rows[] = {{words({1, 3}), 1}, {words({4, 0, 8, 7, 3}), 1}, {words({2, 0, 7, 3}), 0},
                                              {words({0, 3}), 0}, {words({UINT32_MAX, 3}), 0}, {words({1, 2}), 0}};
    for (const auto& [filter, holds_3] : rows) {
        EXPECT_EQ(bt_con_IsCheckProfileFilter(Given(filter), 3), holds_3) << fake::to_hex(filter);
        EXPECT_EQ(bt_con_IsCheckRegDevSupportProfile4Filter(Given(supports_3), Given(filter)), holds_3);
    }
    EXPECT_EQ(bt_con_IsCheckProfileFilter(nullptr, 0), 0);
    EXPECT_EQ(bt_con_IsCheckRegDevSupportProfile4Filter(nullptr, Given(words({1, 3}))), 0);
    EXPECT_EQ(bt_con_IsCheckRegDevSupportProfile4Filter(Given(supports_3), nullptr), 0);
}

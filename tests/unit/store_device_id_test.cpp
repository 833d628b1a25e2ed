// The device ID records: up to two values per device, each under a key.
#include "store_support.h"

using namespace store;

namespace {

// Every device with value 1 under key 5.
Bytes ids(const std::string& letters)
{
    Bytes entries;
    for (const char letter : letters)
        entries = entries + id_entry(letter, 5, 1);
    return id_list(entries);
}

// A value of 0 is a null pointer.
Row add(const std::string& letter, uint32_t key, uint8_t value, const Bytes& before, const Bytes& after)
{
    const Bytes bytes(value == 0 ? 0 : 8, value);
    return change(CALL(bt_con_addRegisteredDeviceDIDInfo(dev(letter), key, Given(bytes))), before, after, 0,
                  Locking::kUnlockIgnored);
}

Row take(const std::string& letter, const std::string& before, const std::string& after, int32_t result = 0)
{
    return change(CALL(bt_con_delRegisteredDeviceDIDInfo(dev(letter))), ids(before), ids(after), result,
                  Locking::kUnlockIgnored);
}

Row read(const std::string& letter, uint32_t key, int32_t result, Bytes value = {})
{
    return answer(CALL(bt_con_getRegisteredDeviceDIDInfo(dev(letter), key, out)), std::move(value), result,
                  Locking::kUnlockIgnored);
}

} // namespace

TEST(StoreDeviceIds, AddReadAndRemove)
{
    const Bytes one = ids("A"), two = id_list(id_entry('A', 5, 1, 9, 2)), full = ids(kSeventeen);
    run_rows({kDeviceIds, 544, id_list(id_entry('A', 5, 1, 9, 2) + id_entry('B', 0, 7))},
             {add("A", 5, 1, ids(""), one),
              add("A", 9, 2, one, two),
              add("A", 7, 3, two, two),
              add("A", 5, 4, two, id_list(id_entry('A', 5, 4, 9, 2))),
              add("A", 9, 4, two, id_list(id_entry('A', 5, 1, 9, 4))),
              add("Q", 5, 1, ids(kSixteen), full),
              add("X", 5, 1, full, full),
              add("B", 0, 1, one, one),
              add("-", 5, 1, one, one),
              add("?", 5, 1, one, one),
              add("B", 5, 0, one, one),
              add("0", 5, 1, ids(""), ids("0")),
              take("A", "ABC", "BC"),
              take("C", "ABC", "AB"),
              take("X", "ABC", "ABC", -2),
              take("-", "ABC", "ABC", -2),
              take("?", "ABC", "ABC", -2),
              take("X", kSeventeen, kSeventeen),
              take("A", kSeventeen, kSeventeen.substr(1)),
              take("Q", kSeventeen, kSixteen),
              read("A", 5, 0, Bytes(8, 1)),
              read("A", 9, 0, Bytes(8, 2)),
              read("A", 8, -1),
              read("B", 0, -2),
              read("X", 5, -2),
              read("?", 5, -2),
              read("X", 5, -2).on(full),
              read("Q", 5, 0, Bytes(8, 1)).on(full)});
}

TEST(StoreDeviceIds, SearchInACallersList)
{
    const struct {
        Bytes list;
        const char* letter;
        int32_t result, index;
    } rows[] = {{ids("ABC"), "C", 0, 2},
                {ids(kSixteen), "X", -2, 16},
                {ids(kSeventeen), "X", 0, 17},
                {ids("AB-D"), "D", -2, 2}};
    int32_t index = 77;
    EXPECT_EQ(bt_con_searchRegisteredDeviceDIDInfo(nullptr, Given(ids("A")), &index), -2);
    EXPECT_EQ(bt_con_searchRegisteredDeviceDIDInfo(dev("A"), nullptr, &index), -2);
    EXPECT_EQ(index, 77);
    EXPECT_EQ(bt_con_searchRegisteredDeviceDIDInfo(dev("A"), Given(ids("A")), nullptr), -2);
    for (const auto& row : rows) {
        EXPECT_EQ(bt_con_searchRegisteredDeviceDIDInfo(dev(row.letter), Given(row.list), &index), row.result);
        EXPECT_EQ(index, row.index);
    }
}

TEST(StoreDeviceIds, SlotsOfACallersList)
{
    const Bytes a = id_entry('A', 5, 1, 9, 2), b = id_entry('B', 5, 1), c = id_entry('C', 6, 1, 7, 2),
                list = id_list(a + b + c), none(8, 0xA5);
    const struct {
        int32_t index;
        uint32_t key;
        int32_t read, written;
        Bytes value, after;
    } rows[] = {{0, 5, 0, 0, Bytes(8, 1), id_list(id_entry('X', 5, 3, 9, 2) + b + c)},
                {0, 9, 0, 0, Bytes(8, 2), id_list(id_entry('X', 5, 1, 9, 3) + b + c)},
                {1, 9, -1, 0, none, id_list(a + id_entry('X', 5, 1, 9, 3) + c)},
                {2, 5, -1, -1, none, list},
                {1, 0, -2, -2, none, list},
                {17, 5, -2, -2, none, list},
                {-1, 5, -2, -2, none, list},
                {INT32_MAX, 5, -2, -2, none, list}};
    for (const auto& row : rows) {
        SCOPED_TRACE("index " + std::to_string(row.index) + ", key " + std::to_string(row.key));
        const Given mine(list), value(none);
        EXPECT_EQ(bt_con_getDeviceDIDInfo(row.index, row.key, mine, value), row.read);
        EXPECT_EQ(value.bytes(), row.value);
        EXPECT_EQ(difference(mine.bytes(), list), "");
        EXPECT_EQ(bt_con_setDeviceDIDInfo(row.index, dev("X"), row.key, mine, Given(Bytes(8, 3))), row.written);
        EXPECT_EQ(difference(mine.bytes(), row.after), "");
    }
    const Given mine(list), value(none);
    EXPECT_EQ(bt_con_getDeviceDIDInfo(0, 5, nullptr, value), -2);
    EXPECT_EQ(bt_con_getDeviceDIDInfo(0, 5, mine, nullptr), -2);
    EXPECT_EQ(bt_con_setDeviceDIDInfo(0, nullptr, 5, mine, value), -2);
    EXPECT_EQ(bt_con_setDeviceDIDInfo(0, dev("X"), 5, nullptr, value), -2);
    EXPECT_EQ(bt_con_setDeviceDIDInfo(0, dev("X"), 5, mine, nullptr), -2);
    EXPECT_EQ(difference(mine.bytes(), list), "");
}

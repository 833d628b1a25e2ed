#include "store_support.h"

#include <climits>
#include <thread>

using namespace store;

namespace {

const Field kList = {kDevices, 0, device_list("ABC"), {{kDevices, 17}}};

Bytes records(const std::string& letters) // '.' is a slot of which only the address was set
{
    Bytes all;
    for (const char letter : letters)
        all = all + (letter == '.' ? Bytes(256, 0xA5) + Bytes(6, 0xFF) + Bytes(746, 0xA5) : device_record(letter));
    return all;
}

Bytes word(uint32_t value)
{
    return words({value}) + Bytes(4, 0xA5);
}

Row query(const std::string& what, Call call, int32_t result, Bytes out = {})
{
    return answer(what, std::move(call), std::move(out), result, result == -2 ? Locking::kNone : Locking::kReported);
}

Call list_call(int32_t value, int32_t maximum)
{
    return [=](At out) { return BT_SRV_CON_getRemoteDeviceList(7, &value, maximum, out); };
}

Row list(const std::string& stored, const std::string& out, int32_t result)
{
    return answer("list of " + stored, list_call(0, static_cast<int32_t>(out.size())), records(out), result,
                  Locking::kNumber)
        .on(device_list(stored));
}

} // namespace

TEST(ConnectionQueries, OneDevice)
{
    const auto mode = [](const char* letter) {
        return [=](At out) { return BT_SRV_CON_getConnectionMode(dev(letter), out); };
    };
    const auto role = [](const char* letter) {
        return [=](At out) { return BT_SRV_CON_getLocalDeviceRole(dev(letter), out); };
    };
    const auto info = [](const char* letter) {
        return [=](At out) { return BT_SRV_CON_getRemoteDeviceInfo(dev(letter), out); };
    };
    const Bytes full = device_list(kSeventeen);
    run_query_rows({query("mode", mode("B"), 0, word(0x242)), query("mode of an unknown", mode("X"), -1),
                    query("mode of no device", mode("-"), -1),
                    query(
                        "mode, null address", [](At out) { return BT_SRV_CON_getConnectionMode(nullptr, out); }, -1),
                    query(
                        "mode, null output", [](At) { return BT_SRV_CON_getConnectionMode(dev("B"), nullptr); }, -2),
                    query("role", role("C"), 0, word(0x343)), query("role of an unknown", role("X"), -1),
                    query(
                        "role, null address", [](At out) { return BT_SRV_CON_getLocalDeviceRole(nullptr, out); }, -1),
                    query(
                        "role, null output", [](At) { return BT_SRV_CON_getLocalDeviceRole(dev("B"), nullptr); }, -2),
                    query("info", info("A"), 0, device_record('A')), query("info of an unknown", info("X"), -1),
                    query(
                        "info, null address", [](At out) { return BT_SRV_CON_getRemoteDeviceInfo(nullptr, out); }, -2),
                    query(
                        "info, null output", [](At) { return BT_SRV_CON_getRemoteDeviceInfo(dev("A"), nullptr); }, -2),
                    query("mode, count too large", mode("Q"), 0, word(0x251)).on(with_count(INT32_MAX, full)),
                    query("info, negative count", info("A"), -1, Bytes(1008, 0xA5)).on(with_count(-1, full))},
                   kList);
}

TEST(ConnectionQueries, DeviceList)
{
    run_query_rows({list("AB", "AB...", 2), list("ABCDE", "ABC", 3), list("AB", "AB", 2), list("", "....", 0),
                    list(kSeventeen, kSeventeen + ".", 17),
                    list("", kSeventeen + "..", 17).on(with_count(18, device_list(kSeventeen))),
                    list("", "..", 0).on(with_count(-1, device_list(kSeventeen)))},
                   kList);
    const Call refused[] = {list_call(0, 0),
                            list_call(-1, 5),
                            list_call(INT32_MIN, 5),
                            list_call(0, -1),
                            list_call(0, INT32_MIN),
                            [](At) { return list_call(0, 5)(nullptr); },
                            [](At out) { return BT_SRV_CON_getRemoteDeviceList(7, nullptr, 5, out); }};
    for (const Call& call : refused) {
        fresh_process(device_list("AB"));
        uint8_t* const out = fake::guarded(8);
        EXPECT_EQ(call(out), 0);
        EXPECT_EQ(Bytes(out, out + 8), Bytes(8, 0xA5));
        EXPECT_EQ(fake::held_locks(), 0u);
    }
}

TEST(ConnectionQueries, ModesOfTheRadio)
{
    const Call discoverable = [](At out) { return BT_SRV_CON_getDiscoverableMode(out); };
    const Call scan = [](At out) { return BT_SRV_CON_getScanMode(out); };
    run_query_rows({answer("discoverable", discoverable, word(0xD1), 0, Locking::kAccessor),
                    answer("scan", scan, word(0x5C), 0, Locking::kAccessor),
                    query(
                        "discoverable, null", [=](At) { return discoverable(nullptr); }, -2),
                    query(
                        "scan, null", [=](At) { return scan(nullptr); }, -2)},
                   {27776, 0, words({0xD1, 0x5C}), {}});
}

TEST(ConnectionQueries, DeviceIds)
{
    const auto id = [](const std::string& letter, uint32_t key, int32_t result, Bytes value = {}) {
        const Call call = [=](At out) { return BT_SRV_CON_getRemoteDeviceDIDInfo(dev(letter), key, out); };
        return answer("id of " + letter, call, std::move(value), result,
                      key == 0 ? Locking::kNone : Locking::kUnlockIgnored);
    };
    run_query_rows({id("A", 5, 0, Bytes(8, 1)), id("A", 9, 0, Bytes(8, 2)), id("A", 8, -1), id("X", 5, -2),
                    id("A", 0, -2),
                    query(
                        "null address", [](At out) { return BT_SRV_CON_getRemoteDeviceDIDInfo(nullptr, 5, out); }, -2),
                    query(
                        "null output", [](At) { return BT_SRV_CON_getRemoteDeviceDIDInfo(dev("A"), 5, nullptr); }, -2)},
                   {kDeviceIds, 0, id_list(id_entry('A', 5, 1, 9, 2)), {}});
}

TEST(ConnectionQueries, ThreadsThatAttachAtOnceSeeWholeLists)
{
    const uint8_t* const area = fresh_process();
    std::vector<std::thread> threads;
    for (const char* const letter : {"A", "B", "C", "D"})
        threads.emplace_back([letter, none = At(nullptr)] {
            Bytes record(1008);
            const Bytes name(256, static_cast<uint8_t>(letter[0]));
            EXPECT_EQ(BT_SRV_CON_getRemoteDeviceInfo(dev(letter), At(record.data())), -1);
            EXPECT_EQ(bt_con_addRegDev(dev(letter), Given(name), none, none, none, none, none, none, 1, 2, none, 3), 0);
            EXPECT_EQ(bt_con_addOrderList(dev(letter)), 0);
            EXPECT_EQ(bt_con_addConnectOrder(dev(letter), 0), 0);
            EXPECT_EQ(BT_SRV_CON_getRemoteDeviceInfo(dev(letter), At(record.data())), 0);
            EXPECT_EQ(Bytes(record.begin(), record.begin() + 256), name);
        });
    for (std::thread& thread : threads)
        thread.join();
    for (const size_t count : {size_t{kDevices}, size_t{kOrder}, size_t{kProfileOrders}})
        EXPECT_EQ(area[count], 4) << count;
    EXPECT_EQ(fake::deepest_lock(), 1u);
    EXPECT_EQ(difference(*fake::read_file(kImagePath), image_of(area_bytes())), "");
}

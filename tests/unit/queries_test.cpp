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
    run_query_rows(
        {answer("mode", mode("B"), word(0x242), 0, Locking::kReported),
         refused("mode of an unknown", -1, mode("X"), Locking::kReported),
         refused("mode of no device", -1, mode("-"), Locking::kReported),
         refused("mode, null address", -1, mode("?"), Locking::kReported),
         refused("mode, null output", -2, nulled(mode("B"))),
         answer("role", role("C"), word(0x343), 0, Locking::kReported),
         refused("role of an unknown", -1, role("X"), Locking::kReported),
         refused("role, null address", -1, role("?"), Locking::kReported),
         refused("role, null output", -2, nulled(role("B"))),
         answer("info", info("A"), device_record('A'), 0, Locking::kReported),
         refused("info of an unknown", -1, info("X"), Locking::kReported), refused("info, null address", -2, info("?")),
         refused("info, null output", -2, nulled(info("A"))),
         answer("mode, count too large", mode("Q"), word(0x251), 0, Locking::kReported).on(with_count(INT32_MAX, full)),
         answer("info, negative count", info("A"), Bytes(1008, 0xA5), -1, Locking::kReported).on(with_count(-1, full))},
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
                            nulled(list_call(0, 5)),
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
                    refused("discoverable, null", -2, nulled(discoverable)), refused("scan, null", -2, nulled(scan))},
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
                    id("A", 0, -2), refused("null address", -2, id("?", 5, -2).call),
                    refused("null output", -2, nulled(id("A", 5, 0).call))},
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

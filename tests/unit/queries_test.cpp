// The connection queries, which attach the area by themselves.
#include "store_support.h"

using namespace store;

namespace {

Bytes records(const std::string& letters) // '.' is a slot of which only the address was set
{
    Bytes all;
    for (const char letter : letters)
        all = all + (letter == '.' ? Bytes(256, 0xA5) + Bytes(6, 0xFF) + Bytes(746, 0xA5) : device_record(letter));
    return all;
}

int32_t list_devices(int32_t value, int32_t maximum, At out)
{
    return BT_SRV_CON_getRemoteDeviceList(7, &value, maximum, out);
}

Row list(const std::string& stored, const std::string& out_records, int32_t result)
{
    const auto maximum = static_cast<int32_t>(out_records.size());
    return answer(CALL(list_devices(0, maximum, out)), records(out_records), result, Locking::kNumber)
        .on(device_list(stored));
}

} // namespace

TEST(ConnectionQueries, Devices)
{
    const Locking kReported = Locking::kReported, kNumber = Locking::kNumber;
    const Bytes full = device_list(kSeventeen);
    run_rows({kDevices, 0, device_list("ABC"), {{kDevices, 17}}, false},
             {answer(CALL(BT_SRV_CON_getConnectionMode(dev("B"), out)), word(0x242), 0, kReported),
              refused(-1, CALL(BT_SRV_CON_getConnectionMode(dev("X"), out)), kReported),
              refused(-1, CALL(BT_SRV_CON_getConnectionMode(nullptr, out)), kReported),
              refused(-2, CALL(BT_SRV_CON_getConnectionMode(dev("B"), nullptr))),
              answer(CALL(BT_SRV_CON_getConnectionMode(dev("Q"), out)), word(0x251), 0, kReported)
                  .on(with_count(INT32_MAX, full)),
              answer(CALL(BT_SRV_CON_getLocalDeviceRole(dev("C"), out)), word(0x343), 0, kReported),
              refused(-1, CALL(BT_SRV_CON_getLocalDeviceRole(nullptr, out)), kReported),
              refused(-2, CALL(BT_SRV_CON_getLocalDeviceRole(dev("B"), nullptr))),
              answer(CALL(BT_SRV_CON_getRemoteDeviceInfo(dev("A"), out)), device_record('A'), 0, kReported),
              answer(CALL(BT_SRV_CON_getRemoteDeviceInfo(dev("X"), out)), Bytes(1008, 0xA5), -1, kReported),
              refused(-2, CALL(BT_SRV_CON_getRemoteDeviceInfo(nullptr, out))),
              refused(-2, CALL(BT_SRV_CON_getRemoteDeviceInfo(dev("A"), nullptr))),
              answer(CALL(BT_SRV_CON_getRemoteDeviceInfo(dev("A"), out)), Bytes(1008, 0xA5), -1, kReported)
                  .on(with_count(-1, full)),
              list("AB", "AB...", 2),
              list("ABCDE", "ABC", 3),
              list(kSeventeen, kSeventeen + ".", 17),
              list("", kSeventeen + "..", 17).on(with_count(18, full)),
              list("", "..", 0).on(with_count(-1, full)),
              refused(0, CALL(list_devices(0, -1, out)), kNumber),
              refused(0, CALL(list_devices(0, INT32_MIN, out)), kNumber)});

    fresh_process(device_list("AB"));
    const Given out(Bytes(8, 0xA5));
    EXPECT_EQ(list_devices(0, 0, static_cast<void*>(out)), 0);
    EXPECT_EQ(list_devices(-1, 5, static_cast<void*>(out)), 0);
    EXPECT_EQ(list_devices(0, 5, nullptr), 0);
    EXPECT_EQ(BT_SRV_CON_getRemoteDeviceList(7, nullptr, 5, out), 0);
    EXPECT_EQ(out.bytes(), Bytes(8, 0xA5));
}

TEST(ConnectionQueries, ModesOfTheRadioAndDeviceIds)
{
    run_rows({27776, 0, words({0xD1, 0x5C}), {}, false},
             {answer(CALL(BT_SRV_CON_getDiscoverableMode(out)), word(0xD1), 0, Locking::kAccessor),
              answer(CALL(BT_SRV_CON_getScanMode(out)), word(0x5C), 0, Locking::kAccessor),
              refused(-2, CALL(BT_SRV_CON_getDiscoverableMode(nullptr))),
              refused(-2, CALL(BT_SRV_CON_getScanMode(nullptr)))});

    const Locking locking = Locking::kUnlockIgnored;
    run_rows({kDeviceIds, 0, id_list(id_entry('A', 5, 1, 9, 2)), {}, false},
             {answer(CALL(BT_SRV_CON_getRemoteDeviceDIDInfo(dev("A"), 9, out)), Bytes(8, 2), 0, locking),
              refused(-1, CALL(BT_SRV_CON_getRemoteDeviceDIDInfo(dev("A"), 8, out)), locking),
              refused(-2, CALL(BT_SRV_CON_getRemoteDeviceDIDInfo(dev("X"), 5, out)), locking),
              refused(-2, CALL(BT_SRV_CON_getRemoteDeviceDIDInfo(dev("A"), 0, out))),
              refused(-2, CALL(BT_SRV_CON_getRemoteDeviceDIDInfo(nullptr, 5, out))),
              refused(-2, CALL(BT_SRV_CON_getRemoteDeviceDIDInfo(dev("A"), 5, nullptr)))});
}

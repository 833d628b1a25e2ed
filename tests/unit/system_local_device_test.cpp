// The local device's record and the states of the profiles, which are read without the service.
#include "request_rows.h"

#include <bt_service/bt_system.h>
#include <gmock/gmock.h>

#include <algorithm>

namespace {

using fake::Bytes;
using requests::output_of;

const char* const kArea = "/tmp/shm_sysmgr_local_devinfo";

const struct Reader {
    uint32_t offset, size;
    std::function<int32_t(void*)> call;
} kReaders[] = {
    {0, 348, [](void* out) { return BT_SRV_getLocalDeviceInformation(static_cast<BtSysLocalDevice*>(out)); }},
    {340, 8, [](void* out) { return BT_SRV_getLocalDeviceDIDInfo(static_cast<BtSysDid*>(out)); }},
};

TEST(SystemLocalDevice, IsCopiedFromWhereItIsNow)
{
    for (const Reader& reader : kReaders)
        for (const int first : {1, 77}) {
            fake::reset(); // the area moves
            uint8_t* const area = fake::area(kArea, 348);
            for (int i = 0; i < 348; ++i)
                area[i] = static_cast<uint8_t>(first + i * 5 + i / 256);
            EXPECT_EQ(output_of(reader.size, reader.call, 0),
                      Bytes(area + reader.offset, area + reader.offset + reader.size));
            EXPECT_THAT(fake::calls(), testing::ElementsAre("LinkShareData(/tmp/shm_sysmgr_local_devinfo)"));
        }
}

TEST(SystemLocalDevice, FailuresLeaveTheOutputUntouched)
{
    for (const Reader& reader : kReaders) {
        fake::reset();
        EXPECT_EQ(reader.call(nullptr), -1);
        EXPECT_TRUE(fake::calls().empty());
        EXPECT_EQ(output_of(reader.size, reader.call, -1), Bytes()) << "no area";
        fake::null_area(kArea); // linked, but to nowhere
        EXPECT_EQ(output_of(reader.size, reader.call, -1), Bytes()) << "null address";
        fake::area(kArea, 347, 0x11);
        EXPECT_EQ(output_of(reader.size, reader.call, -1), Bytes()) << "too small";
        fake::area(kArea, 348, 0x11);
        fake::fail_only("LinkShareData");
        EXPECT_EQ(output_of(reader.size, reader.call, -1), Bytes()) << "failed link";
    }
}

TEST(SystemLocalDevice, ProfileStatesAreThoseOfTheFirstEightWords)
{
    EXPECT_THAT(g_setup_state, testing::Each(0u));
    for (const uint32_t index : {0u, 7u})
        EXPECT_EQ(BT_SRV_getEffectiveProfileState(index), 0);
    const uint32_t states[9] = {10, 11, 12, 13, 14, 15, 16, 0xFFFFFFFF, 18};
    std::copy(std::begin(states), std::end(states), g_setup_state);
    for (uint32_t index = 0; index < 7; ++index)
        EXPECT_EQ(BT_SRV_getEffectiveProfileState(index), static_cast<int32_t>(10 + index));
    EXPECT_EQ(BT_SRV_getEffectiveProfileState(7), -1);
    for (const uint32_t index : {8u, 9u, 0x100u, 0x40000000u, 0x80000000u, UINT32_MAX})
        EXPECT_EQ(BT_SRV_getEffectiveProfileState(index), 2) << index;
    std::fill(std::begin(g_setup_state), std::end(g_setup_state), 0u);
}

} // namespace

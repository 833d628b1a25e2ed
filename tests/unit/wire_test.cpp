// The payload writer's limits. What each append writes is seen in the requests' messages.
#include "fake_platform.h"
#include "wire/post.h"

#include <gtest/gtest.h>

#include <functional>

namespace {

using bt::Payload;

TEST(WirePayload, FieldsFitUpTo1008Bytes)
{
    const fake::Bytes source(1009, 0xA5);
    const struct {
        uint32_t size;
        std::function<void(Payload&)> append;
    } appends[] = {
        {1, [](Payload& payload) { payload.u8(1); }},
        {4, [](Payload& payload) { payload.be32(1); }},
        {8, [](Payload& payload) { payload.address({}); }},
        {1008, [](Payload& payload) { payload.zeros(1008); }},
        {1008, [](Payload& payload) { payload.zeros_to(1008 + payload.size()); }},
        {1008, [&source](Payload& payload) { payload.bytes(source.data(), 1008); }},
        {1008, [](Payload& payload) { payload.bytes_or_zeros(nullptr, 1008); }},
    };
    for (const auto& row : appends) {
        Payload fits, exceeds;
        row.append(fits.zeros(1008 - row.size));
        EXPECT_FALSE(fits.refused()) << row.size;
        EXPECT_EQ(fits.size(), 1008u) << row.size;
        row.append(exceeds.zeros(1009 - row.size));
        EXPECT_TRUE(exceeds.refused()) << row.size;
    }
}

TEST(WirePayload, RefusalLastsAndIsNotPosted)
{
    const uint8_t byte = 0xA5;
    const std::function<void(Payload&)> refused[] = {
        [](Payload& payload) { payload.bytes(nullptr, 1); },
        [&byte](Payload& payload) { payload.bytes(&byte, UINT32_MAX); },
        [](Payload& payload) { payload.zeros(UINT32_MAX); },
        [](Payload& payload) { payload.zeros(2).zeros_to(3); },
    };
    fake::reset();
    for (const auto& append : refused) {
        Payload payload;
        append(payload.u32(7));
        const uint32_t size = payload.size();
        payload.u8(1).bytes(&byte, 1);
        EXPECT_TRUE(payload.refused());
        EXPECT_EQ(payload.size(), size);
        EXPECT_EQ(bt::post(PNO_BT_SYS, bt::Request::shutdown, payload), -1);
    }
    EXPECT_TRUE(fake::calls().empty());
}

} // namespace

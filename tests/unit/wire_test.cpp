// The payload writer: what each append writes, and where it refuses.
#include "fake_platform.h"
#include "wire/post.h"

#include <gtest/gtest.h>

#include <functional>

namespace {

using bt::Payload;

// Header and payload as they are posted.
std::string message_of(Payload& payload)
{
    const auto* const bytes = reinterpret_cast<const uint8_t*>(&payload.framed(0x1234, 0xFF02));
    return fake::to_hex(fake::Bytes(bytes, bytes + 16 + payload.size()));
}

std::string text(const std::string& hex)
{
    return fake::to_hex(fake::hex(hex));
}

TEST(WirePayload, AppendsInOrderAndByteOrder)
{
    const uint8_t source[] = {0xD1, 0xD2, 0xD3};
    const BtDevAddress address = {{1, 2, 3, 4, 5, 6}, {7, 8}};
    Payload payload;
    payload.u8(0xFFFFFF11).u16(0xFFFF1234).u32(0x12345678).i32(-2).be16(0xFFFF1234).be32(0x12345678).le16(0xFFFF1234);
    payload.zeros(2).bytes(source, 3).bytes(nullptr, 0).bytes_or_zeros(source, 2).bytes_or_zeros(nullptr, 2);
    payload.address(address).zeros_to(44);

    EXPECT_FALSE(payload.refused());
    EXPECT_EQ(payload.size(), 44u);
    EXPECT_EQ(message_of(payload), text("00*4 02FF 02FF 3412 2C00 00*4 11 3412 78563412 FEFFFFFF 1234 12345678 3412 "
                                        "00*2 D1D2D3 D1D2 00*2 0102030405060708 00*8"));
}

TEST(WirePayload, FieldsFitUpTo1008Bytes)
{
    const fake::Bytes source(1009, 0xA5);
    const struct {
        uint32_t size;
        std::function<void(Payload&)> append;
    } appends[] = {
        {1, [](Payload& payload) { payload.u8(1); }},
        {2, [](Payload& payload) { payload.u16(1); }},
        {4, [](Payload& payload) { payload.u32(1); }},
        {4, [](Payload& payload) { payload.i32(1); }},
        {2, [](Payload& payload) { payload.be16(1); }},
        {4, [](Payload& payload) { payload.be32(1); }},
        {2, [](Payload& payload) { payload.le16(1); }},
        {8, [](Payload& payload) { payload.address({}); }},
        {0, [](Payload& payload) { payload.bytes(nullptr, 0); }},
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
        [&byte](Payload& payload) { payload.bytes(&byte, 1009); },
        [&byte](Payload& payload) { payload.bytes(&byte, UINT32_MAX); },
        [](Payload& payload) { payload.bytes_or_zeros(nullptr, 1009); },
        [](Payload& payload) { payload.zeros(UINT32_MAX); },
        [](Payload& payload) { payload.zeros(2).zeros_to(3); },
        [](Payload& payload) { payload.zeros_to(1009); },
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

TEST(WirePayload, CutsToALengthAndNamesItsSender)
{
    Payload longer, shorter;
    longer.sent_by(0x08C1).u32(0xA4A3A2A1).u32(0xB4B3B2B1).cut_to(5);
    EXPECT_EQ(message_of(longer), text("00*4 C108 02FF 3412 0500 00*4 A1A2A3A4 B1"));
    EXPECT_EQ(shorter.u8(1).cut_to(5).size(), 1u);
    EXPECT_FALSE(shorter.refused());
}

} // namespace

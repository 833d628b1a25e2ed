// HCI commands and radio tests: command packets in a fixed block to the system service.

#include "wire/post.h"

#include <bt_service/bt_system.h>

#include <iterator>

using bt::Payload;
using bt::Request;

namespace {

constexpr uint32_t kCommandPacket = 1;
constexpr uint32_t kPacketHeader = 4; // packet type, opcode, parameter length

constexpr uint32_t kWriteScanEnable = 0x0C1A;
constexpr uint32_t kReceiveTest = 0xFD17;
constexpr uint32_t kCarrierTest = 0xFD84;
constexpr uint32_t kTransmitTest = 0xFD85;
constexpr uint32_t kEndOfTest = 0xFD88;

constexpr uint8_t kInquiryAndPageScan = 3;
constexpr uint8_t kTransmitPlain = 0;
constexpr uint8_t kTransmitOnChannel = 3;
constexpr uint32_t kLastChannel = 78;

// Longest payload with its header, by packet type: DM1 DH1 DM3 DH3 DM5 DH5, 2-DH1 2-DH3 2-DH5, 3-DH1 3-DH3 3-DH5.
constexpr uint16_t kPacketLengths[] = {18, 28, 123, 185, 226, 341, 56, 369, 681, 85, 554, 1023};

int32_t post_command(Request request, uint32_t opcode, const void* parameters, uint32_t length)
{
    return bt::post(PNO_BT_SYS, request,
                    Payload()
                        .u8(kPacketHeader + length)
                        .u8(kCommandPacket)
                        .le16(opcode)
                        .u8(length)
                        .bytes(parameters, length)
                        .zeros_to(sizeof(BtSysHciCommand)));
}

uint8_t low_byte(uint32_t value)
{
    return static_cast<uint8_t>(value);
}

// The controller counts the even channels first, then the odd ones.
uint8_t channel_index(int32_t channel)
{
    const bool odd = (channel & 1) != 0;
    return low_byte(static_cast<uint32_t>(channel / 2 + (odd ? 40 : 0)));
}

} // namespace

int32_t BT_SRV_sendHciCommand(const BtSysHciCommand* command)
{
    return bt::post(PNO_BT_SYS, Request::sendHciCommand, Payload().bytes_or_zeros(command, sizeof *command));
}

int32_t BT_SRV_Reset()
{
    return post_command(Request::Reset, kEndOfTest, nullptr, 0);
}

int32_t BT_SRV_testRxMode(const BtSysRxTest* test)
{
    if (test == nullptr) return BT_FAILED;

    if (test->mode == 0) {
        const uint8_t parameters[] = {kInquiryAndPageScan};
        return post_command(Request::testRxMode, kWriteScanEnable, parameters, sizeof parameters);
    }
    const uint8_t parameters[] = {channel_index(test->channel), 1};
    return post_command(Request::testRxMode, kReceiveTest, parameters, sizeof parameters);
}

int32_t BT_SRV_testNonModulatedCarrier(const BtSysCarrierTest* test)
{
    if (test == nullptr) return BT_FAILED;

    const uint8_t parameters[12] = {0, 0, channel_index(test->channel), low_byte(test->parameter_3)};
    return post_command(Request::testNonModulatedCarrier, kCarrierTest, parameters, sizeof parameters);
}

int32_t BT_SRV_testTxMode(const BtSysTxTest* test)
{
    if (test == nullptr) return BT_FAILED;
    if (test->packet_type >= std::size(kPacketLengths)) return BT_FAILED;

    const uint8_t mode = test->mode == 0 ? kTransmitPlain : kTransmitOnChannel;
    const uint32_t channel = mode == kTransmitOnChannel && test->channel <= kLastChannel ? test->channel : 0;
    const uint16_t packet_length = kPacketLengths[test->packet_type];
    const uint8_t parameters[12] = {
        mode,
        channel_index(static_cast<int32_t>(channel)),
        0xFF,
        low_byte(test->packet_type),
        low_byte(test->parameter_4),
        0,
        low_byte(packet_length),
        low_byte(packet_length >> 8),
        low_byte(test->parameter_8),
        1,
        0xFF,
        0x01,
    };
    return post_command(Request::testTxMode, kTransmitTest, parameters, sizeof parameters);
}

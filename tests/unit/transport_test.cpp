// Sending, receiving and tracing messages, and the lookups in a request-response table.
#include "log_capture.h"

#include <bt_service/bt_message.h>
#include <bt_service/bt_transport.h>
#include <gmock/gmock.h>
#include <unistd.h>

#include <cstring>

namespace {

using fake::Bytes;
using testing::ElementsAre;

BtMessage message_of(uint16_t cid, uint16_t len)
{
    BtMessage message{};
    message.msg_header.hdr.cid = cid;
    message.msg_header.hdr.len = len;
    for (size_t i = 0; i < sizeof message.payload; ++i)
        message.payload[i] = static_cast<uint8_t>(i);
    return message;
}

Bytes bytes_of(const BtMessage& message, size_t size)
{
    const auto* const bytes = reinterpret_cast<const uint8_t*>(&message);
    return Bytes(bytes, bytes + size);
}

class Transport : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        DebugConsoleLogSts = DebugFileOutLogSts = DebugSRVOutLogSts = 0;
        DebugStrmLogStsOn = 0;
    }
    void TearDown() override { SetUp(); }

    static Outputs sent(uint16_t cid, uint16_t len)
    {
        const BtMessage message = message_of(cid, len);
        return outputs_of([&] { BT_CMN_sendMsgWrapper("f", "g", 1, 0x4001, &message); });
    }
    static std::string traced(uint16_t cid, uint16_t len) { return sent(cid, len).console; }
};

TEST_F(Transport, SendReportsWhatThePlatformAnswers)
{
    const BtMessage message = message_of(0xA081, 12);
    for (const int32_t answer : {0, 1, 2, -2, 65536}) {
        fake::reset();
        fake::answer_send(answer);
        const int32_t result = answer == 0 ? 0 : 1;
        Lines lines = {"[API][START] BT_CMN_sendMsgWrapper caller\n", "[API]BT_CMN_sendMsgWrapper getPno=ff02\n"};
        if (answer != 0)
            lines.push_back("[api:BT_CMN_sendMsgWrapper] _sys_SndMsg err. api_ret = " + std::to_string(answer) + " ");
        lines.push_back("[API][END] BT_CMN_sendMsgWrapper (" + std::to_string(result) + ")");
        const auto send = [&] {
            EXPECT_EQ(BT_CMN_sendMsgWrapper("file.c", "caller", 77, 0xFF02, &message), result) << answer;
        };
        EXPECT_EQ(logged("CMN", send), lines);
        ASSERT_EQ(fake::posts().size(), 1u);
        EXPECT_EQ(fake::posts()[0].pno, 0xFF02u);
        EXPECT_EQ(fake::posts()[0].zero, 0u);
        EXPECT_EQ(fake::posts()[0].message, bytes_of(message, 28));
    }
}

TEST_F(Transport, SizeHandedOverIsLengthPlusHeaderButNeverMoreThanASlot)
{
    const std::pair<uint16_t, size_t> rows[] = {{0, 16}, {1008, 1024}, {1009, 1024}, {65519, 1024}, {65520, 0}};
    for (const auto& [len, size] : rows) {
        const BtMessage message = message_of(1, len);
        void* const slot = std::memcpy(fake::guarded(sizeof message), &message, sizeof message);
        BT_CMN_sendMsgWrapper("f", "g", 1, 0x4001, slot);
        EXPECT_EQ(fake::posts().back().message.size(), size) << len;
    }
}

using TransportDeathTest = Transport;

TEST_F(TransportDeathTest, MinusOneEndsTheProcessAndNullIsRefused)
{
    BtMessage message = message_of(1, 0);
    fake::answer_send(-1);
    fake::answer_receive(-1);
    const testing::ExitedWithCode minus_one(255);
    BT_CMN_logout_wrapperFunc = _BT_CMN_logout_Console;
    EXPECT_EXIT((dup2(2, 1), BT_CMN_sendMsgWrapper("f", "g", 1, 2, &message)), minus_one, "getPno=2\nthe library");
    EXPECT_EXIT((dup2(2, 1), BT_CMN_recvMsgWrapper("f", "g", 1, &message)), minus_one, "getPno=8c2\nthe library");
    BT_CMN_logout_wrapperFunc = _BT_CMN_logout_Stub;

    EXPECT_EQ(logged("CMN", [] { EXPECT_EQ(BT_CMN_sendMsgWrapper("f", "g", 1, 2, nullptr), 1); }),
              (Lines{"[API][START] BT_CMN_sendMsgWrapper g\n", "[api:BT_CMN_sendMsgWrapper] param err. data = (nil) ",
                     "[API][END] BT_CMN_sendMsgWrapper (1)"}));
    EXPECT_EQ(logged("CMN", [] { EXPECT_EQ(BT_CMN_recvMsgWrapper("f", "g", 1, nullptr), 1); }),
              (Lines{"[API][START] BT_CMN_recvMsgWrapper [g]\n", "[api:BT_CMN_recvMsgWrapper] param err. data = (nil) ",
                     "[API][END] BT_CMN_recvMsgWrapper (1)"}));
    EXPECT_TRUE(fake::calls().empty());
}

TEST_F(Transport, ReceiveTakesTheOwnNumbersMessage)
{
    const Bytes sent = bytes_of(message_of(0xA091, 4), 1024);
    BtMessage buffer{};
    fake::incoming(sent);
    const auto receive = [&](int32_t result) {
        return logged("CMN", [&, result] { EXPECT_EQ(BT_CMN_recvMsgWrapper("f", "loop", 1, &buffer), result); });
    };
    EXPECT_THAT(receive(0),
                ElementsAre("[API][START] BT_CMN_recvMsgWrapper [loop]\n", "[API]BT_CMN_recvMsgWrapper getPno=8c2\n",
                            "[API][END] BT_CMN_recvMsgWrapper (0)"));
    EXPECT_EQ(bytes_of(buffer, 1024), sent);
    DebugSRVOutLogSts = DebugConsoleLogSts = 1;
    fake::incoming(sent);
    EXPECT_EQ(outputs_of([&] { receive(0); }).console, "BTSRV A091 00010203\n");
    EXPECT_EQ(fake::calls()[0], "RcvMsg(2242,1024,0)");
    for (const int32_t answer : {0, 2, -2}) {
        fake::answer_receive(answer);
        EXPECT_THAT(
            receive(1),
            ElementsAre("[API][START] BT_CMN_recvMsgWrapper [loop]\n", "[API]BT_CMN_recvMsgWrapper getPno=8c2\n",
                        "[api:BT_CMN_recvMsgWrapper] _sys_RcvMsg err. api_ret = " + std::to_string(answer) + " \n",
                        "[API][END] BT_CMN_recvMsgWrapper (1) \n"));
    }
}

TEST_F(Transport, TraceShowsIdAndAtMost128Bytes)
{
    DebugSRVOutLogSts = DebugConsoleLogSts = 1;
    std::string digits = fake::to_hex(bytes_of(message_of(0, 0), 144)).substr(3 * 16);
    digits.erase(std::remove(digits.begin(), digits.end(), ' '), digits.end());
    EXPECT_EQ(traced(0xA081, 0), "BTSRV A081 \n");
    EXPECT_EQ(traced(0x000F, 3), "BTSRV 000F 000102\n");
    for (const uint16_t len : {uint16_t{128}, uint16_t{129}, uint16_t{65535}})
        EXPECT_EQ(traced(0x1101, len), "BTSRV 1101 " + digits + "\n");
    fake::answer_send(1);
    EXPECT_EQ(traced(1, 1), "") << "an unsent message is not traced";
    fake::answer_send(0);
    DebugSRVOutLogSts = 0;
    EXPECT_EQ(traced(1, 1), "");
    DebugSRVOutLogSts = 1;
    fake::set_pno(0x08C5); // the stream process has a switch of its own
    EXPECT_EQ(traced(1, 1), "");
    DebugStrmLogStsOn = 1;
    EXPECT_EQ(traced(1, 0), "BTSRV 0001 \n");
    EXPECT_EQ(BT_CMN_DebugLogThreadIdFilter(nullptr), 1);
}

TEST_F(Transport, TraceGoesToEveryOutputThatIsOn)
{
    DebugSRVOutLogSts = DebugFileOutLogSts = 1;
    bt_cmn_log_fp_reset();
    VEXLOG_Zone = 45;
    const BtLogParameters before = g_VexLogParams;
    uint8_t* const mask = reinterpret_cast<uint8_t*>(&g_VexLogParams) + 12052 + 4;
    std::memset(mask, 0, 4);
    EXPECT_EQ(sent(0xA091, 1).file, "BTSRV A091 00\n");
    EXPECT_TRUE(fake::logs().empty()) << "the zone is off";
    mask[1] = 1u << (13 - 8);
    EXPECT_EQ(sent(0xA091, 2).file, "BTSRV A091 0001\n");
    EXPECT_EQ(traced(0xA091, 2), "");
    DebugFileOutLogSts = 0;
    EXPECT_EQ(sent(0xA091, 2).file, "");
    ASSERT_EQ(fake::logs().size(), 3u);
    EXPECT_THAT(fake::logs()[0].numbers, ElementsAre(137, 45));
    EXPECT_EQ(fake::logs()[0].tag, "CMN");
    EXPECT_EQ(fake::logs()[0].text, "BTSRV A091 0001\n");
    for (const int32_t zone : {-1, 256, INT32_MAX, INT32_MIN}) {
        VEXLOG_Zone = zone; // no such zone: nothing is read outside the block
        EXPECT_EQ(traced(0xA091, 0), "");
    }
    EXPECT_EQ(fake::logs().size(), 3u);
    VEXLOG_Zone = 13;
    g_VexLogParams = before;
}

TEST(RequestResponseTable, LooksUpByEitherColumn)
{
    const BtResponseRow table[] = {{0x10, 0x110, 4},   {0x11, 0x111, 8},  {0x10, 0x112, 9}, {0x13, 0x111, 7},
                                   {0xFFFF, 0x120, 6}, {0x14, 0xFFFF, 5}, {0x15, 0x121, 3}, {0xFFFF, 0xFFFF, 1}};
    std::vector<BtResponseRow> endless(300, {1, 1, 1});
    endless[255] = {2, 2, 22};
    endless[256] = {3, 3, 33};
    const struct {
        const BtResponseRow* table;
        uint32_t id;
        int32_t by_request; // then what that delivers, 7 being nothing
        uint16_t response, size;
        int32_t by_response;
        uint16_t response_size;
    } rows[] = {{table, 0x10, 0, 0x110, 4, 1, 7},     {table, 0x111, 1, 7, 7, 0, 8},
                {table, 0x112, 1, 7, 7, 0, 9},        {table, 0xFFFF, 1, 7, 7, 1, 7},
                {table, 0x10010, 1, 7, 7, 1, 7},      {table, 0x10111, 1, 7, 7, 1, 7},
                {table, 0x120, 1, 7, 7, 0, 6},        {table, 0x15, 1, 7, 7, 1, 7}, // each column has its end
                {table + 5, 0x15, 0, 0x121, 3, 1, 7}, {table + 5, 0x121, 1, 7, 7, 1, 7},
                {endless.data(), 2, 0, 2, 22, 0, 22}, {endless.data(), 3, 1, 7, 7, 1, 7}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.id);
        uint16_t response = 7, size = 7, response_size = 7;
        EXPECT_EQ(BT_CMN_get_response_from_request(row.table, row.id, &response, &size), row.by_request);
        EXPECT_EQ(BT_CMN_get_data_size_from_response(row.table, row.id, &response_size), row.by_response);
        EXPECT_THAT((std::vector<uint16_t>{response, size, response_size}),
                    ElementsAre(row.response, row.size, row.response_size));
    }
    uint16_t out = 7;
    EXPECT_EQ(BT_CMN_get_response_from_request(nullptr, 0x10, &out, &out), 1);
    EXPECT_EQ(BT_CMN_get_response_from_request(table, 0x10, nullptr, &out), 1);
    EXPECT_EQ(BT_CMN_get_response_from_request(table, 0x10, &out, nullptr), 1);
    EXPECT_EQ(BT_CMN_get_data_size_from_response(nullptr, 0x110, &out), 1);
    EXPECT_EQ(BT_CMN_get_data_size_from_response(table, 0x110, nullptr), 1);
    EXPECT_EQ(out, 7);
}

} // namespace

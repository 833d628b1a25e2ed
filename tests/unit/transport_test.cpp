// Sending, receiving and tracing messages, and the lookups in a request-response table.
#include "fake_platform.h"
#include "log_capture.h"

#include <bt_service/bt_message.h>
#include <bt_service/bt_transport.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <array>
#include <cstring>

namespace {

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

class Transport : public testing::Test {
protected:
    void SetUp() override
    {
        fake::reset();
        DebugConsoleLogSts = DebugFileOutLogSts = DebugSRVOutLogSts = 0;
    }
    void TearDown() override { SetUp(); }

    static std::string traced(BtMessage message)
    {
        testing::internal::CaptureStdout();
        BT_CMN_sendMsgWrapper("f", "g", 1, 0x4001, &message);
        std::fflush(stdout);
        return testing::internal::GetCapturedStdout();
    }

    LogCapture log;
};

TEST_F(Transport, SendReportsWhatThePlatformAnswers)
{
    const struct {
        int32_t answer, result;
    } rows[] = {{0, 0}, {1, 1}, {2, 1}, {-2, 1}, {65536, 1}};
    for (const auto& row : rows) {
        fake::reset();
        fake::answer_send(row.answer);
        const BtMessage message = message_of(0xA081, 12);
        LogCapture::lines().clear();
        EXPECT_EQ(BT_CMN_sendMsgWrapper("file.c", "caller", 77, 0xFF02, &message), row.result) << row.answer;
        ASSERT_EQ(fake::posts().size(), 1u);
        EXPECT_EQ(fake::posts()[0].pno, 0xFF02u);
        EXPECT_EQ(fake::posts()[0].zero, 0u);
        EXPECT_EQ(fake::posts()[0].message.size(), 28u);
        EXPECT_EQ(std::memcmp(fake::posts()[0].message.data(), &message, 28), 0);
        const auto texts = LogCapture::texts();
        if (row.answer == 0) {
            EXPECT_THAT(texts, ElementsAre("CMN|[API][START] BT_CMN_sendMsgWrapper caller\n",
                                           "CMN|[API]BT_CMN_sendMsgWrapper getPno=ff02\n",
                                           "CMN|[API][END] BT_CMN_sendMsgWrapper (0)"));
        } else {
            EXPECT_THAT(texts, ElementsAre("CMN|[API][START] BT_CMN_sendMsgWrapper caller\n",
                                           "CMN|[API]BT_CMN_sendMsgWrapper getPno=ff02\n",
                                           "CMN|[api:BT_CMN_sendMsgWrapper] _sys_SndMsg err. api_ret = " +
                                               std::to_string(row.answer) + " ",
                                           "CMN|[API][END] BT_CMN_sendMsgWrapper (1)"));
        }
    }
}

TEST_F(Transport, SizeHandedOverIsLengthPlusHeaderButNeverMoreThanASlot)
{
    const struct {
        uint16_t len;
        size_t size;
    } rows[] = {{0, 16}, {1, 17}, {1008, 1024}, {1009, 1024}, {2000, 1024}, {65519, 1024}, {65520, 0}, {65535, 15}};
    uint8_t* const slot = fake::guarded(sizeof(BtMessage));
    for (const auto& row : rows) {
        BtMessage message = message_of(1, row.len);
        std::memcpy(slot, &message, sizeof message);
        BT_CMN_sendMsgWrapper("f", "g", 1, 0x4001, reinterpret_cast<BtMessage*>(slot));
        EXPECT_EQ(fake::posts().back().message.size(), row.size) << row.len;
    }
}

TEST_F(Transport, MinusOneEndsTheProcessAndNullIsRefused)
{
    const BtMessage message = message_of(1, 0);
    BtMessage buffer;
    fake::answer_send(-1);
    EXPECT_EQ(fake::exit_code_of([&] { BT_CMN_sendMsgWrapper("f", "g", 1, 2, &message); }), -1);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][START] BT_CMN_sendMsgWrapper g\n", "CMN|[API]BT_CMN_sendMsgWrapper getPno=2\n"));
    fake::answer_receive(-1);
    EXPECT_EQ(fake::exit_code_of([&] { BT_CMN_recvMsgWrapper("f", "g", 1, &buffer); }), -1);
    LogCapture::lines().clear();

    fake::reset();
    EXPECT_EQ(BT_CMN_sendMsgWrapper("f", "g", 1, 2, nullptr), 1);
    EXPECT_EQ(BT_CMN_recvMsgWrapper("f", "g", 1, nullptr), 1);
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][START] BT_CMN_sendMsgWrapper g\n",
                            "CMN|[api:BT_CMN_sendMsgWrapper] param err. data = (nil) ",
                            "CMN|[API][END] BT_CMN_sendMsgWrapper (1)", "CMN|[API][START] BT_CMN_recvMsgWrapper [g]\n",
                            "CMN|[api:BT_CMN_recvMsgWrapper] param err. data = (nil) ",
                            "CMN|[API][END] BT_CMN_recvMsgWrapper (1)"));
    EXPECT_TRUE(fake::calls().empty());
}

TEST_F(Transport, ReceiveTakesTheOwnNumbersMessage)
{
    BtMessage sent = message_of(0xA091, 4), buffer{};
    const auto* const bytes = reinterpret_cast<const uint8_t*>(&sent);
    fake::set_pno(0x08C2);
    fake::incoming({bytes, bytes + sizeof sent});
    EXPECT_EQ(BT_CMN_recvMsgWrapper("f", "loop", 1, &buffer), 0);
    EXPECT_EQ(std::memcmp(&buffer, &sent, sizeof sent), 0);
    EXPECT_THAT(fake::calls(), ElementsAre("RcvMsg(2242,1024)"));
    EXPECT_THAT(LogCapture::texts(),
                ElementsAre("CMN|[API][START] BT_CMN_recvMsgWrapper [loop]\n",
                            "CMN|[API]BT_CMN_recvMsgWrapper getPno=8c2\n", "CMN|[API][END] BT_CMN_recvMsgWrapper (0)"));
    for (const int32_t answer : {0, 2, -2}) {
        fake::answer_receive(answer);
        EXPECT_EQ(BT_CMN_recvMsgWrapper("f", "loop", 1, &buffer), 1);
        EXPECT_THAT(LogCapture::texts(), ElementsAre("CMN|[API][START] BT_CMN_recvMsgWrapper [loop]\n",
                                                     "CMN|[API]BT_CMN_recvMsgWrapper getPno=8c2\n",
                                                     "CMN|[api:BT_CMN_recvMsgWrapper] _sys_RcvMsg err. api_ret = " +
                                                         std::to_string(answer) + " \n",
                                                     "CMN|[API][END] BT_CMN_recvMsgWrapper (1) \n"));
    }
}

TEST_F(Transport, TraceShowsIdAndAtMost128Bytes)
{
    DebugSRVOutLogSts = DebugConsoleLogSts = 1;
    std::string digits;
    char two[3];
    for (int i = 0; i < 128; ++i) {
        std::snprintf(two, sizeof two, "%02X", i);
        digits += two;
    }
    const struct {
        uint16_t cid, len;
        size_t shown;
    } rows[] = {{0xA081, 0, 0}, {0x000F, 3, 3}, {0x1101, 128, 128}, {0x1101, 200, 128}, {0xFFFF, 65535, 128}};
    for (const auto& row : rows) {
        char cid[5];
        std::snprintf(cid, sizeof cid, "%04X", row.cid);
        EXPECT_EQ(traced(message_of(row.cid, row.len)),
                  "BTSRV " + std::string(cid) + " " + digits.substr(0, 2 * row.shown) + "\n");
    }
    fake::answer_send(1);
    EXPECT_EQ(traced(message_of(1, 1)), "") << "an unsent message is not traced";
    fake::answer_send(0);
    DebugSRVOutLogSts = 0;
    EXPECT_EQ(traced(message_of(1, 1)), "");
    DebugSRVOutLogSts = 1;
    fake::set_pno(0x08C5);
    EXPECT_EQ(traced(message_of(1, 1)), "");
}

TEST_F(Transport, TraceGoesToEveryOutputThatIsOn)
{
    DebugSRVOutLogSts = DebugFileOutLogSts = 1;
    fake::remove_file("/tmp/bt_cmn.log");
    bt_cmn_log_fp_reset();
    VEXLOG_Zone = 45;
    const uint32_t enabled = 1u << 13;
    uint8_t* const mask = reinterpret_cast<uint8_t*>(&g_VexLogParams) + 12052 + 4;
    uint8_t before[4];
    std::memcpy(before, mask, sizeof before);

    const uint32_t none = 0;
    std::memcpy(mask, &none, sizeof none);
    EXPECT_EQ(traced(message_of(0xA091, 1)), "");
    EXPECT_TRUE(fake::logs().empty()) << "the zone is off";
    std::memcpy(mask, &enabled, sizeof enabled);
    EXPECT_EQ(traced(message_of(0xA091, 2)), "");
    ASSERT_EQ(fake::logs().size(), 1u);
    EXPECT_THAT(fake::logs()[0].numbers, ElementsAre(137, 45));
    EXPECT_EQ(fake::logs()[0].tag, "CMN");
    EXPECT_EQ(fake::logs()[0].text, "BTSRV A091 0001\n");
    for (const int32_t zone : {-1, 256, INT32_MAX, INT32_MIN}) {
        VEXLOG_Zone = zone; // no such zone: nothing is read outside the block
        EXPECT_EQ(traced(message_of(0xA091, 0)), "");
    }
    EXPECT_EQ(fake::logs().size(), 1u);
    VEXLOG_Zone = 13;
    std::memcpy(mask, before, sizeof before);

    std::fflush(bt_cmn_log_fpget());
    const auto file = fake::read_file("/tmp/bt_cmn.log");
    ASSERT_TRUE(file);
    EXPECT_EQ(std::string(file->begin(), file->end()).substr(0, 30), "BTSRV A091 00\nBTSRV A091 0001\n");
}

TEST(RequestResponseTable, LooksUpByEitherColumn)
{
    const uint16_t table[][3] = {
        {0x10, 0x110, 4}, {0x11, 0x111, 8}, {0x10, 0x112, 9}, {0x13, 0x111, 7}, {0xFFFF, 0xFFFF, 1}};
    const uint16_t empty[][3] = {{0xFFFF, 0xFFFF, 0}};
    std::vector<std::array<uint16_t, 3>> endless(300, {1, 1, 1});
    endless[255] = {2, 2, 22};
    endless[256] = {3, 3, 33};
    struct Row {
        const void* table;
        uint32_t id;
        int32_t result;
        uint16_t response, size;
    };
    const Row by_request[] = {{table, 0x10, 0, 0x110, 4},    {table, 0x11, 0, 0x111, 8},  {table, 0x12, 1, 7, 7},
                              {table, 0xFFFF, 1, 7, 7},      {table, 0x10010, 1, 7, 7},   {empty, 0x10, 1, 7, 7},
                              {endless.data(), 2, 0, 2, 22}, {endless.data(), 3, 1, 7, 7}};
    const Row by_response[] = {{table, 0x111, 0, 7, 8},       {table, 0x112, 0, 7, 9},     {table, 0x10, 1, 7, 7},
                               {table, 0xFFFF, 1, 7, 7},      {table, 0x10111, 1, 7, 7},   {empty, 0x10, 1, 7, 7},
                               {endless.data(), 2, 0, 7, 22}, {endless.data(), 3, 1, 7, 7}};
    for (const Row& row : by_request) {
        uint16_t response = 7, size = 7;
        EXPECT_EQ(
            BT_CMN_get_response_from_request(static_cast<const BtResponseRow*>(row.table), row.id, &response, &size),
            row.result)
            << row.id;
        EXPECT_EQ(response, row.response);
        EXPECT_EQ(size, row.size);
    }
    for (const Row& row : by_response) {
        uint16_t size = 7;
        EXPECT_EQ(BT_CMN_get_data_size_from_response(static_cast<const BtResponseRow*>(row.table), row.id, &size),
                  row.result)
            << row.id;
        EXPECT_EQ(size, row.size);
    }
    uint16_t out = 7;
    const auto* const rows = reinterpret_cast<const BtResponseRow*>(table);
    EXPECT_EQ(BT_CMN_get_response_from_request(nullptr, 0x10, &out, &out), 1);
    EXPECT_EQ(BT_CMN_get_response_from_request(rows, 0x10, nullptr, &out), 1);
    EXPECT_EQ(BT_CMN_get_response_from_request(rows, 0x10, &out, nullptr), 1);
    EXPECT_EQ(BT_CMN_get_data_size_from_response(nullptr, 0x110, &out), 1);
    EXPECT_EQ(BT_CMN_get_data_size_from_response(rows, 0x110, nullptr), 1);
    EXPECT_EQ(out, 7);
}

} // namespace

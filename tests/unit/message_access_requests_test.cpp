// Requests to the message access service: what each posts and what it refuses.
#include "request_rows.h"

#include "api/message_access_post.h"

#include <bt_service/bt_message_access.h>

namespace {

using namespace requests;
using MessageAccessRequests = RequestRows;

const char* const kRequestArea = "/tmp/shm_map_serviceapi";
const std::string kHandle = "A0A1A2A3A4A5A6A7A8A9AAABACADAEAF";
const std::vector<std::string> kLink = {"LinkShareData(/tmp/shm_map_serviceapi)"};

TEST_F(MessageAccessRequests, PostTheirPayload)
{
    channel = {0x08CA, 0, 0, &kPassedThrough};
    POSTS(BT_SRV_MAP_setNotificationRegist, 0x5003, "040302F1", 0xF1020304);
    POSTS(BT_SRV_MAP_getFolderNum, 0x5005, "");
    POSTS(BT_SRV_MAP_getFolderList, 0x5006, "0000000A 00000000", 10, 0);
    POSTS(BT_SRV_MAP_getFolderList, 0x5006, "F1020304 00000001", 0xF1020304, 1);
    POSTS(BT_SRV_MAP_getMessage, 0x5009, kHandle + " 34", kHandle + " 34120000");
    POSTS(BT_SRV_MAP_changeReadStatus, 0x500A, kHandle + " FE", kHandle + " FEFFFFFF");
    POSTS(BT_SRV_MAP_getAttachmentFile, 0x500D, kHandle, kHandle);
    POSTS(BT_SRV_MAP_sendMessage, 0x500F, "0BFD", 0x0A0B, 0xFFFFFFFD);
    POSTS(BT_SRV_MAP_checkMessage, 0x5010, "");
    POSTS(BT_SRV_MAP_cancel, 0x5011, "");
    POSTS(BT_SRV_MAP_sortMessageList, 0x5012, "04030201 080706F5", 0x01020304, 0xF5060708);
    POSTS(BT_SRV_MAP_searchMessageList, 0x5013, "55 00", "55FFFFFF 00 61*255");
    POSTS(BT_SRV_MAP_searchMessageList, 0x5013, "55 03 61*3", "55000000 03 61*255");
    POSTS(BT_SRV_MAP_searchMessageList, 0x5013, "55 FF 61*255", "55000000 FF 61*255");
    POSTS(BT_SRV_MAP_testMode, 0x5014, "", "00*8");
    // The length in memory, and length and text in the payload.
    const std::pair<std::string, std::string> texts[] = {{"00000000", "00000000 "},
                                                         {"03000000", "00000003 61*3"},
                                                         {"00010000", "00000100 61*256"},
                                                         {"01010000", "00000100 61*256"},
                                                         {"FFFFFFFF", "00000100 61*256"}};
    for (const auto& [length, sent] : texts) {
        const std::string field = length + " 61*256";
        POSTS(BT_SRV_MAP_changeDirectory, 0x5004, "FE " + sent, 0xFFFF01FE, field);
        POSTS(BT_SRV_MAP_deleteMessage, 0x500B, "02 " + kHandle + " " + sent + " 00", "02FFFFFF " + kHandle + field);
        POSTS(BT_SRV_MAP_saveMessage, 0x500E, sent, field);
    }
    channel.before = [] { fake::area(kRequestArea, 1024); };
    channel.platform_calls = kLink;
    POSTS(BT_SRV_MAP_getMessageNum, 0x5007, "0000", 0xAB, "00*820");
    POSTS(BT_SRV_MAP_getMessageList, 0x5008, "0000", 0xAB, "00*832");
}

TEST_F(MessageAccessRequests, RefuseWithoutPosting)
{
    REFUSES(-1, BT_SRV_MAP_getMessage, nullptr);
    REFUSES(-1, BT_SRV_MAP_moveMessage, "01*16");
    channel.platform_calls = kLink;
    for (const bool linked : {false, true}) {
        if (linked) channel.before = [] { fake::null_area(kRequestArea); };
        REFUSES(-1, BT_SRV_MAP_getMessageNum, 1, "00*820");
        REFUSES(-1, BT_SRV_MAP_getMessageList, 1, "00*832");
    }
}

TEST(MessageAccessSender, CutsThePayload)
{
    for (const uint32_t length : {1005u, 1006u, 1007u, 1008u}) {
        fake::reset();
        const uint32_t sent = std::min(length, 1006u);
        bt::Payload payload;
        payload.bytes(fake::guarded(length, 0xC7), length);
        EXPECT_EQ(bt::map::post(bt::Request::MAP_saveMessage, payload), 0);
        ASSERT_EQ(fake::posts().size(), 1u);
        EXPECT_EQ(fake::posts()[0].length(), sent);
        EXPECT_EQ(fake::posts()[0].payload(), fake::Bytes(sent, 0xC7)) << length;
    }
}

// ---- the parameter blocks of the two listing requests

std::string characters(const std::string& text)
{
    return fake::to_hex(fake::Bytes(text.begin(), text.end()));
}

const std::string kBegin = characters("19000101T000000Z"), kEnd = characters("20991231T235959Z");
const std::string kDays = characters("20260102T030405Z20271231T235958Z");

// A filter in memory, of which some lengths and the period are given.
std::string filter(const char* folder, const char* period, const char* recipient, const char* originator)
{
    const std::string begin = folder + (" 66*256 1F " + std::string(period)) + " EE*3 11FFFFFF ";
    return begin + recipient + " 72*256 " + originator + " 6F*256 EE*2 22FFFFFF";
}

// Calls one of both in an area that may be too small or be reported so; the area's bytes afterwards.
std::string area_after(bool list, const std::string& filter, uint32_t size, uint32_t reported, int32_t result)
{
    fake::reset();
    uint8_t* const area = fake::area(kRequestArea, size, 0xDD);
    fake::report_size(kRequestArea, reported);
    const auto bytes = [=] { return fake::to_hex(fake::Bytes(area, area + size)); };
    std::string at_post;
    fake::at_send([&] { at_post = bytes(); });
    EXPECT_EQ(list ? call(BT_SRV_MAP_getMessageList, ~0x54u, "04030201 080706F5 " + filter + " 0D0C0B0A")()
                   : call(BT_SRV_MAP_getMessageNum, ~0x54u, filter)(),
              result);
    EXPECT_EQ(fake::sizes_asked(), std::vector<uint32_t>{0});
    EXPECT_EQ(at_post, result == 0 ? bytes() : "") << "the notice comes when the block is complete";
    return bytes();
}

TEST(MessageAccessListing, BlocksHoldTheParametersInOrder)
{
    const struct {
        std::string filter, count_length, list_length, sent;
    } rows[] = {
        {filter("00000000", "00*32", "00", "00"), "2B00", "3700", "00000000 1F " + kBegin + kEnd + "11 00 00"},
        {filter("03000000", "00*32", "02", "01"), "3100", "3D00",
         "00000003 66*3 1F " + kBegin + kEnd + "11 02 72*2 01 6F"},
        {filter("00010000", kDays.c_str(), "FF", "FF"), "2903", "3503",
         "00000100 66*256 1F " + kDays + "11 FF 72*255 FF 6F*255"},
        {filter("01010000", "00*15 5A 00*16", "00", "01"), "2C01", "3801",
         "00000100 66*256 1F 00*15 5A " + kEnd + "11 00 01 6F"},
        {filter("FFFFFFFF", "00*16 01 00*15", "01", "00"), "2C01", "3801",
         "00000100 66*256 1F " + kBegin + "01 00*15 11 01 72 00"},
    };
    for (const auto& row : rows)
        for (const bool list : {false, true}) {
            fake::Bytes expected =
                list ? fake::hex(row.list_length + "0000 AB 01020304 F5060708 " + row.sent + " 22 0D0C0B0A 00")
                     : fake::hex(row.count_length + "0000 AB " + row.sent + " 22 00");
            expected.resize(900, 0);
            EXPECT_EQ(area_after(list, row.filter, 900, 900, 0), fake::to_hex(expected));
        }
}

TEST(MessageAccessListing, OnlyTheReportedAreaIsWritten)
{
    const std::string nothing = filter("00000000", "00*32", "00", "00");
    const fake::Bytes block = fake::hex("2B000000 AB 00000000 1F " + kBegin + kEnd + "11 00 00 22 00");
    const struct {
        uint32_t size, reported;
        int32_t result;
        uint32_t written; // of the block with its length, then zeros
    } rows[] = {{3, 3, -1, 0},   {4, 4, 0, 4},          {46, 46, 0, 46}, {47, 47, 0, 47},
                {60, 47, 0, 47}, {4096, 4096, 0, 4096}, {60, 0, 0, 47},  {60, 3, -1, 0}};
    for (const auto& row : rows) {
        fake::Bytes expected = block;
        expected.resize(row.written, 0);
        expected.resize(row.size, 0xDD);
        EXPECT_EQ(area_after(false, nothing, row.size, row.reported, row.result), fake::to_hex(expected))
            << row.reported;
    }
    EXPECT_EQ(area_after(true, nothing, 100, 0, 0).substr(58 * 3), "00 " + fake::to_hex(fake::Bytes(41, 0xDD)))
        << "the last of 4 + 55 bytes, and none more";
}

} // namespace

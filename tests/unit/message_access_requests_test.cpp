// Requests to the message access service: what each posts and what it refuses.
#include "request_rows.h"

#include "api/message_access_post.h"

#include <bt_service/bt_message_access.h>
#include <gmock/gmock.h>

namespace {

using namespace requests;

constexpr Channel kMessageAccess = {0x08CA, 0, 0, &kPassedThrough};
const char* const kRequestArea = "/tmp/shm_map_serviceapi";
const std::string kLink = "LinkShareData(/tmp/shm_map_serviceapi)";
const std::string kHandle = "A0A1A2A3A4A5A6A7A8A9AAABACADAEAF";

// A record passed by value, from the bytes of its fields.
template <class Record>
Record record_of(const std::string& hex)
{
    const fake::Bytes bytes = fake::hex(hex);
    Record record;
    EXPECT_EQ(bytes.size(), sizeof record) << hex;
    std::memcpy(&record, bytes.data(), std::min(bytes.size(), sizeof record));
    return record;
}

template <class Function, class... Arguments>
Call with_area(Function function, Arguments... arguments)
{
    return [=] {
        fake::area(kRequestArea, 1024);
        return function(arguments...);
    };
}

struct Length {
    const char *given, *sent, *text; // the field in memory, the field in the payload, the text in the payload
};
const Length kLengths[] = {{"00000000", "00000000", ""},       {"03000000", "00000003", "61*3"},
                           {"00010000", "00000100", "61*256"}, {"01010000", "00000100", "61*256"},
                           {"2C010000", "00000100", "61*256"}, {"00000080", "00000100", "61*256"},
                           {"FFFFFFFF", "00000100", "61*256"}};

std::vector<Row> rows_with_text()
{
    std::vector<Row> rows;
    for (const auto& [given, sent, text] : kLengths) {
        const std::string field = std::string(given) + " 61*256", length_and_text = std::string(sent) + " " + text;
        rows.push_back({"BT_SRV_MAP_changeDirectory", 0x5004, "FE " + length_and_text,
                        call(BT_SRV_MAP_changeDirectory, 0xFFFF01FEu, record_of<directory_record>(field))});
        rows.push_back({"BT_SRV_MAP_deleteMessage", 0x500B, "02 " + kHandle + " " + length_and_text + " 00",
                        call(BT_SRV_MAP_deleteMessage, record_of<delete_record>("02FFFFFF " + kHandle + " " + field))});
        rows.push_back({"BT_SRV_MAP_saveMessage", 0x500E, length_and_text,
                        call(BT_SRV_MAP_saveMessage, record_of<save_record>(field))});
    }
    return rows;
}

TEST(MessageAccessRequests, PostTheirPayload)
{
    const message_listing listing{};
    const auto search = [](const std::string& hex) {
        return call(BT_SRV_MAP_searchMessageList, record_of<search_record>(hex));
    };
    std::vector<Row> rows = {
        {"BT_SRV_MAP_setNotificationRegist", 0x5003, "01000000", call(BT_SRV_MAP_setNotificationRegist, 1u)},
        {"BT_SRV_MAP_setNotificationRegist", 0x5003, "040302F1", call(BT_SRV_MAP_setNotificationRegist, 0xF1020304u)},
        {"BT_SRV_MAP_getFolderNum", 0x5005, "", call(BT_SRV_MAP_getFolderNum)},
        {"BT_SRV_MAP_getFolderList", 0x5006, "0000000A 00000000", call(BT_SRV_MAP_getFolderList, 10u, 0u)},
        {"BT_SRV_MAP_getFolderList", 0x5006, "F1020304 00000001", call(BT_SRV_MAP_getFolderList, 0xF1020304u, 1u)},
        {"BT_SRV_MAP_getMessageNum", 0x5007, "0000", with_area(BT_SRV_MAP_getMessageNum, 0xABu, listing.filter), 0xFF02,
         nullptr, kLink},
        {"BT_SRV_MAP_getMessageList", 0x5008, "0000", with_area(BT_SRV_MAP_getMessageList, 0xABu, listing), 0xFF02,
         nullptr, kLink},
        {"BT_SRV_MAP_getMessage", 0x5009, kHandle + " 34", call(BT_SRV_MAP_getMessage, Given(kHandle + " 34120000"))},
        {"BT_SRV_MAP_changeReadStatus", 0x500A, kHandle + " FE",
         call(BT_SRV_MAP_changeReadStatus, record_of<message_handle>(kHandle + " FEFFFFFF"))},
        {"BT_SRV_MAP_getAttachmentFile", 0x500D, kHandle,
         call(BT_SRV_MAP_getAttachmentFile, record_of<attachment_record>(kHandle))},
        {"BT_SRV_MAP_sendMessage", 0x500F, "0BFD", call(BT_SRV_MAP_sendMessage, 0x0A0Bu, 0xFFFFFFFDu)},
        {"BT_SRV_MAP_checkMessage", 0x5010, "", call(BT_SRV_MAP_checkMessage)},
        {"BT_SRV_MAP_cancel", 0x5011, "", call(BT_SRV_MAP_cancel)},
        {"BT_SRV_MAP_sortMessageList", 0x5012, "04030201 080706F5",
         call(BT_SRV_MAP_sortMessageList, 0x01020304u, 0xF5060708u)},
        {"BT_SRV_MAP_searchMessageList", 0x5013, "55 00", search("55FFFFFF 00 61*255")},
        {"BT_SRV_MAP_searchMessageList", 0x5013, "55 03 61*3", search("55000000 03 61*255")},
        {"BT_SRV_MAP_searchMessageList", 0x5013, "55 FF 61*255", search("55000000 FF 61*255")},
        {"BT_SRV_MAP_testMode", 0x5014, "", call(BT_SRV_MAP_testMode, test_record{{1, 2}})},
    };
    for (Row& row : rows_with_text())
        rows.push_back(std::move(row));
    run_all(kMessageAccess, rows);
}

TEST(MessageAccessRequests, RefuseWithoutPosting)
{
    const message_listing listing{};
    const auto on_null_area = [](const Call& request) -> Call {
        return [=] {
            fake::null_area(kRequestArea);
            return request();
        };
    };
    const Call count = call(BT_SRV_MAP_getMessageNum, 1u, listing.filter),
               list = call(BT_SRV_MAP_getMessageList, 1u, listing);
    refuse_all({{"no handle", -1, call(BT_SRV_MAP_getMessage, nullptr)},
                {"moving", -1, call(BT_SRV_MAP_moveMessage, move_record{{1, 2, 3, 4}})},
                {"count, nothing shared", -1, count, kLink},
                {"list, nothing shared", -1, list, kLink},
                {"count, no address", -1, on_null_area(count), kLink},
                {"list, no address", -1, on_null_area(list), kLink}});
}

TEST(MessageAccessRequests, SenderCutsThePayload)
{
    const fake::Bytes bytes(1008, 0xC7);
    const struct {
        uint32_t given, sent;
    } rows[] = {{1005, 1005}, {1006, 1006}, {1007, 1006}, {1008, 1006}};
    for (const auto& row : rows) {
        fake::reset();
        bt::Payload payload;
        payload.bytes(bytes.data(), row.given);
        EXPECT_EQ(bt::map::post(bt::Request::MAP_saveMessage, payload), 0);
        ASSERT_EQ(fake::posts().size(), 1u);
        EXPECT_EQ(fake::posts()[0].length(), row.sent);
        EXPECT_EQ(fake::posts()[0].payload(), fake::Bytes(row.sent, 0xC7)) << row.given;
    }
}

// ---- the parameter blocks of the two listing requests

const std::string kBegin = "19000101T000000Z", kEnd = "20991231T235959Z";
const std::string kNoDate(16, '\0');

struct Filter {
    uint32_t folder = 0; // lengths
    uint8_t recipient = 0, originator = 0;
    std::string begin = kNoDate, end = kNoDate;
};

message_listing listing_of(const Filter& wanted)
{
    message_listing listing;
    std::memset(&listing, 0xEE, sizeof listing);
    message_filter& filter = listing.filter;
    listing.max_count = 0x01020304;
    listing.start_offset = 0xF5060708;
    listing.mask = 0x0A0B0C0D;
    filter.folder_length = wanted.folder;
    filter.type = 0x1F;
    std::memcpy(filter.period_begin, wanted.begin.data(), 16);
    std::memcpy(filter.period_end, wanted.end.data(), 16);
    filter.read_status = 0xFFFFFF11;
    filter.recipient_length = wanted.recipient;
    filter.originator_length = wanted.originator;
    filter.priority = 0xFFFFFF22;
    std::memset(filter.folder, 'f', sizeof filter.folder);
    std::memset(filter.recipient, 'r', sizeof filter.recipient);
    std::memset(filter.originator, 'o', sizeof filter.originator);
    return listing;
}

std::string characters(const std::string& text)
{
    return fake::to_hex(fake::Bytes(text.begin(), text.end()));
}

// Both requests with a block, in an area that may be too small; the area's bytes afterwards.
struct Written {
    int32_t result;
    fake::Bytes area;
};

Written written(bool list, const message_listing& listing, uint32_t size, uint32_t reported)
{
    fake::reset();
    uint8_t* const area = fake::area(kRequestArea, size, 0xDD);
    fake::report_size(kRequestArea, reported);
    fake::Bytes at_post;
    fake::at_send([&] { at_post.assign(area, area + size); });
    const int32_t result =
        list ? BT_SRV_MAP_getMessageList(0xFFFFFFAB, listing) : BT_SRV_MAP_getMessageNum(0xFFFFFFAB, listing.filter);
    EXPECT_THAT(fake::sizes_asked(), testing::ElementsAre(0u));
    const fake::Bytes after(area, area + size);
    EXPECT_EQ(fake::posts().size(), result == 0 ? 1u : 0u);
    EXPECT_EQ(at_post, result == 0 ? after : fake::Bytes()) << "the notice comes when the block is complete";
    return {result, after};
}

TEST(MessageAccessListing, BlocksHoldTheParametersInOrder)
{
    const std::string zeros_but_one = kNoDate.substr(1) + "\x5A", one_then_zeros = "\x01" + kNoDate.substr(1);
    const std::string first_half = " 1F ", list_start = "AB 01020304 F5060708 ", list_end = " 22 0D0C0B0A 00",
                      count_start = "AB ", count_end = " 22 00";
    const struct {
        Filter filter;
        std::string middle;
        uint32_t texts;
    } rows[] = {
        {{}, "00000000" + first_half + characters(kBegin + kEnd) + "11 00 00", 0},
        {{3, 2, 1, kNoDate, kNoDate}, "00000003 66*3" + first_half + characters(kBegin + kEnd) + "11 02 72*2 01 6F", 6},
        {{256, 255, 255, "20260102T030405Z", "20271231T235958Z"},
         "00000100 66*256" + first_half + characters("20260102T030405Z20271231T235958Z") + "11 FF 72*255 FF 6F*255",
         766},
        {{257, 0, 1, zeros_but_one, kNoDate},
         "00000100 66*256" + first_half + characters(zeros_but_one + kEnd) + "11 00 01 6F",
         257},
        {{0xFFFFFFFF, 1, 0, kNoDate, one_then_zeros},
         "00000100 66*256" + first_half + characters(kBegin + one_then_zeros) + "11 01 72 00",
         257},
    };
    for (const auto& row : rows)
        for (const bool list : {false, true}) {
            const uint32_t length = row.texts + (list ? 55 : 43);
            fake::Bytes expected = {static_cast<uint8_t>(length), static_cast<uint8_t>(length >> 8), 0, 0};
            const fake::Bytes block =
                fake::hex(list ? list_start + row.middle + list_end : count_start + row.middle + count_end);
            ASSERT_EQ(block.size(), length);
            expected.insert(expected.end(), block.begin(), block.end());
            expected.resize(900, 0);
            const Written got = written(list, listing_of(row.filter), 900, 900);
            EXPECT_EQ(got.result, 0);
            EXPECT_EQ(fake::to_hex(got.area), fake::to_hex(expected));
        }
}

TEST(MessageAccessListing, OnlyTheReportedAreaIsWritten)
{
    const fake::Bytes block = fake::hex("2B000000 AB 00000000 1F " + characters(kBegin + kEnd) + "11 00 00 22 00");
    const struct {
        uint32_t size, reported;
        int32_t result;
        uint32_t written; // of the block with its length, then zeros
    } rows[] = {
        {1, 1, -1, 0},   {3, 3, -1, 0},   {4, 4, 0, 4},          {5, 5, 0, 5},   {46, 46, 0, 46}, {47, 47, 0, 47},
        {48, 48, 0, 48}, {60, 47, 0, 47}, {4096, 4096, 0, 4096}, {47, 0, 0, 47}, {60, 0, 0, 47},  {60, 3, -1, 0},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(testing::Message() << row.size << " reported as " << row.reported);
        fake::Bytes expected = block;
        expected.resize(row.written, 0);
        expected.resize(row.size, 0xDD);
        const Written got = written(false, listing_of({}), row.size, row.reported);
        EXPECT_EQ(got.result, row.result);
        EXPECT_EQ(fake::to_hex(got.area), fake::to_hex(expected));
    }
    const Written list = written(true, listing_of({}), 100, 0);
    EXPECT_EQ(list.area[58], 0) << "the last of 4 + 55 bytes";
    EXPECT_EQ(fake::Bytes(list.area.begin() + 59, list.area.end()), fake::Bytes(41, 0xDD));
}

} // namespace

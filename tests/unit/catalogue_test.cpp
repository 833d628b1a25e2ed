// The catalogues and their decoder: the grammar, the rows, and payloads of any length and content.
#include "catalogue/decode.h"
#include "catalogue/layout.h"
#include "catalogue/print.h"
#include "catalogue/rows.h"
#include "fake_platform.h"

#include <bt_sim/events.h>

#include <gtest/gtest.h>

#include <cstring>
#include <random>
#include <set>
#include <stdexcept>

namespace {

using namespace bt::catalogue;

TEST(CatalogueLayout, RefusesWhatIsOutsideTheGrammar)
{
    for (const char* text :
         {"value", ":u32", "value:u64", "value:", "bytes:bytes", "gap:zero", "a:u32[0]", "a:u32[1009]", "a:u32[-1]",
          "a:u32[4", "a:u32[]", "a:bytes[later] later:u16", "a:u8 a:u8", "a:u8[2] b:u8[a]", "a:addr b:bytes[a]",
          "a:bytes[rest] b:u8", "a:u32[99999999999999999999]"})
        EXPECT_THROW(parse_layout(text), std::invalid_argument) << text;
}

TEST(CatalogueRows, EventsHaveOneIdEachAndEveryRequestHasAnAnswer)
{
    std::set<uint16_t> ids;
    for (const Row& row : events()) {
        EXPECT_TRUE(ids.insert(row.id).second) << row.name;
        EXPECT_EQ(find(row.id), &row) << row.name << " is hidden by another row";
        EXPECT_NE(row.process, 0) << row.name;
    }
    for (const Row& row : requests()) {
        EXPECT_EQ(ids.count(answer_to(row.id)), 1u) << row.name;
        EXPECT_EQ(find(row.id)->process, row.process) << row.name << " shares its id with another channel";
    }
}

TEST(CatalogueRows, AreFoundWithAndWithoutPrefix)
{
    ASSERT_NE(find_request("CON_search"), nullptr);
    EXPECT_EQ(find_request("CON_search")->id, 0xA091);
    EXPECT_EQ(find_request("BT_SRV_CON_search"), find_request("CON_search"));
    EXPECT_EQ(find_event("BT_SIM_EVENT_CON_SEARCH"), find_event("CON_SEARCH"));
    EXPECT_EQ(find_request(""), nullptr);
    EXPECT_EQ(find_request("CON_searc"), nullptr);
    EXPECT_EQ(find(0xFFFF), nullptr);
}

TEST(CatalogueDecode, TakesFieldsApartAndMarksWhatIsMissingOrTooMuch)
{
    const struct {
        uint16_t id;
        const char *payload, *text;
    } cases[] = {
        {0xA091, "02010000", "0xA091 BT_SRV_CON_search value=258"},
        {0xA084, "010203AABBCC0909", "0xA084 BT_SRV_CON_delete address=01:02:03:AA:BB:CC"},
        {0xA0E9, "01000000", "0xA0E9 BT_SRV_CON_setBluetoothFunction value=1"}, // the first of those that share it
        {0x2006, "FFFFFFFF", "0x2006 BT_SRV_HFP_terminateCall value=-1"},
        {0x101D, "80000001 00000100", "0x101D BT_SRV_AVP_getPlayerList w0=2147483649 w1=256"},
        {0x1024, "0002 6869", "0x1024 BT_SRV_AVP_STRCTL_setDeviceFileName length=2 name=\"hi\""},
        {0x3017, "DEAD", "0x3017 BT_SRV_PBAP_setSessionKey key=dead"},
        {0x1106, "01000000 78", "0x1106 BT_SRV_setLocalDeviceName name_length=1 name=\"x\""},
        {0x1106, "01000700 78", "0x1106 BT_SRV_setLocalDeviceName name_length=1 gap=000700 name=\"x\""},
        {0xA8EC, "01000000 00*8 FCFFFFFF",
         "0xA8EC CON_TRANSMITTING_POWER result=1 (malformed request) address=00:00:00:00:00:00 power=-4"},
        {0x2801, "00000000", "0x2801 HFP_responceSCOConnection.answer result=0 (done)"},
        {0x4242, "0102", "0x4242 (unknown id) payload=0102"},
        {0xA0E2, "01000000 0200", "0xA0E2 BT_SRV_CON_setAutomaticConnectionBehavior first=1 [truncated] extra=0200"},
        {0xA084, "010203", "0xA084 BT_SRV_CON_delete [truncated] extra=010203"},
        {0xA0E6, "07000000 08000000", "0xA0E6 BT_SRV_CON_setLinklossReconnectionBehavior behaviour=[7,8] [truncated]"},
        {0x30A0, "FFFF 05", "0x30A0 BT_SRV_OPP_pushResponseReq length=65535 body=05 [truncated]"},
        {0xA086, "AB", "0xA086 BT_SRV_CON_TerminationRegistration extra=ab"},
        {0x3017, "", "0x3017 BT_SRV_PBAP_setSessionKey key="},
    };
    for (const auto& row : cases) {
        const fake::Bytes payload = fake::hex(row.payload);
        EXPECT_EQ(to_text(decode(row.id, payload.data(), payload.size())), row.text);
    }
}

TEST(CatalogueDecode, BelievesNoLengthOfAHeader)
{
    BtMessage message{};
    message.msg_header.hdr.cid = 0xA091;
    message.msg_header.hdr.len = 0xFFFF;

    EXPECT_TRUE(decode(message).truncated);
    EXPECT_EQ(decode(message).extra.size(), 1004u);
    EXPECT_EQ(to_text(decode(message, 20)), "0xA091 BT_SRV_CON_search value=0 [truncated]");
    EXPECT_EQ(to_text(decode(message, 3)), "0xA091 BT_SRV_CON_search [truncated]");
    message.msg_header.hdr.len = 4;
    EXPECT_EQ(to_text(decode(message)), "0xA091 BT_SRV_CON_search value=0");
}

TEST(CatalogueDecode, AnyBytesGiveWholeOutputWithNothingLost)
{
    std::mt19937 random(20261122);
    std::vector<uint16_t> ids{0x4242};
    for (const std::vector<Row>* rows : {&requests(), &events()})
        for (const Row& row : *rows)
            ids.push_back(row.id);

    for (const uint16_t id : ids)
        for (const size_t size : {0u, 1u, 5u, 16u, 29u, 300u, 1008u}) {
            std::vector<uint8_t> payload(size);
            for (uint8_t& byte : payload)
                byte = static_cast<uint8_t>(random() % 3 ? random() : 0xFF);
            const Decoded message = decode(id, payload.data(), payload.size());

            size_t seen = message.extra.size();
            for (const Value& value : message.values)
                seen += value.bytes.size() + value.numbers.size() * element_size(value.field->type);
            EXPECT_EQ(seen, size) << id_text(id);
            const auto dumped = to_json(message).dump(-1, ' ', false, nlohmann::json::error_handler_t::replace);
            EXPECT_TRUE(nlohmann::json::accept(dumped)) << id_text(id);
        }
}

TEST(CatalogueText, KeepsTerminalsSafe)
{
    EXPECT_EQ(printable("Ann\xC3\xA9 \xF0\x9F\x8E\xB5"), "Ann\xC3\xA9 \xF0\x9F\x8E\xB5");
    EXPECT_EQ(printable("\x1B[31m\n"), "\\x1b[31m\\x0a");
    EXPECT_EQ(printable(std::string_view("\xC3\xA9", 1)), "\\xc3");
    EXPECT_EQ(printable("\xC0\xAF\xED\xA0\x80"), "\\xc0\\xaf\\xed\\xa0\\x80"); // overlong, surrogate
    EXPECT_EQ(printable("\xC2\x9B"
                        "1m"),
              "\\xc2\\x9b1m"); // a control sequence in one character
    EXPECT_EQ(printable(std::string_view("a\0b", 3)), "a\\x00b");
}

} // namespace

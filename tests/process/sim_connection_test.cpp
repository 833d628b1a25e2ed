// What an application sees of the simulated unit's connection service.
#include "sim_unit.h"

#include <bt_platform/host.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <csignal>
#include <cstring>

namespace bt::test {
namespace {

const BtDevAddress kAnna = device_address(0xA0, 1);
const BtDevAddress kBen = device_address(0xB0, 2);
const BtDevAddress kNobody = device_address(0xC0, 3);

const std::vector<uint32_t> kConnectionEvents = {BT_SIM_EVENT_CON_CONNECTION,
                                                 BT_SIM_EVENT_CON_DISCONNECTION,
                                                 BT_SIM_EVENT_CON_ALL_DISCONNECTION,
                                                 BT_SIM_EVENT_CON_DELETE,
                                                 BT_SIM_EVENT_CON_CANCEL_CONNECTION,
                                                 BT_SIM_EVENT_CON_SEARCH,
                                                 BT_SIM_EVENT_CON_DEVICE_FOUND,
                                                 BT_SIM_EVENT_CON_REGISTERED,
                                                 BT_SIM_EVENT_CON_CONNECTED,
                                                 BT_SIM_EVENT_CON_DISCONNECTED,
                                                 BT_SIM_EVENT_CON_PIN_REQUEST,
                                                 BT_SIM_EVENT_CON_AUTHENTICATE_PIN,
                                                 BT_SIM_EVENT_CON_REMOTE_DID,
                                                 BT_SIM_EVENT_CON_DISCOVERABLE_MODE,
                                                 BT_SIM_EVENT_CON_SERVICE_DISCOVERY_UUID,
                                                 BT_SIM_EVENT_CON_CANCEL_SEARCH,
                                                 BT_SIM_EVENT_CON_TERMINATION_REGISTRATION};

uint32_t connect_result(const BtDevAddress& address, uint32_t profile)
{
    request_connection(address, profile);
    return word(wait_for(BT_SIM_EVENT_CON_CONNECTION), 0);
}

uint32_t disconnect_result(const BtDevAddress& address, uint32_t profile)
{
    EXPECT_EQ(0, BT_SRV_CON_requestDisconnection(&address, profile));
    return word(wait_for(BT_SIM_EVENT_CON_DISCONNECTION), 0);
}

BtConPinCode pin_code(const char* digits)
{
    BtConPinCode code{};
    code.bytes[0] = static_cast<uint8_t>(std::strlen(digits));
    std::memcpy(code.bytes + 4, digits, std::strlen(digits));
    return code;
}

class SimConnection : public testing::Test {
protected:
    void run(const std::function<void()>& body)
    {
        ASSERT_TRUE(unit_.ready());
        as_application(unit_.domain(), [&] {
            listen_for(kConnectionEvents);
            body();
        });
    }

    TemporaryRoot root_;
    SimUnit unit_{"sim-connection", root_.path()};
};

TEST_F(SimConnection, SearchReportsEachPhoneThenItsEnd)
{
    run([] {
        ASSERT_EQ(0, BT_SRV_CON_search(0));
        const BtMessage first = next_event();
        EXPECT_EQ(BT_SIM_EVENT_CON_DEVICE_FOUND, first.msg_header.hdr.cid);
        EXPECT_EQ(0, std::memcmp(&kAnna, first.payload, sizeof kAnna));
        EXPECT_EQ(0x5A020CU, word(first, 8));
        EXPECT_EQ("Anna's phone", std::string(reinterpret_cast<const char*>(first.payload) + 16, word(first, 12)));

        EXPECT_EQ(0, std::memcmp(&kBen, next_event().payload, sizeof kBen));
        const BtMessage end = next_event();
        EXPECT_EQ(BT_SIM_EVENT_CON_SEARCH, end.msg_header.hdr.cid);
        EXPECT_EQ(BT_SIM_OK, word(end, 0));
        EXPECT_EQ(2U, word(end, 4));

        BtConSearchDevList found{};
        ASSERT_EQ(0, bt_con_ApiInit(0));
        ASSERT_EQ(0, bt_con_getSearchDevlist(&found, 1));
        EXPECT_EQ(2, found.num);
    });
}

TEST_F(SimConnection, CancelledSearchIsAnsweredOnceAndCanBeRepeated)
{
    run([] {
        ASSERT_EQ(0, BT_SRV_CON_search(0));
        ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
        EXPECT_EQ(BT_SIM_CANCELLED, word(wait_for(BT_SIM_EVENT_CON_SEARCH), 0));
        EXPECT_EQ(BT_SIM_OK, word(wait_for(BT_SIM_EVENT_CON_CANCEL_SEARCH), 0));
        ASSERT_EQ(0, BT_SRV_CON_cancelSearch());
        EXPECT_EQ(BT_SIM_NOT_EXPECTED, word(wait_for(BT_SIM_EVENT_CON_CANCEL_SEARCH), 0));
        ASSERT_EQ(0, BT_SRV_CON_search(0));
        EXPECT_EQ(2U, word(wait_for(BT_SIM_EVENT_CON_SEARCH), 4));
    });
}

TEST_F(SimConnection, DeviceLivesFromItsPairingToItsDeletion)
{
    run([] {
        request_connection(kAnna, 0);
        for (const uint32_t expected :
             {BT_SIM_EVENT_CON_REGISTERED, BT_SIM_EVENT_CON_CONNECTED, BT_SIM_EVENT_CON_CONNECTION})
            EXPECT_EQ(expected, next_event().msg_header.hdr.cid);
        EXPECT_EQ(1, registered_count());
        EXPECT_EQ(2U, connection_mode(kAnna));
        EXPECT_EQ(BT_SIM_ALREADY_CONNECTED, connect_result(kAnna, 0));
        EXPECT_EQ(BT_SIM_OK, connect_result(kAnna, 8));

        BtConOrderList order{};
        ASSERT_EQ(0, bt_con_getallConnectOrder(&order, 7));
        EXPECT_EQ(1, order.num);

        EXPECT_EQ(BT_SIM_OK, disconnect_result(kAnna, 0));
        EXPECT_EQ(2U, connection_mode(kAnna)) << "profile 8 is still connected";
        EXPECT_EQ(BT_SIM_NOT_CONNECTED, disconnect_result(kAnna, 0));

        ASSERT_EQ(0, BT_SRV_CON_delete(&kAnna));
        EXPECT_EQ(8U, word(wait_for(BT_SIM_EVENT_CON_DISCONNECTED), 8));
        EXPECT_EQ(BT_SIM_OK, word(wait_for(BT_SIM_EVENT_CON_DELETE), 0));
        EXPECT_EQ(0, registered_count());
        ASSERT_EQ(0, bt_con_getallConnectOrder(&order, 7));
        EXPECT_EQ(0, order.num);
    });
}

TEST_F(SimConnection, RequestsThatCannotWorkSayWhy)
{
    run([] {
        EXPECT_EQ(BT_SIM_UNKNOWN_DEVICE, connect_result(kNobody, 0));
        EXPECT_EQ(BT_SIM_NOT_SUPPORTED, connect_result(kAnna, 7));
        EXPECT_EQ(BT_SIM_NOT_REGISTERED, disconnect_result(kBen, 0));
        ASSERT_EQ(0, BT_SRV_CON_delete(&kBen));
        EXPECT_EQ(BT_SIM_NOT_REGISTERED, word(wait_for(BT_SIM_EVENT_CON_DELETE), 0));
        ASSERT_EQ(0, BT_SRV_CON_TerminationRegistration());
        EXPECT_EQ(BT_SIM_NOT_EXPECTED, word(wait_for(BT_SIM_EVENT_CON_TERMINATION_REGISTRATION), 0));
    });
}

TEST_F(SimConnection, PinDecidesAboutPairing)
{
    run([] {
        const BtConPinCode wrong = pin_code("9999");
        request_connection(kBen, 0);
        EXPECT_EQ(0, std::memcmp(&kBen, wait_for(BT_SIM_EVENT_CON_PIN_REQUEST).payload, sizeof kBen));
        ASSERT_EQ(0, BT_SRV_CON_authenticatePinCode(0, &kBen, &wrong));
        EXPECT_EQ(BT_SIM_AUTHENTICATION_FAILED, word(wait_for(BT_SIM_EVENT_CON_AUTHENTICATE_PIN), 0));
        EXPECT_EQ(BT_SIM_AUTHENTICATION_FAILED, word(wait_for(BT_SIM_EVENT_CON_CONNECTION), 0));
        EXPECT_EQ(0, registered_count());

        const BtConPinCode right = pin_code("1234");
        request_connection(kBen, 0);
        wait_for(BT_SIM_EVENT_CON_PIN_REQUEST);
        ASSERT_EQ(0, BT_SRV_CON_authenticatePinCode(0, &kBen, &right));
        EXPECT_EQ(BT_SIM_OK, word(wait_for(BT_SIM_EVENT_CON_CONNECTION), 0));

        ASSERT_EQ(0, BT_SRV_CON_authenticatePinCode(0, &kBen, &right));
        EXPECT_EQ(BT_SIM_NOT_EXPECTED, word(wait_for(BT_SIM_EVENT_CON_AUTHENTICATE_PIN), 0));
    });
}

TEST_F(SimConnection, RequestsThatComeWhileTheLinkIsBusyWaitForTheirTurn)
{
    run([] {
        request_connection(kAnna, 0);
        request_connection(kAnna, 1);
        ASSERT_EQ(0, BT_SRV_CON_requestDisconnection(&kAnna, 0));
        EXPECT_EQ(0U, word(wait_for(BT_SIM_EVENT_CON_CONNECTION), 12));
        EXPECT_EQ(1U, word(wait_for(BT_SIM_EVENT_CON_CONNECTION), 12));
        EXPECT_EQ(BT_SIM_OK, word(wait_for(BT_SIM_EVENT_CON_DISCONNECTION), 0));
    });
}

TEST_F(SimConnection, QueriedDeviceIdAndServicesAreThoseOfThePhone)
{
    run([] {
        ASSERT_EQ(0, BT_SRV_CON_queryRemoteDeviceDIDInfo(&kAnna));
        const BtMessage answer = wait_for(BT_SIM_EVENT_CON_REMOTE_DID);
        EXPECT_EQ(2U, word(answer, 12));
        uint8_t value[8] = {};
        ASSERT_EQ(0, BT_SRV_CON_getRemoteDeviceDIDInfo(&kAnna, 2, value));
        EXPECT_EQ(0, std::memcmp("\x00\x01\x00\x02\x00\x03\x00\x04", value, sizeof value));
        EXPECT_EQ(0, std::memcmp(value, answer.payload + 32, sizeof value));

        for (const auto& [uuid, found] : {std::pair<uint8_t, uint32_t>{0x0A, 1}, {0x0B, 0}}) {
            const BtConServiceId service = {{2, 0, 0, 0, 0x11, uuid}};
            ASSERT_EQ(0, BT_SRV_CON_startServiceDiscovery_UUID(&kAnna, &service));
            EXPECT_EQ(found, word(wait_for(BT_SIM_EVENT_CON_SERVICE_DISCOVERY_UUID), 12));
        }
    });
}

TEST_F(SimConnection, KilledServiceComesBackWithItsDevicesAndWithoutConnections)
{
    run([] {
        ASSERT_EQ(BT_SIM_OK, connect_result(kAnna, 0));
        for (uint32_t starts = 2; starts < 5; ++starts) {
            kill_connection_service();
            EXPECT_EQ(BT_SIM_NOT_CONNECTED, disconnect_result(kAnna, 0));
            EXPECT_EQ(starts, service_at(PNO_BT_CON).starts);
            EXPECT_EQ(1, registered_count());
            EXPECT_EQ(0U, connection_mode(kAnna));
            EXPECT_EQ(BT_SIM_OK, connect_result(kAnna, 0)) << "events still arrive";
        }
    });
}

// A message as anybody may post it; `length` is what its header says, whatever is really sent.
void post_raw(uint32_t cid, uint16_t length)
{
    constexpr int32_t kQueueFull = 2;
    BtMessage message;
    std::memset(&message, 0xFF, sizeof message);
    message.msg_header.hdr.cid = static_cast<uint16_t>(cid);
    message.msg_header.hdr.len = length;
    const uint32_t size = std::min<uint32_t>(BT_MESSAGE_HEADER_SIZE + length, sizeof message);
    int32_t posted = kQueueFull;
    while (posted == kQueueFull)
        posted = _sys_SndMsg(PNO_BT_CON, size, &message, 0);
    ASSERT_EQ(0, posted);
}

TEST_F(SimConnection, MessagesOfAnyLengthAreAnsweredOrDroppedAndHarmNothing)
{
    run([] {
        const uint16_t lengths[] = {0, 3, 1008, 65535};
        std::vector<uint32_t> ids = {0, 0xFFFF, 0x1101, BT_SIM_EVENT_CON_CONNECTION, 0xE001, 0xE002, 0xE003};
        for (uint32_t id = 0xA080; id <= 0xA0F4; ++id)
            ids.push_back(id);
        for (const uint32_t id : ids)
            for (const uint16_t length : lengths)
                post_raw(id, length);

        for (size_t i = 0; i < std::size(lengths); ++i)
            EXPECT_EQ(BT_SIM_MALFORMED, word(wait_for(BT_SIM_EVENT_CON_CONNECTION), 0));
        EXPECT_EQ(BT_SIM_OK, connect_result(kAnna, 0));
        EXPECT_EQ(1U, service_at(PNO_BT_CON).starts) << "the service ended on one of the messages";
    });
}

} // namespace
} // namespace bt::test

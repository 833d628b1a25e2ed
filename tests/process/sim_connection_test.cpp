// What an application sees of the simulated unit's connection service.
#include "sim_unit.h"

namespace bt::test {
namespace {

constexpr BtDevAddress kBen = phone(0xB0, 2);
constexpr BtDevAddress kNobody = phone(0xC0, 3);
constexpr uint32_t kBenLast = 0x0200; // word 4 of the address
constexpr BtConParameters kProfile0 = {0, {}}, kProfile1 = {1, {}}, kProfile7 = {7, {}}, kProfile8 = {8, {}};

int32_t registered_count()
{
    const int32_t from = 0;
    BtConRegDevInfo records[BT_CON_DEVICE_MAX];
    return BT_SRV_CON_getRemoteDeviceList(0, &from, BT_CON_DEVICE_MAX, records);
}

uint32_t connection_mode(const BtDevAddress& address)
{
    uint32_t mode = 0;
    EXPECT_EQ(0, BT_SRV_CON_getConnectionMode(&address, &mode));
    return mode;
}

int32_t connected_in_order()
{
    BtConOrderList order{};
    EXPECT_EQ(0, bt_con_ApiInit(0));
    EXPECT_EQ(0, bt_con_getallConnectOrder(&order, 7));
    return order.num;
}

// It comes back; what is posted meanwhile waits for it.
void kill_connection_service()
{
    ASSERT_EQ(0, kill(static_cast<pid_t>(connection_service().pid), SIGKILL));
}

// Runs the body as an application that hears of everything it has to do with.
void in_unit(const char* scenario, const std::function<void()>& body)
{
#define EVENT(name) BT_SIM_EVENT_CON_##name
    const Unit unit("sim", scenario);
    ASSERT_TRUE(unit.ready);
    as_application(unit.domain, [&] {
        listen_for({EVENT(CONNECTION), EVENT(DISCONNECTION), EVENT(ALL_DISCONNECTION), EVENT(DELETE), EVENT(REMOTE_DID),
                    EVENT(SEARCH), EVENT(CANCEL_SEARCH), EVENT(DEVICE_FOUND), EVENT(REGISTERED), EVENT(CONNECTED),
                    EVENT(DISCONNECTED), EVENT(PIN_REQUEST), EVENT(AUTHENTICATE_PIN), EVENT(NUMERIC_REQUEST),
                    EVENT(PASSKEY_REQUEST), EVENT(SERVICE_DISCOVERY_UUID), EVENT(TERMINATION_REGISTRATION),
                    EVENT(CONNECTION_INDICATION), EVENT(ACCEPT_CONNECTION)});
        body();
    });
}

TEST(SimConnection, SearchReportsEachPhoneThenItsEndAndCanBeCancelled)
{
    in_unit("two_phones", [] {
        ASSERT_EQ(0, BT_SRV_CON_search(0));
        const BtMessage first = next_event();
        EXPECT_EQ(BT_SIM_EVENT_CON_DEVICE_FOUND, first.msg_header.hdr.cid);
        EXPECT_EQ(0, std::memcmp("\xA0\0\0\0\0\x01\0\0\x0C\x02\x5A\0\x0C\0\0\0Anna's phone", first.payload, 28));
        EXPECT_EVENT(DEVICE_FOUND, 4, kBenLast);
        EXPECT_EVENT(SEARCH, 4, 2);
        BtConSearchDevList found{};
        ASSERT_EQ(0, bt_con_ApiInit(0));
        ASSERT_EQ(0, bt_con_getSearchDevlist(&found, 1));
        EXPECT_EQ(2, found.num);

        ASSERT_EQ(0, BT_SRV_CON_search(0));
        EXPECT_ANSWER(cancelSearch(), SEARCH, 0, BT_SIM_CANCELLED);
        EXPECT_EVENT(CANCEL_SEARCH, 0, BT_SIM_OK);
        EXPECT_ANSWER(cancelSearch(), CANCEL_SEARCH, 0, BT_SIM_NOT_EXPECTED);
        EXPECT_ANSWER(search(0), SEARCH, 4, 2);
    });
}

TEST(SimConnection, DeviceLivesFromItsPairingToItsDeletion)
{
    in_unit("two_phones", [] {
        ASSERT_EQ(0, BT_SRV_CON_requestConnection(&kAnna, &kProfile0));
        for (const uint32_t id : {EVENT(REGISTERED), EVENT(CONNECTED), EVENT(CONNECTION)})
            EXPECT_EQ(id, next_event().msg_header.hdr.cid);
        EXPECT_EQ(1, registered_count());
        EXPECT_EQ(2U, connection_mode(kAnna));
        EXPECT_ANSWER(requestConnection(&kAnna, &kProfile0), CONNECTION, 0, BT_SIM_ALREADY_CONNECTED);
        EXPECT_ANSWER(requestConnection(&kAnna, &kProfile8), CONNECTION, 0, BT_SIM_OK);
        EXPECT_EQ(1, connected_in_order());

        EXPECT_ANSWER(requestDisconnection(&kAnna, 0), DISCONNECTION, 0, BT_SIM_OK);
        EXPECT_EQ(2U, connection_mode(kAnna)) << "profile 8 is still connected";
        EXPECT_ANSWER(requestDisconnection(&kAnna, 0), DISCONNECTION, 0, BT_SIM_NOT_CONNECTED);
        EXPECT_ANSWER(delete (&kAnna), DISCONNECTED, 8, 8);
        EXPECT_EVENT(DELETE, 0, BT_SIM_OK);
        EXPECT_EQ(0, registered_count());
        EXPECT_EQ(0, connected_in_order());
    });
}

TEST(SimConnection, PhonesAreQueriedAndRequestsWaitForTheirTurnOrSayWhyTheyCannotWork)
{
    in_unit("two_phones", [] {
        EXPECT_ANSWER(queryRemoteDeviceDIDInfo(&kAnna), REMOTE_DID, 32, 0x02000100);
        uint8_t value[8] = {};
        EXPECT_EQ(0, BT_SRV_CON_getRemoteDeviceDIDInfo(&kAnna, 2, value));
        EXPECT_EQ(0, std::memcmp("\x00\x01\x00\x02\x00\x03\x00\x04", value, sizeof value));
        const BtConServiceId offered = {{2, 0, 0, 0, 0x11, 0x0A}}, missing = {{2, 0, 0, 0, 0x11, 0x0B}};
        EXPECT_ANSWER(startServiceDiscovery_UUID(&kAnna, &offered), SERVICE_DISCOVERY_UUID, 12, 1);
        EXPECT_ANSWER(startServiceDiscovery_UUID(&kAnna, &missing), SERVICE_DISCOVERY_UUID, 12, 0);

        EXPECT_ANSWER(requestConnection(&kNobody, &kProfile0), CONNECTION, 0, BT_SIM_UNKNOWN_DEVICE);
        EXPECT_ANSWER(requestConnection(&kAnna, &kProfile7), CONNECTION, 0, BT_SIM_NOT_SUPPORTED);
        EXPECT_ANSWER(requestDisconnection(&kBen, 0), DISCONNECTION, 0, BT_SIM_NOT_REGISTERED);
        EXPECT_ANSWER(delete (&kBen), DELETE, 0, BT_SIM_NOT_REGISTERED);
        EXPECT_ANSWER(TerminationRegistration(), TERMINATION_REGISTRATION, 0, BT_SIM_NOT_EXPECTED);

        EXPECT_EQ(0, BT_SRV_CON_requestConnection(&kAnna, &kProfile0));
        EXPECT_EQ(0, BT_SRV_CON_requestConnection(&kAnna, &kProfile1));
        EXPECT_ANSWER(requestDisconnection(&kAnna, 0), CONNECTION, 12, 0);
        EXPECT_EVENT(CONNECTION, 12, 1);
        EXPECT_EVENT(DISCONNECTION, 0, BT_SIM_OK);
    });
}

TEST(SimConnection, PinDecidesAboutPairing)
{
    in_unit("two_phones", [] {
        const BtConPinCode wrong = {{4, 0, 0, 0, '9', '9', '9', '9'}};
        const BtConPinCode right = {{4, 0, 0, 0, '1', '2', '3', '4'}};
        EXPECT_ANSWER(requestConnection(&kBen, &kProfile0), PIN_REQUEST, 4, kBenLast);
        EXPECT_ANSWER(authenticatePinCode(0, &kBen, &wrong), AUTHENTICATE_PIN, 0, BT_SIM_AUTHENTICATION_FAILED);
        EXPECT_EVENT(CONNECTION, 0, BT_SIM_AUTHENTICATION_FAILED);
        EXPECT_EQ(0, registered_count());
        EXPECT_ANSWER(requestConnection(&kBen, &kProfile0), PIN_REQUEST, 4, kBenLast);
        EXPECT_ANSWER(authenticatePinCode(0, &kBen, &right), CONNECTION, 0, BT_SIM_OK);
        EXPECT_ANSWER(authenticatePinCode(0, &kBen, &right), AUTHENTICATE_PIN, 0, BT_SIM_NOT_EXPECTED);
    });
}

TEST(SimPairing, EachPhoneIsPairedInItsOwnWay)
{
    in_unit("pairing", [] {
        constexpr uint32_t kAgree = 0, kRefuse = 1;
        const BtConPasskey right = {{'3', '1', '4', '1', '5', '9'}}, wrong = {{'3', '1', '4', '1', '5'}};
        const BtDevAddress two = phone(0xA0, 2), three = phone(0xA0, 3), four = phone(0xA0, 4);
        const auto prompt_one = [] {
            EXPECT_ANSWER(requestConnection(&kAnna, &kProfile0), NUMERIC_REQUEST, 4, 0x0100);
        };
        const auto prompt_two = [&] { EXPECT_ANSWER(requestConnection(&two, &kProfile0), PASSKEY_REQUEST, 4, 0x0200); };
        prompt_one();
        EXPECT_ANSWER(authenticateNumericValue(kRefuse, &kAnna), CONNECTION, 0, BT_SIM_REFUSED);
        prompt_one();
        EXPECT_ANSWER(TerminationRegistration(), CONNECTION, 0, BT_SIM_CANCELLED);
        EXPECT_EQ(0, BT_SRV_CON_authenticateNumericValue(kAgree, &kAnna)) << "too late";
        prompt_one();
        EXPECT_ANSWER(cancelConnection(&kAnna, 0), CONNECTION, 0, BT_SIM_CANCELLED);
        prompt_one();
        EXPECT_EVENT(CONNECTION, 0, BT_SIM_AUTHENTICATION_FAILED); // nobody answers
        prompt_one();
        EXPECT_EQ(0, BT_SRV_CON_authenticatePasskey(kAgree, &kAnna, &right)) << "answers another prompt";
        EXPECT_ANSWER(authenticateNumericValue(kAgree, &kAnna), CONNECTION, 0, BT_SIM_OK);

        prompt_two();
        EXPECT_ANSWER(authenticatePasskey(kAgree, &two, &wrong), CONNECTION, 0, BT_SIM_AUTHENTICATION_FAILED);
        prompt_two();
        EXPECT_ANSWER(authenticatePasskey(kAgree, &two, &right), CONNECTION, 0, BT_SIM_OK);
        EXPECT_ANSWER(requestConnection(&three, &kProfile0), CONNECTION, 0, BT_SIM_REFUSED);
        EXPECT_ANSWER(requestConnection(&four, &kProfile0), CONNECTION, 0, BT_SIM_OUT_OF_RANGE);
        EXPECT_EQ(2, registered_count());
    });
}

// The phone asks again after each restart of the service.
TEST(SimPairing, PhoneThatAsksIsConnectedOnlyWhenTheApplicationAccepts)
{
    in_unit("pairing", [] {
        const BtDevAddress caller = phone(0xA0, 5);
        const std::tuple<uint32_t, BtConProfileFilterBlock, uint32_t> rows[] = {
            {1, {}, BT_SIM_REFUSED}, {0, {1, {0}}, BT_SIM_REFUSED}, {0, {2, {0, 1}}, BT_SIM_OK}};
        for (const auto& [first, filter, result] : rows) {
            kill_connection_service();
            EXPECT_ANSWER(cancelSearch(), CANCEL_SEARCH, 0, BT_SIM_NOT_EXPECTED);
            EXPECT_EVENT(CONNECTION_INDICATION, 8, 1);
            EXPECT_ANSWER(acceptConnection(first, &caller, &filter), ACCEPT_CONNECTION, 0, result);
            EXPECT_ANSWER(acceptConnection(0, &caller, nullptr), ACCEPT_CONNECTION, 0, BT_SIM_NOT_EXPECTED);
        }
        EXPECT_EQ(1U, connection_mode(caller));
    });
}

TEST(SimConnection, KilledServiceComesBackWithItsDevicesAndWithoutConnections)
{
    in_unit("two_phones", [] {
        EXPECT_ANSWER(requestConnection(&kAnna, &kProfile0), CONNECTION, 0, BT_SIM_OK);
        for (uint32_t starts = 2; starts < 5; ++starts) {
            kill_connection_service();
            EXPECT_ANSWER(requestDisconnection(&kAnna, 0), DISCONNECTION, 0, BT_SIM_NOT_CONNECTED);
            EXPECT_EQ(starts, connection_service().starts);
            EXPECT_EQ(1, registered_count());
            EXPECT_EQ(0U, connection_mode(kAnna));
            EXPECT_ANSWER(requestConnection(&kAnna, &kProfile0), CONNECTION, 0, BT_SIM_OK) << "events still arrive";
        }
    });
}

// `length` is what the header says, whatever is really sent.
void post_raw(uint32_t cid, uint16_t length)
{
    BtMessage message;
    std::memset(&message, 0xFF, sizeof message);
    message.msg_header.hdr.cid = static_cast<uint16_t>(cid);
    message.msg_header.hdr.len = length;
    const uint32_t size = std::min<uint32_t>(BT_MESSAGE_HEADER_SIZE + length, sizeof message);
    int32_t posted = 0;
    do
        posted = _sys_SndMsg(PNO_BT_CON, size, &message, 0);
    while (posted == 2 || posted == 4);
    ASSERT_EQ(0, posted);
}

TEST(SimConnection, MessagesOfAnyLengthAreAnsweredOrDroppedAndHarmNothing)
{
    in_unit("two_phones", [] {
        std::vector<uint32_t> ids = {0, 0xFFFF, 0x1101, BT_SIM_EVENT_CON_CONNECTION, 0xE001, 0xE002, 0xE003};
        for (uint32_t id = 0xA080; id <= 0xA0F4; ++id)
            ids.push_back(id);
        const uint16_t lengths[] = {0, 3, 1008, 65535};
        for (const uint32_t id : ids)
            for (const uint16_t length : lengths)
                post_raw(id, length);
        for (size_t i = 0; i < std::size(lengths); ++i)
            EXPECT_EVENT(CONNECTION, 0, BT_SIM_MALFORMED);
        EXPECT_ANSWER(requestConnection(&kAnna, &kProfile0), CONNECTION, 0, BT_SIM_OK);
        EXPECT_EQ(1U, connection_service().starts) << "the service ended on one of the messages";
    });
}

} // namespace
} // namespace bt::test

// Requests to the connection service: what each posts, and what is refused.
#include "request_rows.h"

#include <bt_service/bt_connection.h>

namespace {

using namespace requests;
using RequestsConnection = RequestRows;

constexpr Results kMinusOne = {0, -1, -1, 0, -1, -1}; // the low half of the platform's answer tells
constexpr Results kNotPosted = {0, -127, -127, 0, -127, -127};

const std::string kAddress = "112233445566 7788"; // the bytes behind the address travel too
const std::string kNobody = " FF*6 7788";
const std::string kWords = " 11121314 21222324 31323334 41424344 51525354 61626364 ";
const std::string kFilter = " 01000000 A1A2A3A4*7 B1B2B3B4 ";
const std::string kPin = " 30*10 39*9 5A ";

TEST_F(RequestsConnection, PostAFullMessageEach)
{
    channel = {0x08C2, 0xFF02, 1024, &kMinusOne};
    POSTS(BT_SRV_CON_TerminationRegistration, 0xA086, "");
    POSTS(BT_SRV_CON_restartAutomaticConnection, 0xA0E8, "");
    POSTS(BT_SRV_CON_suspendAutomaticConnection, 0xA0E7, "");
    POSTS(BT_SRV_CON_cancelSearch, 0xA092, "00*4");
    POSTS(BT_SRV_CON_search, 0xA091, "44332211", 0x11223344);
    POSTS(BT_SRV_CON_setDiscoverableMode, 0xA0E1, "FF*4", 0xFFFFFFFF);
    POSTS(BT_SRV_CON_setSimplePairingDebugMode, 0xA0E5, "01000000", 1);
    POSTS(BT_SRV_CON_setBluetoothFunction, 0xA0E9, "02010000", 0x102);
    channel.source_pno = 0x08C1;
    POSTS(BT_SRV_CON_setBluetoothFunction_internal, 0xA0E9, "02010000", 0x102);
    channel.source_pno = 0xFF02;
    POSTS(BT_SRV_CON_setSDPEnforcementSetting, 0xA0EB, "00000080", 1u << 31);
    POSTS(BT_SRV_CON_setConnectionRetrySetting, 0xA0EF, "03000000", 3);
    POSTS(BT_SRV_CON_setAutomaticConnectionBehavior, 0xA0E2, "01020000 03040000", 0x201, 0x403);
    POSTS(BT_SRV_CON_setSimplePairing, 0xA0E3, "01020000 03040000", 0x201, 0x403);
    POSTS(BT_SRV_CON_changeTimerValue, 0xA0EA, "01020000 03040000", 0x201, 0x403);
    POSTS(BT_SRV_CON_setLinklossReconnectionDirectionSetting, 0xA0EE, "01020000 03040000", 0x201, 0x403);
    POSTS(BT_SRV_CON_setNoSecurityDeviceAuthenticationSetting, 0xA0F0, "01020000 03040000", 0x201, 0x403);
    const std::string behaviour = "01020304 02000000 03000000 04000000 05000000 06000000 07000000 08000000 F6F7F8F9";
    POSTS(BT_SRV_CON_setLinklossReconnectionBehavior, 0xA0E6, behaviour, behaviour);

    POSTS(BT_SRV_CON_permitProfileConnection, 0xA0F1, "01020000" + kAddress + " 03040000", 0x201, kAddress, 0x403);
    POSTS(BT_SRV_CON_permitProfileConnection, 0xA0F1, "01000000" + kNobody + " 02000000", 1, kNobody, 2);
    POSTS(BT_SRV_CON_queryRemoteDeviceDIDInfo, 0xA0F2, kAddress, kAddress);
    POSTS(BT_SRV_CON_queryRemoteDeviceDIDInfo, 0xA0F2, kNobody, kNobody);
    POSTS(BT_SRV_CON_delete, 0xA084, kAddress, kAddress);
    POSTS(BT_SRV_CON_delete, 0xA084, kNobody, kNobody);
    POSTS(BT_SRV_CON_startServiceDiscovery, 0xA0E4, "00*8", "00*8");
    POSTS(BT_SRV_CON_startServiceDiscovery, 0xA0E4, "FF*5 FE FF*2", "FF*5 FE FF*2");
    POSTS(BT_SRV_CON_cancelRemoteDeviceConnection, 0xA0ED, kAddress, kAddress);
    POSTS(BT_SRV_CON_getTransmittingPower, 0xA0EC, kAddress, kAddress);
    POSTS(BT_SRV_CON_startServiceDiscovery_UUID, 0xA0F3, kAddress + " C1 C2*22 C3", kAddress, "C1 C2*22 C3");
    POSTS(BT_SRV_CON_authenticateNumericValue, 0xA0A2, "00000000" + kAddress, 0, kAddress);
    POSTS(BT_SRV_CON_authenticateNumericValue, 0xA0A2, "01020000" + kAddress, 0x201, kAddress);
    const std::string key = " 3132333435363738";
    POSTS(BT_SRV_CON_authenticatePasskey, 0xA0A3, "00000000" + kAddress + key, 0, kAddress, key);
    POSTS(BT_SRV_CON_authenticatePasskey, 0xA0A3, "00010000" + kAddress + " 00*8", 0x100, kAddress, kUnreadable);
    POSTS(BT_SRV_CON_authenticatePinCode, 0xA0A1, "00000000" + kAddress + kPin, 0, kAddress, kPin);
    POSTS(BT_SRV_CON_authenticatePinCode, 0xA0A1, "01000000" + kAddress + " 00*20", 1, kAddress, nullptr);
    POSTS(BT_SRV_CON_authenticatePinCode, 0xA0A1, "00000080" + kAddress + " 00*20", 1u << 31, kAddress, kUnreadable);
    POSTS(BT_SRV_CON_requestAllDisconnection, 0xA087, "00000000" + kAddress, 0, kAddress);
    POSTS(BT_SRV_CON_requestAllDisconnection, 0xA087, "00010000" + kNobody, 0x100, kNobody);
    for (const std::string& filter : {kFilter, std::string(" FFFFFF7F A1*32")})
        POSTS(BT_SRV_CON_acceptConnection, 0xA082, "07000000" + kAddress + " 01000000" + filter, 7, kAddress, filter);
    for (const Given& filter : {Given("00000000 A1*32"), Given("FFFFFFFF A1*32"), Given(nullptr)})
        POSTS(BT_SRV_CON_acceptConnection, 0xA082, "07000000" + kAddress + " 00000000 00*36", 7, kAddress, filter);

    const std::string zeros = "00*28", five = kAddress + "05000000 ";
    for (const std::string selector : {"01000000", "1A000000", "FF000000"}) {
        POSTS(BT_SRV_CON_requestDisconnection_Ex, 0xA085, five + selector, kAddress, 5, selector);
        if (selector == "FF000000") continue;
        POSTS(BT_SRV_CON_cancelConnection_Ex, 0xA083, five + selector, kAddress, 5, selector);
        channel.results = &kNotPosted;
        POSTS(BT_SRV_CON_requestConnection_Ex, 0xA081, five + kWords + selector, kAddress, "05000000" + kWords,
              selector);
        channel.results = &kMinusOne;
    }
    // What each profile carries behind its number when it is connected.
    const std::string three = "11121314 21222324 31323334 4142 00*14", seven = "11121314 00*24";
    const std::string carried[] = {zeros, zeros, zeros, three, "", kWords + "00*4", zeros, seven, zeros};
    for (uint32_t profile = 0; profile <= 8; ++profile) {
        const std::string number = "0" + std::to_string(profile) + "000000 ", nothing_more = kAddress + number + "00*4";
        channel.results = &kMinusOne;
        POSTS(BT_SRV_CON_requestDisconnection, 0xA085, nothing_more, kAddress, profile);
        POSTS(BT_SRV_CON_cancelConnection, 0xA083, nothing_more, kAddress, profile);
        if (profile != 5)
            POSTS(BT_SRV_CON_requestDisconnection_Ex, 0xA085, nothing_more, kAddress, profile, kUnreadable);
        if (profile != 5) POSTS(BT_SRV_CON_cancelConnection_Ex, 0xA083, nothing_more, kAddress, profile, nullptr);
        if (profile == 4) continue;
        channel.results = &kNotPosted;
        POSTS(BT_SRV_CON_requestConnection, 0xA081, kAddress + number + carried[profile], kAddress, number + kWords);
        if (profile == 5) continue;
        POSTS(BT_SRV_CON_requestConnection_Ex, 0xA081, kAddress + number + kWords + "00*4", kAddress, number + kWords,
              kUnreadable);
    }
}

TEST_F(RequestsConnection, RefuseAddresses)
{
    const std::string two = "02000000" + kWords, selector = "01000000";
    for (const Given& address : {Given(nullptr), Given(kNobody)}) {
        REFUSES(-2, BT_SRV_CON_startServiceDiscovery, address);
        REFUSES(-2, BT_SRV_CON_cancelRemoteDeviceConnection, address);
        REFUSES(-2, BT_SRV_CON_getTransmittingPower, address);
        REFUSES(-2, BT_SRV_CON_startServiceDiscovery_UUID, address, "A1*24");
        REFUSES(-2, BT_SRV_CON_authenticateNumericValue, 1, address);
        REFUSES(-2, BT_SRV_CON_authenticatePasskey, 1, address, "A1*8");
        REFUSES(-2, BT_SRV_CON_authenticatePinCode, 0, address, "A1*20");
        REFUSES(-2, BT_SRV_CON_requestAllDisconnection, 0, address);
        REFUSES(-2, BT_SRV_CON_requestDisconnection, address, 2);
        REFUSES(-2, BT_SRV_CON_requestDisconnection_Ex, address, 5, selector);
        REFUSES(-2, BT_SRV_CON_cancelConnection, address, 2);
        REFUSES(-2, BT_SRV_CON_cancelConnection_Ex, address, 5, selector);
        REFUSES(-2, BT_SRV_CON_acceptConnection, 1, address, kFilter);
        REFUSES(-2, BT_SRV_CON_requestConnection, address, two);
        REFUSES(-2, BT_SRV_CON_requestConnection_Ex, address, two, selector);
    }
    REFUSES(-2, BT_SRV_CON_delete, nullptr);
    REFUSES(-2, BT_SRV_CON_queryRemoteDeviceDIDInfo, nullptr);
    REFUSES(-2, BT_SRV_CON_permitProfileConnection, 1, nullptr, 2);
    REFUSES(-2, BT_SRV_CON_requestAllDisconnection, 1, nullptr);
}

TEST_F(RequestsConnection, RefuseProfilesSelectorsAndNulls)
{
    const std::string one = "01000000", every = "FF000000", five = "05000000" + kWords;
    REFUSES(-2, BT_SRV_CON_startServiceDiscovery_UUID, kAddress, nullptr);
    REFUSES(-2, BT_SRV_CON_authenticatePasskey, 0, kAddress, nullptr);
    REFUSES(-2, BT_SRV_CON_authenticatePinCode, 0, kAddress, nullptr);
    REFUSES(-2, BT_SRV_CON_requestConnection, kAddress, nullptr);
    REFUSES(-2, BT_SRV_CON_requestConnection_Ex, kAddress, nullptr, one);
    REFUSES(-2, BT_SRV_CON_cancelConnection_Ex, kAddress, 5, every);
    REFUSES(-2, BT_SRV_CON_requestConnection_Ex, kAddress, five, every);
    for (const std::string profile : {"04000000", "09000000", "02010000", "FFFFFFFF"}) {
        REFUSES(-2, BT_SRV_CON_requestConnection, kAddress, profile + kWords);
        REFUSES(-2, BT_SRV_CON_requestConnection_Ex, kAddress, profile + kWords, one);
    }
    for (const uint32_t profile : {9u, 0x102u, UINT32_MAX}) {
        REFUSES(-2, BT_SRV_CON_requestDisconnection, kAddress, profile);
        REFUSES(-2, BT_SRV_CON_requestDisconnection_Ex, kAddress, profile, one);
        REFUSES(-2, BT_SRV_CON_cancelConnection, kAddress, profile);
        REFUSES(-2, BT_SRV_CON_cancelConnection_Ex, kAddress, profile, one);
    }
    for (const Given& selector : {Given(nullptr), Given("00000000"), Given("1B000000"), Given("FE000000"),
                                  Given("01010000"), Given("FFFFFFFF")}) {
        REFUSES(-2, BT_SRV_CON_requestConnection_Ex, kAddress, five, selector);
        REFUSES(-2, BT_SRV_CON_requestDisconnection_Ex, kAddress, 5, selector);
        REFUSES(-2, BT_SRV_CON_cancelConnection_Ex, kAddress, 5, selector);
    }
}

TEST_F(RequestsConnection, SenderPostsPreparedMessagesPaddedOrCut)
{
    const struct {
        uint32_t length;
        const char *given, *posted;
    } rows[] = {{0, "", "00*1024"},
                {17, "A1*16 B2", "A1*16 B2 00*1007"},
                {1024, "A1*1023 B2", "A1*1023 B2"},
                {1025, "A1*1023 B2", "A1*1023 B2"},
                {0x10001, "A1*1023 B2", "A1*1023 B2"},
                {UINT32_MAX, "A1*1023 B2", "A1*1023 B2"}};
    for (const auto& row : rows) {
        fake::reset();
        EXPECT_EQ(call(_BT_SRV_CON_sys_SndMsg, 0x1234567, row.length, row.given, 7)(), 0) << row.length;
        ASSERT_EQ(fake::posts().size(), 1u);
        EXPECT_EQ(fake::posts()[0].pno, 0x1234567u);
        EXPECT_EQ(fake::posts()[0].zero, 0u);
        EXPECT_EQ(fake::posts()[0].message, fake::hex(row.posted)) << row.length;
    }
    for (const uint32_t length : {0u, 16u})
        REFUSES(-1, _BT_SRV_CON_sys_SndMsg, 0x08C2, length, nullptr, 0);
}

} // namespace

// Requests to the connection service: what each posts, and what is refused.
#include "request_rows.h"

#include <bt_service/bt_connection.h>

namespace {

using namespace requests;

constexpr Results kMinusOne = {0, -1, -1, 0, -1}; // the low half of the platform's answer tells
constexpr Results kNotPosted = {0, -127, -127, 0, -127};
constexpr Channel kConnection = {0x08C2, 0xFF02, 1024, &kMinusOne};

const std::string kAddress = "112233445566 7788"; // the bytes behind the address travel too
const std::string kNobody = " FF*6 7788";
const std::string kWords = " 11121314 21222324 31323334 41424344 51525354 61626364 ";
const std::string kFilter = " 01000000 A1A2A3A4*7 B1B2B3B4 ";
const std::string kPin = " 30*10 39*9 5A ";

std::vector<Row> value_rows()
{
    const BtConLinklossBehaviour behaviour = {{0x04030201, 2, 3, 4, 5, 6, 7, 8, 0xF9F8F7F6}};
    return {
        {"BT_SRV_CON_TerminationRegistration", 0xA086, "", call(BT_SRV_CON_TerminationRegistration)},
        {"BT_SRV_CON_restartAutomaticConnection", 0xA0E8, "", call(BT_SRV_CON_restartAutomaticConnection)},
        {"BT_SRV_CON_suspendAutomaticConnection", 0xA0E7, "", call(BT_SRV_CON_suspendAutomaticConnection)},
        {"BT_SRV_CON_cancelSearch", 0xA092, "00*4", call(BT_SRV_CON_cancelSearch)},
        {"BT_SRV_CON_search", 0xA091, "44332211", call(BT_SRV_CON_search, 0x11223344)},
        {"BT_SRV_CON_setDiscoverableMode", 0xA0E1, "FF*4", call(BT_SRV_CON_setDiscoverableMode, 0xFFFFFFFF)},
        {"BT_SRV_CON_setSimplePairingDebugMode", 0xA0E5, "01000000", call(BT_SRV_CON_setSimplePairingDebugMode, 1)},
        {"BT_SRV_CON_setBluetoothFunction", 0xA0E9, "02010000", call(BT_SRV_CON_setBluetoothFunction, 0x102)},
        {"BT_SRV_CON_setBluetoothFunction_internal", 0xA0E9, "02010000",
         call(BT_SRV_CON_setBluetoothFunction_internal, 0x102), 0x08C1},
        {"BT_SRV_CON_setSDPEnforcementSetting", 0xA0EB, "00000080",
         call(BT_SRV_CON_setSDPEnforcementSetting, 1u << 31)},
        {"BT_SRV_CON_setConnectionRetrySetting", 0xA0EF, "03000000", call(BT_SRV_CON_setConnectionRetrySetting, 3)},
        {"BT_SRV_CON_setAutomaticConnectionBehavior", 0xA0E2, "01020000 03040000",
         call(BT_SRV_CON_setAutomaticConnectionBehavior, 0x201, 0x403)},
        {"BT_SRV_CON_setSimplePairing", 0xA0E3, "01020000 03040000", call(BT_SRV_CON_setSimplePairing, 0x201, 0x403)},
        {"BT_SRV_CON_changeTimerValue", 0xA0EA, "01020000 03040000", call(BT_SRV_CON_changeTimerValue, 0x201, 0x403)},
        {"BT_SRV_CON_setLinklossReconnectionDirectionSetting", 0xA0EE, "01020000 03040000",
         call(BT_SRV_CON_setLinklossReconnectionDirectionSetting, 0x201, 0x403)},
        {"BT_SRV_CON_setNoSecurityDeviceAuthenticationSetting", 0xA0F0, "01020000 03040000",
         call(BT_SRV_CON_setNoSecurityDeviceAuthenticationSetting, 0x201, 0x403)},
        {"BT_SRV_CON_setLinklossReconnectionBehavior", 0xA0E6,
         "01020304 02000000 03000000 04000000 05000000 06000000 07000000 08000000 F6F7F8F9",
         call(BT_SRV_CON_setLinklossReconnectionBehavior, behaviour)},
    };
}

std::vector<Row> address_rows()
{
    const Given address(kAddress), nobody(kNobody), filter(kFilter);
    const std::string none = " 00*36", minus_one = "FFFFFFFF A1*32";
    return {
        {"BT_SRV_CON_permitProfileConnection", 0xA0F1, "01020000" + kAddress + " 03040000",
         call(BT_SRV_CON_permitProfileConnection, 0x201, address, 0x403)},
        {"BT_SRV_CON_permitProfileConnection", 0xA0F1, "01000000" + kNobody + " 02000000",
         call(BT_SRV_CON_permitProfileConnection, 1, nobody, 2)},
        {"BT_SRV_CON_queryRemoteDeviceDIDInfo", 0xA0F2, kAddress, call(BT_SRV_CON_queryRemoteDeviceDIDInfo, address)},
        {"BT_SRV_CON_queryRemoteDeviceDIDInfo", 0xA0F2, kNobody, call(BT_SRV_CON_queryRemoteDeviceDIDInfo, nobody)},
        {"BT_SRV_CON_delete", 0xA084, kAddress, call(BT_SRV_CON_delete, address)},
        {"BT_SRV_CON_delete", 0xA084, kNobody, call(BT_SRV_CON_delete, nobody)},
        {"BT_SRV_CON_startServiceDiscovery", 0xA0E4, "00*8", call(BT_SRV_CON_startServiceDiscovery, Given("00*8"))},
        {"BT_SRV_CON_startServiceDiscovery", 0xA0E4, "FF*5 FE FF*2",
         call(BT_SRV_CON_startServiceDiscovery, Given("FF*5 FE FF*2"))},
        {"BT_SRV_CON_cancelRemoteDeviceConnection", 0xA0ED, kAddress,
         call(BT_SRV_CON_cancelRemoteDeviceConnection, address)},
        {"BT_SRV_CON_getTransmittingPower", 0xA0EC, kAddress, call(BT_SRV_CON_getTransmittingPower, address)},
        {"BT_SRV_CON_startServiceDiscovery_UUID", 0xA0F3, kAddress + " C1 C2*22 C3",
         call(BT_SRV_CON_startServiceDiscovery_UUID, address, Given("C1 C2*22 C3"))},
        {"BT_SRV_CON_authenticateNumericValue", 0xA0A2, "00000000" + kAddress,
         call(BT_SRV_CON_authenticateNumericValue, 0, address)},
        {"BT_SRV_CON_authenticatePasskey", 0xA0A3, "00000000" + kAddress + " 3132333435363738",
         call(BT_SRV_CON_authenticatePasskey, 0, address, Given("3132333435363738"))},
        {"BT_SRV_CON_authenticatePasskey", 0xA0A3, "00010000" + kAddress + " 00*8",
         call(BT_SRV_CON_authenticatePasskey, 0x100, address, kUnreadable)},
        {"BT_SRV_CON_authenticatePinCode", 0xA0A1, "00000000" + kAddress + kPin,
         call(BT_SRV_CON_authenticatePinCode, 0, address, Given(kPin))},
        {"BT_SRV_CON_authenticatePinCode", 0xA0A1, "01000000" + kAddress + " 00*20",
         call(BT_SRV_CON_authenticatePinCode, 1, address, nullptr)},
        {"BT_SRV_CON_authenticatePinCode", 0xA0A1, "00000080" + kAddress + " 00*20",
         call(BT_SRV_CON_authenticatePinCode, 1u << 31, address, kUnreadable)},
        {"BT_SRV_CON_requestAllDisconnection", 0xA087, "00000000" + kAddress,
         call(BT_SRV_CON_requestAllDisconnection, 0, address)},
        {"BT_SRV_CON_requestAllDisconnection", 0xA087, "00010000" + kNobody,
         call(BT_SRV_CON_requestAllDisconnection, 0x100, nobody)},
        {"BT_SRV_CON_acceptConnection", 0xA082, "07000000" + kAddress + " 01000000" + kFilter,
         call(BT_SRV_CON_acceptConnection, 7, address, filter)},
        {"BT_SRV_CON_acceptConnection", 0xA082, "07000000" + kAddress + " 01000000 FFFFFF7F A1*32",
         call(BT_SRV_CON_acceptConnection, 7, address, Given("FFFFFF7F A1*32"))},
        {"BT_SRV_CON_acceptConnection", 0xA082, "07000000" + kAddress + " 00000000" + none,
         call(BT_SRV_CON_acceptConnection, 7, address, Given("00000000 A1*32"))},
        {"BT_SRV_CON_acceptConnection", 0xA082, "07000000" + kAddress + " 00000000" + none,
         call(BT_SRV_CON_acceptConnection, 7, address, Given(minus_one))},
        {"BT_SRV_CON_acceptConnection", 0xA082, "07000000" + kAddress + " 00000000" + none,
         call(BT_SRV_CON_acceptConnection, 7, address, nullptr)},
    };
}

// Connecting and disconnecting: what each profile carries behind its number.
std::vector<Row> profile_rows()
{
    const Given address(kAddress);
    const std::string zeros = "00*28";
    const std::pair<std::string, std::string> carried[] = {{"00000000", zeros},
                                                           {"01000000", zeros},
                                                           {"02000000", zeros},
                                                           {"03000000", "11121314 21222324 31323334 4142 00*14"},
                                                           {"05000000", kWords + "00*4"},
                                                           {"06000000", zeros},
                                                           {"07000000", "11121314 00*24"},
                                                           {"08000000", zeros}};
    std::vector<Row> rows;
    for (const auto& [profile, behind] : carried) {
        const Given parameters(profile + kWords);
        rows.push_back({"BT_SRV_CON_requestConnection", 0xA081, kAddress + profile + " " + behind,
                        call(BT_SRV_CON_requestConnection, address, parameters), 0xFF02, &kNotPosted});
        if (profile != "05000000")
            rows.push_back({"BT_SRV_CON_requestConnection_Ex", 0xA081, kAddress + profile + kWords + "00*4",
                            call(BT_SRV_CON_requestConnection_Ex, address, parameters, kUnreadable), 0xFF02,
                            &kNotPosted});
    }
    for (const std::string selector : {"01000000", "1A000000"}) {
        const Given pointer(selector);
        rows.push_back({"BT_SRV_CON_requestConnection_Ex", 0xA081, kAddress + "05000000" + kWords + selector,
                        call(BT_SRV_CON_requestConnection_Ex, address, Given("05000000" + kWords), pointer), 0xFF02,
                        &kNotPosted});
        rows.push_back({"BT_SRV_CON_cancelConnection_Ex", 0xA083, kAddress + "05000000" + selector,
                        call(BT_SRV_CON_cancelConnection_Ex, address, 5, pointer)});
        rows.push_back({"BT_SRV_CON_requestDisconnection_Ex", 0xA085, kAddress + "05000000" + selector,
                        call(BT_SRV_CON_requestDisconnection_Ex, address, 5, pointer)});
    }
    rows.push_back({"BT_SRV_CON_requestDisconnection_Ex", 0xA085, kAddress + "05000000 FF000000",
                    call(BT_SRV_CON_requestDisconnection_Ex, address, 5, Given("FF000000"))});
    const std::string numbers[] = {"00000000", "01000000", "02000000", "03000000", "04000000",
                                   "05000000", "06000000", "07000000", "08000000"};
    for (uint32_t profile = 0; profile <= 8; ++profile) {
        const std::string payload = kAddress + numbers[profile] + "00000000";
        rows.push_back({"BT_SRV_CON_requestDisconnection", 0xA085, payload,
                        call(BT_SRV_CON_requestDisconnection, address, profile)});
        rows.push_back(
            {"BT_SRV_CON_cancelConnection", 0xA083, payload, call(BT_SRV_CON_cancelConnection, address, profile)});
        if (profile == 5) continue;
        rows.push_back({"BT_SRV_CON_requestDisconnection_Ex", 0xA085, payload,
                        call(BT_SRV_CON_requestDisconnection_Ex, address, profile, kUnreadable)});
        rows.push_back({"BT_SRV_CON_cancelConnection_Ex", 0xA083, payload,
                        call(BT_SRV_CON_cancelConnection_Ex, address, profile, nullptr)});
    }
    return rows;
}

TEST(RequestsConnection, PostAFullMessageEach)
{
    std::vector<Row> rows = value_rows();
    for (const auto& more : {address_rows(), profile_rows()})
        rows.insert(rows.end(), more.begin(), more.end());
    run_all(kConnection, rows);
}

TEST(RequestsConnection, RefuseAddresses)
{
    std::vector<Refusal> refusals = {
        {"delete", -2, call(BT_SRV_CON_delete, nullptr)},
        {"query device ID", -2, call(BT_SRV_CON_queryRemoteDeviceDIDInfo, nullptr)},
        {"permit", -2, call(BT_SRV_CON_permitProfileConnection, 1, nullptr, 2)},
        {"disconnect all", -2, call(BT_SRV_CON_requestAllDisconnection, 0, nullptr)},
        {"disconnect all, flag", -2, call(BT_SRV_CON_requestAllDisconnection, 1, nullptr)},
        {"disconnect all of nobody", -2, call(BT_SRV_CON_requestAllDisconnection, 0, Given(kNobody))},
    };
    const auto refuse = [&refusals](const auto& address) {
        const Given key("A1*20"), filter(kFilter), selector("01000000"), id("A1*24"), two("02000000" + kWords);
        const std::initializer_list<Refusal> both = {
            {"discovery", -2, call(BT_SRV_CON_startServiceDiscovery, address)},
            {"cancel", -2, call(BT_SRV_CON_cancelRemoteDeviceConnection, address)},
            {"power", -2, call(BT_SRV_CON_getTransmittingPower, address)},
            {"discovery of a service", -2, call(BT_SRV_CON_startServiceDiscovery_UUID, address, id)},
            {"numeric value", -2, call(BT_SRV_CON_authenticateNumericValue, 1, address)},
            {"passkey", -2, call(BT_SRV_CON_authenticatePasskey, 0, address, key)},
            {"no passkey", -2, call(BT_SRV_CON_authenticatePasskey, 1, address, key)},
            {"pin", -2, call(BT_SRV_CON_authenticatePinCode, 0, address, key)},
            {"no pin", -2, call(BT_SRV_CON_authenticatePinCode, 1, address, key)},
            {"disconnect", -2, call(BT_SRV_CON_requestDisconnection, address, 2)},
            {"disconnect Ex", -2, call(BT_SRV_CON_requestDisconnection_Ex, address, 5, selector)},
            {"cancel connection", -2, call(BT_SRV_CON_cancelConnection, address, 2)},
            {"cancel connection Ex", -2, call(BT_SRV_CON_cancelConnection_Ex, address, 5, selector)},
            {"accept", -2, call(BT_SRV_CON_acceptConnection, 1, address, filter)},
            {"connect", -2, call(BT_SRV_CON_requestConnection, address, two)},
            {"connect Ex", -2, call(BT_SRV_CON_requestConnection_Ex, address, two, selector)},
        };
        refusals.insert(refusals.end(), both);
    };
    refuse(nullptr);
    refuse(Given(kNobody));
    refuse_all(refusals);
}

TEST(RequestsConnection, RefuseProfilesSelectorsAndNulls)
{
    const Given address(kAddress), one("01000000");
    std::vector<Refusal> refusals = {
        {"service", -2, call(BT_SRV_CON_startServiceDiscovery_UUID, address, nullptr)},
        {"passkey", -2, call(BT_SRV_CON_authenticatePasskey, 0, address, nullptr)},
        {"pin", -2, call(BT_SRV_CON_authenticatePinCode, 0, address, nullptr)},
        {"connect", -2, call(BT_SRV_CON_requestConnection, address, nullptr)},
        {"connect Ex", -2, call(BT_SRV_CON_requestConnection_Ex, address, nullptr, one)},
        {"connect Ex, selector", -2,
         call(BT_SRV_CON_requestConnection_Ex, address, Given("05000000" + kWords), nullptr)},
        {"disconnect Ex, selector", -2, call(BT_SRV_CON_requestDisconnection_Ex, address, 5, nullptr)},
        {"cancel Ex, selector", -2, call(BT_SRV_CON_cancelConnection_Ex, address, 5, nullptr)},
        {"cancel Ex, selector 255", -2, call(BT_SRV_CON_cancelConnection_Ex, address, 5, Given("FF000000"))},
        {"connect Ex, selector 255", -2,
         call(BT_SRV_CON_requestConnection_Ex, address, Given("05000000" + kWords), Given("FF000000"))},
    };
    for (const std::string profile : {"04000000", "09000000", "02010000", "FFFFFFFF"}) {
        const Given record(profile + kWords);
        refusals.push_back({"connect", -2, call(BT_SRV_CON_requestConnection, address, record)});
        refusals.push_back({"connect Ex", -2, call(BT_SRV_CON_requestConnection_Ex, address, record, one)});
    }
    for (const uint32_t profile : {9u, 0x102u, UINT32_MAX}) {
        refusals.push_back({"disconnect", -2, call(BT_SRV_CON_requestDisconnection, address, profile)});
        refusals.push_back({"disconnect Ex", -2, call(BT_SRV_CON_requestDisconnection_Ex, address, profile, one)});
        refusals.push_back({"cancel", -2, call(BT_SRV_CON_cancelConnection, address, profile)});
        refusals.push_back({"cancel Ex", -2, call(BT_SRV_CON_cancelConnection_Ex, address, profile, one)});
    }
    for (const std::string number : {"00000000", "1B000000", "FE000000", "00010000", "01010000", "FFFFFFFF"}) {
        const Given selector(number);
        refusals.push_back({"connect Ex, selector", -2,
                            call(BT_SRV_CON_requestConnection_Ex, address, Given("05000000" + kWords), selector)});
        refusals.push_back(
            {"disconnect Ex, selector", -2, call(BT_SRV_CON_requestDisconnection_Ex, address, 5, selector)});
        refusals.push_back({"cancel Ex, selector", -2, call(BT_SRV_CON_cancelConnection_Ex, address, 5, selector)});
    }
    refuse_all(refusals);
}

TEST(RequestsConnection, SenderPostsPreparedMessagesPaddedOrCut)
{
    struct {
        uint32_t length;
        std::string given, posted;
    } const rows[] = {{0, "", "00*1024"},
                      {1, "A1", "A1 00*1023"},
                      {17, "A1*16 B2", "A1*16 B2 00*1007"},
                      {1023, "A1*1022 B2", "A1*1022 B2 00"},
                      {1024, "A1*1023 B2", "A1*1023 B2"},
                      {1025, "A1*1023 B2", "A1*1023 B2"},
                      {0x10001, "A1*1023 B2", "A1*1023 B2"},
                      {UINT32_MAX, "A1*1023 B2", "A1*1023 B2"}};
    for (const auto& row : rows)
        for (size_t i = 0; i < std::size(kPosted); ++i) {
            fake::reset();
            fake::answer_send(kPosted[i]);
            EXPECT_EQ(_BT_SRV_CON_sys_SndMsg(0x1234567, row.length, Given(row.given), 7), kMinusOne[i]) << row.length;
            ASSERT_EQ(fake::posts().size(), 1u);
            EXPECT_EQ(fake::posts()[0].pno, 0x1234567u);
            EXPECT_EQ(fake::posts()[0].zero, 0u);
            EXPECT_EQ(fake::posts()[0].message, fake::hex(row.posted)) << row.length;
        }
    refuse_all({{"null message", -1, call(_BT_SRV_CON_sys_SndMsg, 0x08C2, 16, nullptr, 0)},
                {"null message of no length", -1, call(_BT_SRV_CON_sys_SndMsg, 0x08C2, 0, nullptr, 0)}});
}

} // namespace

// Requests to the system service: what each posts, and what is refused.
#include "request_rows.h"

#include <bt_service/bt_system.h>

namespace {

using namespace requests;
using RequestsSystem = RequestRows;

const std::vector<std::string> kSetUp = {"SetupZX44API(1)"};

TEST_F(RequestsSystem, PostHeaderAndPayload)
{
    const char *const sco = "0102 A1*4 FDFE", *const fts = "0102 A1*38 FDFE", *const snapshot = "01 A1*62 FE";
    channel = {0x08C1, 0, 0, &kPassedThrough};
    POSTS(BT_SRV_deinitialize, 0x1110, "44332211", 0x11223344);
    POSTS(BT_SRV_shutdown, 0x1102, "");
    POSTS(BT_SRV_radioShutdown, 0x1103, "");
    POSTS(BT_SRV_setHciMode, 0x1104, "");
    POSTS(BT_SRV_getSoftVersion, 0x1107, "");
    POSTS(BT_SRV_stopFtsLog, 0x110D, "");
    opens_files = true;
    POSTS(BT_SRV_requestDebugEnable, 0x1108, "", "00*36");
    opens_files = false;
    POSTS(BT_SRV_requestDebugDisable, 0x1108, "");
    POSTS(BT_SRV_setLocalDeviceDIDInfo, 0x110B, "0102 A1*4 FDFE FF 44332211", "0102 A1*4 FDFE", 255, 0x11223344);
    POSTS(BT_SRV_setLocalDeviceDIDInfo, 0x110B, "0102 A1*4 FDFE 01 00000080", "0102 A1*4 FDFE", 1, 0x80000000);
    POSTS(BT_SRV_setEffectiveProfile, 0x1109, "00*4", 0);
    POSTS(BT_SRV_setEffectiveProfile, 0x1109, "FF000000", 255);
    POSTS(BT_SRV_setConnectSCODevice, 0x110A, sco, sco);
    POSTS(BT_SRV_simulation_Event, 0x110F, "44332211 88 00*3", 0x11223344, 0x55667788);
    POSTS(BT_SRV_startFtsLog, 0x110C, fts, fts);
    POSTS(BT_SRV_shapshotFtsLog, 0x110E, snapshot, snapshot, 64);
    POSTS(BT_SRV_shapshotFtsLog, 0x110E, "", kUnreadable, 0);
    POSTS(BT_SRV_shapshotFtsLog, 0x110E, "00*64", nullptr, 64);
    POSTS(BT_SRV_setFtsLogSize, 0x1112, "00*4", 0);
    POSTS(BT_SRV_setFtsLogSize, 0x1112, "00005000", 0x500000);

    // The three bytes behind the length are not the name's.
    const std::pair<std::string, std::string> names[] = {{"00", ""},          {"01", "7E"},        {"0A", "61*9 7E"},
                                                         {"F7", "61*246 7E"}, {"F8", "61*247 7E"}, {"FF", "61*254 7E"}};
    for (const auto& [length, text] : names) {
        const std::string given = length + " CACBCC " + text, sent = length + " 00*3 " + text, start = "01020384";
        POSTS(BT_SRV_setLocalDeviceName, 0x1106, sent, given);
        if (length == "FF") continue;
        POSTS(BT_SRV_resetBtFunction, 0x1111, start + sent, start, given);
        channel.platform_calls = kSetUp;
        POSTS(BT_SRV_initialize, 0x1101, start + sent, start, given);
        channel.platform_calls.clear();
    }

    // channel, its index anywhere in 32 bits, its index in the transmit test
    const std::string channels[][3] = {{"00000000", "00", "00"}, {"01000000", "28", "28"}, {"02000000", "01", "01"},
                                       {"4D000000", "4E", "4E"}, {"4E000000", "27", "27"}, {"4F000000", "4F", "00"},
                                       {"50000000", "28", "00"}, {"FE010000", "FF", "00"}, {"00020000", "00", "00"},
                                       {"FFFFFFFF", "28", "00"}, {"FEFFFFFF", "FF", "00"}, {"00000080", "00", "00"}};
    for (const auto& [number, index, transmit_index] : channels) {
        POSTS(BT_SRV_testRxMode, 0x1105, "06 01 17FD 02 " + index + " 01 00*249", "01000000" + number);
        POSTS(BT_SRV_testNonModulatedCarrier, 0x1105, "10 01 84FD 0C 0000 " + index + " 85 00*8 00*239",
              number + "85868788");
        POSTS(BT_SRV_testTxMode, 0x1105, "10 01 85FD 0C 03 " + transmit_index + " FF 05 00 00 5501 04 01 FF01 00*239",
              "01000000" + number + "05000000 00000000 04000000");
    }
    POSTS(BT_SRV_sendHciCommand, 0x1105, "FF 01 0102 A1*251 FE", "FF 01 0102 A1*251 FE");
    POSTS(BT_SRV_sendHciCommand, 0x1105, "00*256", nullptr);
    POSTS(BT_SRV_Reset, 0x1105, "04 01 88FD 00 00*251");
    POSTS(BT_SRV_testRxMode, 0x1105, "05 01 1A0C 01 03 00*250", "00000000 05000000");
    POSTS(BT_SRV_testRxMode, 0x1105, "06 01 17FD 02 2A 01 00*249", "00010000 05000000");
    POSTS(BT_SRV_testTxMode, 0x1105, "10 01 85FD 0C 00 00 FF 05 34 00 5501 CD 01 FF01 00*239",
          "00000000 05000000 05000000 34120000 CDAB0000");
    POSTS(BT_SRV_testTxMode, 0x1105, "10 01 85FD 0C 03 2A FF 05 FF 00 5501 FF 01 FF01 00*239",
          "00010000 05000000 05000000 FF*4 FF*4");
    // DM1 DH1 DM3 DH3 DM5 DH5 2-DH1 2-DH3 2-DH5 3-DH1 3-DH3 3-DH5
    const std::pair<std::string, std::string> packets[] = {
        {"00", "1200"}, {"01", "1C00"}, {"02", "7B00"}, {"03", "B900"}, {"04", "E200"}, {"05", "5501"},
        {"06", "3800"}, {"07", "7101"}, {"08", "A902"}, {"09", "5500"}, {"0A", "2A02"}, {"0B", "FF03"}};
    for (const auto& [type, length] : packets)
        POSTS(BT_SRV_testTxMode, 0x1105, "10 01 85FD 0C 03 27 FF " + type + " 07 00 " + length + " 08 01 FF01 00*239",
              "02000000 4E000000" + type + "000000 07000000 08000000");
}

TEST_F(RequestsSystem, RefuseNullsAndValuesOutOfRange)
{
    const std::string start = "01020304", name = "01 CACBCC 7E";
    for (const Given& wrong : {Given(nullptr), Given("F9 CACBCC 61*249"), Given("FF CACBCC 61*255")}) {
        REFUSES(-1, BT_SRV_resetBtFunction, start, wrong);
        channel.platform_calls = kSetUp;
        REFUSES(-1, BT_SRV_initialize, start, wrong);
        channel.platform_calls.clear();
    }
    REFUSES(-1, BT_SRV_resetBtFunction, nullptr, name);
    REFUSES(-1, BT_SRV_setLocalDeviceName, nullptr);
    REFUSES(-1, BT_SRV_setLocalDeviceDIDInfo, nullptr, 1, 1);
    REFUSES(-1, BT_SRV_setLocalDeviceDIDInfo, "01*8", 0, 1);
    REFUSES(-1, BT_SRV_setLocalDeviceDIDInfo, "01*8", 1, 0);
    REFUSES(-1, BT_SRV_setEffectiveProfile, 256);
    REFUSES(-1, BT_SRV_setEffectiveProfile, UINT32_MAX);
    REFUSES(-1, BT_SRV_setConnectSCODevice, nullptr);
    REFUSES(-1, BT_SRV_startFtsLog, nullptr);
    REFUSES(-1, BT_SRV_shapshotFtsLog, kUnreadable, 65);
    REFUSES(-1, BT_SRV_shapshotFtsLog, kUnreadable, UINT32_MAX);
    REFUSES(-1, BT_SRV_shapshotFtsLog, nullptr, 65);
    REFUSES(-1, BT_SRV_setFtsLogSize, 0x500001);
    REFUSES(-1, BT_SRV_setFtsLogSize, UINT32_MAX);
    REFUSES(-1, BT_SRV_testRxMode, nullptr);
    REFUSES(-1, BT_SRV_testTxMode, nullptr);
    REFUSES(-1, BT_SRV_testNonModulatedCarrier, nullptr);
    REFUSES(-1, BT_SRV_requestDebugEnable, nullptr);
    for (const std::string packet : {"0C000000", "00010000", "FFFFFFFF"})
        for (const std::string mode : {"00000000", "01000000"})
            REFUSES(-1, BT_SRV_testTxMode, mode + "05000000" + packet + "00000000 00000000");
    channel.platform_calls = kSetUp;
    REFUSES(-1, BT_SRV_initialize, nullptr, name);
}

} // namespace

// Requests to the system service: what each posts, and what is refused.
#include "request_rows.h"

#include <bt_service/bt_system.h>

namespace {

using namespace requests;

constexpr Channel kSystem = {0x08C1, 0, 0, &kPassedThrough};
const std::string kSetUp = "SetupZX44API(1)";

// A name record as a caller has it; the three bytes behind the length are not the name's.
Given name_of(const std::string& length, const std::string& text)
{
    return Given(length + " CACBCC " + text);
}

std::vector<Row> plain_rows()
{
    const std::string sco = "0102 A1*4 FDFE", fts = "0102 A1*38 FDFE", snapshot = "01 A1*62 FE";
    const Given none("00*36"), did("0102 A1*4 FDFE");
    return {
        {"BT_SRV_deinitialize", 0x1110, "44332211", call(BT_SRV_deinitialize, 0x11223344)},
        {"BT_SRV_shutdown", 0x1102, "", call(BT_SRV_shutdown)},
        {"BT_SRV_radioShutdown", 0x1103, "", call(BT_SRV_radioShutdown)},
        {"BT_SRV_setHciMode", 0x1104, "", call(BT_SRV_setHciMode)},
        {"BT_SRV_getSoftVersion", 0x1107, "", call(BT_SRV_getSoftVersion)},
        {"BT_SRV_stopFtsLog", 0x110D, "", call(BT_SRV_stopFtsLog)},
        {"BT_SRV_requestDebugEnable", 0x1108, "", call(BT_SRV_requestDebugEnable, none)},
        {"BT_SRV_requestDebugDisable", 0x1108, "", call(BT_SRV_requestDebugDisable)},
        {"BT_SRV_setLocalDeviceDIDInfo", 0x110B, "0102 A1*4 FDFE FF 44332211",
         call(BT_SRV_setLocalDeviceDIDInfo, did, 255, 0x11223344)},
        {"BT_SRV_setLocalDeviceDIDInfo", 0x110B, "0102 A1*4 FDFE 01 00000080",
         call(BT_SRV_setLocalDeviceDIDInfo, did, 1, 0x80000000)},
        {"BT_SRV_setEffectiveProfile", 0x1109, "00*4", call(BT_SRV_setEffectiveProfile, 0)},
        {"BT_SRV_setEffectiveProfile", 0x1109, "FF000000", call(BT_SRV_setEffectiveProfile, 255)},
        {"BT_SRV_setConnectSCODevice", 0x110A, sco, call(BT_SRV_setConnectSCODevice, Given(sco))},
        {"BT_SRV_simulation_Event", 0x110F, "44332211 88 00*3", call(BT_SRV_simulation_Event, 0x11223344, 0x55667788)},
        {"BT_SRV_startFtsLog", 0x110C, fts, call(BT_SRV_startFtsLog, Given(fts))},
        {"BT_SRV_shapshotFtsLog", 0x110E, snapshot, call(BT_SRV_shapshotFtsLog, Given(snapshot), 64)},
        {"BT_SRV_shapshotFtsLog", 0x110E, "7E", call(BT_SRV_shapshotFtsLog, Given("7E"), 1)},
        {"BT_SRV_shapshotFtsLog", 0x110E, "", call(BT_SRV_shapshotFtsLog, kUnreadable, 0)},
        {"BT_SRV_shapshotFtsLog", 0x110E, "", call(BT_SRV_shapshotFtsLog, nullptr, 0)},
        {"BT_SRV_shapshotFtsLog", 0x110E, "00*64", call(BT_SRV_shapshotFtsLog, nullptr, 64)},
        {"BT_SRV_setFtsLogSize", 0x1112, "00*4", call(BT_SRV_setFtsLogSize, 0)},
        {"BT_SRV_setFtsLogSize", 0x1112, "00005000", call(BT_SRV_setFtsLogSize, 0x500000)},
    };
}

std::vector<Row> name_rows()
{
    const Given start("01020384");
    const std::pair<std::string, std::string> names[] = {
        {"00", ""}, {"01", "7E"}, {"0A", "61*9 7E"}, {"F7", "61*246 7E"}, {"F8", "61*247 7E"}};
    std::vector<Row> rows = {{"BT_SRV_setLocalDeviceName", 0x1106, "FF 00*3 61*254 7E",
                              call(BT_SRV_setLocalDeviceName, name_of("FF", "61*254 7E"))}};
    for (const auto& [length, text] : names) {
        const Given name = name_of(length, text);
        rows.push_back(
            {"BT_SRV_setLocalDeviceName", 0x1106, length + " 00*3 " + text, call(BT_SRV_setLocalDeviceName, name)});
        rows.push_back({"BT_SRV_initialize", 0x1101, "01020384" + length + " 00*3 " + text,
                        call(BT_SRV_initialize, start, name), 0xFF02, nullptr, kSetUp});
        rows.push_back({"BT_SRV_resetBtFunction", 0x1111, "01020384" + length + " 00*3 " + text,
                        call(BT_SRV_resetBtFunction, start, name)});
    }
    return rows;
}

std::vector<Row> channel_rows()
{
    // channel, its index anywhere in 32 bits, its index in the transmit test
    const struct {
        std::string channel, index, transmit_index;
    } channels[] = {{"00000000", "00", "00"}, {"01000000", "28", "28"}, {"02000000", "01", "01"},
                    {"05000000", "2A", "2A"}, {"4D000000", "4E", "4E"}, {"4E000000", "27", "27"},
                    {"4F000000", "4F", "00"}, {"50000000", "28", "00"}, {"FE010000", "FF", "00"},
                    {"00020000", "00", "00"}, {"FFFFFF7F", "27", "00"}, {"FFFFFFFF", "28", "00"},
                    {"FEFFFFFF", "FF", "00"}, {"FDFFFFFF", "27", "00"}, {"00000080", "00", "00"}};
    std::vector<Row> rows;
    for (const auto& row : channels) {
        rows.push_back({"BT_SRV_testRxMode", 0x1105, "06 01 17FD 02 " + row.index + " 01 00*249",
                        call(BT_SRV_testRxMode, Given("01000000" + row.channel))});
        rows.push_back({"BT_SRV_testNonModulatedCarrier", 0x1105, "10 01 84FD 0C 0000 " + row.index + " 85 00*8 00*239",
                        call(BT_SRV_testNonModulatedCarrier, Given(row.channel + "85868788"))});
        rows.push_back({"BT_SRV_testTxMode", 0x1105,
                        "10 01 85FD 0C 03 " + row.transmit_index + " FF 05 00 00 5501 04 01 FF01 00*239",
                        call(BT_SRV_testTxMode, Given("01000000" + row.channel + "05000000 00000000 04000000"))});
    }
    return rows;
}

std::vector<Row> test_mode_rows()
{
    const std::string command = "FF 01 0102 A1*251 FE";
    std::vector<Row> rows = {
        {"BT_SRV_sendHciCommand", 0x1105, command, call(BT_SRV_sendHciCommand, Given(command))},
        {"BT_SRV_sendHciCommand", 0x1105, "00*256", call(BT_SRV_sendHciCommand, nullptr)},
        {"BT_SRV_Reset", 0x1105, "04 01 88FD 00 00*251", call(BT_SRV_Reset)},
        {"BT_SRV_testRxMode", 0x1105, "05 01 1A0C 01 03 00*250", call(BT_SRV_testRxMode, Given("00000000 05000000"))},
        {"BT_SRV_testRxMode", 0x1105, "06 01 17FD 02 2A 01 00*249",
         call(BT_SRV_testRxMode, Given("00010000 05000000"))},
        {"BT_SRV_testTxMode", 0x1105, "10 01 85FD 0C 00 00 FF 05 34 00 5501 CD 01 FF01 00*239",
         call(BT_SRV_testTxMode, Given("00000000 05000000 05000000 34120000 CDAB0000"))},
        {"BT_SRV_testTxMode", 0x1105, "10 01 85FD 0C 03 2A FF 05 FF 00 5501 FF 01 FF01 00*239",
         call(BT_SRV_testTxMode, Given("00010000 05000000 05000000 FF*4 FF*4"))},
    };
    // DM1 DH1 DM3 DH3 DM5 DH5 2-DH1 2-DH3 2-DH5 3-DH1 3-DH3 3-DH5
    const std::pair<const char*, const char*> packets[] = {
        {"00", "1200"}, {"01", "1C00"}, {"02", "7B00"}, {"03", "B900"}, {"04", "E200"}, {"05", "5501"},
        {"06", "3800"}, {"07", "7101"}, {"08", "A902"}, {"09", "5500"}, {"0A", "2A02"}, {"0B", "FF03"}};
    for (const std::pair<std::string, std::string> packet : packets)
        rows.push_back(
            {"BT_SRV_testTxMode", 0x1105,
             "10 01 85FD 0C 03 27 FF " + packet.first + " 07 00 " + packet.second + " 08 01 FF01 00*239",
             call(BT_SRV_testTxMode, Given("02000000 4E000000" + packet.first + "000000 07000000 08000000"))});
    return rows;
}

TEST(RequestsSystem, PostHeaderAndPayload)
{
    std::vector<Row> rows = plain_rows();
    for (const auto& more : {name_rows(), channel_rows(), test_mode_rows()})
        rows.insert(rows.end(), more.begin(), more.end());
    run_all(kSystem, rows);
}

TEST(RequestsSystem, RefuseNullsAndValuesOutOfRange)
{
    const Given start("01020304"), name = name_of("01", "7E"), did("01*8");
    const Given long_name = name_of("F9", "61*249"), longest_name = name_of("FF", "61*255");
    std::vector<Refusal> refusals = {
        {"null start", -1, call(BT_SRV_initialize, nullptr, name), kSetUp},
        {"null name", -1, call(BT_SRV_initialize, start, nullptr), kSetUp},
        {"nulls", -1, call(BT_SRV_initialize, nullptr, nullptr), kSetUp},
        {"249 bytes", -1, call(BT_SRV_initialize, start, long_name), kSetUp},
        {"255 bytes", -1, call(BT_SRV_initialize, start, longest_name), kSetUp},
        {"reset, null start", -1, call(BT_SRV_resetBtFunction, nullptr, name)},
        {"reset, null name", -1, call(BT_SRV_resetBtFunction, start, nullptr)},
        {"reset, 249 bytes", -1, call(BT_SRV_resetBtFunction, start, long_name)},
        {"reset, 255 bytes", -1, call(BT_SRV_resetBtFunction, start, longest_name)},
        {"null device name", -1, call(BT_SRV_setLocalDeviceName, nullptr)},
        {"null device ID", -1, call(BT_SRV_setLocalDeviceDIDInfo, nullptr, 1, 1)},
        {"device ID, byte", -1, call(BT_SRV_setLocalDeviceDIDInfo, did, 0, 1)},
        {"device ID, word", -1, call(BT_SRV_setLocalDeviceDIDInfo, did, 1, 0)},
        {"profile", -1, call(BT_SRV_setEffectiveProfile, 256)},
        {"profile", -1, call(BT_SRV_setEffectiveProfile, UINT32_MAX)},
        {"null SCO device", -1, call(BT_SRV_setConnectSCODevice, nullptr)},
        {"null FTS block", -1, call(BT_SRV_startFtsLog, nullptr)},
        {"snapshot", -1, call(BT_SRV_shapshotFtsLog, kUnreadable, 65)},
        {"snapshot", -1, call(BT_SRV_shapshotFtsLog, kUnreadable, UINT32_MAX)},
        {"snapshot of zeros", -1, call(BT_SRV_shapshotFtsLog, nullptr, 65)},
        {"FTS size", -1, call(BT_SRV_setFtsLogSize, 0x500001)},
        {"FTS size", -1, call(BT_SRV_setFtsLogSize, UINT32_MAX)},
        {"null receive test", -1, call(BT_SRV_testRxMode, nullptr)},
        {"null transmit test", -1, call(BT_SRV_testTxMode, nullptr)},
        {"null carrier test", -1, call(BT_SRV_testNonModulatedCarrier, nullptr)},
        {"null switches", -1, call(BT_SRV_requestDebugEnable, nullptr)},
    };
    for (const std::string packet : {"0C000000", "00010000", "FFFFFFFF"})
        for (const std::string mode : {"00000000", "01000000"})
            refusals.push_back(
                {"packet type", -1, call(BT_SRV_testTxMode, Given(mode + "05000000" + packet + "00000000 00000000"))});
    refuse_all(refusals);
}

} // namespace

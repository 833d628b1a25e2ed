// Requests to the hands-free service: what each posts, and what is refused.
#include "request_rows.h"

#include <bt_service/bt_hands_free.h>

#include <climits>

namespace {

using namespace requests;

constexpr Channel kHandsFree = {0x08C3, 0, 0, &kPassedThrough};

const std::string kAtCommand = "0102 A1*44 FDFE", kDial = "0102 A2*80 FDFE", kCodec = "0102 A3*53 FDFE";
const std::string kTones = "06000000 31 32 23 2A 61 44 00*249 5A"; // 12#*aD
const std::string kAllTones = "14000000 30313233343536373839 41424344 61626364 23 2A 45 FF*235";
const std::string kLongest = "00010000 39*255 64";
const std::string kNoTone = "00000000 65*256", kMinusFive = "FBFFFFFF 65*256", kLowest = "00000080 65*256";

std::vector<Row> rows()
{
    std::vector<Row> rows = {
        {"BT_SRV_HFP_responceSCOConnection", 0x2001, "44332211", call(BT_SRV_HFP_responceSCOConnection, 0x11223344)},
        {"BT_SRV_HFP_controlCall", 0x2002, "FF*4 FFFFFF7F", call(BT_SRV_HFP_controlCall, UINT32_MAX, INT32_MAX)},
        {"BT_SRV_HFP_controlCall", 0x2002, "02010000 00*4", call(BT_SRV_HFP_controlCall, 0x102, 0)},
        {"BT_SRV_HFP_sendATCommand", 0x2003, kAtCommand, call(BT_SRV_HFP_sendATCommand, Given(kAtCommand))},
        {"BT_SRV_HFP_dialMemoryNumber", 0x2004, "00*4", call(BT_SRV_HFP_dialMemoryNumber, 0)},
        {"BT_SRV_HFP_dialMemoryNumber", 0x2004, "0F270000", call(BT_SRV_HFP_dialMemoryNumber, 9999)},
        {"BT_SRV_HFP_dialNumber", 0x2005, kDial, call(BT_SRV_HFP_dialNumber, Given(kDial))},
        {"BT_SRV_HFP_terminateCall", 0x2006, "00*4", call(BT_SRV_HFP_terminateCall, 0)},
        {"BT_SRV_HFP_terminateCall", 0x2006, "FFFFFF7F", call(BT_SRV_HFP_terminateCall, INT32_MAX)},
        {"BT_SRV_HFP_cancelDtmf", 0x2008, "", call(BT_SRV_HFP_cancelDtmf)},
        {"BT_SRV_HFP_answerCall", 0x2009, "00*4 FF*4", call(BT_SRV_HFP_answerCall, 0, UINT32_MAX)},
        {"BT_SRV_HFP_answerCall", 0x2009, "02010000 00*4", call(BT_SRV_HFP_answerCall, 0x102, 0)},
        {"BT_SRV_HFP_holdCall", 0x200A, "00*4", call(BT_SRV_HFP_holdCall, 0)},
        {"BT_SRV_HFP_holdCall", 0x200A, "02010000", call(BT_SRV_HFP_holdCall, 0x102)},
        {"BT_SRV_HFP_switchAudioLink", 0x200B, "00*4", call(BT_SRV_HFP_switchAudioLink, 0)},
        {"BT_SRV_HFP_switchAudioLink", 0x200B, "01000000", call(BT_SRV_HFP_switchAudioLink, 1)},
        {"BT_SRV_HFP_switchAudioLink", 0x200B, "03000000", call(BT_SRV_HFP_switchAudioLink, 3)},
        {"BT_SRV_HFP_switchAudioLink", 0x200B, "02010000", call(BT_SRV_HFP_switchAudioLink, 0x102)},
        {"BT_SRV_HFP_swapCall", 0x2101, "", call(BT_SRV_HFP_swapCall)},
        {"BT_SRV_HFP_mergeCall", 0x2102, "", call(BT_SRV_HFP_mergeCall)},
        {"BT_SRV_HFP_terminateAllCall", 0x2103, "FF*4", call(BT_SRV_HFP_terminateAllCall, UINT32_MAX)},
        {"BT_SRV_HFP_setCodecValue", 0x2105, kCodec, call(BT_SRV_HFP_setCodecValue, Given(kCodec))},
    };
    for (const std::string& tones : {kTones, kAllTones, kLongest, kNoTone, kMinusFive, kLowest})
        rows.push_back({"BT_SRV_HFP_sendDtmf", 0x2007, tones, call(BT_SRV_HFP_sendDtmf, Given(tones))});
    for (const std::string volume : {"00000000 01 A1A2A3", "01000000 0F 000000", "01000000 01 FFFFFF"})
        rows.push_back({"BT_SRV_HFP_setRemoteVolume", 0x2104, volume, call(BT_SRV_HFP_setRemoteVolume, Given(volume))});
    const std::pair<uint32_t, const char*> commands[] = {{2, "02"},  {3, "03"},  {4, "04"}, {5, "05"},
                                                         {6, "06"},  {7, "07"},  {8, "08"}, {10, "0A"},
                                                         {12, "0C"}, {13, "0D"}, {19, "13"}};
    for (const auto& [command, byte] : commands)
        rows.push_back({"BT_SRV_HFP_sendGeneralPhoneATCommand", 0x2106, byte + std::string("000000 02010000 04030000"),
                        call(BT_SRV_HFP_sendGeneralPhoneATCommand, command, 0x102, 0x304)});
    return rows;
}

TEST(RequestsHandsFree, PostHeaderAndPayload)
{
    run_all(kHandsFree, rows());
}

TEST(RequestsHandsFree, RefuseValuesOutOfRange)
{
    std::vector<Refusal> refusals = {
        {"control", -1, call(BT_SRV_HFP_controlCall, 0, -1)},
        {"control", -1, call(BT_SRV_HFP_controlCall, 0, INT32_MIN)},
        {"answer", -1, call(BT_SRV_HFP_answerCall, -1, 0)},
        {"answer", -1, call(BT_SRV_HFP_answerCall, INT32_MIN, 0)},
        {"terminate", -1, call(BT_SRV_HFP_terminateCall, -1)},
        {"hold", -1, call(BT_SRV_HFP_holdCall, -1)},
        {"memory", -1, call(BT_SRV_HFP_dialMemoryNumber, 10000)},
        {"memory", -1, call(BT_SRV_HFP_dialMemoryNumber, UINT32_MAX)},
        {"audio link", -1, call(BT_SRV_HFP_switchAudioLink, 2)},
        {"null command", -1, call(BT_SRV_HFP_sendATCommand, nullptr)},
        {"null number", -1, call(BT_SRV_HFP_dialNumber, nullptr)},
        {"null tones", -1, call(BT_SRV_HFP_sendDtmf, nullptr)},
        {"null volume", -2, call(BT_SRV_HFP_setRemoteVolume, nullptr)},
        {"null codec", -2, call(BT_SRV_HFP_setCodecValue, nullptr)},
    };
    for (const uint32_t command :
         {0u, 1u, 9u, 11u, 14u, 15u, 16u, 17u, 18u, 20u, 31u, 32u, 34u, 35u, 66u, 0x102u, 0x10002u, UINT32_MAX})
        refusals.push_back({"command", -2, call(BT_SRV_HFP_sendGeneralPhoneATCommand, command, 1, 1)});
    for (const std::string volume : {"02000000 01 A1A2A3", "00010000 01 A1A2A3", "FFFFFFFF 01 A1A2A3",
                                     "00000000 00 010101", "01000000 10 000000", "01000000 FF 000000"})
        refusals.push_back({"volume", -2, call(BT_SRV_HFP_setRemoteVolume, Given(volume))});
    refuse_all(refusals);
}

TEST(RequestsHandsFree, RefuseTonesThatAreNone)
{
    std::vector<Refusal> refusals;
    // '1', 'e', '2'; a wrong one at the end of the longest record; counts above the record
    for (const std::string record :
         {"03000000 31 65 32 30*253", "00010000 39*255 65", "01010000 30*256", "00000100 30*256", "FFFFFF7F 30*256"})
        refusals.push_back({"tones", -1, call(BT_SRV_HFP_sendDtmf, Given(record))});
    // the neighbours of each range of accepted characters, and those that a sign or a cut may confuse
    for (const std::string wrong :
         {"2F", "3A", "40", "45", "60", "65", "22", "24", "29", "2B", "00", "20", "7F", "80", "B1", "C1", "E1", "FF"})
        refusals.push_back({"character", -1, call(BT_SRV_HFP_sendDtmf, Given("02000000 30 " + wrong + " 30*254"))});
    refuse_all(refusals);
}

TEST(RequestsHandsFree, MuteStatusSendsNothing)
{
    refuse_all({{"mute", 0, call(BT_SRV_HFP_setMuteStatus)}});
}

} // namespace

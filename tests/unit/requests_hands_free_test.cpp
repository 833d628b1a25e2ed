// Requests to the hands-free service: what each posts, and what is refused.
#include "request_rows.h"

#include <bt_service/bt_hands_free.h>

#include <climits>

namespace {

using namespace requests;
using RequestsHandsFree = RequestRows;

TEST_F(RequestsHandsFree, PostHeaderAndPayload)
{
    const char *const at_command = "0102 A1*44 FDFE", *const dial = "0102 A2*80 FDFE", *const codec = "0102 A3*53 FDFE";
    channel = {0x08C3, 0, 0, &kPassedThrough};
    POSTS(BT_SRV_HFP_responceSCOConnection, 0x2001, "44332211", 0x11223344);
    POSTS(BT_SRV_HFP_controlCall, 0x2002, "FF*4 FFFFFF7F", UINT32_MAX, INT32_MAX);
    POSTS(BT_SRV_HFP_controlCall, 0x2002, "02010000 00*4", 0x102, 0);
    POSTS(BT_SRV_HFP_sendATCommand, 0x2003, at_command, at_command);
    POSTS(BT_SRV_HFP_dialMemoryNumber, 0x2004, "00*4", 0);
    POSTS(BT_SRV_HFP_dialMemoryNumber, 0x2004, "0F270000", 9999);
    POSTS(BT_SRV_HFP_dialNumber, 0x2005, dial, dial);
    POSTS(BT_SRV_HFP_terminateCall, 0x2006, "00*4", 0);
    POSTS(BT_SRV_HFP_terminateCall, 0x2006, "FFFFFF7F", INT32_MAX);
    POSTS(BT_SRV_HFP_cancelDtmf, 0x2008, "");
    POSTS(BT_SRV_HFP_answerCall, 0x2009, "00*4 FF*4", 0, UINT32_MAX);
    POSTS(BT_SRV_HFP_answerCall, 0x2009, "02010000 00*4", 0x102, 0);
    POSTS(BT_SRV_HFP_holdCall, 0x200A, "00*4", 0);
    POSTS(BT_SRV_HFP_holdCall, 0x200A, "02010000", 0x102);
    POSTS(BT_SRV_HFP_switchAudioLink, 0x200B, "00*4", 0);
    POSTS(BT_SRV_HFP_switchAudioLink, 0x200B, "01000000", 1);
    POSTS(BT_SRV_HFP_switchAudioLink, 0x200B, "03000000", 3);
    POSTS(BT_SRV_HFP_switchAudioLink, 0x200B, "02010000", 0x102);
    POSTS(BT_SRV_HFP_swapCall, 0x2101, "");
    POSTS(BT_SRV_HFP_mergeCall, 0x2102, "");
    POSTS(BT_SRV_HFP_terminateAllCall, 0x2103, "FF*4", UINT32_MAX);
    POSTS(BT_SRV_HFP_setCodecValue, 0x2105, codec, codec);
    for (const std::string tones : {"06000000 31 32 23 2A 61 44 00*249 5A", // 12#*aD
                                    "14000000 30313233343536373839 41424344 61626364 23 2A 45 FF*235",
                                    "00010000 39*255 64", "00000000 65*256", "FBFFFFFF 65*256", "00000080 65*256"})
        POSTS(BT_SRV_HFP_sendDtmf, 0x2007, tones, tones);
    for (const std::string volume : {"00000000 01 A1A2A3", "01000000 0F 000000", "01000000 01 FFFFFF"})
        POSTS(BT_SRV_HFP_setRemoteVolume, 0x2104, volume, volume);
    for (const uint32_t command : {2u, 3u, 4u, 5u, 6u, 7u, 8u, 10u, 12u, 13u, 19u}) {
        const std::string sent = fake::to_hex({static_cast<uint8_t>(command)}) + "000000 02010000 04030000";
        POSTS(BT_SRV_HFP_sendGeneralPhoneATCommand, 0x2106, sent, command, 0x102, 0x304);
    }
}

TEST_F(RequestsHandsFree, RefuseValuesOutOfRange)
{
    for (const int32_t value : {-1, INT32_MIN}) {
        REFUSES(-1, BT_SRV_HFP_controlCall, 0, value);
        REFUSES(-1, BT_SRV_HFP_answerCall, value, 0);
        REFUSES(-1, BT_SRV_HFP_terminateCall, value);
        REFUSES(-1, BT_SRV_HFP_holdCall, value);
    }
    REFUSES(-1, BT_SRV_HFP_dialMemoryNumber, 10000);
    REFUSES(-1, BT_SRV_HFP_dialMemoryNumber, UINT32_MAX);
    REFUSES(-1, BT_SRV_HFP_switchAudioLink, 2);
    REFUSES(-1, BT_SRV_HFP_sendATCommand, nullptr);
    REFUSES(-1, BT_SRV_HFP_dialNumber, nullptr);
    REFUSES(-1, BT_SRV_HFP_sendDtmf, nullptr);
    REFUSES(-2, BT_SRV_HFP_setRemoteVolume, nullptr);
    REFUSES(-2, BT_SRV_HFP_setCodecValue, nullptr);
    for (const uint32_t command :
         {0u, 1u, 9u, 11u, 14u, 15u, 16u, 17u, 18u, 20u, 31u, 32u, 34u, 66u, 0x102u, 0x10002u, UINT32_MAX})
        REFUSES(-2, BT_SRV_HFP_sendGeneralPhoneATCommand, command, 1, 1);
    for (const char* const volume : {"02000000 01 A1A2A3", "00010000 01 A1A2A3", "FFFFFFFF 01 A1A2A3",
                                     "00000000 00 010101", "01000000 10 000000", "01000000 FF 000000"})
        REFUSES(-2, BT_SRV_HFP_setRemoteVolume, volume);
    // '1', 'e', '2'; a wrong one at the end of the longest record; counts above the record
    for (const char* const tones :
         {"03000000 31 65 32 30*253", "00010000 39*255 65", "01010000 30*256", "00000100 30*256", "FFFFFF7F 30*256"})
        REFUSES(-1, BT_SRV_HFP_sendDtmf, tones);
    // the neighbours of each range of accepted characters, and those that a sign or a cut may confuse
    for (const std::string wrong :
         {"2F", "3A", "40", "45", "60", "65", "22", "24", "29", "2B", "00", "20", "7F", "80", "B1", "C1", "E1", "FF"})
        REFUSES(-1, BT_SRV_HFP_sendDtmf, "02000000 30 " + wrong + " 30*254");
    REFUSES(0, BT_SRV_HFP_setMuteStatus); // which sends nothing ever
}

} // namespace

// Requests to the audio/video service: what each posts and what it refuses.
#include "request_rows.h"

#include <bt_service/bt_audio_video.h>

namespace {

using namespace requests;
using AudioVideoRequests = RequestRows;

const std::string kItem = "A1A2A3A4A5A6A7A8";
const char* const kWords = "04030201 00000080 FEFFFFFF"; // as they lie in memory

TEST_F(AudioVideoRequests, PostTheirPayload)
{
    const std::string sent_words = " 01020304 80000000 FFFFFFFE";
    channel = {0x08C4, 0, 0, &kPassedThrough};
    POSTS(BT_SRV_AVP_play, 0x1004, "");
    POSTS(BT_SRV_AVP_pause, 0x1005, "");
    POSTS(BT_SRV_AVP_togglePlayPause, 0x1006, "");
    POSTS(BT_SRV_AVP_stop, 0x1007, "");
    POSTS(BT_SRV_AVP_trackUp, 0x1008, "");
    POSTS(BT_SRV_AVP_trackDown, 0x1009, "");
    POSTS(BT_SRV_AVP_albumUp, 0x100A, "");
    POSTS(BT_SRV_AVP_albumDown, 0x100B, "");
    POSTS(BT_SRV_AVP_fastForward, 0x100C, "FE", 0xFE);
    POSTS(BT_SRV_AVP_rewind, 0x100D, "FF", 0xFF);
    POSTS(BT_SRV_AVP_changeVolume, 0x100E, "04030201", 0x01020304);
    POSTS(BT_SRV_AVP_setBTAAudio, 0x100F, "80", 0x80);
    POSTS(BT_SRV_AVP_getSupportInfo, 0x1010, "");
    POSTS(BT_SRV_AVP_setRandom, 0x1011, "040302F1", 0xF1020304);
    POSTS(BT_SRV_AVP_setEq, 0x1012, "FEFFFFFF", 0xFFFFFFFE);
    POSTS(BT_SRV_AVP_setRepeat, 0x1013, "00000001", 0x01000000);
    POSTS(BT_SRV_AVP_setScan, 0x1014, "00010000", 0x100);
    POSTS(BT_SRV_AVP_getPlayerApplicationValue, 0x1015, "01000000", 1);
    POSTS(BT_SRV_AVP_setCharacterCode, 0x1016, "81 01020304 00000005 80000000 FFFEFDFC 00000000",
          "81 00*3 04030201 05000000 00000080 FCFDFEFF 00000000");
    POSTS(BT_SRV_AVP_getPlaybackStatus, 0x1017, "");
    POSTS(BT_SRV_AVP_getMediaInfo, 0x1018, "");
    POSTS(BT_SRV_AVP_selectFolder, 0x1019, kItem + sent_words, kItem, kWords);
    POSTS(BT_SRV_AVP_getMediaListNum, 0x101A, "04030201", 0x01020304);
    POSTS(BT_SRV_AVP_getMediaList, 0x101B, sent_words, kWords);
    POSTS(BT_SRV_AVP_folderUp, 0x101C, kItem + sent_words, kItem, kWords);
    POSTS(BT_SRV_AVP_getPlayerList, 0x101D, "01020304 FFFFFFFE", "04030201 FEFFFFFF");
    POSTS(BT_SRV_AVP_searchItem, 0x101E, "00000007 0003 616263", 7, 3, "616263");
    POSTS(BT_SRV_AVP_searchItem, 0x101E, "01020304 0000", 0x01020304, 0, nullptr);
    POSTS(BT_SRV_AVP_searchItem, 0x101E, "FFFFFFFF 0000", 0xFFFFFFFF, 0, kUnreadable);
    POSTS(BT_SRV_AVP_searchItem, 0x101E, "00000007 01EA 61*490", 7, 490, "61*490");
    POSTS(BT_SRV_AVP_selectPlayer, 0x101F, "0A0B", "0A0B");
    POSTS(BT_SRV_AVP_selectPlayer, 0x101F, "0000", nullptr);
    POSTS(BT_SRV_AVP_addNowPlaying, 0x1020, kItem + " F234 F6789ABC", kItem, 0xF234, 0xF6789ABC);
    POSTS(BT_SRV_AVP_cancelSearchItem, 0x1021, "");
    POSTS(BT_SRV_AVP_selectMediaContent, 0x1022, kItem + " 1234 56789ABC", kItem, 0x1234, 0x56789ABC);
    POSTS(BT_SRV_AVP_rootFolder, 0x1023, sent_words, kWords);
    POSTS(BT_SRV_AVP_STRCTL_setDeviceFileName, 0x1024, "0000", 0, kUnreadable);
    POSTS(BT_SRV_AVP_STRCTL_setDeviceFileName, 0x1024, "0001 39", 1, "39");
    POSTS(BT_SRV_AVP_STRCTL_setDeviceFileName, 0x1024, "01EE 62*494", 494, "62*494");
    POSTS(BT_SRV_AVP_STRCTL_setCapability, 0x1025, "C1*19 C2", "C1*19 C2");
    POSTS(BT_SRV_AVP_userPlay, 0x1026, "");
    POSTS(BT_SRV_AVP_setAbsoluteVomule, 0x1027, "7F", 0x7F);
    POSTS(BT_SRV_AVP_setAbsoluteVomule, 0x1027, "00", 0x100);
    POSTS(BT_SRV_AVP_setAbsoluteVomule, 0x1027, "7F", 0xFFFFFF7F);
    POSTS(BT_SRV_AVP_cancelBrwsCmd, 0x1028, "");
}

TEST_F(AudioVideoRequests, RefuseWithoutPosting)
{
    REFUSES(-1, BT_SRV_AVP_selectFolder, kItem, nullptr);
    REFUSES(-1, BT_SRV_AVP_selectFolder, nullptr, kWords);
    REFUSES(-1, BT_SRV_AVP_folderUp, kItem, nullptr);
    REFUSES(-1, BT_SRV_AVP_folderUp, nullptr, kWords);
    REFUSES(-1, BT_SRV_AVP_getMediaList, nullptr);
    REFUSES(-1, BT_SRV_AVP_getPlayerList, nullptr);
    REFUSES(-1, BT_SRV_AVP_rootFolder, nullptr);
    REFUSES(-1, BT_SRV_AVP_addNowPlaying, nullptr, 1, 2);
    REFUSES(-1, BT_SRV_AVP_selectMediaContent, nullptr, 1, 2);
    REFUSES(-1, BT_SRV_AVP_STRCTL_setCapability, nullptr);
    REFUSES(-1, BT_SRV_AVP_STRCTL_setDeviceFileName, 0, nullptr);
    REFUSES(-1, BT_SRV_AVP_STRCTL_setDeviceFileName, 3, nullptr);
    REFUSES(-1, BT_SRV_AVP_searchItem, 7, 1, nullptr);
    REFUSES(-1, BT_SRV_AVP_searchItem, 7, 491, kUnreadable);
    // Lengths whose low 16 bits or whose sum with the fixed part would fit.
    for (const uint32_t length : {495u, 1003u, 0x10000u, 0x80000000u, 0xFFFFFFFAu, 0xFFFFFFFFu}) {
        REFUSES(-1, BT_SRV_AVP_STRCTL_setDeviceFileName, length, kUnreadable);
        REFUSES(-1, BT_SRV_AVP_searchItem, 7, length, kUnreadable);
    }
    for (const uint32_t volume : {0x80u, 0xFFu, 0x180u, 0x80000080u, 0xFFFFFFFFu})
        REFUSES(-2, BT_SRV_AVP_setAbsoluteVomule, volume);
}

} // namespace

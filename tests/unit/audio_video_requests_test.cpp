// Requests to the audio/video service: what each posts and what it refuses.
#include "request_rows.h"

#include <bt_service/bt_audio_video.h>

namespace {

using namespace requests;

constexpr Channel kAudioVideo = {0x08C4, 0, 0, &kPassedThrough};

const Given kItem{"A1A2A3A4A5A6A7A8"};
const Given kTwoWords{"04030201 FEFFFFFF"}; // as they lie in memory
const Given kThreeWords{"04030201 00000080 FEFFFFFF"};
const Given kNine{"39"};
constexpr std::nullptr_t kNull = nullptr;

TEST(AudioVideoRequests, PostTheirPayload)
{
    const character_code code = {0x81, {0x01020304, 5, 0x80000000, 0xFFFEFDFC, 0}};
    run_all(
        kAudioVideo,
        {{"BT_SRV_AVP_play", 0x1004, "", call(BT_SRV_AVP_play)},
         {"BT_SRV_AVP_pause", 0x1005, "", call(BT_SRV_AVP_pause)},
         {"BT_SRV_AVP_togglePlayPause", 0x1006, "", call(BT_SRV_AVP_togglePlayPause)},
         {"BT_SRV_AVP_stop", 0x1007, "", call(BT_SRV_AVP_stop)},
         {"BT_SRV_AVP_trackUp", 0x1008, "", call(BT_SRV_AVP_trackUp)},
         {"BT_SRV_AVP_trackDown", 0x1009, "", call(BT_SRV_AVP_trackDown)},
         {"BT_SRV_AVP_albumUp", 0x100A, "", call(BT_SRV_AVP_albumUp)},
         {"BT_SRV_AVP_albumDown", 0x100B, "", call(BT_SRV_AVP_albumDown)},
         {"BT_SRV_AVP_fastForward", 0x100C, "FE", call(BT_SRV_AVP_fastForward, uint8_t{0xFE})},
         {"BT_SRV_AVP_rewind", 0x100D, "FF", call(BT_SRV_AVP_rewind, uint8_t{0xFF})},
         {"BT_SRV_AVP_changeVolume", 0x100E, "04030201", call(BT_SRV_AVP_changeVolume, 0x01020304u)},
         {"BT_SRV_AVP_setBTAAudio", 0x100F, "80", call(BT_SRV_AVP_setBTAAudio, uint8_t{0x80})},
         {"BT_SRV_AVP_getSupportInfo", 0x1010, "", call(BT_SRV_AVP_getSupportInfo)},
         {"BT_SRV_AVP_setRandom", 0x1011, "040302F1", call(BT_SRV_AVP_setRandom, 0xF1020304u)},
         {"BT_SRV_AVP_setEq", 0x1012, "FFFFFFFF", call(BT_SRV_AVP_setEq, 0xFFFFFFFFu)},
         {"BT_SRV_AVP_setRepeat", 0x1013, "00000001", call(BT_SRV_AVP_setRepeat, 0x01000000u)},
         {"BT_SRV_AVP_setScan", 0x1014, "00010000", call(BT_SRV_AVP_setScan, 0x100u)},
         {"BT_SRV_AVP_getPlayerApplicationValue", 0x1015, "01000000", call(BT_SRV_AVP_getPlayerApplicationValue, 1u)},
         {"BT_SRV_AVP_setCharacterCode", 0x1016, "81 01020304 00000005 80000000 FFFEFDFC 00000000",
          call(BT_SRV_AVP_setCharacterCode, code)},
         {"BT_SRV_AVP_getPlaybackStatus", 0x1017, "", call(BT_SRV_AVP_getPlaybackStatus)},
         {"BT_SRV_AVP_getMediaInfo", 0x1018, "", call(BT_SRV_AVP_getMediaInfo)},
         {"BT_SRV_AVP_selectFolder", 0x1019, "A1A2A3A4A5A6A7A8 01020304 80000000 FFFFFFFE",
          call(BT_SRV_AVP_selectFolder, kItem, kThreeWords)},
         {"BT_SRV_AVP_getMediaListNum", 0x101A, "04030201", call(BT_SRV_AVP_getMediaListNum, 0x01020304u)},
         {"BT_SRV_AVP_getMediaList", 0x101B, "01020304 80000000 FFFFFFFE", call(BT_SRV_AVP_getMediaList, kThreeWords)},
         {"BT_SRV_AVP_folderUp", 0x101C, "A1A2A3A4A5A6A7A8 01020304 80000000 FFFFFFFE",
          call(BT_SRV_AVP_folderUp, kItem, kThreeWords)},
         {"BT_SRV_AVP_getPlayerList", 0x101D, "01020304 FFFFFFFE", call(BT_SRV_AVP_getPlayerList, kTwoWords)},
         {"BT_SRV_AVP_searchItem", 0x101E, "00000007 0003 616263",
          call(BT_SRV_AVP_searchItem, 7u, 3u, Given("616263"))},
         {"BT_SRV_AVP_searchItem", 0x101E, "01020304 0000", call(BT_SRV_AVP_searchItem, 0x01020304u, 0u, kNull)},
         {"BT_SRV_AVP_searchItem", 0x101E, "FFFFFFFF 0000", call(BT_SRV_AVP_searchItem, ~0u, 0u, kUnreadable)},
         {"BT_SRV_AVP_searchItem", 0x101E, "00000007 01EA 61*490",
          call(BT_SRV_AVP_searchItem, 7u, 490u, Given("61*490"))},
         {"BT_SRV_AVP_selectPlayer", 0x101F, "0A0B", call(BT_SRV_AVP_selectPlayer, Given("0A0B"))},
         {"BT_SRV_AVP_selectPlayer", 0x101F, "0000", call(BT_SRV_AVP_selectPlayer, kNull)},
         {"BT_SRV_AVP_addNowPlaying", 0x1020, "A1A2A3A4A5A6A7A8 F234 F6789ABC",
          call(BT_SRV_AVP_addNowPlaying, kItem, uint16_t{0xF234}, 0xF6789ABCu)},
         {"BT_SRV_AVP_cancelSearchItem", 0x1021, "", call(BT_SRV_AVP_cancelSearchItem)},
         {"BT_SRV_AVP_selectMediaContent", 0x1022, "A1A2A3A4A5A6A7A8 1234 56789ABC",
          call(BT_SRV_AVP_selectMediaContent, kItem, uint16_t{0x1234}, 0x56789ABCu)},
         {"BT_SRV_AVP_rootFolder", 0x1023, "01020304 80000000 FFFFFFFE", call(BT_SRV_AVP_rootFolder, kThreeWords)},
         {"BT_SRV_AVP_STRCTL_setDeviceFileName", 0x1024, "0000",
          call(BT_SRV_AVP_STRCTL_setDeviceFileName, 0u, kUnreadable)},
         {"BT_SRV_AVP_STRCTL_setDeviceFileName", 0x1024, "0001 39",
          call(BT_SRV_AVP_STRCTL_setDeviceFileName, 1u, kNine)},
         {"BT_SRV_AVP_STRCTL_setDeviceFileName", 0x1024, "01EE 62*494",
          call(BT_SRV_AVP_STRCTL_setDeviceFileName, 494u, Given("62*494"))},
         {"BT_SRV_AVP_STRCTL_setCapability", 0x1025, "C1*19 C2",
          call(BT_SRV_AVP_STRCTL_setCapability, Given("C1*19 C2"))},
         {"BT_SRV_AVP_userPlay", 0x1026, "", call(BT_SRV_AVP_userPlay)},
         {"BT_SRV_AVP_setAbsoluteVomule", 0x1027, "7F", call(BT_SRV_AVP_setAbsoluteVomule, 0x7Fu)},
         {"BT_SRV_AVP_setAbsoluteVomule", 0x1027, "00", call(BT_SRV_AVP_setAbsoluteVomule, 0x100u)},
         {"BT_SRV_AVP_setAbsoluteVomule", 0x1027, "7F", call(BT_SRV_AVP_setAbsoluteVomule, 0xFFFFFF7Fu)},
         {"BT_SRV_AVP_cancelBrwsCmd", 0x1028, "", call(BT_SRV_AVP_cancelBrwsCmd)}});
}

TEST(AudioVideoRequests, RefuseWithoutPosting)
{
    std::vector<Refusal> refusals = {
        {"folder, no words", -1, call(BT_SRV_AVP_selectFolder, kItem, kNull)},
        {"folder, no item", -1, call(BT_SRV_AVP_selectFolder, kNull, kThreeWords)},
        {"folder, nothing", -1, call(BT_SRV_AVP_selectFolder, kNull, kNull)},
        {"parent, no words", -1, call(BT_SRV_AVP_folderUp, kItem, kNull)},
        {"parent, no item", -1, call(BT_SRV_AVP_folderUp, kNull, kThreeWords)},
        {"media list", -1, call(BT_SRV_AVP_getMediaList, kNull)},
        {"player list", -1, call(BT_SRV_AVP_getPlayerList, kNull)},
        {"root folder", -1, call(BT_SRV_AVP_rootFolder, kNull)},
        {"now playing", -1, call(BT_SRV_AVP_addNowPlaying, kNull, uint16_t{1}, 2u)},
        {"media content", -1, call(BT_SRV_AVP_selectMediaContent, kNull, uint16_t{1}, 2u)},
        {"capability", -1, call(BT_SRV_AVP_STRCTL_setCapability, kNull)},
        {"search, no text", -1, call(BT_SRV_AVP_searchItem, 7u, 1u, kNull)},
        {"search, no long text", -1, call(BT_SRV_AVP_searchItem, 7u, 491u, kNull)},
        {"file name, none", -1, call(BT_SRV_AVP_STRCTL_setDeviceFileName, 0u, kNull)},
        {"file name, none of three", -1, call(BT_SRV_AVP_STRCTL_setDeviceFileName, 3u, kNull)},
    };
    // Lengths whose low 16 bits or whose sum with the fixed part would fit.
    const uint32_t lengths[] = {495, 1003, 0x10000, 0x10003, 0x80000000, 0xFFFFFFFA, 0xFFFFFFFE, 0xFFFFFFFF};
    refuse_each(refusals, "file name length", -1, lengths,
                [](uint32_t length) { return call(BT_SRV_AVP_STRCTL_setDeviceFileName, length, kUnreadable); });
    refuse_each(refusals, "text length", -1, lengths,
                [](uint32_t length) { return call(BT_SRV_AVP_searchItem, 7u, length, kUnreadable); });
    refusals.push_back({"text length 491", -1, call(BT_SRV_AVP_searchItem, 7u, 491u, kUnreadable)});
    const uint32_t volumes[] = {0x80, 0xFF, 0x180, 0x80000080, 0xFFFFFFFF};
    refuse_each(refusals, "volume", -2, volumes,
                [](uint32_t volume) { return call(BT_SRV_AVP_setAbsoluteVomule, volume); });
    refuse_all(refusals);
}

} // namespace

// Requests to the audio/video service.

#include "wire/post.h"

#include <bt_service/bt_audio_video.h>

namespace bt::avp {
namespace {

int32_t post(Request request)
{
    return bt::post(PNO_BT_AVP, request);
}

int32_t post(Request request, Payload& payload)
{
    return bt::post(PNO_BT_AVP, request, payload);
}

int32_t post_byte(Request request, uint8_t value)
{
    return post(request, Payload().u8(value));
}

int32_t post_value(Request request, uint32_t value)
{
    return post(request, Payload().u32(value));
}

int32_t post_three_words(Request request, const uint32_t* words)
{
    if (words == nullptr) return BT_FAILED;

    return post(request, Payload().be32(words[0]).be32(words[1]).be32(words[2]));
}

int32_t post_item_and_words(Request request, const void* item, const uint32_t* words)
{
    if (item == nullptr || words == nullptr) return BT_FAILED;

    return post(request, Payload().bytes(item, BT_AVP_ITEM_SIZE).be32(words[0]).be32(words[1]).be32(words[2]));
}

int32_t post_item(Request request, const void* item, uint16_t a, uint32_t b)
{
    if (item == nullptr) return BT_FAILED;

    return post(request, Payload().bytes(item, BT_AVP_ITEM_SIZE).be16(a).be32(b));
}

} // namespace
} // namespace bt::avp

using bt::Payload;
using bt::Request;
using namespace bt::avp;

// ---- playback

int32_t BT_SRV_AVP_play()
{
    return post(Request::AVP_play);
}

int32_t BT_SRV_AVP_userPlay()
{
    return post(Request::AVP_userPlay);
}

int32_t BT_SRV_AVP_pause()
{
    return post(Request::AVP_pause);
}

int32_t BT_SRV_AVP_togglePlayPause()
{
    return post(Request::AVP_togglePlayPause);
}

int32_t BT_SRV_AVP_stop()
{
    return post(Request::AVP_stop);
}

int32_t BT_SRV_AVP_trackUp()
{
    return post(Request::AVP_trackUp);
}

int32_t BT_SRV_AVP_trackDown()
{
    return post(Request::AVP_trackDown);
}

int32_t BT_SRV_AVP_albumUp()
{
    return post(Request::AVP_albumUp);
}

int32_t BT_SRV_AVP_albumDown()
{
    return post(Request::AVP_albumDown);
}

int32_t BT_SRV_AVP_fastForward(uint8_t value)
{
    return post_byte(Request::AVP_fastForward, value);
}

int32_t BT_SRV_AVP_rewind(uint8_t value)
{
    return post_byte(Request::AVP_rewind, value);
}

// ---- sound and player settings

int32_t BT_SRV_AVP_changeVolume(uint32_t value)
{
    return post_value(Request::AVP_changeVolume, value);
}

int32_t BT_SRV_AVP_setAbsoluteVomule(uint32_t volume)
{
    if ((volume & 0x80U) != 0) return BT_BAD_ARGUMENT;

    return post(Request::AVP_setAbsoluteVomule, Payload().u8(volume));
}

int32_t BT_SRV_AVP_setBTAAudio(uint8_t value)
{
    return post_byte(Request::AVP_setBTAAudio, value);
}

int32_t BT_SRV_AVP_setRandom(uint32_t value)
{
    return post_value(Request::AVP_setRandom, value);
}

int32_t BT_SRV_AVP_setEq(uint32_t value)
{
    return post_value(Request::AVP_setEq, value);
}

int32_t BT_SRV_AVP_setRepeat(uint32_t value)
{
    return post_value(Request::AVP_setRepeat, value);
}

int32_t BT_SRV_AVP_setScan(uint32_t value)
{
    return post_value(Request::AVP_setScan, value);
}

int32_t BT_SRV_AVP_getPlayerApplicationValue(uint32_t value)
{
    return post_value(Request::AVP_getPlayerApplicationValue, value);
}

int32_t BT_SRV_AVP_setCharacterCode(struct character_code code)
{
    Payload payload;
    payload.u8(code.first);
    for (const uint32_t value : code.values) {
        payload.be32(value);
    }
    return post(Request::AVP_setCharacterCode, payload);
}

// ---- information about the player

int32_t BT_SRV_AVP_getSupportInfo()
{
    return post(Request::AVP_getSupportInfo);
}

int32_t BT_SRV_AVP_getPlaybackStatus()
{
    return post(Request::AVP_getPlaybackStatus);
}

int32_t BT_SRV_AVP_getMediaInfo()
{
    return post(Request::AVP_getMediaInfo);
}

// ---- browsing

int32_t BT_SRV_AVP_getPlayerList(const uint32_t* words)
{
    if (words == nullptr) return BT_FAILED;

    return post(Request::AVP_getPlayerList, Payload().be32(words[0]).be32(words[1]));
}

int32_t BT_SRV_AVP_selectPlayer(const void* player)
{
    return post(Request::AVP_selectPlayer, Payload().bytes_or_zeros(player, BT_AVP_PLAYER_ID_SIZE));
}

int32_t BT_SRV_AVP_rootFolder(const uint32_t* words)
{
    return post_three_words(Request::AVP_rootFolder, words);
}

int32_t BT_SRV_AVP_selectFolder(const void* item, const uint32_t* words)
{
    return post_item_and_words(Request::AVP_selectFolder, item, words);
}

int32_t BT_SRV_AVP_folderUp(const void* item, const uint32_t* words)
{
    return post_item_and_words(Request::AVP_folderUp, item, words);
}

int32_t BT_SRV_AVP_getMediaListNum(uint32_t value)
{
    return post_value(Request::AVP_getMediaListNum, value);
}

int32_t BT_SRV_AVP_getMediaList(const uint32_t* words)
{
    return post_three_words(Request::AVP_getMediaList, words);
}

int32_t BT_SRV_AVP_addNowPlaying(const void* item, uint16_t a, uint32_t b)
{
    return post_item(Request::AVP_addNowPlaying, item, a, b);
}

int32_t BT_SRV_AVP_selectMediaContent(const void* item, uint16_t a, uint32_t b)
{
    return post_item(Request::AVP_selectMediaContent, item, a, b);
}

int32_t BT_SRV_AVP_searchItem(uint32_t value, uint32_t length, const void* text)
{
    if (length > BT_AVP_SEARCH_TEXT_MAX) return BT_FAILED;
    if (text == nullptr && length != 0) return BT_FAILED;

    return post(Request::AVP_searchItem, Payload().be32(value).be16(length).bytes(text, length));
}

int32_t BT_SRV_AVP_cancelSearchItem()
{
    return post(Request::AVP_cancelSearchItem);
}

int32_t BT_SRV_AVP_cancelBrwsCmd()
{
    return post(Request::AVP_cancelBrwsCmd);
}

// ---- streaming control

int32_t BT_SRV_AVP_STRCTL_setDeviceFileName(uint32_t length, const void* name)
{
    if (name == nullptr) return BT_FAILED;
    if (length > BT_AVP_FILE_NAME_MAX) return BT_FAILED;

    return post(Request::AVP_STRCTL_setDeviceFileName, Payload().be16(length).bytes(name, length));
}

int32_t BT_SRV_AVP_STRCTL_setCapability(const void* record)
{
    if (record == nullptr) return BT_FAILED;

    return post(Request::AVP_STRCTL_setCapability, Payload().bytes(record, BT_AVP_CAPABILITY_SIZE));
}

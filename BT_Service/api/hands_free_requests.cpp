// Requests to the hands-free service.

#include "wire/post.h"

#include <bt_service/bt_hands_free.h>

using bt::Payload;
using bt::Request;

namespace {

constexpr uint32_t kLastMemoryNumber = 9999;
constexpr uint32_t kNoAudioLink = 2;
constexpr uint32_t kLastVolumeTarget = 1;
constexpr uint32_t kLoudest = 15;

// One bit per code: 2..8, 10, 12, 13 and 19.
constexpr uint32_t kPhoneCommands = 0x835FC;
constexpr uint32_t kLastPhoneCommand = 19;

int32_t post(Request request)
{
    return bt::post(PNO_BT_HFP, request);
}

int32_t post(Request request, Payload& payload)
{
    return bt::post(PNO_BT_HFP, request, payload);
}

bool is_dtmf(char c)
{
    return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'D') || (c >= 'a' && c <= 'd') || c == '#' || c == '*';
}

bool is_phone_command(uint32_t command)
{
    return command <= kLastPhoneCommand && (kPhoneCommands >> command & 1) != 0;
}

} // namespace

int32_t BT_SRV_HFP_responceSCOConnection(uint32_t value)
{
    return post(Request::HFP_responceSCOConnection, Payload().u32(value));
}

int32_t BT_SRV_HFP_controlCall(uint32_t a, int32_t b)
{
    if (b < 0) return BT_FAILED;

    return post(Request::HFP_controlCall, Payload().u32(a).i32(b));
}

int32_t BT_SRV_HFP_sendATCommand(const BtHfpAtCommand* command)
{
    if (command == nullptr) return BT_FAILED;

    return post(Request::HFP_sendATCommand, Payload().bytes(command, sizeof *command));
}

int32_t BT_SRV_HFP_dialMemoryNumber(uint32_t number)
{
    if (number > kLastMemoryNumber) return BT_FAILED;

    return post(Request::HFP_dialMemoryNumber, Payload().u32(number));
}

int32_t BT_SRV_HFP_dialNumber(const BtHfpDialNumber* record)
{
    if (record == nullptr) return BT_FAILED;

    return post(Request::HFP_dialNumber, Payload().bytes(record, sizeof *record));
}

int32_t BT_SRV_HFP_terminateCall(int32_t value)
{
    if (value < 0) return BT_FAILED;

    return post(Request::HFP_terminateCall, Payload().i32(value));
}

int32_t BT_SRV_HFP_sendDtmf(const BtHfpDtmf* dtmf)
{
    if (dtmf == nullptr) return BT_FAILED;
    const int32_t count = dtmf->count;
    if (count > static_cast<int32_t>(sizeof dtmf->characters)) return BT_FAILED;
    for (int32_t i = 0; i < count; ++i) {
        if (!is_dtmf(dtmf->characters[i])) return BT_FAILED;
    }

    return post(Request::HFP_sendDtmf, Payload().bytes(dtmf, sizeof *dtmf));
}

int32_t BT_SRV_HFP_cancelDtmf()
{
    return post(Request::HFP_cancelDtmf);
}

int32_t BT_SRV_HFP_answerCall(int32_t a, uint32_t b)
{
    if (a < 0) return BT_FAILED;

    return post(Request::HFP_answerCall, Payload().i32(a).u32(b));
}

int32_t BT_SRV_HFP_holdCall(int32_t value)
{
    if (value < 0) return BT_FAILED;

    return post(Request::HFP_holdCall, Payload().i32(value));
}

int32_t BT_SRV_HFP_switchAudioLink(uint32_t value)
{
    if (value == kNoAudioLink) return BT_FAILED;

    return post(Request::HFP_switchAudioLink, Payload().u32(value));
}

int32_t BT_SRV_HFP_swapCall()
{
    return post(Request::HFP_swapCall);
}

int32_t BT_SRV_HFP_mergeCall()
{
    return post(Request::HFP_mergeCall);
}

int32_t BT_SRV_HFP_terminateAllCall(uint32_t value)
{
    return post(Request::HFP_terminateAllCall, Payload().u32(value));
}

int32_t BT_SRV_HFP_setRemoteVolume(const BtHfpVolume* volume)
{
    if (volume == nullptr) return BT_BAD_ARGUMENT;
    if (volume->target > kLastVolumeTarget) return BT_BAD_ARGUMENT;
    if (volume->level == 0 || volume->level > kLoudest) return BT_BAD_ARGUMENT;

    return post(Request::HFP_setRemoteVolume, Payload().bytes(volume, sizeof *volume));
}

int32_t BT_SRV_HFP_setCodecValue(const BtHfpCodec* codec)
{
    if (codec == nullptr) return BT_BAD_ARGUMENT;

    return post(Request::HFP_setCodecValue, Payload().bytes(codec, sizeof *codec));
}

int32_t BT_SRV_HFP_sendGeneralPhoneATCommand(uint32_t command, uint32_t p1, uint32_t p2)
{
    if (!is_phone_command(command)) return BT_BAD_ARGUMENT;

    return post(Request::HFP_sendGeneralPhoneATCommand, Payload().u32(command).u32(p1).u32(p2));
}

int32_t BT_SRV_HFP_setMuteStatus()
{
    return BT_OK;
}

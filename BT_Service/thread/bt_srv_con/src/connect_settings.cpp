// The connect setting words, read and written one at a time.
#include "thread/bt_srv_con/src/area.h"

namespace {

constexpr auto kWords = &BtConShareData::connect_set_val;
using Words = bt::con::Field<kWords>;

} // namespace

using namespace bt::con;

int32_t bt_con_getSettingStatusVtype(uint32_t* value, uint32_t vtype)
{
    if (value == nullptr || vtype >= BT_CON_CONNECT_SETTINGS) return BT_BAD_ARGUMENT;
    return look_at_field<kWords>([=](const Words& words) -> int32_t {
        *value = words[vtype];
        return BT_OK;
    });
}

int32_t bt_con_setSettingStatusVtype(uint32_t value, uint32_t vtype)
{
    if (vtype >= BT_CON_CONNECT_SETTINGS) return BT_BAD_ARGUMENT;
    return change_field<kWords>(bt_con_setConnectSetVal, [=](Words& words) -> int32_t {
        if (words[vtype] == value) return kUnchanged;
        words[vtype] = value;
        return BT_OK;
    });
}

// The search device list: the devices found by the last search, each once.
#include "thread/bt_srv_con/src/area.h"

namespace bt::con {
namespace {

int32_t put(BtConSearchDevList& list, const BtConDevInfo* devinfo)
{
    int32_t index = 0;
    if (bt_con_SerchDevInfo(&list, devinfo, &index) == 0) {
        if (list.num == BT_CON_SEARCH_MAX) return kUnchanged;
        index = list.num++;
    }
    bt_con_setDevInfo(&list.device[index], devinfo);
    return BT_OK;
}

} // namespace
} // namespace bt::con

using namespace bt::con;

int32_t bt_con_SerchDevInfo(const BtConSearchDevList* list, const BtConDevInfo* devinfo, int32_t* index)
{
    if (list == nullptr || devinfo == nullptr) return 0;
    if (index == nullptr) return BT_BAD_ARGUMENT;

    const int32_t used = possible(list->num, BT_CON_SEARCH_MAX);
    for (int32_t i = 0; i < used; ++i) {
        if (bt_con_IsCompBtDevAddress(&list->device[i].bd_addr, &devinfo->bd_addr) == 0) continue;
        *index = i;
        return 1;
    }
    return 0;
}

void bt_con_setDevInfo(BtConDevInfo* dst, const BtConDevInfo* src)
{
    if (dst == nullptr || src == nullptr) return;
    dst->name = src->name;
    bt_con_copyBtDevAddress(&dst->bd_addr, &src->bd_addr);
    dst->device_class = src->device_class;
}

int32_t bt_con_addSearchdevlist(const BtConDevInfo* devinfo)
{
    if (devinfo == nullptr || bt_con_IsValidBtDevAddress(&devinfo->bd_addr) == 0) return BT_BAD_ARGUMENT;
    return change_field<&BtConShareData::search_devlist>(bt_con_setSearchDevlist,
                                                         [=](BtConSearchDevList& list) { return put(list, devinfo); });
}

int32_t bt_con_delSearchdevlist(void)
{
    BtConSearchDevList empty{};
    for (BtConDevInfo& device : empty.device)
        bt_con_clearBtDevAddress(&device.bd_addr);
    return bt_con_setSearchDevlist(&empty, 1);
}

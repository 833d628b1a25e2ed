// The order lists by profile: the device most recently connected on the profile first.
#include "thread/bt_srv_con/src/area.h"
#include "thread/bt_srv_con/src/order_lists.h"

namespace bt::con {
namespace {

constexpr auto kLists = &BtConShareData::profile_connected_order_list;
using Lists = Field<kLists>;

int32_t put_first(BtConOrderList& list, const BtDevAddress* addr)
{
    const int32_t position = position_of(list, addr);
    if (position >= 0) return bt_con_movedownOrderList(addr, &list, 0, position, 0);
    if (list.num > 0) return bt_con_movedownOrderList(addr, &list, 0, list.num - 1, 1);

    bt_con_copyBtDevAddress(&list.addr[0], addr);
    list.num = 1;
    return BT_OK;
}

} // namespace
} // namespace bt::con

using namespace bt::con;

int32_t bt_con_initConnectOrderList(void)
{
    AreaLock lock;
    if (lock.taken() != BT_OK) return lock.taken();

    const int32_t stored = bt_con_setProfileConnectedOrderList(g_con_data_from_init.profile_connected_order_list, 0);
    return stored != BT_OK ? stored : lock.release();
}

int32_t bt_con_addConnectOrder(const BtDevAddress* addr, uint32_t profile_index)
{
    if (profile_index >= BT_CON_PROFILE_INDEXES) return BT_BAD_ARGUMENT;
    if (addr == nullptr || bt_con_IsValidBtDevAddress(addr) == 0) return BT_BAD_ARGUMENT;
    return change_field<kLists>(bt_con_setProfileConnectedOrderList,
                                [=](Lists& lists) { return put_first(lists[profile_index], addr); });
}

int32_t bt_con_delConnectOrder(const BtDevAddress* addr, uint32_t profile_index)
{
    if (addr == nullptr || profile_index >= BT_CON_PROFILE_INDEXES) return BT_BAD_ARGUMENT;
    return change_field<kLists>(bt_con_setProfileConnectedOrderList,
                                [=](Lists& lists) { return remove_address(lists[profile_index], addr); });
}

int32_t bt_con_getoneConnectOrder(BtDevAddress* addr, uint32_t profile_index, int32_t position)
{
    if (profile_index >= BT_CON_PROFILE_INDEXES) return BT_BAD_ARGUMENT;
    if (addr == nullptr) return BT_FAILED;
    Lists lists;
    const int32_t read = copy_field<kLists>(lists);
    return read != BT_OK ? read : copy_slot(lists[profile_index], position, addr);
}

int32_t bt_con_getallConnectOrder(BtConOrderList* list, uint32_t profile_index)
{
    if (list == nullptr || profile_index >= BT_CON_PROFILE_INDEXES) return BT_BAD_ARGUMENT;
    Lists lists;
    const int32_t read = copy_field<kLists>(lists);
    if (read == BT_OK) *list = lists[profile_index];
    return read;
}

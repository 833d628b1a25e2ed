// The registered order list: the devices in the order in which they were registered, oldest first.
#include "thread/bt_srv_con/src/area.h"
#include "thread/bt_srv_con/src/order_lists.h"

namespace bt::con {
namespace {

constexpr auto kList = &BtConShareData::registered_order_list;

int32_t append(BtConOrderList& list, const BtDevAddress* addr)
{
    if (position_of(list, addr) >= 0) return kUnchanged;
    if (list.num == BT_CON_DEVICE_MAX) return BT_FAILED;
    bt_con_copyBtDevAddress(&list.addr[list.num++], addr);
    return BT_OK;
}

} // namespace
} // namespace bt::con

using namespace bt::con;

int32_t bt_con_initOrderList(void)
{
    AreaLock lock;
    if (lock.taken() != BT_OK) return lock.taken();

    const int32_t stored = bt_con_setRegisteredOrderList(&g_con_data_from_init.registered_order_list, 0);
    return stored != BT_OK ? stored : lock.release();
}

int32_t bt_con_addOrderList(const BtDevAddress* addr)
{
    if (addr == nullptr || bt_con_IsValidBtDevAddress(addr) == 0) return BT_BAD_ARGUMENT;
    return change_field<kList>(bt_con_setRegisteredOrderList, [=](BtConOrderList& list) { return append(list, addr); });
}

int32_t bt_con_delOrderList(const BtDevAddress* addr)
{
    if (addr == nullptr) return BT_BAD_ARGUMENT;
    return change_field<kList>(bt_con_setRegisteredOrderList,
                               [=](BtConOrderList& list) { return remove_address(list, addr); });
}

int32_t bt_con_getoneOrderList(BtDevAddress* addr, int32_t position)
{
    if (addr == nullptr) return BT_BAD_ARGUMENT;
    BtConOrderList list;
    const int32_t read = copy_field<kList>(list);
    return read != BT_OK ? read : copy_slot(list, position, addr);
}

int32_t bt_con_getallOrderList(BtConOrderList* list)
{
    if (list == nullptr) return BT_BAD_ARGUMENT;
    BtConOrderList copy;
    const int32_t read = copy_field<kList>(copy);
    if (read == BT_OK) *list = copy;
    return read;
}

int32_t bt_con_SearshOrderListAddr(const BtDevAddress* addr, int32_t* position)
{
    if (position == nullptr) return BT_BAD_ARGUMENT;
    *position = -1;
    if (addr == nullptr) return BT_BAD_ARGUMENT;

    BtConOrderList list;
    const int32_t read = bt_con_getallOrderList(&list);
    if (read == BT_OK) *position = position_of(list, addr);
    return read;
}

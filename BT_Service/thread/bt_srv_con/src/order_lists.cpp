// The two primitives that shift an order list, and what both kinds of order lists share.
#include "thread/bt_srv_con/src/order_lists.h"

#include "thread/bt_srv_con/src/area.h"

namespace bt::con {
namespace {

constexpr int32_t kLastSlot = BT_CON_DEVICE_MAX - 1;

} // namespace

int32_t position_of(const BtConOrderList& list, const BtDevAddress* addr)
{
    for (int32_t position = 0; position < list.num; ++position)
        if (bt_con_IsCompBtDevAddress(addr, &list.addr[position]) != 0) return position;
    return -1;
}

int32_t copy_slot(const BtConOrderList& list, int32_t position, BtDevAddress* out)
{
    if (position < 0 || position > kLastSlot || list.num == 0) return BT_FAILED;
    bt_con_copyBtDevAddress(out, &list.addr[position]);
    return BT_OK;
}

int32_t remove_address(BtConOrderList& list, const BtDevAddress* addr)
{
    const int32_t position = position_of(list, addr);
    return position < 0 ? kUnchanged : bt_con_moveupOrderList(&list, position);
}

} // namespace bt::con

using namespace bt::con;

int32_t bt_con_moveupOrderList(BtConOrderList* list, int32_t position)
{
    if (list == nullptr || position < 0) return BT_FAILED;
    const int32_t last = possible(list->num, BT_CON_DEVICE_MAX) - 1;
    if (position > last) return BT_FAILED;

    for (int32_t to = position; to < last; ++to)
        bt_con_copyBtDevAddress(&list->addr[to], &list->addr[to + 1]);
    bt_con_clearBtDevAddress(&list->addr[last]);
    list->num = last;
    return BT_OK;
}

int32_t bt_con_movedownOrderList(const BtDevAddress* addr, BtConOrderList* list, int32_t to, int32_t from,
                                 int32_t insert)
{
    if (addr == nullptr || list == nullptr) return BT_FAILED;
    if (to < 0 || to > from || from > kLastSlot) return BT_FAILED;

    // The address may be that of a slot which the shift overwrites.
    BtDevAddress placed;
    bt_con_copyBtDevAddress(&placed, addr);

    const bool grows = insert == 1 && from < kLastSlot;
    for (int32_t slot = grows ? from + 1 : from; slot > to; --slot)
        bt_con_copyBtDevAddress(&list->addr[slot], &list->addr[slot - 1]);
    bt_con_copyBtDevAddress(&list->addr[to], &placed);

    make_possible(*list);
    if (insert == 1 && list->num < BT_CON_DEVICE_MAX) ++list->num;
    return BT_OK;
}

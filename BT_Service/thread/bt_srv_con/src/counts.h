// The one place where counts that somebody else stored are made possible before anything is indexed by them.
#pragma once

#include <bt_service/bt_connection_records.h>

namespace bt::con {

inline int32_t possible(int32_t count, int32_t capacity)
{
    if (count < 0) return 0;
    return count > capacity ? capacity : count;
}

inline void make_possible(BtConRegDevListInfo& list)
{
    list.device_num = possible(list.device_num, BT_CON_DEVICE_MAX);
}

inline void make_possible(BtConOrderList& list)
{
    list.num = possible(list.num, BT_CON_DEVICE_MAX);
}

inline void make_possible(BtConOrderList (&lists)[BT_CON_PROFILE_INDEXES])
{
    for (BtConOrderList& list : lists)
        make_possible(list);
}

inline void make_possible(BtConSearchDevList& list)
{
    list.num = possible(list.num, BT_CON_SEARCH_MAX);
}

// Fields without a count.
inline void make_possible(BtConDidInfoEntry (&)[BT_CON_DEVICE_MAX]) {}
inline void make_possible(uint32_t (&)[BT_CON_CONNECT_SETTINGS]) {}

} // namespace bt::con

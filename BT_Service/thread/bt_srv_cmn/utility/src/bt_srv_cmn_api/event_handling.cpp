// The way of a message into the state machines, and the stock functions that fill table cells without behaviour.
#include "log_line.h"
#include "message_header.h"

#include <bt_service/bt_state_machine.h>

using namespace bt::cmn;

uint32_t BT_CMN_doMtxFunc(void* message, const BtDispatchRow* dispatch_table, const BtFunctionIdRow* func_id_table)
{
    CMN_LOG_START();
    if (message == nullptr || dispatch_table == nullptr || func_id_table == nullptr) {
        CMN_LOG(CMN_AT "param err. data = %p, dispatch_table = %p, func_id_table = %p ", CMN_API_PLACE, message,
                static_cast<const void*>(dispatch_table), static_cast<const void*>(func_id_table));
        return ended(__func__, 1U);
    }
    return ended(__func__, bt_cmn_searchDispatchTable(message, dispatch_table, func_id_table));
}

uint32_t BT_CMN_nopMtxFunc(void* message)
{
    CMN_LOG_START();
    if (message == nullptr) {
        CMN_LOG(CMN_AT "param err. data = %p ", CMN_API_PLACE, message);
        return ended(__func__, 1U);
    }
    CMN_LOG("[API][END] %s (%ld)", __func__, 0L);
    return 0;
}

uint32_t BT_CMN_errMtxFunc(void* message)
{
    CMN_LOG_START();
    if (message == nullptr) {
        CMN_LOG(CMN_AT "param err. data = %p ", CMN_API_PLACE, message);
        return ended(__func__, 1U);
    }
    CMN_LOG(CMN_AT "event id = %04x ", CMN_API_PLACE, static_cast<unsigned>(header_of(message).cid));
    CMN_LOG("[API][END] %s (%ld)", __func__, 1L);
    return 1;
}

uint32_t BT_CMN_nopGetState(void)
{
    CMN_LOG_START();
    CMN_LOG("[API][END] %s (%ld)", __func__, static_cast<long>(BT_TABLE_END));
    return BT_TABLE_END;
}

void BT_CMN_nopEntryExit(void)
{
    CMN_LOG_START();
    CMN_LOG("[API][END] %s ", __func__);
}

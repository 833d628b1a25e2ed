// The searches that lead from a message to the action to run: dispatch table, function-id table, matrix.
#include "thread/bt_srv_cmn/utility/src/bt_srv_cmn_api/log_line.h"
#include "thread/bt_srv_cmn/utility/src/bt_srv_cmn_api/message_header.h"

#include <bt_service/bt_state_machine.h>

namespace bt::cmn {
namespace {

constexpr uint32_t kNotHandled = 1;

// The end of a search that a null pointer ended.
uint32_t left_unhandled(const char* function)
{
    CMN_LOG("[API][MODEL] %s ", function);
    return kNotHandled;
}

const BtFunctionIdRow* find_machine(const BtFunctionIdRow* table, uint32_t func_id)
{
    for (const BtFunctionIdRow* row = table; row->func_id != BT_TABLE_END; ++row)
        if (row->func_id == func_id) return row;
    return nullptr;
}

const BtMatrixRow* find_action(const BtMatrixRow* table, uint32_t state, uint32_t cid)
{
    for (const BtMatrixRow* row = table; row->state != BT_TABLE_END; ++row)
        if (row->state == state && row->cid == cid) return row;
    return nullptr;
}

} // namespace
} // namespace bt::cmn

using namespace bt::cmn;

uint32_t bt_cmn_searchDispatchTable(void* message, const BtDispatchRow* dispatch_table,
                                    const BtFunctionIdRow* func_id_table)
{
    CMN_LOG_START();
    if (message == nullptr || dispatch_table == nullptr || func_id_table == nullptr) {
        CMN_LOG(CMN_AT "param err. data = %p, dispatch_table = %p, func_id_table = %p ", CMN_MODEL_PLACE, message,
                static_cast<const void*>(dispatch_table), static_cast<const void*>(func_id_table));
        return left_unhandled(__func__);
    }
    const uint32_t cid = header_of(message).cid;
    uint32_t result = kNotHandled;
    for (const BtDispatchRow* row = dispatch_table; row->cid != BT_TABLE_END; ++row)
        if (row->cid == cid) result = bt_cmn_searchFuncIdTable(message, row, func_id_table);
    return ended(__func__, result);
}

uint32_t bt_cmn_searchFuncIdTable(void* message, const BtDispatchRow* dispatch_row,
                                  const BtFunctionIdRow* func_id_table)
{
    CMN_LOG_START();
    if (message == nullptr || dispatch_row == nullptr || func_id_table == nullptr) {
        CMN_LOG(CMN_AT "param err. data = %p, dispatch_table = %p, func_id_table = %p ", CMN_MODEL_PLACE, message,
                static_cast<const void*>(dispatch_row), static_cast<const void*>(func_id_table));
        return left_unhandled(__func__);
    }
    CMN_LOG("[API][tmp_func_id] %d ", static_cast<int>(dispatch_row->func_id));

    uint32_t result = kNotHandled;
    const BtFunctionIdRow* const machine = find_machine(func_id_table, dispatch_row->func_id);
    if (machine != nullptr) {
        if (machine->getstate == nullptr)
            CMN_LOG(CMN_AT "param err. getstate = %p ", CMN_MODEL_PLACE, static_cast<void*>(nullptr));
        else
            result = bt_cmn_searchMtxTable(message, machine, machine->getstate());
    }
    return ended(__func__, result);
}

uint32_t bt_cmn_searchMtxTable(void* message, const BtFunctionIdRow* func_id_row, uint32_t state)
{
    CMN_LOG_START();
    if (message == nullptr || func_id_row == nullptr) {
        CMN_LOG(CMN_AT "param err. data = %p, func_id_table = %p ", CMN_MODEL_PLACE, message,
                static_cast<const void*>(func_id_row));
        return left_unhandled(__func__);
    }
    if (func_id_row->mtx_table == nullptr) {
        CMN_LOG(CMN_AT "param err. mtx_table = %p ", CMN_MODEL_PLACE, static_cast<void*>(nullptr));
        return left_unhandled(__func__);
    }
    const uint32_t cid = header_of(message).cid;
    CMN_LOG("data->msg_header.hdr.cid of RECV EVENT is %x ", cid);
    CMN_LOG("When EVENT recieved , current_state is %d ", static_cast<int>(state));

    uint32_t result = kNotHandled;
    const BtMatrixRow* const row = find_action(func_id_row->mtx_table, state, cid);
    if (row != nullptr) {
        if (row->func == nullptr)
            CMN_LOG(CMN_AT "param err. func = %p ", CMN_MODEL_PLACE, static_cast<void*>(nullptr));
        else
            result = row->func(message);
    }
    return ended(__func__, result);
}

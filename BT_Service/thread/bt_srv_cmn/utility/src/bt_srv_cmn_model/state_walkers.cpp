// The walks along the parents of a state: exits inside out, entries outside in.
#include "thread/bt_srv_cmn/utility/src/bt_srv_cmn_api/log_line.h"

#include <bt_service/bt_state_machine.h>

void bt_cmn_changeStatusExit(const BtStateRow* row)
{
    CMN_LOG("[API][MODEL] %s", __func__);
    if (row == nullptr) {
        CMN_LOG(CMN_AT "param err. state_table = %p ", CMN_MODEL_PLACE, static_cast<const void*>(row));
    } else if (row->exit == nullptr) {
        CMN_LOG(CMN_AT "param err. exit = %p ", CMN_MODEL_PLACE, static_cast<void*>(nullptr));
    } else {
        row->exit();
        CMN_LOG(CMN_AT "done state( %04x ) exit func. ", CMN_MODEL_PLACE, row->state);
        if (row->parent != nullptr) {
            CMN_LOG(CMN_AT "state( %04x ) has parent state. ", CMN_MODEL_PLACE, row->state);
            bt_cmn_changeStatusExit(row->parent);
        }
    }
    CMN_LOG("[API][MODEL] %s ", __func__);
}

void bt_cmn_changeStatusEntry(const BtStateRow* row)
{
    CMN_LOG("[API][MODEL] %s", __func__);
    if (row == nullptr) {
        CMN_LOG(CMN_AT "param err. state_table = %p ", CMN_MODEL_PLACE, static_cast<const void*>(row));
    } else if (row->entry == nullptr) {
        CMN_LOG(CMN_AT "param err. entry = %p ", CMN_MODEL_PLACE, static_cast<void*>(nullptr));
    } else {
        if (row->parent != nullptr) {
            CMN_LOG(CMN_AT "state( %04x ) has parent state. ", CMN_MODEL_PLACE, row->state);
            bt_cmn_changeStatusEntry(row->parent);
        }
        row->entry();
        CMN_LOG(CMN_AT "done state( %04x ) entry func. ", CMN_MODEL_PLACE, row->state);
    }
    CMN_LOG("[API][MODEL] %s ", __func__);
}

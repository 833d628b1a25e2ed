// Event dispatch: the service's side of event distribution.
#include "listener_table.h"

#include <bt_service/bt_events.h>
#include <bt_service/bt_log.h>
#include <bt_service/bt_transport.h>

#include <cstring>

#define EDS_LOG(...) BT_CMN_logout_wrapperFunc("EDS", __VA_ARGS__)

namespace bt::eds {
namespace {

constexpr char kSource[] = "BT_Service/api/../thread/bt_srv_eds/src/bt_eds";

TableLock g_dispatch_lock;

} // namespace
} // namespace bt::eds

using namespace bt::eds;

void BT_EDS_initialize(void)
{
    EDS_LOG("[START] %s", __func__);
    if (!g_dispatch_lock.create()) {
        EDS_LOG(" %s _sys_CreateSemaphore ERROR", __func__);
        return;
    }
    if (!g_dispatch_lock.take()) {
        EDS_LOG("[END] %s get sem ERROR", __func__);
        return;
    }
    if (BtEvtListenerTable* const table = link_table()) {
        EDS_LOG(" %s intialize shared memory", __func__);
        std::memset(table, 0, sizeof *table);
        table->next_handle = 1;
    }
    if (!g_dispatch_lock.release()) EDS_LOG(" %s release sem ERROR", __func__);
    EDS_LOG("[END] %s", __func__);
}

void BT_EDS_dispatch(uint32_t, const void* message)
{
    EDS_LOG("[START] %s", __func__);
    if (message == nullptr) {
        EDS_LOG("[END] %s Param ERROR", __func__);
        return;
    }
    if (!g_dispatch_lock.take()) {
        EDS_LOG("[END] %s get sem ERROR", __func__);
        return;
    }
    const int32_t sent = BT_CMN_sendMsgWrapper(kSource, __func__, __LINE__, PNO_BT_EDS, message);
    if (sent != 0) EDS_LOG("[%s] Send Error= %d", __func__, sent);
    if (!g_dispatch_lock.release()) EDS_LOG(" %s release sem ERROR", __func__);
    EDS_LOG("[END] %s", __func__);
}

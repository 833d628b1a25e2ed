// The hands-free status area: attaching, locking, initial values and the queries.

#include <bt_platform/platform.h>
#include <bt_service/bt_hands_free.h>

#include <algorithm>
#include <iterator>

BtShareHandle g_bt_hfp_share = {};

namespace {

constexpr char kAreaName[] = "BT_HFP_SHARE_DATA_NAME";
constexpr char kLockName[] = "BT_HFP_SEMAPHORE_NAME";

constexpr uint32_t kInitialSignalLevel = 6;
constexpr uint32_t kUnknown = 2;

// What the process's handle holds now. Threads fill its fields in while others read them.
struct Attached {
    Attached()
    {
        const BtShareHandle* const share = bt_hfp_getShareMemAccessPtr();
        lock = __atomic_load_n(&share->semaphore, __ATOMIC_ACQUIRE);
        area = static_cast<BtHfpStatusArea*>(__atomic_load_n(&share->area, __ATOMIC_ACQUIRE));
    }

    bool complete() const { return lock != 0 && area != nullptr; }

    uint32_t lock;
    BtHfpStatusArea* area;
};

int32_t link_area(BtShareHandle& share)
{
    if (__atomic_load_n(&share.area, __ATOMIC_ACQUIRE) != nullptr) return BT_OK;

    void* area = nullptr;
    uint32_t any_size = 0;
    if (_sys_LinkShareData(kAreaName, &area, &any_size) != 0) return BT_FAILED;

    __atomic_store_n(&share.area, area, __ATOMIC_RELEASE);
    return BT_OK;
}

int32_t create_lock(BtShareHandle& share)
{
    if (__atomic_load_n(&share.semaphore, __ATOMIC_ACQUIRE) != 0) return BT_OK;

    const uint32_t handle = _sys_CreateSemaphore(kLockName);
    if (handle == 0) return BT_FAILED;

    __atomic_store_n(&share.semaphore, handle, __ATOMIC_RELEASE);
    return BT_OK;
}

// Runs `access` on the area under its lock. A failed lock does not stop it: what is read may then be of two moments,
// which is better than no answer. Returns 0, or -1 without access when the area or its lock is not there.
template <class Access>
int32_t with_area(Access access)
{
    bt_hfp_ShareMemAccessInit();
    bt_hfp_SemLock();

    const Attached attached;
    if (attached.complete()) access(*attached.area);
    return attached.complete() ? BT_OK : BT_FAILED;
}

template <class Copy>
int32_t query(const void* out, Copy copy)
{
    if (out == nullptr) return BT_FAILED;

    const int32_t result = with_area(copy);
    bt_hfp_SemUnlock();
    return result;
}

} // namespace

BtShareHandle* bt_hfp_getShareMemAccessPtr()
{
    return &g_bt_hfp_share;
}

int32_t bt_hfp_ShareMemAccessInit()
{
    BtShareHandle& share = *bt_hfp_getShareMemAccessPtr();
    const int32_t linked = link_area(share);
    const int32_t created = create_lock(share);
    return linked == BT_OK && created == BT_OK ? BT_OK : BT_FAILED;
}

int32_t bt_hfp_SemLock()
{
    const Attached attached;
    if (!attached.complete()) return BT_FAILED;

    return _sys_SemLock(attached.lock) == 0 ? BT_OK : BT_FAILED;
}

int32_t bt_hfp_SemUnlock()
{
    const Attached attached;
    if (!attached.complete()) return BT_FAILED;

    return _sys_SemUnlock(attached.lock) == 0 ? BT_OK : BT_FAILED;
}

int32_t bt_hfp_InitShareMemData()
{
    BtHfpStatusArea initial = {};
    initial.signal_level = kInitialSignalLevel;
    initial.service_area = initial.roaming = initial.audio_link = kUnknown;
    std::fill(std::begin(initial.ag_functions.words), std::end(initial.ag_functions.words), kUnknown);
    initial.ag_functions.inband_ring_tone = kUnknown;
    std::fill(std::begin(initial.ag_functions.more_words), std::end(initial.ag_functions.more_words), kUnknown);
    std::fill(std::begin(initial.threeway_call.words), std::end(initial.threeway_call.words), kUnknown);

    with_area([&](BtHfpStatusArea& area) { area = initial; });
    return bt_hfp_SemUnlock();
}

int32_t BT_SRV_HFP_getSignalLevel(uint32_t* out)
{
    return query(out, [=](const BtHfpStatusArea& area) { *out = area.signal_level; });
}

int32_t BT_SRV_HFP_getServiceAreaStatus(uint32_t* out)
{
    return query(out, [=](const BtHfpStatusArea& area) { *out = area.service_area; });
}

int32_t BT_SRV_HFP_getRoamingStatus(uint32_t* out)
{
    return query(out, [=](const BtHfpStatusArea& area) { *out = area.roaming; });
}

int32_t BT_SRV_HFP_getAudioLinkStatus(uint32_t* out)
{
    return query(out, [=](const BtHfpStatusArea& area) { *out = area.audio_link; });
}

int32_t BT_SRV_HFP_getAGSupportFunction(BtHfpAgFunctions* out)
{
    return query(out, [=](const BtHfpStatusArea& area) { *out = area.ag_functions; });
}

int32_t BT_SRV_HFP_getSupportInbandRingTone(uint32_t* out)
{
    return query(out, [=](const BtHfpStatusArea& area) { *out = area.ag_functions.inband_ring_tone; });
}

int32_t BT_SRV_HFP_getSupportThreewayCall(BtHfpThreewayCall* out)
{
    return query(out, [=](const BtHfpStatusArea& area) { *out = area.threeway_call; });
}

int32_t BT_SRV_HFP_getCallList(BtHfpCallList* out)
{
    return query(out, [=](const BtHfpStatusArea& area) { *out = area.call_list; });
}

int32_t BT_SRV_HFP_getCallInfo(uint32_t index, BtHfpCall* out)
{
    if (index >= BT_HFP_CALLS) return BT_FAILED;

    return query(out, [=](const BtHfpStatusArea& area) { *out = area.call_list.calls[index]; });
}

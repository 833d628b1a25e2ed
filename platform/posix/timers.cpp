// One thread, started with the first timer, sleeps until the nearest deadline and posts the expiry. It posts under the
// timers' lock: a stop that succeeds means that no expiry comes, one that fails that it is in the queue.
#include "timers.h"

#include "background.h"
#include "clock.h"
#include "error.h"
#include "fork.h"
#include "number.h"

#include <bt_platform/host.h>

#include <pthread.h>

#include <algorithm>
#include <cstring>
#include <iterator>

namespace bt::platform {
namespace {

constexpr uint64_t kRetryNs = 10 * kMillisecond; // an expiry that meets a full queue is not lost

struct Timer {
    uint64_t deadline_ns;
    uint32_t id;
};

struct Expiry {
    uint32_t reserved;
    uint16_t src_pno;
    uint16_t alt_pno;
    uint16_t cid;
    uint16_t len;
    uint32_t reserved2;
    uint32_t timer_id;
};
static_assert(sizeof(Expiry) == 20, "header and one word");

pthread_mutex_t g_lock = PTHREAD_MUTEX_INITIALIZER; // of everything below
pthread_cond_t g_changed;
pthread_once_t g_changed_made = PTHREAD_ONCE_INIT;
Timer g_timers[BT_HOST_TIMER_MAX]; // by deadline; equal ones in the order of their start
uint32_t g_count = 0;
bool g_running = false;

void make_condition()
{
    pthread_condattr_t attributes;
    pthread_condattr_init(&attributes);
    pthread_condattr_setclock(&attributes, CLOCK_MONOTONIC);
    pthread_cond_init(&g_changed, &attributes);
    pthread_condattr_destroy(&attributes);
}

bool remove(uint32_t id)
{
    Timer* const end = g_timers + g_count;
    Timer* const at = std::find_if(g_timers, end, [id](const Timer& timer) { return timer.id == id; });
    if (at == end) return false;
    std::copy(at + 1, end, at);
    --g_count;
    return true;
}

bool insert(const Timer& timer)
{
    if (g_count == std::size(g_timers)) return false;
    Timer* const end = g_timers + g_count;
    Timer* const at =
        std::find_if(g_timers, end, [&timer](const Timer& other) { return other.deadline_ns > timer.deadline_ns; });
    std::copy_backward(at, end, end + 1);
    *at = timer;
    ++g_count;
    return true;
}

void expire(const Timer& timer)
{
    remove(timer.id);
    Ring* const ring = own_ring();
    if (ring == nullptr) return;

    Expiry message{};
    message.src_pno = static_cast<uint16_t>(ring->pno);
    message.cid = static_cast<uint16_t>(timer.id);
    message.len = sizeof message.timer_id;
    message.timer_id = timer.id;
    const int32_t posted = post(*ring, sizeof message, &message);
    if (posted == 2 || posted == 4) insert({now_ns() + kRetryNs, timer.id});
}

void* run(void*)
{
    pthread_mutex_lock(&g_lock);
    for (;;) {
        const uint64_t now = now_ns();
        if (g_count == 0) {
            pthread_cond_wait(&g_changed, &g_lock);
        } else if (g_timers[0].deadline_ns > now) {
            const timespec deadline = to_timespec(g_timers[0].deadline_ns);
            pthread_cond_timedwait(&g_changed, &g_lock, &deadline);
        } else {
            expire(Timer{g_timers[0]});
        }
    }
}

bool ensure_thread()
{
    if (g_running) return true;
    pthread_t thread;
    if (!start_thread(&thread, run, nullptr)) return false;
    pthread_detach(thread);
    g_running = true;
    return true;
}

int32_t check_owner(uint32_t pno)
{
    if (pno != 0 && pno == own_number()) return 0;
    return fail(1, "timers go to the process's own number, which is not 0x%X", pno);
}

} // namespace

void cancel_timers()
{
    pthread_mutex_lock(&g_lock);
    g_count = 0;
    pthread_mutex_unlock(&g_lock);
}

void timers_before_fork()
{
    pthread_mutex_lock(&g_lock);
}

void timers_after_fork_in_parent()
{
    pthread_mutex_unlock(&g_lock);
}

void timers_after_fork_in_child()
{
    if (g_running) make_condition(); // the parent's thread may stand in it
    g_running = false;
    g_count = 0;
    pthread_mutex_unlock(&g_lock);
}

} // namespace bt::platform

using namespace bt::platform;

int32_t _sys_ReqTimerStart(uint32_t pno, uint32_t timer_id, uint32_t, uint32_t time)
{
    if (const int32_t refused = check_owner(pno)) return refused;
    set_up_fork_handlers();
    pthread_once(&g_changed_made, make_condition);

    pthread_mutex_lock(&g_lock);
    int32_t result = 0;
    remove(timer_id);
    if (!ensure_thread()) {
        result = fail(3, "no thread for the timers");
    } else if (!insert({now_ns() + time * kMillisecond, timer_id})) {
        result = fail(2, "all %d timers of the process run", BT_HOST_TIMER_MAX);
    }
    pthread_cond_signal(&g_changed);
    pthread_mutex_unlock(&g_lock);
    return result;
}

int32_t _sys_TimerStop(uint32_t pno, uint32_t timer_id, uint32_t)
{
    if (const int32_t refused = check_owner(pno)) return refused;

    pthread_mutex_lock(&g_lock);
    const bool removed = remove(timer_id);
    pthread_mutex_unlock(&g_lock);
    return removed ? 0 : fail(4, "no timer 0x%X runs", timer_id);
}

#include "domain.h"

#include "clock.h"
#include "entries.h"
#include "error.h"
#include "fork.h"
#include "number.h"
#include "queues.h"
#include "ring.h"
#include "robust_mutex.h"

#include <bt_platform/host.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace bt::platform {
namespace {

constexpr uint32_t kEntriesWaitMs = 2000;
constexpr uint64_t kFinishWaitNs = 500 * kMillisecond;

pthread_mutex_t g_process = PTHREAD_MUTEX_INITIALIZER;
std::atomic<DomainArea*> g_area{nullptr};
int g_descriptor = -1;
char g_name[33];

// The name is read anew while no domain is mapped.
bool read_name()
{
    const char* name = std::getenv("BT_PLATFORM_DOMAIN");
    if (name == nullptr || name[0] == '\0') name = "default";

    constexpr char kAllowed[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-";
    const size_t length = std::strlen(name);
    if (length >= sizeof g_name || std::strspn(name, kAllowed) != length) {
        fail(-1, "BT_PLATFORM_DOMAIN is \"%.40s\"; use 1 to 32 characters of A-Z a-z 0-9 _ -", name);
        return false;
    }
    std::memcpy(g_name, name, length + 1);
    return true;
}

bool usable(const DomainArea* area)
{
    return area != nullptr && area->stamp.retired.load(std::memory_order_relaxed) == 0;
}

ObjectName own_object()
{
    return object_name(g_name, Kind::domain, "");
}

// A domain in the making is ready within microseconds; one whose creator was killed never is.
Opening open_finished(Object* object)
{
    const uint64_t end = now_ns() + kFinishWaitNs;
    const timespec pause = to_timespec(kMillisecond);
    Opening opening = open_object(own_object(), Kind::domain, sizeof(DomainArea), object);
    while (opening == Opening::unfinished && now_ns() < end) {
        nanosleep(&pause, nullptr);
        opening = open_object(own_object(), Kind::domain, sizeof(DomainArea), object);
    }
    return opening;
}

DomainArea* keep(const Object& object)
{
    auto* const area = static_cast<DomainArea*>(static_cast<void*>(object.stamp));
    g_descriptor = object.fd;
    g_area.store(area, std::memory_order_release);
    return area;
}

// Other threads may still read the old domain, so its mapping stays.
void forget_domain()
{
    if (g_area.load(std::memory_order_relaxed) == nullptr) return;
    forget_number();
    forget_queues();
    g_area.store(nullptr, std::memory_order_release);
    Object old;
    old.fd = g_descriptor;
    close_descriptor(old);
    g_descriptor = -1;
}

// `absent` when the name is taken, or was taken away while the domain was made.
Opening make_domain(Object* object)
{
    const Opening opening = create_object(own_object(), Kind::domain, sizeof(DomainArea), object);
    if (opening != Opening::done) return opening;

    auto* const area = static_cast<DomainArea*>(static_cast<void*>(object->stamp));
    if (!make_mutex(&area->lock, Priority::plain)) {
        remove_object(own_object());
        discard(*object);
        fail(-1, "the system has no robust mutexes between processes");
        return Opening::refused;
    }
    if (publish(*object)) return Opening::done;
    discard(*object);
    return Opening::absent;
}

void remove_entries(DomainArea& area)
{
    for (Entry& entry : area.entries) {
        if (entry.kind == 0) continue;
        const ObjectName name = entry_object(entry);
        Object object;
        if (entry.kind == static_cast<uint32_t>(Kind::queue) &&
            open_object(name, Kind::queue, sizeof(Ring), &object) == Opening::done) {
            close_ring(*static_cast<Ring*>(static_cast<void*>(object.stamp)));
            discard(object);
        }
        remove_object(name);
    }
}

// Several may remove at once, and one of them may die: all work under the old domain's lock and look first whether it
// still has its name, so that nobody removes the domain that was created behind them.
bool remove_all(DomainArea& area, int descriptor)
{
    if (!is_held(lock_within(&area.lock, kEntriesWaitMs))) {
        fail(-1, "domain \"%s\" is locked by a process that does not go on (stopped in a debugger?)", g_name);
        return false;
    }
    area.stamp.retired.store(1);
    bool removed = true;
    if (still_named(descriptor)) {
        remove_entries(area);
        remove_leftovers(g_name);
        removed = remove_object(own_object());
    }
    unlock(&area.lock);
    return removed;
}

bool remove_all(Object& object)
{
    const bool removed = remove_all(*static_cast<DomainArea*>(static_cast<void*>(object.stamp)), object.fd);
    discard(object);
    return removed;
}

// One attempt; 2 asks for another one.
int32_t try_to_create()
{
    Object object;
    Opening opening = open_object(own_object(), Kind::domain, sizeof(DomainArea), &object);
    if (opening == Opening::done && object.stamp->retired.load() == 0) {
        keep(object);
        return 1;
    }
    if (opening == Opening::refused) return -1;
    if (opening == Opening::done && !remove_all(object)) return -1; // a removal that did not get to its end
    if (opening == Opening::unfinished && !remove_unfinished(own_object())) return -1;

    opening = make_domain(&object);
    if (opening == Opening::done) {
        keep(object);
        return 0;
    }
    return opening == Opening::absent ? 2 : -1;
}

} // namespace

ProcessLock::ProcessLock()
{
    pthread_mutex_lock(&g_process);
}

ProcessLock::~ProcessLock()
{
    pthread_mutex_unlock(&g_process);
}

DomainArea* domain_locked()
{
    DomainArea* const mapped = g_area.load(std::memory_order_relaxed);
    if (usable(mapped)) return mapped;

    set_up_fork_handlers();
    forget_domain();
    if (!read_name()) return nullptr;

    Object object;
    switch (open_finished(&object)) {
    case Opening::done:
        break;
    case Opening::absent:
        fail(-1, "there is no domain \"%s\"; create it (bt_host_create_domain) or set BT_PLATFORM_DOMAIN", g_name);
        return nullptr;
    case Opening::unfinished:
        fail(-1, "domain \"%s\" was never finished, its creator died; create it again", g_name);
        return nullptr;
    default:
        return nullptr;
    }
    if (object.stamp->retired.load() == 0) return keep(object);

    discard(object);
    fail(-1, "domain \"%s\" is being removed", g_name);
    return nullptr;
}

DomainArea* domain()
{
    DomainArea* const mapped = g_area.load(std::memory_order_acquire);
    if (usable(mapped)) return mapped;

    const ProcessLock lock;
    return domain_locked();
}

int domain_descriptor()
{
    return g_descriptor;
}

const char* domain_name()
{
    return g_name;
}

void domain_before_fork()
{
    pthread_mutex_lock(&g_process);
}

void domain_after_fork()
{
    pthread_mutex_unlock(&g_process);
}

} // namespace bt::platform

using namespace bt::platform;

const char* bt_host_domain()
{
    const ProcessLock lock;
    if (g_area.load(std::memory_order_relaxed) == nullptr) read_name();
    return g_name;
}

int32_t bt_host_create_domain()
{
    const ProcessLock lock;
    if (usable(g_area.load())) return 1;

    set_up_fork_handlers();
    forget_domain();
    if (!read_name()) return -1;
    for (int attempt = 0; attempt < 100; ++attempt) {
        const int32_t result = try_to_create();
        if (result != 2) return result;
    }
    return fail(-1, "domain \"%s\" is created and removed by others all the time", g_name);
}

int32_t bt_host_remove_domain()
{
    const ProcessLock lock;
    if (DomainArea* const area = domain_locked()) {
        const bool removed = remove_all(*area, domain_descriptor());
        forget_domain();
        return removed ? 0 : -1;
    }

    Object object;
    switch (open_object(own_object(), Kind::domain, sizeof(DomainArea), &object)) {
    case Opening::absent:
        return -1;
    case Opening::done:
        return remove_all(object) ? 0 : -1;
    default:
        break;
    }
    remove_leftovers(g_name);
    return remove_object(own_object()) ? 0 : -1;
}

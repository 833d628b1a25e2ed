#include "number.h"

#include "domain.h"
#include "error.h"
#include "fork.h"
#include "queues.h"
#include "receive_fd.h"
#include "timers.h"

#include <bt_platform/host.h>

#include <fcntl.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>

namespace bt::platform {
namespace {

static_assert(sizeof(off_t) == 8, "a process number is an offset of the domain object");

std::atomic<uint32_t> g_number{0};
std::atomic<Ring*> g_ring{nullptr};
std::atomic<bool> g_from_environment{true}; // until the program claims or releases one in this domain
pthread_mutex_t g_taking = PTHREAD_MUTEX_INITIALIZER;

struct flock byte_of(uint32_t pno, short type)
{
    struct flock lock {};
    lock.l_type = type;
    lock.l_whence = SEEK_SET;
    lock.l_start = pno;
    lock.l_len = 1;
    return lock;
}

// A record lock ends with its process, however that ends, and belongs to the process, not to a thread or a child.
// 0 locked, 1 another process has it, -1.
int32_t lock_number(uint32_t pno)
{
    struct flock lock = byte_of(pno, F_WRLCK);
    if (fcntl(domain_descriptor(), F_SETLK, &lock) == 0) return 0;
    if (errno != EACCES && errno != EAGAIN)
        return fail(-1, "domain \"%s\": cannot lock process number 0x%X: %s", domain_name(), pno, strerror(errno));
    return fail(1, "process number 0x%X is owned by process %u; end it or take another number", pno, owner_of(pno));
}

void unlock_number(uint32_t pno)
{
    struct flock lock = byte_of(pno, F_UNLCK);
    fcntl(domain_descriptor(), F_SETLK, &lock);
}

int32_t claim_one(DomainArea& area, uint32_t pno, bool fresh)
{
    const int32_t locked = lock_number(pno);
    if (locked != 0) return locked;

    Ring* const ring = obtain_queue(area, pno);
    if (ring == nullptr) {
        unlock_number(pno);
        return -1;
    }
    open_ring(*ring, fresh);
    g_ring.store(ring);
    g_number.store(pno);
    return 0;
}

int32_t claim_any(DomainArea& area)
{
    for (uint32_t pno = BT_HOST_FIRST_FREE_PNO; pno <= BT_HOST_LAST_FREE_PNO; ++pno) {
        const int32_t result = claim_one(area, pno, true);
        if (result != 1) return result;
    }
    return fail(-1, "domain \"%s\" has no free process number left", domain_name());
}

int32_t claim(uint32_t pno)
{
    const ProcessLock lock;
    DomainArea* const area = domain_locked();
    if (area == nullptr) return -1;

    const uint32_t owned = g_number.load();
    if (owned != 0 && (pno == BT_HOST_ANY_PNO || pno == owned)) return 0;
    if (owned != 0) return fail(-1, "the process owns number 0x%X already; release it first", owned);
    return pno == BT_HOST_ANY_PNO ? claim_any(*area) : claim_one(*area, pno, false);
}

void claim_from_environment()
{
    const char* const text = std::getenv("BT_PLATFORM_PNO");
    if (text == nullptr || text[0] == '\0' || domain() == nullptr) return;

    char* end = nullptr;
    errno = 0;
    const unsigned long value = std::strtoul(text, &end, 0);
    if (errno != 0 || *end != '\0' || value == 0 || value > UINT32_MAX) {
        fail(-1, "BT_PLATFORM_PNO is \"%.40s\"; use a process number such as 0x08C1", text);
        return;
    }
    claim(static_cast<uint32_t>(value));
}

void end_what_depends()
{
    cancel_timers();
    close_receive_fd();
}

} // namespace

uint32_t own_number()
{
    const uint32_t number = g_number.load(std::memory_order_acquire);
    if (number != 0 || !g_from_environment.load(std::memory_order_relaxed)) return number;
    claim_from_environment();
    return g_number.load();
}

Ring* own_ring()
{
    return g_ring.load(std::memory_order_acquire);
}

bool take_own(Ring& ring, void* buffer, uint32_t size)
{
    pthread_mutex_lock(&g_taking);
    const bool taken = own_ring() == &ring && take(ring, buffer, size);
    pthread_mutex_unlock(&g_taking);
    return taken;
}

uint32_t owner_of(uint32_t pno)
{
    if (g_number.load() == pno) return own_pid();
    struct flock lock = byte_of(pno, F_WRLCK);
    const bool found = fcntl(domain_descriptor(), F_GETLK, &lock) == 0 && lock.l_type != F_UNLCK;
    return found ? static_cast<uint32_t>(lock.l_pid) : 0;
}

void forget_number()
{
    g_number.store(0);
    g_ring.store(nullptr);
    g_from_environment.store(true);
    end_what_depends();
}

void number_before_fork()
{
    pthread_mutex_lock(&g_taking);
}

void number_after_fork_in_parent()
{
    pthread_mutex_unlock(&g_taking);
}

void number_after_fork_in_child()
{
    pthread_mutex_unlock(&g_taking);
    if (g_number.load() != 0) g_from_environment.store(false); // the number in the environment is the parent's
    g_number.store(0);
    g_ring.store(nullptr);
}

} // namespace bt::platform

using namespace bt::platform;

uint32_t _sys_GetPno()
{
    return own_number();
}

int32_t bt_host_claim_pno(uint32_t pno)
{
    const int32_t result = claim(pno);
    if (result == 0) g_from_environment.store(false);
    return result;
}

int32_t bt_host_release_pno()
{
    const ProcessLock lock;
    const uint32_t number = g_number.load();
    Ring* const ring = own_ring();
    if (domain_locked() == nullptr || number == 0 || ring == nullptr || own_ring() != ring)
        return fail(-1, "the process owns no process number");

    pthread_mutex_lock(&g_taking);
    close_ring(*ring);
    g_number.store(0);
    g_ring.store(nullptr);
    pthread_mutex_unlock(&g_taking);
    g_from_environment.store(false);
    end_what_depends();
    unlock_number(number);
    return 0;
}

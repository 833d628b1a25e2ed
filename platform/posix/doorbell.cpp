// The only file with calls of one operating system: futexes on Linux. Elsewhere the bell is polled every millisecond,
// which is slower but needs nothing that a process killed in the middle could leave behind.
#include "doorbell.h"

#include "clock.h"

#include <cerrno>

#if defined(__linux__)
#include <linux/futex.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <climits>
#endif

namespace bt::platform {

static_assert(sizeof(std::atomic<uint32_t>) == sizeof(uint32_t) && std::atomic<uint32_t>::is_always_lock_free,
              "the bell is one plain word");

#if defined(__linux__)

namespace {

// The kernel's own timespec of the plain futex call: two longs on every machine.
struct KernelTime {
    long seconds;
    long nanoseconds;
};

long futex(const std::atomic<uint32_t>& word, int operation, uint32_t value, const KernelTime* timeout)
{
    return syscall(SYS_futex, &word, operation, value, timeout, nullptr, 0);
}

} // namespace

Woken wait_for_bell(const std::atomic<uint32_t>& bell, uint32_t seen, uint64_t ns)
{
    const KernelTime timeout{static_cast<long>(ns / 1'000'000'000), static_cast<long>(ns % 1'000'000'000)};
    const bool interrupted = futex(bell, FUTEX_WAIT, seen, &timeout) == -1 && errno == EINTR;
    return interrupted ? Woken::by_signal : Woken::rung_or_late;
}

void ring_bell(std::atomic<uint32_t>& bell)
{
    bell.fetch_add(1);
    futex(bell, FUTEX_WAKE, INT_MAX, nullptr);
}

#else

Woken wait_for_bell(const std::atomic<uint32_t>& bell, uint32_t seen, uint64_t ns)
{
    const uint64_t end = now_ns() + ns;
    const timespec pause = to_timespec(kMillisecond);
    while (bell.load() == seen && now_ns() < end) {
        if (nanosleep(&pause, nullptr) == -1 && errno == EINTR) return Woken::by_signal;
    }
    return Woken::rung_or_late;
}

void ring_bell(std::atomic<uint32_t>& bell)
{
    bell.fetch_add(1);
}

#endif

} // namespace bt::platform

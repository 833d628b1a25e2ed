// Posting and receiving.
#include "clock.h"
#include "domain.h"
#include "error.h"
#include "number.h"
#include "queues.h"
#include "receive_fd.h"

#include <bt_platform/host.h>

namespace bt::platform {
namespace {

constexpr uint64_t kForever = UINT64_MAX;

int32_t receive(void* buffer, uint32_t size, uint64_t limit_ns)
{
    if (buffer == nullptr || size < kMessageMin)
        return fail(-1, "a receive buffer has at least %u bytes, best %u", kMessageMin, kMessageMax);
    Ring* const ring = own_number() == 0 ? nullptr : own_ring();
    if (ring == nullptr) return fail(-1, "the process owns no process number; claim one or set BT_PLATFORM_PNO");

    const uint64_t start = limit_ns == kForever ? 0 : now_ns();
    while (!take_own(*ring, buffer, size)) {
        if (domain() == nullptr) return -1;
        if (own_ring() != ring) return fail(-1, "the process number was released while it was received from");

        const uint64_t passed = limit_ns == kForever ? 0 : now_ns() - start;
        if (passed >= limit_ns) return 0;
        if (sleep_on(*ring, limit_ns - passed) == Slept::by_signal) return 0;
    }
    settle_receive_fd(*ring);
    return 1;
}

} // namespace
} // namespace bt::platform

using namespace bt::platform;

int32_t _sys_SndMsg(uint32_t pno, uint32_t size, const void* message, uint32_t)
{
    if (size < kMessageMin || size > kMessageMax || message == nullptr)
        return fail(3, "a message has %u to %u bytes, not %u", kMessageMin, kMessageMax, message == nullptr ? 0 : size);

    int32_t result = 0;
    Ring* const ring = find_queue(pno, &result);
    return ring == nullptr ? result : post(*ring, size, message);
}

int32_t _sys_RcvMsg(uint32_t own_pno, uint32_t size, void* buffer, uint32_t)
{
    if (own_pno == 0 || own_pno != own_number())
        return fail(-1, "the process does not own process number 0x%X; claim it or set BT_PLATFORM_PNO", own_pno);
    return receive(buffer, size, kForever);
}

int32_t bt_host_receive(void* buffer, uint32_t size, int32_t timeout_ms)
{
    return receive(buffer, size, timeout_ms < 0 ? kForever : static_cast<uint64_t>(timeout_ms) * kMillisecond);
}

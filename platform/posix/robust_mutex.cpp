#include "robust_mutex.h"

#include "clock.h"

#include <cerrno>

namespace bt::platform {
namespace {

#if defined(__SANITIZE_THREAD__)
#define BT_CLOCKLOCK 0 // the sanitizer does not follow pthread_mutex_clocklock()
#elif defined(__has_feature)
#if __has_feature(thread_sanitizer)
#define BT_CLOCKLOCK 0
#endif
#endif
#if !defined(BT_CLOCKLOCK) && defined(__GLIBC__)
#define BT_CLOCKLOCK 1
#elif !defined(BT_CLOCKLOCK)
#define BT_CLOCKLOCK 0
#endif

int wait_realtime(pthread_mutex_t* mutex, uint32_t milliseconds)
{
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    const uint64_t start = static_cast<uint64_t>(now.tv_sec) * 1'000'000'000 + static_cast<uint64_t>(now.tv_nsec);
    const timespec deadline = to_timespec(start + milliseconds * kMillisecond);
    return pthread_mutex_timedlock(mutex, &deadline);
}

int wait_for(pthread_mutex_t* mutex, uint32_t milliseconds)
{
#if BT_CLOCKLOCK
    // Kernels without FUTEX_LOCK_PI2 refuse the monotonic clock for priority inheritance.
    const timespec deadline = to_timespec(now_ns() + milliseconds * kMillisecond);
    const int result = pthread_mutex_clocklock(mutex, CLOCK_MONOTONIC, &deadline);
    if (result != EINVAL) return result;
#endif
    return wait_realtime(mutex, milliseconds);
}

} // namespace

bool make_mutex(pthread_mutex_t* mutex, Priority priority)
{
    pthread_mutexattr_t attributes;
    if (pthread_mutexattr_init(&attributes) != 0) return false;

    pthread_mutexattr_settype(&attributes, PTHREAD_MUTEX_ERRORCHECK);
    pthread_mutexattr_setpshared(&attributes, PTHREAD_PROCESS_SHARED);
    pthread_mutexattr_setrobust(&attributes, PTHREAD_MUTEX_ROBUST);
    if (priority == Priority::inherited) pthread_mutexattr_setprotocol(&attributes, PTHREAD_PRIO_INHERIT);

    int result = pthread_mutex_init(mutex, &attributes);
    if (result != 0 && priority == Priority::inherited) {
        pthread_mutexattr_setprotocol(&attributes, PTHREAD_PRIO_NONE);
        result = pthread_mutex_init(mutex, &attributes);
    }
    pthread_mutexattr_destroy(&attributes);
    return result == 0;
}

Locked lock_within(pthread_mutex_t* mutex, uint32_t milliseconds)
{
    int result = pthread_mutex_trylock(mutex);
    if (result == EBUSY) result = wait_for(mutex, milliseconds);

    switch (result) {
    case 0:
        return Locked::yes;
    case EOWNERDEAD:
        pthread_mutex_consistent(mutex);
        return Locked::from_the_dead;
    case ETIMEDOUT:
        return Locked::not_in_time;
    case EDEADLK:
        return Locked::already_by_this_thread;
    default:
        return Locked::broken;
    }
}

bool unlock(pthread_mutex_t* mutex)
{
    return pthread_mutex_unlock(mutex) == 0;
}

} // namespace bt::platform

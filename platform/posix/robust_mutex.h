// Mutexes between processes that survive the death of their holder.
#pragma once

#include <pthread.h>

#include <cstdint>

namespace bt::platform {

enum class Locked {
    yes,
    from_the_dead, // held; the holder before died with it
    not_in_time,
    already_by_this_thread,
    broken // the memory holds no usable mutex
};

enum class Priority { plain, inherited };

// Makes a robust, error-checking mutex in shared memory; priority inheritance is left out where there is none.
bool make_mutex(pthread_mutex_t* mutex, Priority priority);

Locked lock_within(pthread_mutex_t* mutex, uint32_t milliseconds);

// False when the calling thread does not hold it; that changes nothing.
bool unlock(pthread_mutex_t* mutex);

inline bool is_held(Locked locked)
{
    return locked == Locked::yes || locked == Locked::from_the_dead;
}

} // namespace bt::platform

// Serialises the threads of this process over something that the area's lock does not guard.
#pragma once

#include <pthread.h>

namespace bt::con {

class ProcessLock {
public:
    explicit ProcessLock(pthread_mutex_t& mutex) : mutex_(mutex) { pthread_mutex_lock(&mutex_); }
    ~ProcessLock() { pthread_mutex_unlock(&mutex_); }
    ProcessLock(const ProcessLock&) = delete;
    ProcessLock& operator=(const ProcessLock&) = delete;

private:
    pthread_mutex_t& mutex_;
};

} // namespace bt::con

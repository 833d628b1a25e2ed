#include "background.h"

#include <csignal>

namespace bt::platform {

bool start_thread(pthread_t* thread, void* (*body)(void*), void* argument)
{
    sigset_t all;
    sigset_t before;
    sigfillset(&all);
    pthread_sigmask(SIG_SETMASK, &all, &before);
    const bool started = pthread_create(thread, nullptr, body, argument) == 0;
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
    return started;
}

} // namespace bt::platform

// Threads of the layer's own.
#pragma once

#include <pthread.h>

namespace bt::platform {

// Starts a thread with all signals blocked: signals are the program's and must end its waits, not the layer's.
bool start_thread(pthread_t* thread, void* (*body)(void*), void* argument);

} // namespace bt::platform

// The domain object: it says that the domain exists, lists the objects in it and holds its locks.
#pragma once

#include "object.h"

#include <pthread.h>

namespace bt::platform {

constexpr uint32_t kNameSize = 64; // of names of data and locks, terminating zero included
constexpr uint32_t kEntryCount = 256;
constexpr uint32_t kLockCount = 128;

// An object of the domain. An entry is made before its object and removed after it, so that no object is ever lost.
struct Entry {
    uint32_t kind; // 0 free, else a Kind
    uint32_t pno; // of a queue
    char name[kNameSize]; // of data
};

struct LockSlot {
    uint32_t used; // set last
    std::atomic<uint32_t> holder_pid;
    std::atomic<uint32_t> holder_thread;
    std::atomic<uint32_t> recovered;
    char name[kNameSize];
    alignas(16) pthread_mutex_t mutex;
};

struct DomainArea {
    Stamp stamp; // retired: the domain was removed
    alignas(64) pthread_mutex_t lock; // of entries, and of lock slots while they are made
    Entry entries[kEntryCount];
    alignas(64) LockSlot locks[kLockCount];
};

// The calling process's domain, mapped at first use and again when it was removed and created anew. Null, with an error
// text, when there is none. Costs two loads once mapped.
DomainArea* domain();

// Descriptor of the domain object. Byte `pno` of it is locked by the process that owns the number. The descriptor is the
// process's only one of the object: closing a second one would give the lock away.
int domain_descriptor();

const char* domain_name();

// The lock of everything the process keeps about its domain: held while something is mapped, claimed or released.
class ProcessLock {
public:
    ProcessLock();
    ~ProcessLock();
    ProcessLock(const ProcessLock&) = delete;
    ProcessLock& operator=(const ProcessLock&) = delete;
};

// As domain(), for callers that hold the process lock.
DomainArea* domain_locked();

void domain_before_fork();
void domain_after_fork();

} // namespace bt::platform

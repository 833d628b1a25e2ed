// The list of objects in the domain: finding, making and naming them.
#pragma once

#include "domain.h"

namespace bt::platform {

// Holds the lock of the domain's entries; `held()` is false, with an error text, when it was not had or the domain is
// removed.
class EntriesLock {
public:
    explicit EntriesLock(DomainArea& area);
    ~EntriesLock();
    EntriesLock(const EntriesLock&) = delete;
    EntriesLock& operator=(const EntriesLock&) = delete;
    bool held() const { return held_; }

private:
    DomainArea& area_;
    bool held_;
};

// Everything below is for callers that hold the entries' lock. Queues have a number and an empty name, data a name and
// number 0.
Entry* find_entry(DomainArea& area, Kind kind, uint32_t pno, const char* name);
ObjectName entry_object(const Entry& entry);

enum class Obtained {
    existing,
    created, // the caller fills it and publishes it
    failed // the error text says why
};

// Opens the object, or makes entry and object.
Obtained obtain_object(DomainArea& area, Kind kind, uint32_t pno, const char* name, uint32_t size, Object* object);

// Copies a name that another process may have written without an end.
void copy_name(char (&to)[kNameSize], const char (&from)[kNameSize]);

// False, with an error text, for a null, empty or too long name.
bool check_name(const char* name);

} // namespace bt::platform

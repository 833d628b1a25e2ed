// Shared memory objects: their names, their stamp, and the checks an object has to pass before it is used.
#pragma once

#include <atomic>
#include <cstdint>

namespace bt::platform {

enum class Kind : uint32_t { domain = 1, queue = 2, data = 3 };

// Stands at the start of every object.
struct Stamp {
    uint32_t magic;
    uint32_t version;
    uint32_t word_size; // bytes of a pointer: mutexes of 32- and 64-bit programs differ
    uint32_t kind;
    uint32_t size; // of the whole object
    std::atomic<uint32_t> ready; // set last; an object without it was never finished
    std::atomic<uint32_t> retired; // the object's name was removed; whoever still maps it looks for the new one
    uint32_t reserved[9];
};
static_assert(sizeof(Stamp) == 64, "what follows the stamp is aligned to a cache line");

struct ObjectName {
    char text[256];
};

// "/bt.<domain>.<kind>.<name>". Whatever is no letter, digit, "_" or "-" in `name` becomes %XX, so that names with
// slashes are possible and no two names meet.
ObjectName object_name(const char* domain, Kind kind, const char* name);

enum class Opening {
    done,
    absent,
    unfinished, // its creator has not set `ready`
    refused // foreign or unusable; the error text says why
};

struct Object {
    Stamp* stamp = nullptr;
    uint32_t size = 0;
    int fd = -1;
};

// Maps an existing object. `size` is the size it must have, 0 any. Everything but `done` leaves nothing open.
Opening open_object(const ObjectName& name, Kind kind, uint32_t size, Object* object);

// Creates an object of `size` zero bytes behind the stamp's fields, for its owner only. The caller fills it and then
// publishes it. `absent` means that the name is taken.
Opening create_object(const ObjectName& name, Kind kind, uint32_t size, Object* object);

// Marks the object ready. False when its name was taken away meanwhile by remove_unfinished().
bool publish(Object& object);

// Removes an object that its creator will not finish, since it is dead or has not got far; it creates it again then. True
// when the name is free or belongs to a finished object now.
bool remove_unfinished(const ObjectName& name);

// False when the object's name was removed.
bool still_named(int fd);

// Unmaps and closes; for paths that have not handed the mapping out.
void discard(Object& object);

// Closes the descriptor; the mapping stays.
void close_descriptor(Object& object);

// Removes the name of an object that belongs to this user, whatever its state. True when it is gone.
bool remove_object(const ObjectName& name);

// Removes what is in a domain but not listed by it, where the system shows objects as files (Linux: /dev/shm). The domain
// object itself is left: it goes last, since nobody can make a new domain before.
void remove_leftovers(const char* domain);

} // namespace bt::platform

#include "object.h"

#include "error.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <cstdio>
#include <cstring>

namespace bt::platform {
namespace {

constexpr uint32_t kMagic = 0x4C505442; // "BTPL"
constexpr uint32_t kVersion = 1;
constexpr mode_t kMode = 0600;

const char* kind_name(Kind kind)
{
    switch (kind) {
    case Kind::domain:
        return "domain";
    case Kind::queue:
        return "queue";
    default:
        return "data";
    }
}

Opening refuse(const ObjectName& name, const char* what, const char* remedy)
{
    fail(-1, "shared memory object %s %s; %s", name.text, what, remedy);
    return Opening::refused;
}

Opening refuse_call(const ObjectName& name, const char* call, int error)
{
    fail(-1, "shared memory object %s: %s failed: %s", name.text, call, strerror(error));
    return Opening::refused;
}

bool check_owner(const ObjectName& name, const struct stat& file)
{
    if (file.st_uid == geteuid()) return true;

    char what[96];
    std::snprintf(what, sizeof what, "belongs to user %lu, not to user %lu", static_cast<unsigned long>(file.st_uid),
                  static_cast<unsigned long>(geteuid()));
    refuse(name, what, "run as that user, or set BT_PLATFORM_DOMAIN to another name");
    return false;
}

bool check_file(const ObjectName& name, const struct stat& file)
{
    if (!check_owner(name, file)) return false;

    char what[96];
    if (!S_ISREG(file.st_mode) || (file.st_mode & 07777) != kMode) {
        std::snprintf(what, sizeof what, "has mode %04o, not 0600", static_cast<unsigned>(file.st_mode & 07777));
        refuse(name, what, "others could change it: look who made it, then remove it (on Linux it stands in /dev/shm)");
        return false;
    }
    return true;
}

bool check_stamp(const ObjectName& name, const Stamp& stamp, Kind kind, uint32_t size)
{
    constexpr const char* kRemake = "remove the domain and create it again";
    char what[96];
    if (stamp.magic != kMagic || stamp.kind != static_cast<uint32_t>(kind)) {
        refuse(name, "is not what its name says", kRemake);
        return false;
    }
    if (stamp.version != kVersion) {
        std::snprintf(what, sizeof what, "has layout version %u, not %u", stamp.version, kVersion);
        refuse(name, what, "use one version of libbt_platform, or another BT_PLATFORM_DOMAIN");
        return false;
    }
    if (stamp.word_size != sizeof(void*)) {
        std::snprintf(what, sizeof what, "was made by a %u-bit program, this is a %u-bit one", stamp.word_size * 8,
                      static_cast<unsigned>(sizeof(void*) * 8));
        refuse(name, what, "give each word size a BT_PLATFORM_DOMAIN of its own");
        return false;
    }
    if (stamp.size != size) {
        std::snprintf(what, sizeof what, "is stamped with %u bytes but has %u", stamp.size, size);
        refuse(name, what, kRemake);
        return false;
    }
    return true;
}

Opening refuse_size(const ObjectName& name, off_t found, uint32_t wanted)
{
    char what[96];
    const auto bytes = static_cast<long long>(found);
    if (wanted == 0) {
        std::snprintf(what, sizeof what, "has an impossible size, %lld bytes", bytes);
    } else {
        std::snprintf(what, sizeof what, "has %lld bytes, not %u", bytes, wanted);
    }
    return refuse(name, what, "it was made by another version or cut: remove the domain and create it again");
}

void* map(int fd, uint32_t size)
{
    void* const address = mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0);
    return address == MAP_FAILED ? nullptr : address;
}

Opening check_and_map(const ObjectName& name, Kind kind, uint32_t size, int fd, Object* object)
{
    struct stat file {};
    if (fstat(fd, &file) != 0) return refuse_call(name, "fstat", errno);
    if (!check_file(name, file)) return Opening::refused;
    if (file.st_size == 0) return Opening::unfinished;
    if (file.st_size < static_cast<off_t>(sizeof(Stamp)) || file.st_size > INT32_MAX)
        return refuse_size(name, file.st_size, size);

    const auto bytes = static_cast<uint32_t>(file.st_size);
    void* const address = map(fd, bytes);
    if (address == nullptr) return refuse_call(name, "mmap", errno);

    auto* const stamp = static_cast<Stamp*>(address);
    Opening opening = Opening::done;
    if (stamp->ready.load(std::memory_order_acquire) != 1) {
        opening = Opening::unfinished;
    } else if (size != 0 && size != bytes) {
        opening = refuse_size(name, file.st_size, size);
    } else if (!check_stamp(name, *stamp, kind, bytes)) {
        opening = Opening::refused;
    }
    if (opening == Opening::done) {
        *object = Object{stamp, bytes, fd};
    } else {
        munmap(address, bytes);
    }
    return opening;
}

// Reserves the memory at once: where it is short the creator gets an error now, not a user a bus error later.
int reserve(int fd, uint32_t size)
{
    if (ftruncate(fd, static_cast<off_t>(size)) != 0) return errno;
    const int result = posix_fallocate(fd, 0, static_cast<off_t>(size));
    return result == EOPNOTSUPP || result == EINVAL ? 0 : result;
}

bool lock_creation(int fd, short type)
{
    struct flock lock {};
    lock.l_type = type;
    lock.l_whence = SEEK_SET;
    lock.l_len = 1;
    return fcntl(fd, F_SETLKW, &lock) == 0;
}

// A program may run with a standard stream closed. An object that took its descriptor would be written into by whatever
// the program prints.
int above_standard_streams(int fd)
{
    if (fd < 0 || fd > STDERR_FILENO) return fd;
    const int moved = fcntl(fd, F_DUPFD_CLOEXEC, STDERR_FILENO + 1);
    const int error = errno;
    close(fd);
    errno = error;
    return moved;
}

bool is_ready(int fd)
{
    uint32_t ready = 0;
    return pread(fd, &ready, sizeof ready, offsetof(Stamp, ready)) == sizeof ready && ready == 1;
}

} // namespace

ObjectName object_name(const char* domain, Kind kind, const char* name)
{
    ObjectName out{};
    const int head = std::snprintf(out.text, sizeof out.text, "/bt.%s.%s.", domain, kind_name(kind));
    if (kind == Kind::domain) {
        out.text[head - 1] = '\0';
        return out;
    }

    constexpr char kDigits[] = "0123456789ABCDEF";
    char* at = out.text + head;
    for (; *name != '\0' && at < out.text + sizeof out.text - 4; ++name) {
        const char c = *name;
        const bool plain =
            (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || c == '_' || c == '-';
        if (plain) {
            *at++ = c;
        } else {
            const auto byte = static_cast<unsigned char>(c);
            *at++ = '%';
            *at++ = kDigits[byte >> 4];
            *at++ = kDigits[byte & 15];
        }
    }
    return out;
}

Opening open_object(const ObjectName& name, Kind kind, uint32_t size, Object* object)
{
    const int fd = above_standard_streams(shm_open(name.text, O_RDWR, 0));
    if (fd < 0) return errno == ENOENT ? Opening::absent : refuse_call(name, "shm_open", errno);

    const Opening opening = check_and_map(name, kind, size, fd, object);
    if (opening != Opening::done) close(fd);
    return opening;
}

Opening create_object(const ObjectName& name, Kind kind, uint32_t size, Object* object)
{
    const int fd = above_standard_streams(shm_open(name.text, O_RDWR | O_CREAT | O_EXCL, kMode));
    if (fd < 0) return errno == EEXIST ? Opening::absent : refuse_call(name, "shm_open", errno);

    int error = fchmod(fd, kMode) == 0 && lock_creation(fd, F_WRLCK) ? 0 : errno; // whatever the umask is
    if (error == 0) error = reserve(fd, size);
    void* const address = error == 0 ? map(fd, size) : nullptr;
    if (address == nullptr) {
        if (error == 0) error = errno;
        shm_unlink(name.text);
        close(fd);
        return refuse_call(name, "reserving its memory", error);
    }

    auto* const stamp = static_cast<Stamp*>(address);
    stamp->magic = kMagic;
    stamp->version = kVersion;
    stamp->word_size = sizeof(void*);
    stamp->kind = static_cast<uint32_t>(kind);
    stamp->size = size;
    *object = Object{stamp, size, fd};
    return Opening::done;
}

// The creator holds the first byte's lock from the start to here, so whoever gets it can tell a creator that is dead from
// one that is slow. One that had not come to the lock yet finds here that it has to start again.
bool publish(Object& object)
{
    object.stamp->ready.store(1, std::memory_order_release);
    const bool named = still_named(object.fd);
    lock_creation(object.fd, F_UNLCK);
    return named;
}

bool remove_unfinished(const ObjectName& name)
{
    const int fd = shm_open(name.text, O_RDWR, 0);
    if (fd < 0) return errno == ENOENT;

    bool settled = lock_creation(fd, F_WRLCK);
    if (!settled) refuse_call(name, "waiting for its creator", errno);
    if (settled && !is_ready(fd) && still_named(fd)) settled = remove_object(name);
    close(fd);
    return settled;
}

bool still_named(int fd)
{
    struct stat file {};
    return fstat(fd, &file) == 0 && file.st_nlink != 0;
}

void discard(Object& object)
{
    munmap(object.stamp, object.size);
    object.stamp = nullptr;
    close_descriptor(object);
}

void close_descriptor(Object& object)
{
    close(object.fd);
    object.fd = -1;
}

bool remove_object(const ObjectName& name)
{
    const int fd = shm_open(name.text, O_RDONLY, 0);
    if (fd < 0 && errno == ENOENT) return true;
    if (fd < 0) return refuse_call(name, "shm_open", errno), false;

    struct stat file {};
    const bool own = fstat(fd, &file) == 0 && check_owner(name, file);
    close(fd);
    if (own && shm_unlink(name.text) != 0 && errno != ENOENT) return refuse_call(name, "shm_unlink", errno), false;
    return own;
}

void remove_leftovers(const char* domain)
{
    char prefix[64];
    const int length = std::snprintf(prefix, sizeof prefix, "bt.%s.", domain);
    DIR* const folder = opendir("/dev/shm");
    if (folder == nullptr) return;
    while (const dirent* const file = readdir(folder)) {
        if (std::strncmp(file->d_name, prefix, static_cast<size_t>(length)) != 0) continue;
        if (std::strcmp(file->d_name + length, "domain") == 0) continue;
        ObjectName name{};
        if (std::snprintf(name.text, sizeof name.text, "/%s", file->d_name) < static_cast<int>(sizeof name.text))
            remove_object(name);
    }
    closedir(folder);
}

} // namespace bt::platform

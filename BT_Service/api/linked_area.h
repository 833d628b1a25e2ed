// Named shared areas that have no lock: linked anew on each call, read and written within their size only.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace bt {

// A shared area that is a list: what precedes the entries, then the entries.
struct ListLayout {
    const char* name;
    uint32_t area_size;
    uint32_t entries_at;
    uint32_t entry_size;
    uint32_t capacity;
};

template <class Area>
constexpr ListLayout list_layout(const char* name)
{
    using Entries = decltype(Area::entries);
    return {name, sizeof(Area), offsetof(Area, entries), sizeof(std::remove_extent_t<Entries>), std::extent_v<Entries>};
}

class LinkedArea {
public:
    // Asks for `size_needed` bytes, 0 for any size. Where the platform does not report a size, `size_if_unreported`
    // counts.
    LinkedArea(const char* name, uint32_t size_needed, uint32_t size_if_unreported);

    // Whether the area is linked and has at least that many bytes. The members below count on it.
    bool has(uint32_t bytes) const { return start_ != nullptr && size_ >= bytes; }

    uint32_t size() const { return size_; }
    uint8_t* at(uint32_t offset) { return start_ + offset; }
    const uint8_t* at(uint32_t offset) const { return start_ + offset; }

    // A copy of what another process may be writing; what is checked is what is used.
    template <class T>
    T read(uint32_t offset) const
    {
        T value;
        std::memcpy(&value, at(offset), sizeof value);
        // Keeps the compiler from reading the area again where the value is used.
        std::atomic_signal_fence(std::memory_order_seq_cst);
        return value;
    }

    // The entries that list and area have room for.
    uint32_t room(const ListLayout& list) const;
    void copy_entries(const ListLayout& list, uint32_t first, uint32_t count, void* to) const;

private:
    uint8_t* start_ = nullptr;
    uint32_t size_;
};

// Held while an area is written, so that threads of one process never mix their data in it. Between processes the
// areas have no lock.
class AreaWriting {
public:
    AreaWriting();
    ~AreaWriting();
    AreaWriting(const AreaWriting&) = delete;
    AreaWriting& operator=(const AreaWriting&) = delete;
};

} // namespace bt

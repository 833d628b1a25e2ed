// Private copies of what others have written: records in named shared data, text fields of records.
#pragma once

#include <bt_platform/platform.h>

#include <cstdint>
#include <cstring>
#include <memory>
#include <string>
#include <type_traits>

namespace bt::client {

// Null when there is no such data, or less than a record of it.
template <class Record>
std::unique_ptr<Record> shared_copy(const char* name)
{
    static_assert(std::is_trivially_copyable<Record>::value, "copied as bytes");
    void* address = nullptr;
    uint32_t size = sizeof(Record);
    if (_sys_LinkShareData(name, &address, &size) != 0 || address == nullptr) return nullptr;

    auto copy = std::make_unique<Record>();
    std::memcpy(copy.get(), address, sizeof(Record));
    return copy;
}

// A text field of a record: up to its zero byte, or all of it.
template <size_t Size>
std::string bounded_text(const char (&text)[Size])
{
    return std::string(text, ::strnlen(text, Size));
}

} // namespace bt::client

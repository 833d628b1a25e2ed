// The arguments of a call: words of the command line, typed and range-checked by the call's argument list.
#pragma once

#include "catalogue/layout.h"

#include <cstdint>
#include <cstring>
#include <string>
#include <type_traits>
#include <vector>

namespace bt::client {

// The argument list is written in the grammar of the catalogues: "address:addr profile:u32 pin:bytes[20]". Blocks and
// lists may be given shorter, the rest is zero; the word "null" stands for a null pointer where a pointer is passed.
class Arguments {
public:
    // Throws Failure(kUsage) naming the argument.
    Arguments(const catalogue::Layout& layout, const std::vector<std::string>& words);

    uint32_t u32(size_t i) const { return static_cast<uint32_t>(values_[i].number); }
    int32_t i32(size_t i) const { return static_cast<int32_t>(values_[i].number); }

    // The block as a record that stays valid with this object; null for "null".
    template <class Record>
    const Record* record(size_t i) const
    {
        return values_[i].is_null ? nullptr
                                  : static_cast<const Record*>(static_cast<const void*>(values_[i].block.data()));
    }

    // A record passed by value; zero for "null".
    template <class Record>
    Record value(size_t i) const
    {
        static_assert(std::is_trivially_copyable<Record>::value, "copied as bytes");
        Record copy{};
        if (!values_[i].is_null) std::memcpy(&copy, values_[i].block.data(), sizeof copy);
        return copy;
    }

    // Bytes of a block of any length.
    uint32_t length(size_t i) const { return static_cast<uint32_t>(values_[i].given); }

private:
    struct Value {
        int64_t number = 0;
        std::vector<uint8_t> block;
        size_t given = 0;
        bool is_null = false;
    };
    static Value read(const catalogue::Field& field, const std::string& word);

    std::vector<Value> values_;
};

// "address profile values[7]": the argument list as a usage line shows it.
std::string usage_text(const catalogue::Layout& layout);

} // namespace bt::client

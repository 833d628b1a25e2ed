// What the tests of the connection data store share: its memory typed by offset, and rows of operations with one body
// that runs each of them plainly, with every platform call failing in turn, and on hostile memory.
#pragma once

#include "fake_platform.h"

#include <bt_service/bt_connection_queries.h>
#include <bt_service/bt_connection_store.h>
#include <gtest/gtest.h>

#include <climits>

namespace store {

using fake::Bytes;

enum : size_t { kAreaSize = 27796, kPersistentSize = 19148, kImageSize = 19160 };
enum : size_t { kDevices = 0, kOrder = 17344, kProfileOrders = 17484, kDeviceIds = 18604, kSearch = 19148 };

constexpr const char* kAreaName = "BT_CON_SHARE_DATA_NAME";
constexpr const char* kLockName = "BT_CON_SEMAPHORE_NAME";
constexpr const char* kImagePath = "/fs/tmpfs/btdevicelist.txt";
inline const std::string kSixteen = "ABCDEFGHIJKLMNOP", kSeventeen = kSixteen + "Q";

// Memory for a parameter of any pointer type, so that no row depends on the records of the headers.
class At {
public:
    At(void* memory) : memory_(memory) {}
    At operator+(size_t bytes) const { return static_cast<uint8_t*>(memory_) + bytes; }
    template <class T>
    operator T*() const
    {
        return static_cast<T*>(memory_);
    }

private:
    void* memory_;
};

// Bytes of the caller for a parameter of any pointer type, exactly as long as they are; none are a null pointer.
class Given {
public:
    explicit Given(Bytes bytes) : bytes_(std::move(bytes)) {}
    template <class T>
    operator T*() const
    {
        return bytes_.empty() ? nullptr : static_cast<T*>(static_cast<void*>(bytes_.data()));
    }
    const Bytes& bytes() const { return bytes_; }

private:
    mutable Bytes bytes_;
};

Bytes words(std::initializer_list<uint32_t> values);
Bytes word(uint32_t value); // as an output holds it, whose last four bytes are untouched
Bytes operator+(Bytes left, const Bytes& right);
void put(Bytes& bytes, size_t at, const Bytes& part);
Bytes with_count(int32_t count, Bytes list); // the word at its start
std::string difference(const Bytes& got, const Bytes& want); // empty when there is none

// Slots of devices, named by a letter: 'A' is 41 10 20 30 40 50, '0' is 00 x 6, '-' is FF x 6; EE EF behind each. '?' is
// a null pointer.
Given dev(const std::string& letters);
Bytes address(char letter); // the six bytes

// The records of the area, holding the devices of those letters.
Bytes device_record(char letter); // every byte the letter, but for the address
Bytes device_list(const std::string& letters); // words 0x100, 0x200 and 0x300 + letter
Bytes order_list(const std::string& letters, bool padded = true); // padding tells every slot
Bytes profile_orders(size_t profile, const std::string& letters, bool padded = true); // the others hold one device each
Bytes id_entry(char letter, uint32_t key, uint8_t value, uint32_t key2 = 0, uint8_t value2 = 0);
Bytes id_list(Bytes entries); // followed by empty entries
Bytes device_info(char letter, uint8_t fill); // of a found device: name and class of `fill`
Bytes search_list(const Bytes& infos); // as the store keeps them, padding 0
Bytes sample_data(); // some of everything that is persistent
const Bytes& default_data();
Bytes image_of(const Bytes& data, uint8_t init_request = 0);
const Bytes& stale_image(); // what the file holds before each run

// A process that has attached nothing yet; the area is `data` with 5A behind it.
uint8_t* fresh_process(const Bytes& data = default_data());
uint8_t* attached_process(const Bytes& data = default_data());
Bytes area_bytes(size_t at = 0, size_t size = kAreaSize);

enum class Locking {
    kNone, // takes no lock
    kReported, // a failure of the closing unlock is the result
    kUnlockIgnored, // a failure of the closing unlock is not reported
    kUnlockSpoils, // a failure of the closing unlock is the result and spoils the answer
    kNumber, // answers a number: every failure but that of the unlock is 0
    kGeneric, // locks inside the generic setter: a failure of the unlock is the result and keeps the image
    kAccessor, // the same inside a field accessor, where every failure is -1
};

struct Operation {
    std::string what;
    std::function<int32_t(At out)> call; // `out` ends at an unreadable page
};
#define CALL(expression)                                                                                               \
    {                                                                                                                  \
#expression, [=]([[maybe_unused]] At out) -> int32_t { return expression; }                                    \
    }

// An operation, what it answers, what it finds in its field and what it leaves behind.
struct Row {
    Operation operation;
    int32_t result;
    Locking locking;
    Bytes before{}, after{}; // of the field; empty: as the field usually is, unchanged
    Bytes out{}, out_failed{}; // empty: left untouched
    bool writes_image = true; // when something persistent changed

    Row on(Bytes held) { return before = std::move(held), *this; }
    Row unwritten() { return writes_image = false, *this; }
};

Row change(Operation operation, Bytes before, Bytes after, int32_t result = 0, Locking locking = Locking::kReported);
Row answer(Operation operation, Bytes out, int32_t result = 0, Locking locking = Locking::kNone, Bytes out_failed = {});
Row refused(int32_t result, Operation operation, Locking locking = Locking::kNone);

struct Field {
    size_t at, owned; // nothing but `owned` bytes there may change
    Bytes usual;
    std::vector<std::pair<size_t, int32_t>> counts{}; // place and capacity
    bool attached = true; // false: the operations attach by themselves
};

void run_rows(const Field& field, const std::vector<Row>& rows);

} // namespace store

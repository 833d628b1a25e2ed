// The connection data area as the operations of the store use it: attached pointer, lock guard, typed fields.
#pragma once

#include <bt_service/bt_connection_store.h>

#include <type_traits>

#include "thread/bt_srv_con/src/counts.h"
#include "thread/bt_srv_con/src/shared_bytes.h"

namespace bt::con {

// Where the area is attached in this process, null while it is not.
BtConShareData* area();

// Holds the area's lock. A failed lock has been dealt with already and is not released again.
class AreaLock {
public:
    AreaLock() : taken_(bt_con_semLock()), held_(taken_ == BT_OK) {}
    ~AreaLock() { release(); }
    AreaLock(const AreaLock&) = delete;
    AreaLock& operator=(const AreaLock&) = delete;

    int32_t taken() const { return taken_; }
    int32_t release()
    {
        if (!held_) return BT_OK;
        held_ = false;
        return bt_con_semUnlock();
    }

private:
    const int32_t taken_;
    bool held_;
};

template <auto Member>
using Field = std::remove_reference_t<decltype(static_cast<BtConShareData*>(nullptr)->*Member)>;

// What a field is handed over by: a record, a word, or the first element of an array.
template <auto Member>
using Element = std::remove_all_extents_t<Field<Member>>;

template <class Record>
Record* first_of(Record& record)
{
    return &record;
}

template <class Record, size_t N>
Record* first_of(Record (&records)[N])
{
    return records;
}

// The bytes of a field as they are stored. 0, or -1 on any failure.
template <auto Member>
int32_t read_field(Element<Member>* out, uint32_t lock_flag)
{
    BtConShareData* const attached = area();
    if (attached == nullptr) return BT_FAILED;
    const int32_t result = bt_con_getter(&(attached->*Member), out, sizeof(Field<Member>), lock_flag);
    return result == BT_OK ? BT_OK : BT_FAILED;
}

enum class Image : uint32_t { kLeave = 0, kWrite = 1 };

template <auto Member>
int32_t write_field(const Element<Member>* in, Image image, uint32_t lock_flag)
{
    BtConShareData* const attached = area();
    if (attached == nullptr) return BT_FAILED;
    const int32_t result =
        bt_con_setter(&(attached->*Member), in, sizeof(Field<Member>), static_cast<uint32_t>(image), lock_flag);
    return result == BT_OK ? BT_OK : BT_FAILED;
}

// A copy of a field whose counts are possible ones, for a caller that holds the lock.
template <auto Member>
int32_t copy_held(Field<Member>& copy)
{
    const BtConShareData* const attached = area();
    if (attached == nullptr) return BT_FAILED;
    load_held(first_of(copy), &(attached->*Member), sizeof copy);
    make_possible(copy);
    return BT_OK;
}

// The same without the lock.
template <auto Member>
int32_t copy_field(Field<Member>& copy)
{
    const int32_t result = read_field<Member>(first_of(copy), 0);
    if (result == BT_OK) make_possible(copy);
    return result;
}

// What a change of a local copy answers when there is nothing to store; a negative answer refuses the operation.
constexpr int32_t kUnchanged = 1;

// Read, change, store, for a caller that holds the lock. 0, kUnchanged, or the failure.
template <auto Member, class Store, class Change>
int32_t change_held(Store store, Change change)
{
    Field<Member> copy;
    const int32_t read = copy_held<Member>(copy);
    if (read != BT_OK) return read;

    const int32_t changed = change(copy);
    return changed == BT_OK ? store(first_of(copy), 0) : changed;
}

// The same under the lock. Returns the lock's failure, the operation's, else the result of the release.
template <auto Member, class Store, class Change>
int32_t change_field(Store store, Change change)
{
    AreaLock lock;
    if (lock.taken() != BT_OK) return lock.taken();

    const int32_t result = change_held<Member>(store, change);
    return result < 0 ? result : lock.release();
}

// A look at a copy of a field, made and looked at under the lock. Results as for change_field.
template <auto Member, class Look>
int32_t look_at_field(Look look)
{
    AreaLock lock;
    if (lock.taken() != BT_OK) return lock.taken();

    Field<Member> copy;
    const int32_t read = copy_held<Member>(copy);
    if (read != BT_OK) return read;

    const int32_t looked = look(copy);
    return looked < 0 ? looked : lock.release();
}

} // namespace bt::con

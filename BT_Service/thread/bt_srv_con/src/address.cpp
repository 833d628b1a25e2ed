// The device address: copy, clear, compare and validate its six bytes.
#include <bt_service/bt_connection_store.h>

#include <cstring>

namespace {

constexpr BtDevAddress kNoDevice = {{0xFF, 0xFF, 0xFF, 0xFF, 0xFF, 0xFF}, {0, 0}};

} // namespace

BtDevAddress* bt_con_copyBtDevAddress(BtDevAddress* destination, const BtDevAddress* source)
{
    std::memmove(destination->address, source->address, sizeof source->address);
    return destination;
}

BtDevAddress* bt_con_clearBtDevAddress(BtDevAddress* destination)
{
    return bt_con_copyBtDevAddress(destination, &kNoDevice);
}

int32_t bt_con_IsCompBtDevAddress(const BtDevAddress* a, const BtDevAddress* b)
{
    return std::memcmp(a->address, b->address, sizeof a->address) == 0 ? 1 : 0;
}

int32_t bt_con_IsValidBtDevAddress(const BtDevAddress* addr)
{
    return bt_con_IsCompBtDevAddress(addr, &kNoDevice) != 0 ? 0 : 1;
}

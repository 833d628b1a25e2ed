// What a simulated unit tells about itself, as named shared data of its domain. Written by the unit alone; readers take
// no lock, and a counter may be a moment older than its neighbour. Counters wrap at 32 bits.
#pragma once

#include <bt_service/bt_types.h>

constexpr const char* kUnitDataName = "btsim_unit";
constexpr const char* kDistributorDataName = "btsim_distributor";

// A service process of the unit.
struct BtSimService {
    uint32_t pno; //  0  process number; 0 marks an unused record
    uint32_t pid; //  4  0 while it is not running
    uint32_t starts; //  8  times it was started
    uint32_t reserved; // 12  zero
    char name[32]; // 16  zero-terminated
};
BT_ASSERT_SIZE(BtSimService, 48);

// "btsim_unit": written by the supervisor.
struct BtSimUnit {
    uint32_t supervisor_pid; //    0
    uint32_t service_count; //    4  records in use, 0..15
    BtSimService services[15]; //    8
    char root[1024]; //  728  folder in front of the unit's absolute paths, zero-terminated
};
BT_ASSERT_SIZE(BtSimUnit, 1752);
BT_ASSERT_AT(BtSimUnit, root, 728);

// What the distributor did for one registration.
struct BtSimListenerCount {
    uint32_t handle; //  0  handle of the registration; 0 marks an unused record
    uint32_t pno; //  4
    uint32_t delivered; //  8  events posted
    uint32_t full; // 12  events lost because the listener's queue was full
    uint32_t gone; // 16  events lost because nobody owns the number
    uint32_t failed; // 20  events lost for any other reason
    uint32_t failed_in_a_row; // 24  since the last event that arrived
};
BT_ASSERT_SIZE(BtSimListenerCount, 28);

// "btsim_distributor": written by the event distributor; listeners[i] belongs to entry i of the listener table.
struct BtSimDistributor {
    uint32_t events; //  0  events taken
    uint32_t unwanted; //  4  events that no active listener asked for
    uint32_t deregistered; //  8  registrations removed because their process was gone
    uint32_t reserved; // 12  zero
    BtSimListenerCount listeners[50]; // 16
};
BT_ASSERT_SIZE(BtSimDistributor, 1416);

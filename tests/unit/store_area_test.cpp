#include "store_support.h"

#include <cstring>

using namespace store;
using Calls = std::vector<std::string>;

namespace {

const std::string kLink = "LinkShareData(" + std::string(kAreaName) + ")";
const std::string kCreate = "CreateSemaphore(" + std::string(kLockName) + ")";
const Calls kLocked = {"SemLock", "SemUnlock"};

Bytes sample_data()
{
    return device_list("AB") + order_list("A") + profile_orders(2, "BA") + id_list(id_entry('A', 5, 1));
}

template <auto Function>
int32_t call(At buffer, uint32_t lock_flag)
{
    return Function(buffer, lock_flag);
}

const struct Accessor {
    int32_t (*get)(At, uint32_t);
    int32_t (*set)(At, uint32_t);
    size_t at, size;
    bool writes_image;
} kAccessors[] = {
    {call<bt_con_getRegisteredDeviceListInfo>, call<bt_con_setRegisteredDeviceListInfo>, 0, 17344, true},
    {call<bt_con_getRegisteredDeviceListInfoNoFROMWrite>, call<bt_con_setRegisteredDeviceListInfoNoFROMWrite>, 0, 17344,
     false},
    {call<bt_con_getRegisteredOrderList>, call<bt_con_setRegisteredOrderList>, 17344, 140, true},
    {call<bt_con_getProfileConnectedOrderList>, call<bt_con_setProfileConnectedOrderList>, 17484, 1120, true},
    {call<bt_con_getRegisteredDeviceDIDInfoList>, call<bt_con_setRegisteredDeviceDIDInfoList>, 18604, 544, true},
    {call<bt_con_getSearchDevlist>, call<bt_con_setSearchDevlist>, 19148, 8580, false},
    {call<bt_con_getConnectSetVal>, call<bt_con_setConnectSetVal>, 27728, 16, false},
    {call<bt_con_getLinkLossConnectSetVal>, call<bt_con_setLinkLossConnectSetVal>, 27744, 32, false},
    {call<bt_con_getDiscoverableStatus>, call<bt_con_setDiscoverableStatus>, 27776, 4, false},
    {call<bt_con_getScanMode>, call<bt_con_setScanMode>, 27780, 4, false},
    {call<bt_con_getSimplepairingCapability>, call<bt_con_setSimplepairingCapability>, 27784, 8, false},
    {call<bt_con_getBluetoothSetVal>, call<bt_con_setBluetoothSetVal>, 27792, 4, false},
};

// An attached process whose area tells every byte from its neighbours.
Bytes attach_numbered()
{
    uint8_t* const area = attached_process();
    for (size_t i = 0; i < kAreaSize; ++i)
        area[i] = static_cast<uint8_t>(i * 7 + i / 256);
    return area_bytes();
}

Calls calls_of(const std::function<void()>& body)
{
    const auto before = static_cast<ptrdiff_t>(fake::calls().size());
    body();
    return {fake::calls().begin() + before, fake::calls().end()};
}

} // namespace

TEST(StoreAttach, FirstCallAttachesAndOnlyModeOneLoadsTheImage)
{
    const Bytes image = sample_data(), kept = default_data();
    const struct {
        uint32_t mode, failing; // number of the platform call
        int32_t result;
        Calls calls;
        const Bytes& data;
    } rows[] = {
        {0, 0, 0, {kLink, kCreate}, kept},
        {1, 0, 0, {kLink, kCreate, "SemLock", "SemUnlock"}, image},
        {2, 0, 0, {kLink, kCreate}, kept},
        {1, 1, fake::kLinkFailure, {kLink}, kept},
        {1, 2, -4, {kLink, kCreate}, kept},
        {1, 3, 0, {kLink, kCreate, "SemLock", "SemUnlock"}, kept}, // a failing load is not reported
    };
    for (const auto& row : rows) {
        SCOPED_TRACE("mode " + std::to_string(row.mode) + ", failing " + std::to_string(row.failing));
        uint8_t* const area = fresh_process();
        fake::write_file(kImagePath, image_of(image));
        fake::fail_nth(row.failing);
        EXPECT_EQ(bt_con_ApiInit(row.mode), row.result);
        EXPECT_EQ(fake::calls(), row.calls);
        EXPECT_EQ(fake::sizes_asked(), std::vector<uint32_t>{0});
        EXPECT_EQ(handle_area(), row.failing == 1 ? nullptr : area);
        EXPECT_EQ(handle_semaphore(), row.result == 0 ? fake::lock_handle(kLockName) : 0u);
        EXPECT_EQ(difference(area_bytes(), row.data + Bytes(kAreaSize - kPersistentSize, 0x5A)), "");
        EXPECT_EQ(fake::held_locks(), 0u);
    }
    EXPECT_EQ(static_cast<void*>(bt_con_getShareMemAccessPtr()), static_cast<void*>(&g_bt_con_share));
}

TEST(StoreAttach, LaterCallsOnlyConfirm)
{
    for (const uint32_t modes : {0u, 1u, 2u, 3u}) {
        fresh_process();
        fake::write_file(kImagePath, image_of(sample_data()));
        ASSERT_EQ(bt_con_ApiInit(modes & 1), 0);
        const Bytes before = area_bytes();
        fake::write_file(kImagePath, image_of(Bytes(kPersistentSize, 0x42)));
        EXPECT_EQ(calls_of([&] { EXPECT_EQ(bt_con_ApiInit(modes / 2), 0); }), Calls{});
        EXPECT_EQ(difference(area_bytes(), before), "");
    }
}

TEST(StoreAttach, WithoutSemaphoreNothingIsLockedUntilItCanBeCreated)
{
    fresh_process();
    fake::write_file(kImagePath, image_of(sample_data()));
    fake::fail_nth(2);
    EXPECT_EQ(bt_con_ApiInit(0), -4);
    EXPECT_EQ(calls_of([] { EXPECT_EQ(bt_con_semLock() | bt_con_semUnlock(), 0); }), Calls{});
    EXPECT_EQ(calls_of([] { EXPECT_EQ(bt_con_ApiInit(1), 0); }), (Calls{kCreate, "SemLock", "SemUnlock"}));
    EXPECT_EQ(difference(area_bytes(0, kPersistentSize), sample_data()), "");
}

TEST(StoreLock, PassesCodesOnAndReleasesAFailedLockOnce)
{
    attached_process();
    EXPECT_EQ(calls_of([] { EXPECT_EQ(bt_con_semLock(), 0); }), Calls{"SemLock"});
    EXPECT_EQ(calls_of([] { EXPECT_EQ(bt_con_semUnlock(), 0); }), Calls{"SemUnlock"});
    fake::fail_from(1);
    EXPECT_EQ(calls_of([] { EXPECT_EQ(bt_con_semLock(), fake::kLockFailure); }), kLocked);
    EXPECT_EQ(calls_of([] { EXPECT_EQ(bt_con_semUnlock(), fake::kUnlockFailure); }), Calls{"SemUnlock"});
}

TEST(StoreAccessors, GetCopiesExactlyItsField)
{
    for (const Accessor& row : kAccessors) {
        SCOPED_TRACE("field at " + std::to_string(row.at));
        const Bytes area = attach_numbered(), field = area_bytes(row.at, row.size);
        const auto get = [&](uint32_t flag, int32_t result, const Bytes& want) {
            uint8_t* const out = fake::guarded(static_cast<uint32_t>(row.size));
            EXPECT_EQ(row.get(out, flag), result);
            EXPECT_EQ(difference(Bytes(out, out + row.size), want), "");
            EXPECT_EQ(fake::held_locks(), 0u);
        };
        for (const uint32_t flag : {0u, 1u, 2u})
            EXPECT_EQ(calls_of([&] { get(flag, 0, field); }), flag == 1 ? kLocked : Calls{});
        EXPECT_EQ(row.get(nullptr, 0), -1);
        fake::fail_nth(1);
        get(1, -1, Bytes(row.size, 0xA5));
        fake::fail_nth(2);
        get(1, -1, field);
        set_handle(handle_semaphore(), nullptr);
        get(0, -1, Bytes(row.size, 0xA5));
        EXPECT_EQ(difference(area_bytes(), area), "");
    }
}

TEST(StoreAccessors, SetChangesExactlyItsFieldAndWritesTheImageOnChangeOnly)
{
    for (const Accessor& row : kAccessors)
        for (const uint32_t flag : {0u, 1u, 2u})
            for (const size_t changed : {size_t{0}, row.size - 1, row.size}) {
                SCOPED_TRACE("field at " + std::to_string(row.at) + ", byte " + std::to_string(changed));
                Bytes want = attach_numbered();
                uint8_t* const value = fake::guarded(static_cast<uint32_t>(row.size));
                std::memcpy(value, want.data() + row.at, row.size);
                const bool differs = changed < row.size;
                if (differs) want[row.at + changed] = value[changed] ^= 0x80;

                EXPECT_EQ(calls_of([&] { EXPECT_EQ(row.set(value, flag), 0); }),
                          differs && flag == 1 ? kLocked : Calls{});
                EXPECT_EQ(difference(area_bytes(), want), "");
                const bool writes = row.writes_image && differs;
                EXPECT_EQ(difference(*fake::read_file(kImagePath), writes ? image_of(want) : stale_image()), "");
            }
}

TEST(StoreAccessors, SetReportsEveryFailureAsMinusOneButThatOfTheImage)
{
    for (const Accessor& row : kAccessors) {
        SCOPED_TRACE("field at " + std::to_string(row.at));
        const Bytes area = attach_numbered(), value(row.size, 0xC3);
        const auto set = [&](const Bytes& bytes, uint32_t failing, int32_t result) {
            fake::fail_nth(failing);
            EXPECT_EQ(row.set(static_cast<uint8_t*>(Given(bytes)), 1), result);
        };
        EXPECT_EQ(row.set(nullptr, 1), -1);
        set(value, 1, -1);
        EXPECT_EQ(difference(area_bytes(), area), "");
        set(value, 2, -1);
        EXPECT_EQ(difference(area_bytes(row.at, row.size), value), "");
        EXPECT_EQ(difference(*fake::read_file(kImagePath), stale_image()), "");
        EXPECT_EQ(fake::held_locks(), 0u);
        EXPECT_EQ(fake::stray_unlocks(), 1u);

        fake::remove_file(kImagePath);
        set(Bytes(row.size, 0x3C), 0, 0);
        set_handle(handle_semaphore(), nullptr);
        set(value, 0, -1);
        EXPECT_EQ(area_bytes(row.at, row.size), Bytes(row.size, 0x3C));
    }
}

TEST(StoreGetterAndSetter, RefuseWhatTheyCannotCopyAndPassCodesOn)
{
    const Bytes area = attach_numbered();
    uint8_t *const field = handle_area() + kOrder, *const buffer = fake::guarded(140), *const none = nullptr;
    const struct {
        uint8_t *field, *buffer;
        uint32_t size;
        uint8_t* area;
    } refused[] = {{none, buffer, 4, handle_area()},
                   {field, none, 4, handle_area()},
                   {field, buffer, 0, handle_area()},
                   {field, buffer, 4, none}};
    for (const auto& row : refused) {
        set_handle(handle_semaphore(), row.area);
        EXPECT_EQ(bt_con_getter(row.field, row.buffer, row.size, 1), -1);
        EXPECT_EQ(bt_con_setter(row.field, row.buffer, row.size, 1, 1), -1);
    }
    EXPECT_EQ(difference(area_bytes(), area), "");

    set_handle(handle_semaphore(), fake::find_area(kAreaName));
    for (const uint32_t failing : {1u, 2u}) {
        const int32_t code = failing == 1 ? fake::kLockFailure : fake::kUnlockFailure;
        std::memset(buffer, 0xA5, 140);
        fake::fail_nth(failing);
        EXPECT_EQ(bt_con_getter(field, buffer, 140, 1), code);
        EXPECT_EQ(buffer[139], failing == 1 ? 0xA5 : area[kOrder + 139]);
        std::memset(buffer, 0x77, 140);
        fake::fail_nth(failing);
        EXPECT_EQ(bt_con_setter(field, buffer, 140, 1, 1), code);
        EXPECT_EQ(field[139], failing == 1 ? area[kOrder + 139] : 0x77);
        EXPECT_EQ(difference(*fake::read_file(kImagePath), stale_image()), "");
    }
    for (const uint32_t write_from : {0u, 2u, 1u}) {
        field[0] = 0;
        EXPECT_EQ(bt_con_setter(field, buffer, 140, write_from, 0), 0);
        EXPECT_EQ(field[0], 0x77);
        EXPECT_EQ(difference(*fake::read_file(kImagePath), write_from == 1 ? image_of(area_bytes()) : stale_image()),
                  "");
    }
}

TEST(StoreAddress, SixBytesCountAndPaddingStays)
{
    const struct {
        const char *a, *b;
        int32_t equal, valid; // whether a is an address
    } rows[] = {
        {"00*6 00 00", "00*6 01 02", 1, 1},
        {"FF*6 00 00", "FF*6 FF FF", 1, 0},
        {"FF*5 FE FF FF", "FF*6 FF FF", 0, 1},
        {"FE FF*5 FF FF", "FF*6 FF FF", 0, 1},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.a);
        const Given a(fake::hex(row.a)), b(fake::hex(row.b)), to(Bytes(8, 0x33));
        EXPECT_EQ(bt_con_IsCompBtDevAddress(a, b), row.equal);
        EXPECT_EQ(bt_con_IsValidBtDevAddress(a), row.valid);
        void* const start = to;
        EXPECT_EQ(static_cast<void*>(bt_con_copyBtDevAddress(to, a)), start);
        EXPECT_EQ(to.bytes(), Bytes(a.bytes().begin(), a.bytes().begin() + 6) + Bytes(2, 0x33));
        EXPECT_EQ(static_cast<void*>(bt_con_clearBtDevAddress(to)), start);
        EXPECT_EQ(to.bytes(), fake::hex("FF*6 33 33"));
    }
}

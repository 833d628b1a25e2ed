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

TEST(StoreAccessors, CopyExactlyTheirFieldAndWriteTheImageOnChangeOnly)
{
    for (const Accessor& accessor : kAccessors) {
        SCOPED_TRACE("field at " + std::to_string(accessor.at));
        Bytes usual(accessor.size);
        for (size_t i = 0; i < usual.size(); ++i)
            usual[i] = static_cast<uint8_t>(i * 7 + i / 256);
        Bytes first = usual, last = usual;
        first.front() ^= 0x80;
        last.back() ^= 0x80;
        std::vector<Row> rows;
        for (const uint32_t flag : {0u, 1u, 2u}) {
            const Locking locking = flag == 1 ? Locking::kAccessor : Locking::kNone;
            const std::string with = " with flag " + std::to_string(flag);
            const auto set = [&](const Bytes& after, Locking locks) {
                const Call call = [=](At) { return accessor.set(static_cast<void*>(Given(after)), flag); };
                rows.push_back(change("set" + with, usual, after, call, 0, locks));
                rows.back().writes_image = accessor.writes_image;
            };
            const Call get = [=](At out) { return accessor.get(out, flag); };
            rows.push_back(answer("get" + with, get, usual.size() < 8 ? usual + Bytes(4, 0xA5) : usual, 0, locking));
            rows.push_back(refused("get into null" + with, -1, nulled(get)));
            rows.push_back(refused("set null" + with, -1, [=](At) { return accessor.set(At(nullptr), flag); }));
            set(first, locking);
            set(last, locking);
            set(usual, Locking::kNone);
        }
        run_rows(rows, {accessor.at, accessor.size, usual, {}});
    }
}

TEST(StoreGetterAndSetter, PassCodesOnAndRefuseWhatTheyCannotCopy)
{
    const Bytes usual = order_list("AB"), other = order_list("BA");
    const auto get = [](size_t at, uint32_t size, uint32_t flag) -> Call {
        return [=](At out) { return bt_con_getter(fake::find_area(kAreaName) + at, out, size, flag); };
    };
    const auto set = [&](const Bytes& given, uint32_t size, uint32_t write_from, uint32_t flag) -> Call {
        return [=](At) {
            return bt_con_setter(fake::find_area(kAreaName) + kOrder, Given(given), size, write_from, flag);
        };
    };
    std::vector<Row> rows = {
        answer("get", get(kOrder, 140, 1), usual, 0, Locking::kGeneric),
        answer("get with flag 2", get(kOrder, 140, 2), usual),
        answer("get some", get(kOrder + 4, 8, 0), address('A') + Bytes(2, 0x70)),
        refused("get nothing", -1, get(kOrder, 0, 1)),
        refused("get into null", -1, nulled(get(kOrder, 140, 1))),
        refused("get from null", -1, [](At out) { return bt_con_getter(nullptr, out, 8, 1); }),
        refused("set nothing", -1, set(other, 0, 1, 1)),
        refused("set null", -1, set({}, 140, 1, 1)),
        refused("set in null", -1, [](At) { return bt_con_setter(nullptr, Given(Bytes(8)), 8, 1, 1); }),
        change("set", usual, other, set(other, 140, 1, 1), 0, Locking::kGeneric),
        change("set with flag 2", usual, other, set(other, 140, 1, 2), 0, Locking::kNone),
    };
    for (const uint32_t write_from : {0u, 2u}) {
        rows.push_back(
            change("set for the area alone", usual, other, set(other, 140, write_from, 1), 0, Locking::kGeneric));
        rows.back().writes_image = false;
    }
    run_rows(rows, {kOrder, 140, usual, {}});

    attached_process();
    fake::remove_file(kImagePath); // an image that cannot be written is not reported
    EXPECT_EQ(bt_con_setRegisteredOrderList(Given(other), 1), 0);
    EXPECT_EQ(difference(area_bytes(kOrder, 140), other), "");
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

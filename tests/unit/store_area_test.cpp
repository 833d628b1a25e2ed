// The connection data area: attaching, its lock, the field accessors and what they are made of.
#include "store_support.h"

#include <cstring>

using namespace store;
using Calls = std::vector<std::string>;

namespace {

const std::string kLink = "LinkShareData(" + std::string(kAreaName) + ")";
const std::string kCreate = "CreateSemaphore(" + std::string(kLockName) + ")";

template <auto Function>
int32_t call(At buffer, uint32_t lock_flag)
{
    return Function(buffer, lock_flag);
}
#define ACCESSORS(name) call<bt_con_get##name>, call<bt_con_set##name>

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
        EXPECT_EQ(static_cast<void*>(g_bt_con_share.area), row.failing == 1 ? nullptr : area);
        EXPECT_EQ(g_bt_con_share.semaphore, row.result == 0 ? fake::lock_handle(kLockName) : 0u);
        EXPECT_EQ(difference(area_bytes(), row.data + Bytes(kAreaSize - kPersistentSize, 0x5A)), "");
        EXPECT_EQ(fake::held_locks(), 0u);

        if (row.result != 0) continue; // what is attached is only confirmed
        fake::write_file(kImagePath, image_of(Bytes(kPersistentSize, 0x42)));
        EXPECT_EQ(calls_of([] { EXPECT_EQ(bt_con_ApiInit(1), 0); }), Calls{});
        EXPECT_EQ(difference(area_bytes(0, kPersistentSize), row.data), "");
    }
    EXPECT_EQ(bt_con_getShareMemAccessPtr(), &g_bt_con_share);
}

TEST(StoreAttach, WithoutSemaphoreNothingIsLockedUntilItCanBeCreated)
{
    fresh_process();
    fake::write_file(kImagePath, image_of(sample_data()));
    fake::fail_nth(2);
    EXPECT_EQ(bt_con_ApiInit(0), -4);
    const auto lock = [] { EXPECT_EQ(bt_con_semLock() | bt_con_semUnlock(), 0); };
    EXPECT_EQ(calls_of(lock), Calls{});
    EXPECT_EQ(calls_of([] { EXPECT_EQ(bt_con_ApiInit(1), 0); }), (Calls{kCreate, "SemLock", "SemUnlock"}));
    EXPECT_EQ(calls_of(lock), (Calls{"SemLock", "SemUnlock"}));
    EXPECT_EQ(difference(area_bytes(0, kPersistentSize), sample_data()), "");
}

TEST(StoreAccessors, CopyExactlyTheirFieldAndWriteTheImageOnChangeOnly)
{
    const struct {
        int32_t (*get)(At, uint32_t);
        int32_t (*set)(At, uint32_t);
        size_t at, size;
        bool writes_image;
    } accessors[] = {
        {ACCESSORS(RegisteredDeviceListInfo), 0, 17344, true},
        {ACCESSORS(RegisteredDeviceListInfoNoFROMWrite), 0, 17344, false},
        {ACCESSORS(RegisteredOrderList), 17344, 140, true},
        {ACCESSORS(ProfileConnectedOrderList), 17484, 1120, true},
        {ACCESSORS(RegisteredDeviceDIDInfoList), 18604, 544, true},
        {ACCESSORS(SearchDevlist), 19148, 8580, false},
        {ACCESSORS(ConnectSetVal), 27728, 16, false},
        {ACCESSORS(LinkLossConnectSetVal), 27744, 32, false},
        {ACCESSORS(DiscoverableStatus), 27776, 4, false},
        {ACCESSORS(ScanMode), 27780, 4, false},
        {ACCESSORS(SimplepairingCapability), 27784, 8, false},
        {ACCESSORS(BluetoothSetVal), 27792, 4, false},
    };
    for (const auto& accessor : accessors) {
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
            const Bytes got = usual.size() < 8 ? usual + Bytes(4, 0xA5) : usual;
            rows.push_back(answer(CALL(accessor.get(out, flag)), got, 0, locking));
            rows.push_back(refused(-1, CALL(accessor.get(nullptr, flag))));
            rows.push_back(refused(-1, CALL(accessor.set(nullptr, flag))));
            for (const Bytes& after : {first, last, usual}) {
                const Operation set = CALL(accessor.set(static_cast<void*>(Given(after)), flag));
                rows.push_back(change(set, usual, after, 0, after == usual ? Locking::kNone : locking));
                rows.back().writes_image = accessor.writes_image;
            }
        }
        run_rows({accessor.at, accessor.size, usual}, rows);
    }
}

TEST(StoreGetterAndSetter, PassCodesOnAndRefuseWhatTheyCannotCopy)
{
    const Bytes usual = order_list("AB"), other = order_list("BA");
    const auto order = [] { return fake::find_area(kAreaName) + kOrder; };
    const auto set = [=](uint32_t write_from, uint32_t flag, Locking locking) {
        return change(CALL(bt_con_setter(order(), Given(other), 140, write_from, flag)), usual, other, 0, locking);
    };
    run_rows({kOrder, 140, usual},
             {answer(CALL(bt_con_getter(order(), out, 140, 1)), usual, 0, Locking::kGeneric),
              answer(CALL(bt_con_getter(order(), out, 140, 2)), usual),
              answer(CALL(bt_con_getter(order() + 4, out, 8, 0)), address('A') + Bytes(2, 0x70)),
              refused(-1, CALL(bt_con_getter(order(), out, 0, 1))),
              refused(-1, CALL(bt_con_getter(order(), nullptr, 140, 1))),
              refused(-1, CALL(bt_con_getter(nullptr, out, 8, 1))),
              refused(-1, CALL(bt_con_setter(order(), Given(other), 0, 1, 1))),
              refused(-1, CALL(bt_con_setter(order(), nullptr, 140, 1, 1))),
              refused(-1, CALL(bt_con_setter(nullptr, Given(Bytes(8)), 8, 1, 1))), set(1, 1, Locking::kGeneric),
              set(1, 2, Locking::kNone), set(0, 1, Locking::kGeneric).unwritten(),
              set(2, 1, Locking::kGeneric).unwritten()});

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
    } rows[] = {{"00*6 00 00", "00*6 01 02", 1, 1},
                {"FF*6 00 00", "FF*6 FF FF", 1, 0},
                {"FF*5 FE FF FF", "FF*6 FF FF", 0, 1},
                {"FE FF*5 FF FF", "FF*6 FF FF", 0, 1}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.a);
        const Given a(fake::hex(row.a)), b(fake::hex(row.b)), to(Bytes(8, 0x33));
        EXPECT_EQ(bt_con_IsCompBtDevAddress(a, b), row.equal);
        EXPECT_EQ(bt_con_IsValidBtDevAddress(a), row.valid);
        BtDevAddress* const start = to;
        EXPECT_EQ(bt_con_copyBtDevAddress(to, a), start);
        EXPECT_EQ(to.bytes(), Bytes(a.bytes().begin(), a.bytes().begin() + 6) + Bytes(2, 0x33));
        EXPECT_EQ(bt_con_clearBtDevAddress(to), start);
        EXPECT_EQ(to.bytes(), fake::hex("FF*6 33 33"));
    }
}

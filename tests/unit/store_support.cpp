#include "store_support.h"

#include <algorithm>
#include <cstring>

namespace store {

Bytes words(std::initializer_list<uint32_t> values)
{
    Bytes bytes(4 * values.size());
    std::memcpy(bytes.data(), values.begin(), bytes.size());
    return bytes;
}

Bytes word(uint32_t value)
{
    return words({value}) + Bytes(4, 0xA5);
}

Bytes operator+(Bytes left, const Bytes& right)
{
    left.insert(left.end(), right.begin(), right.end());
    return left;
}

void put(Bytes& bytes, size_t at, const Bytes& part)
{
    std::copy(part.begin(), part.end(), bytes.begin() + static_cast<ptrdiff_t>(at));
}

Bytes with_count(int32_t count, Bytes list)
{
    put(list, 0, words({static_cast<uint32_t>(count)}));
    return list;
}

std::string difference(const Bytes& got, const Bytes& want)
{
    if (got.size() != want.size()) return std::to_string(got.size()) + " bytes, not " + std::to_string(want.size());
    const auto at = std::mismatch(got.begin(), got.end(), want.begin());
    if (at.first == got.end()) return "";
    const auto some = [](auto from, auto end) {
        return fake::to_hex({from, from + std::min<ptrdiff_t>(16, end - from)});
    };
    return "byte " + std::to_string(at.first - got.begin()) + ": " + some(at.first, got.end()) + "not " +
           some(at.second, want.end());
}

Bytes address(char letter)
{
    if (letter == '-' || letter == '0') return Bytes(6, letter == '-' ? 0xFF : 0x00);
    return {static_cast<uint8_t>(letter), 0x10, 0x20, 0x30, 0x40, 0x50};
}

Given dev(const std::string& letters)
{
    Bytes slots;
    for (const char letter : letters)
        if (letter != '?') slots = slots + address(letter) + Bytes{0xEE, 0xEF};
    return Given(slots);
}

Bytes device_record(char letter)
{
    return Bytes(256, static_cast<uint8_t>(letter)) + address(letter) + Bytes(746, static_cast<uint8_t>(letter));
}

Bytes device_list(const std::string& letters)
{
    const Bytes empty = fake::hex("03 00*255 FF*6 00*114 07 00*3 07 00*3 07 00*3 00*64 03 00*555");
    Bytes list = words({static_cast<uint32_t>(letters.size())});
    for (size_t slot = 0; slot < 17; ++slot)
        list = list + (slot < letters.size() ? device_record(letters[slot]) : empty);
    for (const uint32_t word : {0x100u, 0x200u, 0x300u})
        for (size_t slot = 0; slot < 17; ++slot)
            list = list + words({slot < letters.size() ? word + static_cast<uint8_t>(letters[slot]) : 0});
    return list;
}

Bytes order_list(const std::string& letters, bool padded)
{
    Bytes list = words({static_cast<uint32_t>(letters.size())});
    for (size_t slot = 0; slot < 17; ++slot) {
        const auto padding = static_cast<uint8_t>(padded ? 0x70 + slot : 0);
        list = list + address(slot < letters.size() ? letters[slot] : '-') + Bytes(2, padding);
    }
    return list;
}

Bytes profile_orders(size_t profile, const std::string& letters, bool padded)
{
    Bytes lists;
    for (size_t i = 0; i < 8; ++i)
        lists = lists + order_list(i == profile ? letters : std::string(1, static_cast<char>('a' + i)), padded);
    return lists;
}

Bytes id_entry(char letter, uint32_t key, uint8_t value, uint32_t key2, uint8_t value2)
{
    return dev(std::string(1, letter)).bytes() + words({key}) + Bytes(8, value) + words({key2}) + Bytes(8, value2);
}

Bytes id_list(Bytes entries)
{
    while (entries.size() < 544)
        entries = entries + fake::hex("FF*6 00*26");
    return entries;
}

Bytes device_info(char letter, uint8_t fill)
{
    return Bytes(256, fill) + dev(std::string(1, letter)).bytes() + Bytes(4, fill);
}

Bytes search_list(const Bytes& infos)
{
    Bytes list = words({static_cast<uint32_t>(infos.size() / 268)}) + infos;
    for (size_t at = 4; at < list.size(); at += 268)
        put(list, at + 262, {0, 0});
    while (list.size() < 8580)
        list = list + fake::hex("00*256 FF*6 00*6");
    return list;
}

Bytes sample_data()
{
    return device_list("PQR") + order_list("QP") + profile_orders(7, "RPQ") + id_list(id_entry('R', 9, 2));
}

const Bytes& default_data()
{
    static const Bytes data = [] {
        Bytes lists = device_list("");
        for (int list = 0; list < 9; ++list)
            lists = lists + order_list("", false);
        return lists + id_list({});
    }();
    return data;
}

Bytes image_of(const Bytes& data, uint8_t init_request)
{
    uint32_t sum = 0;
    for (size_t i = 0; i < kPersistentSize; ++i)
        sum += data[i];
    return Bytes{'B', 'T', 'C', 'N', 0, init_request, 0, 0} + words({sum}) +
           Bytes(data.begin(), data.begin() + kPersistentSize);
}

const Bytes& stale_image()
{
    static const Bytes image(kImageSize, 0xEE);
    return image;
}

uint8_t* fresh_process(const Bytes& data)
{
    fake::reset();
    g_bt_con_share = {};
    uint8_t* const area = fake::area(kAreaName, kAreaSize, 0x5A);
    std::memcpy(area, data.data(), data.size());
    fake::remove_file(kImagePath); // a new file costs no flush, rewriting the old one does
    fake::write_file(kImagePath, stale_image());
    return area;
}

uint8_t* attached_process(const Bytes& data)
{
    uint8_t* const area = fresh_process(data);
    EXPECT_EQ(bt_con_ApiInit(0), 0);
    return area;
}

Bytes area_bytes(size_t at, size_t size)
{
    const uint8_t* const from = fake::find_area(kAreaName) + at;
    return Bytes(from, from + size);
}

Row change(Operation operation, Bytes before, Bytes after, int32_t result, Locking locking)
{
    return {std::move(operation), result, locking, std::move(before), std::move(after)};
}

Row answer(Operation operation, Bytes out, int32_t result, Locking locking, Bytes out_failed)
{
    return {std::move(operation), result, locking, {}, {}, std::move(out), std::move(out_failed)};
}

Row refused(int32_t result, Operation operation, Locking locking)
{
    return {std::move(operation), result, locking};
}

namespace {

using Spoil = std::function<void(uint8_t* area)>;

class Runner {
public:
    Runner(const Field& field, const Row& row)
        : row_(row), field_(field), old_(default_data() + Bytes(kAreaSize - kPersistentSize, 0x5A))
    {
        put(old_, field.at, row.before.empty() ? field.usual : row.before);
        new_ = old_;
        put(new_, field.at, row.after);
        writes_image_ = row.writes_image && !std::equal(new_.begin(), new_.begin() + kPersistentSize, old_.begin());
    }

    void run()
    {
        SCOPED_TRACE(row_.operation.what);
        perform();
        EXPECT_EQ(result_, row_.result);
        EXPECT_EQ(std::count(calls_.begin(), calls_.end(), "SemLock"), row_.locking == Locking::kNone ? 0 : 1);
        EXPECT_EQ(fake::stray_unlocks(), 0u);
        expect_new(writes_image_);
        sweep(fake::fail_nth);
        sweep(fake::fail_from);
        hostile();
        if (field_.attached) detached();
    }

private:
    // One run of the operation; `spoil` comes right before it.
    void perform(const Spoil& spoil = [](uint8_t*) {})
    {
        uint8_t* const area = field_.attached ? attached_process() : fresh_process();
        std::copy(old_.begin(), old_.end(), area);
        const size_t size = std::max<size_t>(row_.out.size(), 8);
        uint8_t* const out = fake::guarded(static_cast<uint32_t>(size));
        const auto calls_before = static_cast<ptrdiff_t>(fake::calls().size());
        spoil(area);

        result_ = row_.operation.call(out);

        EXPECT_EQ(fake::held_locks(), 0u);
        EXPECT_LE(fake::deepest_lock(), 1u);
        area_ = area_bytes();
        out_.assign(out, out + size);
        calls_.assign(fake::calls().begin() + calls_before, fake::calls().end());
    }

    void expect_left(const Bytes& area, const Bytes& out, const Bytes& image)
    {
        EXPECT_EQ(difference(area_, area), "");
        EXPECT_EQ(difference(out_, out.empty() ? Bytes(out_.size(), 0xA5) : out), "");
        EXPECT_EQ(difference(*fake::read_file(kImagePath), image), "");
    }
    void expect_old() { expect_left(old_, row_.out_failed, stale_image()); }
    void expect_new(bool image) { expect_left(new_, row_.out, image ? image_of(new_) : stale_image()); }

    int32_t code_of_failure(const std::string& call) const
    {
        const Locking locking = row_.locking;
        if (call == "SemUnlock") {
            if (locking == Locking::kAccessor) return -1;
            if (locking == Locking::kUnlockSpoils) return fake::kUnlockFailure;
            const bool ignored = locking == Locking::kUnlockIgnored || locking == Locking::kNumber;
            return ignored || row_.result != 0 ? row_.result : fake::kUnlockFailure;
        }
        if (locking == Locking::kNumber) return 0;
        if (call == "SemLock") return locking == Locking::kAccessor ? -1 : fake::kLockFailure;
        return call == std::string("LinkShareData(") + kAreaName + ")" ? fake::kLinkFailure : -4;
    }

    // Fails only the nth platform call, or that one and all behind it, until none is left to fail.
    void sweep(void (*fail)(uint32_t))
    {
        for (uint32_t n = 1; n < 9; ++n) {
            perform([=](uint8_t*) { fail(n); });
            if (fake::counted_calls() < n) return;
            const std::string& failed = calls_[n - 1];
            SCOPED_TRACE("failing call " + std::to_string(n) + ", " + failed);
            EXPECT_EQ(result_, code_of_failure(failed));
            EXPECT_EQ(fake::stray_unlocks(), failed == "SemLock" ? 1u : 0u);
            if (failed == "SemUnlock" && row_.locking != Locking::kUnlockSpoils)
                expect_new(writes_image_ && row_.locking < Locking::kGeneric);
            else
                expect_old();
        }
        ADD_FAILURE() << "no end of platform calls";
    }

    // Whatever the memory holds, nothing but the own field changes and a stored count is a possible one.
    void hostile()
    {
        for (const auto& [at, capacity] : field_.counts)
            for (const int32_t value : {0, capacity, capacity + 1, -1, INT32_MIN, INT32_MAX}) {
                SCOPED_TRACE("count " + std::to_string(value) + " at " + std::to_string(at));
                spoiled([&, place = at](uint8_t* area) { std::memcpy(area + place, &value, 4); });
                int32_t left = 0;
                std::memcpy(&left, area_.data() + at, 4);
                EXPECT_TRUE(left == value || (left >= 0 && left <= capacity)) << "left as " << left;
            }
        for (const int fill : {0x00, 0x7F, 0x80, 0xFF})
            spoiled([=](uint8_t* area) { std::memset(area, fill, kAreaSize); });
    }

    void spoiled(const Spoil& spoil)
    {
        Bytes before;
        perform([&](uint8_t* area) {
            spoil(area);
            before = area_bytes();
        });
        EXPECT_EQ(fake::stray_unlocks(), 0u);
        std::memcpy(before.data() + field_.at, area_.data() + field_.at, field_.owned);
        EXPECT_EQ(difference(area_, before), "");
    }

    // Without a semaphore an operation runs unguarded, without the area it fails; bad arguments are told before that.
    void detached()
    {
        perform([](uint8_t*) { g_bt_con_share.semaphore = 0; });
        EXPECT_EQ(result_, row_.result);
        EXPECT_TRUE(calls_.empty());
        expect_new(writes_image_);
        perform([](uint8_t*) { g_bt_con_share.area = nullptr; });
        EXPECT_EQ(result_, row_.result == -2 && row_.locking == Locking::kNone ? -2 : -1);
        if (row_.result == 0) expect_old();
    }

    const Row& row_;
    const Field& field_;
    bool writes_image_;
    int32_t result_ = 0;
    Bytes old_, new_, area_, out_;
    std::vector<std::string> calls_;
};

} // namespace

void run_rows(const Field& field, const std::vector<Row>& rows)
{
    for (const Row& row : rows)
        Runner(field, row).run();
}

} // namespace store

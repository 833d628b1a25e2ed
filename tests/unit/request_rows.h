// Rows of requests: how each is called and what it posts, or that it is refused, with one body that runs any row.
#pragma once

#include "catalogue/decode.h"
#include "fake_platform.h"

#include <bt_service/bt_log.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <functional>
#include <set>
#include <string>
#include <tuple>
#include <type_traits>
#include <vector>

// The rows of a test, for the fixture below. Strings are the bytes behind a pointer, or those of a record by value.
#define POSTS(function, ...) posts(#function, function, __VA_ARGS__)
#define REFUSES(result, ...) refuses(#__VA_ARGS__, result, requests::call(__VA_ARGS__))

namespace requests {

// Heap calls that the library makes, the platform's own left out; 0 where a sanitizer has the heap.
uint32_t heap_calls_of(const std::function<void()>& body);

inline bool opens_files = false; // what the rows call, which takes heap

inline void refuse_log(const char*, const char* format, ...)
{
    ADD_FAILURE() << format;
}

template <class Body>
int32_t without_heap_or_log(const Body& body)
{
    int32_t result = 0;
    BT_CMN_logout_wrapperFunc = refuse_log;
    EXPECT_TRUE(heap_calls_of([&] { result = body(); }) == 0 || opens_files);
    BT_CMN_logout_wrapperFunc = _BT_CMN_logout_Stub;
    return result;
}

// Memory of the caller for a parameter of any pointer type: exactly these bytes, the next one faults. Made anew by
// every call, since a row runs several times.
class Given {
public:
    Given(std::nullptr_t) : null_(true) {}
    Given(const std::string& hex) : bytes_(fake::hex(hex)) {}
    template <class T>
    operator T*() const
    {
        if (null_) return nullptr;
        uint8_t* const memory = fake::guarded(static_cast<uint32_t>(bytes_.size()));
        if (!bytes_.empty()) std::memcpy(memory, bytes_.data(), bytes_.size());
        return static_cast<T*>(static_cast<void*>(memory));
    }
    template <class Record>
    Record record() const
    {
        Record record{};
        EXPECT_EQ(bytes_.size(), sizeof record);
        std::memcpy(&record, bytes_.data(), std::min(bytes_.size(), sizeof record));
        return record;
    }

private:
    fake::Bytes bytes_;
    bool null_ = false;
};

constexpr const char* kUnreadable = ""; // a pointer that must not be read at all

using Call = std::function<int32_t()>;

template <class Parameter, class Argument>
Parameter as(const Argument& argument)
{
    if constexpr (std::is_integral_v<Parameter>)
        return static_cast<Parameter>(argument);
    else if constexpr (std::is_pointer_v<Parameter>)
        return Given(argument);
    else
        return Given(argument).template record<Parameter>();
}

template <class... Parameters, class... Arguments>
Call call(int32_t (*function)(Parameters...), Arguments... arguments)
{
    return [=] {
        const std::tuple<Parameters...> parameters{as<Parameters>(arguments)...};
        return without_heap_or_log([&] { return std::apply(function, parameters); });
    };
}

// What a request answers when the platform answers 0, -1, 2, 0x10000, 0x10001 and -2 to the post.
using Results = int32_t[6];
constexpr Results kPosted = {0, -1, 2, 0x10000, 0x10001, -2};
constexpr Results kPassedThrough = {0, -127, 2, 0x10000, 0x10001, -2};

struct Channel {
    uint16_t pno;
    uint16_t alternative_pno;
    size_t message_size; // 0: as long as header and payload
    const Results* results;
    uint16_t source_pno = 0xFF02;
    std::vector<std::string> platform_calls = {}; // made before the post, or though there is none
    std::function<void()> before = [] {}; // what a request finds
};

struct Row {
    const char* name; // exported function
    uint16_t id;
    std::string payload;
    Call call;
};

inline fake::Bytes message_of(const Channel& channel, const Row& row)
{
    const fake::Bytes payload = fake::hex(row.payload);
    const auto length = static_cast<uint16_t>(payload.size());
    const uint16_t header[8] = {0, 0, channel.source_pno, channel.alternative_pno, row.id, length, 0, 0};
    fake::Bytes message(sizeof header);
    std::memcpy(message.data(), header, sizeof header);
    message.insert(message.end(), payload.begin(), payload.end());
    if (channel.message_size != 0) message.resize(channel.message_size, 0);
    return message;
}

class RequestRows : public testing::Test {
protected:
    template <class Function, class... Arguments>
    void posts(const char* name, Function function, uint16_t id, const std::string& payload, Arguments... arguments)
    {
        SCOPED_TRACE(std::string(name) + " " + payload.substr(0, 100));
        const Row row = {name, id, payload, call(function, arguments...)};
        std::vector<std::string> calls = channel.platform_calls;
        calls.push_back("SndMsg");
        for (size_t i = 0; i < std::size(kPosted); ++i) {
            fake::reset();
            channel.before();
            fake::answer_send(kPosted[i]);
            EXPECT_EQ(row.call(), (*channel.results)[i]) << kPosted[i];
            EXPECT_EQ(fake::calls(), calls);
            EXPECT_TRUE(fake::logs().empty());
            ASSERT_EQ(fake::posts().size(), 1u);
            EXPECT_EQ(fake::posts()[0].pno, channel.pno);
            EXPECT_EQ(fake::posts()[0].zero, 0u);
            EXPECT_EQ(fake::to_hex(fake::posts()[0].message), fake::to_hex(message_of(channel, row)));
        }
        posted_.insert(name);
        const bt::catalogue::Row* const entry = bt::catalogue::find_request(name);
        ASSERT_NE(entry, nullptr);
        EXPECT_EQ(entry->id, id);
        EXPECT_EQ(entry->process, channel.pno);
        const fake::Bytes bytes = fake::hex(payload);
        const bt::catalogue::Decoded decoded = bt::catalogue::decode_by(*entry, bytes.data(), bytes.size());
        EXPECT_EQ(decoded.values.size(), entry->layout.size());
        EXPECT_TRUE(!decoded.truncated && decoded.extra.empty());
    }

    void refuses(const char* text, int32_t result, const Call& call)
    {
        ++refused_;
        fake::reset();
        channel.before();
        SCOPED_TRACE(testing::Message() << "refusal " << refused_ << " of the test: " << text);
        EXPECT_EQ(call(), result);
        EXPECT_EQ(fake::calls(), channel.platform_calls);
    }

    // A test that has rows which post has one for every request that the catalogue has for the channel.
    void TearDown() override
    {
        for (const bt::catalogue::Row& entry : bt::catalogue::requests())
            EXPECT_TRUE(posted_.empty() || entry.process != channel.pno || posted_.count(entry.name)) << entry.name;
    }

    Channel channel{};

private:
    std::set<std::string> posted_;
    int refused_ = 0;
};

// What a query writes to an output of `size` bytes; empty when it leaves the output untouched.
inline fake::Bytes output_of(uint32_t size, const std::function<int32_t(void*)>& query, int32_t result)
{
    uint8_t* const out = fake::guarded(size, 0xA5);
    EXPECT_EQ(without_heap_or_log([&] { return query(out); }), result);
    const fake::Bytes written(out, out + size);
    return written == fake::Bytes(size, 0xA5) ? fake::Bytes() : written;
}

} // namespace requests

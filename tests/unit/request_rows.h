// Rows of requests: how each is called and what it posts, with one body that runs every row of a profile.
#pragma once

#include "catalogue/decode.h"
#include "fake_platform.h"

#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <set>
#include <string>
#include <type_traits>
#include <vector>

namespace requests {

// Memory of the caller for a parameter of any pointer type: exactly these bytes, the next one faults. Made anew by
// every call, since a row runs several times. Without bytes it is a pointer that must not be read at all.
class Given {
public:
    Given(const std::string& hex) : bytes_(fake::hex(hex)) {}
    template <class T>
    operator T*() const
    {
        uint8_t* const memory = fake::guarded(static_cast<uint32_t>(bytes_.size()));
        if (!bytes_.empty()) std::memcpy(memory, bytes_.data(), bytes_.size());
        return static_cast<T*>(static_cast<void*>(memory));
    }

private:
    fake::Bytes bytes_;
};

inline const Given kUnreadable{""};

using Call = std::function<int32_t()>;

// Integers are the parameter's whatever they are written as; everything else converts itself.
template <class Parameter, class Argument>
Parameter as(const Argument& argument)
{
    if constexpr (std::is_integral_v<Parameter>)
        return static_cast<Parameter>(argument);
    else
        return argument;
}

template <class... Parameters, class... Arguments>
Call call(int32_t (*function)(Parameters...), Arguments... arguments)
{
    return [=] { return function(as<Parameters>(arguments)...); };
}

// What a request answers when the platform answers 0, -1, 2, 0x10000 and 0x10001 to the post.
using Results = int32_t[5];
constexpr Results kPosted = {0, -1, 2, 0x10000, 0x10001};
constexpr Results kPassedThrough = {0, -127, 2, 0x10000, 0x10001};

struct Channel {
    uint16_t pno;
    uint16_t alternative_pno;
    size_t message_size; // 0: as long as header and payload
    const Results* results;
};

struct Row {
    const char* name; // exported function
    uint16_t id;
    std::string payload;
    Call call;
    uint16_t source_pno = 0xFF02;
    const Results* results = nullptr; // where they differ from those of the channel
    std::string platform_call = ""; // made before the post
};

struct Refusal {
    const char* what;
    int32_t result;
    Call call;
    std::string platform_call = ""; // made all the same
};

inline std::vector<std::string> calls_of(const std::string& first, bool posts)
{
    std::vector<std::string> calls;
    if (!first.empty()) calls.push_back(first);
    if (posts) calls.push_back("SndMsg");
    return calls;
}

inline fake::Bytes message_of(const Channel& channel, const Row& row)
{
    const fake::Bytes payload = fake::hex(row.payload);
    fake::Bytes message(16, 0);
    const auto put = [&message](size_t at, size_t value) {
        message[at] = static_cast<uint8_t>(value);
        message[at + 1] = static_cast<uint8_t>(value >> 8);
    };
    put(4, row.source_pno);
    put(6, channel.alternative_pno);
    put(8, row.id);
    put(10, payload.size());
    message.insert(message.end(), payload.begin(), payload.end());
    if (channel.message_size != 0) message.resize(channel.message_size, 0);
    return message;
}

inline void expect_catalogued(const Channel& channel, const Row& row)
{
    const bt::catalogue::Row* const entry = bt::catalogue::find_request(row.name);
    ASSERT_NE(entry, nullptr);
    EXPECT_EQ(entry->id, row.id);
    EXPECT_EQ(entry->process, channel.pno);
    const fake::Bytes payload = fake::hex(row.payload);
    const bt::catalogue::Decoded decoded = bt::catalogue::decode_by(*entry, payload.data(), payload.size());
    EXPECT_EQ(decoded.values.size(), entry->layout.size());
    EXPECT_FALSE(decoded.truncated);
    EXPECT_TRUE(decoded.extra.empty());
}

inline void run(const Channel& channel, const Row& row)
{
    SCOPED_TRACE(std::string(row.name) + " " + row.payload.substr(0, 100));
    const fake::Bytes message = message_of(channel, row);
    for (size_t i = 0; i < std::size(kPosted); ++i) {
        fake::reset();
        fake::answer_send(kPosted[i]);
        EXPECT_EQ(row.call(), (row.results != nullptr ? *row.results : *channel.results)[i]) << kPosted[i];
        EXPECT_EQ(fake::calls(), calls_of(row.platform_call, true));
        EXPECT_TRUE(fake::logs().empty());
        ASSERT_EQ(fake::posts().size(), 1u);
        EXPECT_EQ(fake::posts()[0].pno, channel.pno);
        EXPECT_EQ(fake::posts()[0].zero, 0u);
        EXPECT_EQ(fake::to_hex(fake::posts()[0].message), fake::to_hex(message));
    }
    expect_catalogued(channel, row);
}

// Runs the rows; they must name every request that the catalogue has for the channel.
inline void run_all(const Channel& channel, const std::vector<Row>& rows)
{
    std::set<std::string> tested, catalogued;
    for (const Row& row : rows) {
        run(channel, row);
        tested.insert(row.name);
    }
    for (const bt::catalogue::Row& entry : bt::catalogue::requests())
        if (entry.process == channel.pno) catalogued.insert(entry.name);
    EXPECT_EQ(tested, catalogued);
}

inline void refuse_all(const std::vector<Refusal>& refusals)
{
    for (const Refusal& refusal : refusals) {
        fake::reset();
        EXPECT_EQ(refusal.call(), refusal.result) << refusal.what;
        EXPECT_EQ(fake::calls(), calls_of(refusal.platform_call, false)) << refusal.what;
    }
}

// Adds a refusal for each value of a family; `make` gives the call for one.
template <class Values = std::initializer_list<uint32_t>, class Make>
void refuse_each(std::vector<Refusal>& refusals, const char* what, int32_t result, const Values& values, Make make)
{
    for (const auto& value : values)
        refusals.push_back({what, result, make(value)});
}

// What a query writes to an output of `size` bytes; empty when it leaves the output untouched.
inline fake::Bytes output_of(uint32_t size, const std::function<int32_t(void*)>& query, int32_t result)
{
    uint8_t* const out = fake::guarded(size, 0xA5);
    EXPECT_EQ(query(out), result);
    const fake::Bytes written(out, out + size);
    return written == fake::Bytes(size, 0xA5) ? fake::Bytes() : written;
}

} // namespace requests

// Integers to and from bytes, byte by byte.
#include "hex_digits.h"
#include "log_line.h"

#include <bt_service/bt_byte_order.h>

namespace bt::cmn {
namespace {

constexpr int kLong = 4;
constexpr int kShort = 2;

enum class Order { kBig, kLittle };

// How far the byte at a place of the sequence is shifted in the value.
int shift_at(int place, int width, Order order)
{
    return 8 * (order == Order::kBig ? width - 1 - place : place);
}

// The written bytes in hex; they are spelled out only when somebody is going to read them.
void log_written(const char* function, const uint8_t* bytes, int count)
{
    char text[2 * kLong + 1] = "";
    if (BT_CMN_logout_wrapperFunc != _BT_CMN_logout_Stub && bytes != nullptr) {
        char* at = text;
        for (int i = 0; i < count; ++i)
            at = put_hex(at, bytes[i], kLowerDigits);
    }
    CMN_LOG("[API][END] %s (%s)", function, text);
}

void write_bytes(const char* function, int line, uint32_t value, int width, Order order, uint8_t* output)
{
    CMN_LOG("[API][START] %s", function);
    if (output == nullptr) {
        CMN_LOG(CMN_AT "param err. output = %p ", kApiSource, function, line, static_cast<void*>(output));
    } else {
        for (int i = 0; i < width; ++i)
            output[i] = static_cast<uint8_t>(value >> shift_at(i, width, order));
    }
    log_written(function, output, width);
}

uint32_t read_bytes(const char* function, int line, const uint8_t* input, int width, Order order)
{
    CMN_LOG("[API][START] %s", function);
    uint32_t value = 0;
    if (input == nullptr) {
        CMN_LOG(CMN_AT "param err. input = %p ", kApiSource, function, line, static_cast<const void*>(input));
    } else {
        for (int i = 0; i < width; ++i)
            value |= static_cast<uint32_t>(input[i]) << shift_at(i, width, order);
    }
    return value;
}

uint32_t read_long(const char* function, int line, const uint8_t* input, Order order)
{
    const uint32_t value = read_bytes(function, line, input, kLong, order);
    CMN_LOG("[API][END] %s (0x%04x)", function, value);
    return value;
}

uint16_t read_short(const char* function, int line, const uint8_t* input, Order order)
{
    const auto value = static_cast<uint16_t>(read_bytes(function, line, input, kShort, order));
    CMN_LOG("[API][END] %s (0x%02x)", function, static_cast<unsigned>(value));
    return value;
}

} // namespace
} // namespace bt::cmn

using namespace bt::cmn;

void BT_CMN_LONG2BIG(uint32_t value, uint8_t* output)
{
    write_bytes(__func__, __LINE__, value, kLong, Order::kBig, output);
}

void BT_CMN_LONG2LITTLE(uint32_t value, uint8_t* output)
{
    write_bytes(__func__, __LINE__, value, kLong, Order::kLittle, output);
}

void BT_CMN_SHORT2BIG(uint16_t value, uint8_t* output)
{
    write_bytes(__func__, __LINE__, value, kShort, Order::kBig, output);
}

void BT_CMN_SHORT2LITTLE(uint16_t value, uint8_t* output)
{
    write_bytes(__func__, __LINE__, value, kShort, Order::kLittle, output);
}

uint32_t BT_CMN_BIG2LONG(const uint8_t* input)
{
    return read_long(__func__, __LINE__, input, Order::kBig);
}

uint32_t BT_CMN_LITTLE2LONG(const uint8_t* input)
{
    return read_long(__func__, __LINE__, input, Order::kLittle);
}

uint16_t BT_CMN_BIG2SHORT(const uint8_t* input)
{
    return read_short(__func__, __LINE__, input, Order::kBig);
}

uint16_t BT_CMN_LITTLE2SHORT(const uint8_t* input)
{
    return read_short(__func__, __LINE__, input, Order::kLittle);
}

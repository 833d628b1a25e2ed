#include "wire/payload.h"

#include <cstring>

namespace bt {

uint8_t* Payload::append(uint32_t length)
{
    if (refused_ || length > BT_MESSAGE_PAYLOAD_MAX - size_) {
        refused_ = true;
        return nullptr;
    }
    uint8_t* const at = message_.payload + size_;
    size_ += length;
    return at;
}

Payload& Payload::u8(uint32_t value)
{
    const auto low = static_cast<uint8_t>(value);
    return bytes(&low, sizeof low);
}

Payload& Payload::u16(uint32_t value)
{
    const auto low = static_cast<uint16_t>(value);
    return bytes(&low, sizeof low);
}

Payload& Payload::u32(uint32_t value)
{
    return bytes(&value, sizeof value);
}

Payload& Payload::i32(int32_t value)
{
    return bytes(&value, sizeof value);
}

Payload& Payload::be16(uint32_t value)
{
    return u8(value >> 8).u8(value);
}

Payload& Payload::be32(uint32_t value)
{
    return be16(value >> 16).be16(value);
}

Payload& Payload::le16(uint32_t value)
{
    return u8(value).u8(value >> 8);
}

Payload& Payload::zeros(uint32_t length)
{
    append(length);
    return *this;
}

Payload& Payload::zeros_to(uint32_t size)
{
    // The difference of a longer payload wraps to a length that cannot fit.
    return zeros(size - size_);
}

Payload& Payload::bytes(const void* source, uint32_t length)
{
    if (length == 0) return *this;
    if (source == nullptr) {
        refused_ = true;
        return *this;
    }
    if (uint8_t* const at = append(length)) std::memcpy(at, source, length);
    return *this;
}

Payload& Payload::bytes_or_zeros(const void* source, uint32_t length)
{
    return source == nullptr ? zeros(length) : bytes(source, length);
}

Payload& Payload::cut_to(uint32_t length)
{
    if (size_ > length) {
        std::memset(message_.payload + length, 0, size_ - length);
        size_ = length;
    }
    return *this;
}

const BtMessage& Payload::framed(uint16_t cid, uint16_t alternative_pno)
{
    BtMessageHeaderFields& header = message_.msg_header.hdr;
    header.src_pno = source_pno_;
    header.alt_pno = alternative_pno;
    header.cid = cid;
    header.len = static_cast<uint16_t>(size_);
    return message_;
}

} // namespace bt

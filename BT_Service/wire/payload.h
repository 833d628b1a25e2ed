// The payload writer: the appends of a request, in order, are the layout of its payload.
#pragma once

#include <bt_service/bt_message.h>

namespace bt {

// Builds a payload in place behind the header of a message. A field that does not fit, or a null source with bytes to
// copy, makes the payload refused: nothing more is appended and it cannot be posted.
class Payload {
public:
    Payload& u8(uint32_t value);
    Payload& u16(uint32_t value);
    Payload& u32(uint32_t value);
    Payload& i32(int32_t value);
    Payload& be16(uint32_t value);
    Payload& be32(uint32_t value);
    Payload& le16(uint32_t value);
    Payload& zeros(uint32_t length);
    // Appends zeros until the payload has `size` bytes; a payload that is longer already is refused.
    Payload& zeros_to(uint32_t size);
    Payload& bytes(const void* source, uint32_t length);
    // As bytes(), but a null source stands for that many zero bytes.
    Payload& bytes_or_zeros(const void* source, uint32_t length);
    Payload& address(const BtDevAddress& slot) { return bytes(&slot, sizeof slot); }
    Payload& cut_to(uint32_t length);

    uint32_t size() const { return size_; }
    bool refused() const { return refused_; }

    // The message around the payload, its header filled in.
    const BtMessage& framed(uint16_t cid, uint16_t alternative_pno);
    Payload& sent_by(uint16_t pno)
    {
        source_pno_ = pno;
        return *this;
    }

private:
    uint8_t* append(uint32_t length);

    BtMessage message_{};
    uint32_t size_ = 0;
    uint16_t source_pno_ = PNO_BT_EDS;
    bool refused_ = false;
};

} // namespace bt

/**
 * @file
 * Integers to and from bytes in a given order, at any address and on any machine.
 *
 * BIG is most significant byte first, LITTLE least significant byte first; LONG is 32 bits in 4 bytes, SHORT 16 bits in
 * 2 bytes. Writers do nothing for a null output; readers give 0 for a null input.
 */
#ifndef BT_SERVICE_BT_BYTE_ORDER_H
#define BT_SERVICE_BT_BYTE_ORDER_H

#include <bt_service/bt_types.h>

BT_EXTERN_C_BEGIN

/** Writes 0x01020304 as 01 02 03 04. */
BT_API void BT_CMN_LONG2BIG(uint32_t value, uint8_t* output);

/** Writes 0x01020304 as 04 03 02 01. */
BT_API void BT_CMN_LONG2LITTLE(uint32_t value, uint8_t* output);

/** Writes 0x0102 as 01 02. */
BT_API void BT_CMN_SHORT2BIG(uint16_t value, uint8_t* output);

/** Writes 0x0102 as 02 01. */
BT_API void BT_CMN_SHORT2LITTLE(uint16_t value, uint8_t* output);

/** Reads 01 02 03 04 as 0x01020304. */
BT_API uint32_t BT_CMN_BIG2LONG(const uint8_t* input);

/** Reads 01 02 03 04 as 0x04030201. */
BT_API uint32_t BT_CMN_LITTLE2LONG(const uint8_t* input);

/** Reads 01 02 as 0x0102. */
BT_API uint16_t BT_CMN_BIG2SHORT(const uint8_t* input);

/** Reads 01 02 as 0x0201. */
BT_API uint16_t BT_CMN_LITTLE2SHORT(const uint8_t* input);

BT_EXTERN_C_END

#endif

/**
 * @file
 * Sending and receiving between the service's processes, with a trace of every message, and the table that relates
 * requests to their responses.
 *
 * With the trace on (bt_log.h), every message sent, received or taken from an event queue leaves the line
 * "BTSRV A081 0102..." - id and at most 128 payload bytes in hex - at the platform logger, on the console and in the
 * log file, as far as each is switched on.
 */
#ifndef BT_SERVICE_BT_TRANSPORT_H
#define BT_SERVICE_BT_TRANSPORT_H

#include <bt_service/bt_message.h>
#include <bt_service/bt_types.h>

BT_EXTERN_C_BEGIN

/** A row of a request-response table; a row with BT_RESPONSE_END in both ids ends the table. */
typedef struct BtResponseRow {
    uint16_t request;          /*  0  id of the request             */
    uint16_t response;         /*  2  id of its response            */
    uint16_t data_size;        /*  4  payload bytes of the response */
} BtResponseRow;
BT_ASSERT_SIZE(BtResponseRow, 6);
BT_ASSERT_AT(BtResponseRow, response, 2);
BT_ASSERT_AT(BtResponseRow, data_size, 4);

enum {
    BT_RESPONSE_END = 0xFFFF,
    BT_RESPONSE_ROWS_MAX = 256 /**< rows a lookup looks at, the end row included */
};

/**
 * Sends a message to a process of the service.
 *
 * Posts header and payload, `len` + 16 bytes as a 16-bit sum and never more than 1,024, and traces the message. When
 * the platform's message layer is unusable the calling process ends with code -1.
 *
 * @param file      caller's source file; not used
 * @param function  caller's name for the log
 * @param line      caller's source line; not used
 * @param pno       process number of the receiver
 * @param message   a BtMessage, of which header and payload are read
 * @return 0 sent; 1 null function or message, or not taken by the message layer
 */
BT_API int32_t BT_CMN_sendMsgWrapper(const char* file, const char* function, int32_t line, uint32_t pno,
                                     const void* message);

/**
 * Takes the calling process's next message, waiting for one, and traces it.
 *
 * When the platform's message layer is unusable the calling process ends with code -1.
 *
 * @param file      caller's source file; not used
 * @param function  caller's name for the log
 * @param line      caller's source line; not used
 * @param buffer    a BtMessage, 1,024 bytes; its content is undefined unless the result is 0
 * @return 0 a message was received; 1 null function or buffer, or no message
 */
BT_API int32_t BT_CMN_recvMsgWrapper(const char* file, const char* function, int32_t line, void* buffer);

/**
 * Finds the response that belongs to a request.
 *
 * @param table      rows of BtResponseRow
 * @param request    id of the request
 * @param response   receives the id of the response
 * @param data_size  receives the payload size of the response
 * @return 0 found in the first 256 rows; 1 not found or a null pointer, nothing written
 */
BT_API int32_t BT_CMN_get_response_from_request(const BtResponseRow* table, uint32_t request, uint16_t* response,
                                                uint16_t* data_size);

/**
 * Finds the payload size of a response.
 *
 * @param table      rows of BtResponseRow
 * @param response   id of the response
 * @param data_size  receives the payload size
 * @return 0 found in the first 256 rows; 1 not found or a null pointer, nothing written
 */
BT_API int32_t BT_CMN_get_data_size_from_response(const BtResponseRow* table, uint32_t response, uint16_t* data_size);

BT_EXTERN_C_END

#endif

/**
 * @file
 * The whole Bluetooth service interface: requests and queries per profile, events, the connection data store and the
 * framework that service processes are built on.
 */
#ifndef BT_SERVICE_BT_SERVICE_H
#define BT_SERVICE_BT_SERVICE_H

#include <bt_service/bt_audio_video.h>
#include <bt_service/bt_byte_order.h>
#include <bt_service/bt_connection.h>
#include <bt_service/bt_connection_queries.h>
#include <bt_service/bt_connection_records.h>
#include <bt_service/bt_connection_store.h>
#include <bt_service/bt_event_queue.h>
#include <bt_service/bt_events.h>
#include <bt_service/bt_hands_free.h>
#include <bt_service/bt_log.h>
#include <bt_service/bt_message.h>
#include <bt_service/bt_message_access.h>
#include <bt_service/bt_object_push.h>
#include <bt_service/bt_share_handle.h>
#include <bt_service/bt_shared_memory.h>
#include <bt_service/bt_state_machine.h>
#include <bt_service/bt_system.h>
#include <bt_service/bt_timer.h>
#include <bt_service/bt_transport.h>
#include <bt_service/bt_types.h>

#endif

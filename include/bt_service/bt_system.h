/**
 * @file
 * Requests to the system service: start and stop, the local device, radio tests, HCI commands, the FTS log, and the
 * debug switches with the export of the logs.
 *
 * Conventions of this header, in addition to those of bt_types.h:
 *
 *  1. Requests go to the system service (PNO_BT_SYS). A request returns 0 when it is posted; -1 when an argument is
 *     refused, and nothing is sent; -127 when the message layer is unusable; any other code is what the platform's
 *     _sys_SndMsg() returned (1 nobody owns the process number, 2 its queue is full). The outcome arrives later as an
 *     event of the system service.
 *  2. A name is a `BtSysName` of which only 4 + length bytes need to exist.
 *  3. The paths named here are moved below the folder that the environment variable BT_SERVICE_ROOT names, if it is
 *     set; the folder that a caller passes is used as it is.
 */
#ifndef BT_SERVICE_BT_SYSTEM_H
#define BT_SERVICE_BT_SYSTEM_H

#include <bt_service/bt_types.h>

enum {
    BT_SYS_START_NAME_MAX = 248,       /* longest name that BT_SRV_initialize() takes */
    BT_SYS_FTS_SNAPSHOT_MAX = 64,      /* bytes of an FTS log snapshot                */
    BT_SYS_FTS_LOG_SIZE_MAX = 5242880, /* bytes of the largest FTS log                */
    BT_SYS_EFFECTIVE_PROFILE_MAX = 255,
    BT_SYS_SETUP_STATES = 9            /* words of g_setup_state                      */
};

/** What the service is started with; sent as it is. */
typedef struct BtSysStart {
    uint8_t bytes[4];          /*  0                                                  */
} BtSysStart;
BT_ASSERT_SIZE(BtSysStart, 4);

/** Name of the local device. */
typedef struct BtSysName {
    uint8_t length;            /*  0  bytes of text, 0..255                           */
    uint8_t reserved[3];       /*  1  not read                                        */
    char text[255];            /*  4  not closed by a zero                            */
} BtSysName;
BT_ASSERT_SIZE(BtSysName, 259);
BT_ASSERT_AT(BtSysName, text, 4);

/** Device ID information of the local device. */
typedef struct BtSysDid {
    uint8_t bytes[8];          /*  0                                                  */
} BtSysDid;
BT_ASSERT_SIZE(BtSysDid, 8);

/** The device that carries the audio of calls; sent as it is. */
typedef struct BtSysScoDevice {
    uint8_t bytes[8];          /*  0                                                  */
} BtSysScoDevice;
BT_ASSERT_SIZE(BtSysScoDevice, 8);

/** How the FTS log is started; sent as it is. */
typedef struct BtSysFtsStart {
    uint8_t bytes[42];         /*  0                                                  */
} BtSysFtsStart;
BT_ASSERT_SIZE(BtSysFtsStart, 42);

/** An HCI command packet for the controller (Bluetooth Core Specification, UART transport). */
typedef struct BtSysHciCommand {
    uint8_t packet_length;     /*  0  bytes of the packet: 4 + parameter_length       */
    uint8_t packet_type;       /*  1  1, a command                                    */
    uint8_t opcode[2];         /*  2  low byte first                                  */
    uint8_t parameter_length;  /*  4  0..251                                          */
    uint8_t parameters[251];   /*  5  zero behind the parameters                      */
} BtSysHciCommand;
BT_ASSERT_SIZE(BtSysHciCommand, 256);
BT_ASSERT_AT(BtSysHciCommand, opcode, 2);
BT_ASSERT_AT(BtSysHciCommand, parameters, 5);

/** Parameters of the receive test. */
typedef struct BtSysRxTest {
    uint32_t mode;             /*  0  0: answer inquiries and pages; else: receive    */
    int32_t channel;           /*  4  radio channel, 0..78                            */
} BtSysRxTest;
BT_ASSERT_SIZE(BtSysRxTest, 8);
BT_ASSERT_AT(BtSysRxTest, channel, 4);

/** Parameters of the transmit test. */
typedef struct BtSysTxTest {
    uint32_t mode;             /*  0  0: parameters 0 and 1 are 0; else: 3, channel   */
    uint32_t channel;          /*  4  radio channel, 0..78; a larger one is sent as 0 */
    uint32_t packet_type;      /*  8  0..11: DM1 DH1 DM3 DH3 DM5 DH5 2-DH1 2-DH3      */
                               /*     2-DH5 3-DH1 3-DH3 3-DH5                         */
    uint32_t parameter_4;      /* 12  low byte is the controller's parameter 4        */
    uint32_t parameter_8;      /* 16  low byte is the controller's parameter 8        */
} BtSysTxTest;
BT_ASSERT_SIZE(BtSysTxTest, 20);
BT_ASSERT_AT(BtSysTxTest, packet_type, 8);
BT_ASSERT_AT(BtSysTxTest, parameter_8, 16);

/** Parameters of the carrier test. */
typedef struct BtSysCarrierTest {
    int32_t channel;           /*  0  radio channel, 0..78                            */
    uint32_t parameter_3;      /*  4  low byte is the controller's parameter 3        */
} BtSysCarrierTest;
BT_ASSERT_SIZE(BtSysCarrierTest, 8);
BT_ASSERT_AT(BtSysCarrierTest, parameter_3, 4);

/** The local device as the system manager describes it: start of the shared data "/tmp/shm_sysmgr_local_devinfo". */
typedef struct BtSysLocalDevice {
    uint8_t bytes[340];        /*   0                                                 */
    BtSysDid did;              /* 340  device ID information                          */
} BtSysLocalDevice;
BT_ASSERT_SIZE(BtSysLocalDevice, 348);
BT_ASSERT_AT(BtSysLocalDevice, did, 340);

/** Places of the debug switches in the array that BT_SRV_requestDebugEnable() takes; key in the switch file. */
enum BtSysDebugSwitch {
    BT_SYS_DEBUG_SERVICE_CONSOLE = 0, /**< service log to the console, "@ConsoleLog" */
    BT_SYS_DEBUG_SERVICE_FILE = 1,    /**< service log to the file, "@FileOutLog" */
    BT_SYS_DEBUG_SERVICE_TRACE = 2,   /**< message trace, "@ConsoleSRVLog" */
    BT_SYS_DEBUG_SERVICE_STREAM = 3,  /**< message trace of the stream process too, "@StrmLog" */
    BT_SYS_DEBUG_STACK_AIR = 4,       /**< stack: "@AirLog" */
    BT_SYS_DEBUG_STACK_CONSOLE = 5,   /**< stack: "@ConsoleLog" */
    BT_SYS_DEBUG_STACK_FILE = 6,      /**< stack: "@FileOutLog" */
    BT_SYS_DEBUG_STACK_TRACE = 7,     /**< stack: "@ConsoleSTKLog" */
    BT_SYS_DEBUG_STACK_OS_API = 8,    /**< stack: "@OsApiLog" */
    BT_SYS_DEBUG_SWITCHES = 9
};

BT_EXTERN_C_BEGIN

/* ---- start and stop */

/**
 * Sets the platform interface up for the calling process and starts the service.
 *
 * The set-up is made by every call, also by one whose arguments are refused.
 *
 * @param start  sent as it is
 * @param name   name of the local device, at most 248 bytes of text
 * @return 0 posted; -1 null argument or name too long; -127 not posted
 *
 * Request 0x1101, 8 + length payload bytes: start, length (1), zeros (3), text.
 */
BT_API int32_t BT_SRV_initialize(const BtSysStart *start, const BtSysName *name);

/**
 * Resets the Bluetooth function and starts it again.
 *
 * @return 0 posted; -1 null argument or name above 248 bytes; -127 not posted
 *
 * Request 0x1111, payload as BT_SRV_initialize().
 */
BT_API int32_t BT_SRV_resetBtFunction(const BtSysStart *start, const BtSysName *name);

/** Takes the service back to before its start. @return 0 posted; -127 not posted. Request 0x1110, 4 payload bytes. */
BT_API int32_t BT_SRV_deinitialize(uint32_t value);

/** Ends the service. @return 0 posted; -127 not posted. Request 0x1102, no payload. */
BT_API int32_t BT_SRV_shutdown(void);

/** Switches the radio off. @return 0 posted; -127 not posted. Request 0x1103, no payload. */
BT_API int32_t BT_SRV_radioShutdown(void);

/** Asks for the version of the service. @return 0 posted; -127 not posted. Request 0x1107, no payload. */
BT_API int32_t BT_SRV_getSoftVersion(void);

/* ---- the local device */

/**
 * Names the local device.
 *
 * @param name  up to 255 bytes of text
 * @return 0 posted; -1 null name; -127 not posted
 *
 * Request 0x1106, 4 + length payload bytes: length (1), zeros (3), text.
 */
BT_API int32_t BT_SRV_setLocalDeviceName(const BtSysName *name);

/**
 * Sets the device ID information of the local device.
 *
 * @param did      sent as it is
 * @param value8   not 0
 * @param value32  not 0
 * @return 0 posted; -1 null information or a value of 0; -127 not posted
 *
 * Request 0x110B, 13 payload bytes: did (8), value8 (1), value32 (4).
 */
BT_API int32_t BT_SRV_setLocalDeviceDIDInfo(const BtSysDid *did, uint8_t value8, uint32_t value32);

/**
 * Sets the profiles that take effect.
 *
 * @param value  at most 255
 * @return 0 posted; -1 value too large; -127 not posted
 *
 * Request 0x1109, 4 payload bytes: value.
 */
BT_API int32_t BT_SRV_setEffectiveProfile(uint32_t value);

/**
 * Sets the device that carries the audio of calls.
 *
 * @return 0 posted; -1 null; -127 not posted
 *
 * Request 0x110A, 8 payload bytes.
 */
BT_API int32_t BT_SRV_setConnectSCODevice(const BtSysScoDevice *device);

/**
 * Copies the system manager's record of the local device. No lock guards it.
 *
 * @return 0 copied; -1 null output, or the record is not there yet; the output is untouched then
 */
BT_API int32_t BT_SRV_getLocalDeviceInformation(BtSysLocalDevice *out);

/** As BT_SRV_getLocalDeviceInformation(), but copies the device ID information alone. */
BT_API int32_t BT_SRV_getLocalDeviceDIDInfo(BtSysDid *out);

/** Returns word `index` of g_setup_state, or 2 for an index above 7. */
BT_API int32_t BT_SRV_getEffectiveProfileState(uint32_t index);

/** State of each profile in this process; all zero until somebody else fills it. The library only reads it. */
extern BT_API uint32_t g_setup_state[BT_SYS_SETUP_STATES];

/* ---- radio tests and HCI; request 0x1105, 256 payload bytes (`BtSysHciCommand`) */

/** Prepares the service for HCI commands. @return 0 posted; -127 not posted. Request 0x1104, no payload. */
BT_API int32_t BT_SRV_setHciMode(void);

/** Sends a command to the controller; null sends 256 zero bytes. @return 0 posted; -127 not posted */
BT_API int32_t BT_SRV_sendHciCommand(const BtSysHciCommand *command);

/**
 * Receive test: with mode 0 HCI Write Scan Enable (0x0C1A), else opcode 0xFD17.
 *
 * @return 0 posted; -1 null; -127 not posted
 */
BT_API int32_t BT_SRV_testRxMode(const BtSysRxTest *test);

/** Transmit test, opcode 0xFD85. @return 0 posted; -1 null or packet type above 11; -127 not posted */
BT_API int32_t BT_SRV_testTxMode(const BtSysTxTest *test);

/** Carrier without modulation, opcode 0xFD84. @return 0 posted; -1 null; -127 not posted */
BT_API int32_t BT_SRV_testNonModulatedCarrier(const BtSysCarrierTest *test);

/** Ends a test, opcode 0xFD88. @return 0 posted; -127 not posted */
BT_API int32_t BT_SRV_Reset(void);

/* ---- FTS log and simulation */

/** Starts the FTS log. @return 0 posted; -1 null; -127 not posted. Request 0x110C, 42 payload bytes. */
BT_API int32_t BT_SRV_startFtsLog(const BtSysFtsStart *start);

/** Ends the FTS log. @return 0 posted; -127 not posted. Request 0x110D, no payload. */
BT_API int32_t BT_SRV_stopFtsLog(void);

/**
 * Takes a snapshot of the FTS log.
 *
 * @param data    `length` bytes; null sends that many zeros
 * @param length  0..64
 * @return 0 posted; -1 length above 64; -127 not posted
 *
 * Request 0x110E, `length` payload bytes.
 */
BT_API int32_t BT_SRV_shapshotFtsLog(const void *data, uint32_t length);

/**
 * Sets the size of the FTS log.
 *
 * @param size  bytes, at most 5,242,880 (0x500000)
 * @return 0 posted; -1 size too large; -127 not posted
 *
 * Request 0x1112, 4 payload bytes: size.
 */
BT_API int32_t BT_SRV_setFtsLogSize(uint32_t size);

/**
 * Has the service act as if an event had happened.
 *
 * @param first   sent as given
 * @param second  its low byte is sent
 * @return 0 posted; -127 not posted
 *
 * Request 0x110F, 8 payload bytes: first (4), second (1), zeros (3).
 */
BT_API int32_t BT_SRV_simulation_Event(uint32_t first, uint32_t second);

/* ---- debug switches and logs; request 0x1108, no payload */

/**
 * Replaces the two debug switch files and tells the service.
 *
 * Switches 0..3 go to /fs/rwdata/BT/btstack/BT_SERVICE_DEBUG, 4..8 to /fs/rwdata/BT/btstack/BT_STACK_DEBUG; processes
 * read them when they set their logging up. A file that cannot be written is skipped silently.
 *
 * @param switches  nine words (`BtSysDebugSwitch`); exactly 1 switches on, anything else leaves off
 * @return 0 posted; -1 null; -127 not posted, with the files already replaced
 */
BT_API int32_t BT_SRV_requestDebugEnable(const uint32_t *switches);

/** Removes both debug switch files and tells the service. @return 0 posted; -127 not posted, with the files gone */
BT_API int32_t BT_SRV_requestDebugDisable(void);

/**
 * Copies the logs /tmp/bt_cmn.log, /tmp/bt_stk.log and /tmp/osapi.log into a folder, under the same names, and removes
 * both debug switch files. Sends nothing.
 *
 * A log that is missing or cannot be copied is skipped silently. So is one whose destination path would get too long:
 * a folder of up to 242 characters gets all three logs, one of 243 only osapi.log, one of 244 to 253 none.
 *
 * @param directory  folder, without a slash at its end
 * @return 0 done; -1 null, no such folder, or a path of more than 253 characters, and nothing is changed
 */
BT_API int32_t BT_SRV_requestDebugOutput(const char *directory);

BT_EXTERN_C_END

#endif

/* libkivsocket: the device's message bus. One named queue a process; message boundaries are kept. */
#ifndef KIV_SOCKET_H
#define KIV_SOCKET_H

#include <assert.h>
#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Module ids, as they stand in us_dest_module_id and us_source_module_id. */
enum {
    KIV_MODULE_MAIN = 1,
    KIV_MODULE_PPP = 3,
    KIV_MODULE_SMS = 5,
    KIV_MODULE_WLAN = 10,
    KIV_MODULE_MDM = 16,
    KIV_MODULE_NWINFO = 23,
    KIV_MODULE_DST = 24,
    KIV_MODULE_SLEEP = 27,
    KIV_MODULE_LED = 38,
    KIV_MODULE_VOICE = 43,
};

/* Commands, as they stand in us_cmd. */
enum {
    KIV_MSG_CMD_LED_CPE_CIRCLE_LED_CTRL = 6914,
    KIV_MSG_CMD_LED_CPE_DATA_LIMIT_MSG = 6915,
    KIV_MSG_CMD_LED_CPE_RESET_MSG = 6916,
    KIV_MSG_CMD_LED_OVER_TEMP_MSG = 6932,
    KIV_MSG_CMD_LED_NIGHT_MODE_MSG = 6933,
    KIV_MSG_CMD_LED_RELIGHT_MSG = 6934,
    MSG_CMD_SERVICE_REG = 12033,
    MSG_CMD_SERVICE_NOTIFY = 12034,
};

/* How many messages a queue holds. A sender to a full queue waits. */
enum { KIV_QUEUE_DEPTH = 10 };

enum {
    KIV_SVC_MSG_SIZE = 1036, /* bytes of every receive buffer, and of svc_msg */
    KIV_SVC_MSG_TEXT_SIZE = 1020,
    KIV_DAEMON_RECORD_SIZE = 104,
};

/* One message between modules. Native byte order, no padding.
 * In a registration request (MSG_CMD_SERVICE_REG) the bytes from ul_event_mask on are four uint32 masks. */
typedef struct svc_msg {
    uint16_t us_cmd;
    uint16_t us_reserved1; /* 0 */
    uint16_t us_dest_module_id;
    uint16_t us_source_module_id;
    uint16_t us_data_len;  /* bytes from ul_event_mask on */
    uint16_t us_reserved2; /* 0 */
    uint32_t ul_event_mask;
    char p_data[KIV_SVC_MSG_TEXT_SIZE]; /* payload text, NUL-terminated by a well-behaved sender */
} svc_msg;

static_assert(sizeof(svc_msg) == KIV_SVC_MSG_SIZE, "svc_msg crosses the bus");
static_assert(offsetof(svc_msg, ul_event_mask) == 12, "svc_msg crosses the bus");
static_assert(offsetof(svc_msg, p_data) == 16, "svc_msg crosses the bus");

enum {
    DAEMON_RECORD_HELLO = 0,        /* sent to the system daemon at start */
    DAEMON_RECORD_START = 2,        /* received: go ahead */
    DAEMON_RECORD_REG_COMPLETE = 6, /* sent once every notification is registered */
};

/* The record exchanged with the system daemon on its queue "MSG_ID_DAEMON". */
typedef struct daemon_record {
    int32_t record_type;
    char process_name[64]; /* NUL-padded */
    char queue_name[32];   /* NUL-padded */
    int32_t reserved;      /* 0 */
} daemon_record;

static_assert(sizeof(daemon_record) == KIV_DAEMON_RECORD_SIZE, "daemon_record crosses the bus");

/* Opens the named queue for receiving; the handle for kiv_recv_msg is stored in *handle.
 * Returns 0 or more, or a negative value when the queue cannot be opened (another process holds it). */
int kiv_init_msg(const char *queue_name, int *handle);

/* Sends length raw bytes (1 to 1036) to the named queue. Any thread. Blocks for a bounded time while the queue is
 * full. Returns 0, or -1 when the queue does not exist or stayed full. */
int kiv_send_msg(const char *queue_name, const void *data, int length);

/* Waits for the next message on the handle and copies at most size bytes of it into buffer; a longer message is
 * cut. Bytes behind a shorter message are left as they were. Returns the bytes copied, or -1. */
int kiv_recv_msg(int handle, void *buffer, int size);

/* Sends a message to the module named in us_dest_module_id; data_len is its us_data_len (the bytes from
 * ul_event_mask on, 0 to 1024). Any thread. Returns 0 on success; as kiv_send_msg it may block for a bounded time. */
int kiv_msg_send(const svc_msg *message, int data_len);

#ifdef __cplusplus
}
#endif
#endif

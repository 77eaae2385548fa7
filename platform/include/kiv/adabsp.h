/* libkivadabsp: the board-support library: LEDs, temperature sensors, charger and battery. */
#ifndef KIV_ADABSP_H
#define KIV_ADABSP_H

#include <assert.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* The board's LEDs. A name carries the colour where the board names one, the number where it does not. */
enum {
    LED_BAT_RED = 0,
    LED_BAT_GREEN = 1,
    LED_BAT_BLUE = 2,
    LED_BAT_YELLOW = 3,
    LED_SIG_6 = 6,
    LED_SIG_BLUE = 8,
    LED_FLOW_RED = 9,
    LED_FLOW_GREEN = 10,
    LED_FLOW_BLUE = 11,
    LED_FLOW_YELLOW = 12,
    LED_NET_RED = 13,
    LED_NET_14 = 14,
    LED_NET_BLUE = 15,
    LED_NET_16 = 16,
    LED_NET_WHITE = 17,
    LED_ID_41 = 41,
    LED_WIFI_BLUE = 43,
    LED_RSSI_RED = 44,
    LED_RSSI_GREEN = 45,
    LED_RSSI_BLUE = 46,
    LED_RSSI_YELLOW = 47,
    LED_SMS_GREEN = 49,
    LED_SMS_BLUE = 50,
    LED_POWER_BLUE = 52,
    LED_POWER_54 = 54,
    LED_VOICE_RED = 58,
    LED_VOICE_GREEN = 59,
    LED_VOICE_BLUE = 60,
    LED_VOICE_YELLOW = 61,
    LED_VOICEMAIL_RED = 62,
    LED_VOICEMAIL_GREEN = 63,
    LED_VOICEMAIL_BLUE = 64,
    LED_VOICEMAIL_YELLOW = 65,
    LED_SIGBAR_0 = 66, /* LED_SIGBAR_0 to LED_SIGBAR_15 are 66 to 81 */
    LED_SIGBAR_15 = 81,
    LED_ID_COUNT, /* ids are below it, with gaps; a new LED stands above this line */
};

static_assert(LED_ID_COUNT == 82, "whoever keeps something for each LED keeps this many");

enum {
    LED_OP_ON = 0,
    LED_OP_OFF = 1,
    LED_OP_BLINK = 2,
};

typedef struct led_request {
    int32_t led_id;
    int32_t led_operation;
    int32_t brightness;  /* level 0 to 4; 0 with every off request */
    int32_t blink_time1; /* ms; 0 with on; with off of no meaning: night mode turns a blink into off as it came */
    int32_t blink_time2; /* ms; likewise */
} led_request;

static_assert(sizeof(led_request) == 20, "led_request is passed to the BSP by value");

/* Sets one LED and returns when it is done. Any thread. *result becomes 0 on success or a failure code; a caller
 * clears it before the call. The return value carries nothing. */
int kiv_bsp_set_leds_sync(led_request request, int *result);

typedef struct bsp_query_result {
    int32_t ret;  /* 0 when data is valid */
    int32_t data; /* the answer: 1 connected or present, 0 not */
} bsp_query_result;

/* Each returns 0 when the query was made; the record then holds the answer. Any thread. */
int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *result);
int kiv_bsp_get_battery_online_status_sync(bsp_query_result *result);

typedef struct bsp_sensor_temp {
    int32_t reserved;
    int32_t temperature; /* in the BSP's unit, the unit of NV "thermal_led_enable" */
} bsp_sensor_temp;

enum { BSP_SENSOR_COUNT = 7 };

/* Reads temperature sensor 0 to 6. A failed read leaves the record untouched. Any thread. Returns 0, or -1. */
int kiv_bsp_get_sensor_temp_sync(int sensor_id, bsp_sensor_temp *temp);

/* Indications: event_id 1350 to 1357, arg2 unused, ind_msg_struct the BSP's record (opaque, not null).
 * The callback runs on the thread that runs the uloop. */
typedef int (*bsp_ind_callback)(int event_id, int arg2, void *ind_msg_struct);

int kiv_bsp_register_battery_online_ind(bsp_ind_callback callback);
int kiv_bsp_register_battery_offline_ind(bsp_ind_callback callback);
int kiv_bsp_register_charger_connect_ind(bsp_ind_callback callback);
int kiv_bsp_register_charger_disconnect_ind(bsp_ind_callback callback);

#ifdef __cplusplus
}
#endif
#endif

/* libkivreg: registration for other modules' notifications, and the event values that they notify with. */
#ifndef KIV_REG_H
#define KIV_REG_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/* Event values, as they stand in ul_event_mask of a notification. Events of the second mask word carry
 * bit 30 as well as their own bit, here and in mask2. One notification carries one event. */
enum {
    /* KIV_MODULE_MAIN */
    REG_MC_CHARGIN_STATUS = 0x2,
    REG_MC_EVENT_SHUTTING_DOWN = 0x20,
    REG_MC_EVENT_POWERON = 0x40,
    REG_MC_EVENT_RESETTING = 0x80,
    REG_MC_EVENT_RESTARTING = 0x100,
    REG_MC_EVENT_INITAL = 0x200,
    REG_MC_EVENT_POWER_OFF_CHARGE = 0x400,
    REG_MC_EVENT_POWER_OFF_UNREADL = 0x800,
    REG_MC_BATTERY_VALUE = 0x40000010,
    REG_MC_EVENT_POWER_OFF_QUICKEN = 0x40000200,
    REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN = 0x40000400,
    REG_MC_EVENT_POWER_OFF_QUICKEN_ACK = 0x40004000,
    /* KIV_MODULE_MDM */
    REG_SIM_STATUS = 0x1,
    /* KIV_MODULE_NWINFO */
    REG_NWINFO_SIG_BAR = 0x1,
    REG_NWINFO_ROAMING_STATUS = 0x2,
    REG_NWINFO_NETTYPE = 0x40,
    /* KIV_MODULE_PPP */
    REG_PPP_STATUS = 0x1,
    REG_Q6_PPP_STATUS = 0x4,
    /* KIV_MODULE_WLAN */
    REG_WLAN_CURRENT_STATUS = 0x10,
    REG_WLAN_AP_WPS_STATE = 0x80,
    REG_WLAN_AP_WPS_STATE_CHIP2 = 0x100, /* the same event under a second value; both are handled alike */
    /* KIV_MODULE_SMS */
    REG_WMS_SMS_NV_UNREAD_SMS = 0x2,
    REG_WMS_SMS_NEW_SMS = 0x4,
    REG_WMS_SMS_MEMORY_FULL = 0x1000,
    REG_WMS_SMS_VOCEMAIL_SET_FLAG = 0x2000,
    /* KIV_MODULE_SLEEP */
    REG_SLEEP_STATUS_EVENT = 0x1,
    /* KIV_MODULE_DST */
    REG_DST_FLOW_STATUS = 0x1,
    /* KIV_MODULE_VOICE */
    REG_VOICE_PHONE_LED_STATE = 0x2,
};

typedef struct reg_masks {
    uint32_t mask1;
    uint32_t mask2;
    uint32_t mask3;
    uint32_t mask4;
} reg_masks;

/* Prepares the registration table of this process's module. Returns 0, or -1. */
int kiv_reg_table_init(int module_id);

/* Records another module's request (its id and the four masks) to be notified by this module.
 * Returns 1 on success, anything else is a failure. */
int kiv_reg_proc(int source_module_id, const uint32_t *masks);

/* Asks module source_module_id to notify module dest_module_id of the events in masks.
 * Returns 0 when the request was sent, -1 when not. */
int kiv_reg_func(int source_module_id, int dest_module_id, const reg_masks *masks);

#ifdef __cplusplus
}
#endif
#endif

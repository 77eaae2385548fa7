#include "core/bsp_ind.h"

#include "ground/led_log.h"
#include "kiv/adabsp.h"
#include "policy/products.h"
#include "ubox/uloop.h"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";
constexpr int NULL_RECORD_LOG_ID = 14; // of this one line; field logs are searched for it

enum bsp_indication : int {
    BSP_IND_BATTERY_FIRST = 1350, // which of the two is online and which offline makes no difference here
    BSP_IND_BATTERY_SECOND = 1351,
    BSP_IND_CHARGER_CONNECT = 1356,
    BSP_IND_CHARGER_DISCONNECT = 1357
};

// Runs on the IPC listen thread. ind_msg_struct: the board's record, only checked for null. 0, or -1 for a null record.
static int kiv_led_bspIpcCallBack(int event_id, int, void *ind_msg_struct)
{
    if (ind_msg_struct == nullptr) {
        kiv_syslog_append(KIV_LOG_ERROR, LED_LOG_SOURCE, __LINE__, NULL_RECORD_LOG_ID,
                          "[info] current bspIpcCallBack ind_msg_struct is null.....\n");
        return -1;
    }
    LED_INFO("[info] kiv_led_bspIpcCallBack : event id = %d  \n", event_id);
    switch (event_id) {
    case BSP_IND_BATTERY_FIRST:
        kiv_led_battery_ind_dispatch(1);
        break;
    case BSP_IND_BATTERY_SECOND:
        kiv_led_battery_ind_dispatch(0);
        break;
    case BSP_IND_CHARGER_CONNECT:
        kiv_led_charger_ind_dispatch(1);
        break;
    case BSP_IND_CHARGER_DISCONNECT:
        kiv_led_charger_ind_dispatch(0);
        break;
    default: // nothing that the LEDs show
        break;
    }
    return 0;
}

void kiv_led_register_bsp_ind()
{
    if (!kiv_led_hears_bsp_ind()) {
        return;
    }
    kiv_bsp_register_battery_online_ind(kiv_led_bspIpcCallBack);
    kiv_bsp_register_battery_offline_ind(kiv_led_bspIpcCallBack);
    kiv_bsp_register_charger_connect_ind(kiv_led_bspIpcCallBack);
    kiv_bsp_register_charger_disconnect_ind(kiv_led_bspIpcCallBack);
}

void *kiv_led_ipc_server_thread(void *)
{
    LED_INFO("kiv_led_ipc_server_thread \n");
    uloop_run();
    return nullptr;
}

#include "core/bsp_ind.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "core/product_route.h"
#include "kiv/adabsp.h"
#include "policy/cpe/battery.h"
#include "policy/standard/battery.h"

#include <libubox/uloop.h>

constexpr char led_log_source[] = "kiv_mirta_led";
constexpr int null_record_log_id = 14; // the IPC library's log id: the record is its affair

enum bsp_indication : int {
    BSP_IND_BATTERY_FIRST = 1350, // which of the two is online and which offline makes no difference here
    BSP_IND_BATTERY_SECOND = 1351,
    BSP_IND_CHARGER_CONNECT = 1356,
    BSP_IND_CHARGER_DISCONNECT = 1357
};

// The handlers ask for the battery state themselves; what the indication says is not passed on.
static void requery_battery(int)
{
    kiv_led_query_battery_state();
}

static void requery_cpe_battery(int)
{
    kiv_cpe_led_handle_battery_state();
}

constexpr product_route battery_ind_route = {
    .module = requery_cpe_battery,
};
constexpr product_route charger_ind_route = {
    .ufi = requery_battery,
    .module = kiv_cpe_led_handle_charger_state,
};

void kiv_led_register_bsp_ind()
{
    if (led_product_type != LED_PRODUCT_MODULE) {
        return;
    }
    kiv_bsp_register_battery_online_ind(kiv_led_bspIpcCallBack);
    kiv_bsp_register_battery_offline_ind(kiv_led_bspIpcCallBack);
    kiv_bsp_register_charger_connect_ind(kiv_led_bspIpcCallBack);
    kiv_bsp_register_charger_disconnect_ind(kiv_led_bspIpcCallBack);
}

int kiv_led_bspIpcCallBack(int event_id, int, void *ind_msg_struct)
{
    if (ind_msg_struct == nullptr) {
        kiv_syslog_append(KIV_LOG_ERROR, led_log_source, __LINE__, null_record_log_id,
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
    default: // 1352 to 1355 concern other daemons
        break;
    }
    return 0;
}

void kiv_led_battery_ind_dispatch(int present)
{
    kiv_led_route(battery_ind_route, present);
}

void kiv_led_charger_ind_dispatch(int connected)
{
    kiv_led_route(charger_ind_route, connected);
}

void *kiv_led_ipc_server_thread(void *)
{
    LED_INFO("kiv_led_ipc_server_thread \n");
    uloop_run();
    return nullptr;
}

#include "core/start.h"

#include "alarms/kiv_led_over_temp.h"
#include "core/bsp_ind.h"
#include "core/bsp_ready.h"
#include "core/channel.h"
#include "core/config.h"
#include "core/led_ctx.h"
#include "core/led_log.h"
#include "core/registration.h"
#include "kiv/ipc.h"
#include "kiv/nv.h"
#include "kiv/reg.h"
#include "nightmode/kiv_led_night_mode.h"
#include "nightmode/kiv_led_tr181.h"
#include "policy/initial_scenes.h"

#include <pthread.h>

constexpr char led_log_source[] = "kiv_mirta_led";

// Threads live as long as the process: none is joined or detached.
static bool create_thread(void *(*body)(void *))
{
    pthread_t thread;

    return pthread_create(&thread, nullptr, body, nullptr) == 0;
}

static void register_and_init()
{
    LED_ERROR("LED enable,  reg and init!\n");
    kiv_ipc_init(led_log_id, 0);
    kiv_led_regNotifyMsg();
    kiv_led_register_bsp_ind();
    if (led_bsp_ready == 1) {
        kiv_led_init();
    }
}

static bool create_working_threads()
{
    if (!create_thread(kiv_led_socket_server_thread)) {
        LED_ERROR("error: Create kiv_led_socket_server_thread failed\n");
        return false;
    }
    if (led_enable == 1 && !create_thread(kiv_led_ipc_server_thread)) {
        LED_ERROR("[error]    Create the ipc listen sever thread fail");
        return false;
    }
    return true;
}

int kiv_led_start()
{
    LED_ERROR("***************kiv_mirta_led start!***************\n");
    kiv_reg_table_init(KIV_MODULE_LED);
    kiv_led_wait_for_daemon();
    kiv_led_get_cfg();
    led_bsp_ready = kiv_led_bsp_ready();
    if (led_enable == 1) {
        register_and_init();
    }
    if (!create_working_threads()) {
        return -1;
    }
    if (kiv_led_send_reg_complete() == -1) {
        LED_ERROR("error: kiv send reg complete msg failed!\n");
    }
    if (!create_thread(kiv_tr181_led_init)) {
        LED_ERROR("Create kiv_tr181_led_init thread failed\n");
    }
    kiv_led_over_temp_init();
    kiv_nvconfig_write("is_night_mode", "0", 1);
    kiv_led_night_mode_init();
    return 0;
}

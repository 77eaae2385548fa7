#include "core/start.h"

#include "core/bsp_ind.h"
#include "core/channel.h"
#include "core/config.h"
#include "core/registration.h"
#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/rolling_leds.h"
#include "kiv/ipc.h"
#include "kiv/nv.h"
#include "kiv/reg.h"
#include "nightmode/kiv_led_night_mode.h"
#include "nightmode/kiv_led_tr181.h"
#include "policy/products.h"

#include <pthread.h>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

// None is joined or detached: the TR-181 thread ends by itself, the others live as long as the process.
static bool create_thread(void *(*body)(void *))
{
    pthread_t thread;

    return pthread_create(&thread, nullptr, body, nullptr) == 0;
}

static void register_and_init()
{
    LED_ERROR("LED enable,  reg and init!\n");
    kiv_ipc_init(LED_LOG_ID, 0);
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

// The handshake comes before the configuration: the system daemon waits for it also where the LED function is off. What
// the daemon registers for and shows at first is settled before another thread runs, and the system daemon hears that
// registration is complete only when somebody receives. The alarm and night mode come last, beside the receive thread:
// their first look may relight, which is a message to this very daemon.
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
    kiv_led_over_temp_dispatch();
    kiv_nvconfig_write("is_night_mode", "0", 1);
    kiv_led_night_mode_init();
    return 0;
}

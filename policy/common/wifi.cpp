#include "policy/common/wifi.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

static void show_wifi_off()
{
    LED_INFO("wifi led off\n");
    kiv_led_set_wifi_led_off();
}

static void show_wifi_on(const char *line)
{
    LED_INFO("%s", line);
    kiv_led_set_wifi_led_operation(LED_WIFI_BLUE, LED_OP_ON, 0, 0, 2);
}

// No timer ends the blink: it lasts until the next Wi-Fi or WPS indication.
static void show_wps_pairing()
{
    LED_INFO("WPS active, wifi blue blink 2 mins\n");
    kiv_led_set_wifi_led_operation(LED_WIFI_BLUE, LED_OP_BLINK, 400, 1600, 2);
}

void kiv_led_set_led_wifi_status(const char *wifi_status_text)
{
    const int status = kiv_led_text_to_int(wifi_status_text);
    const int asleep = cur_led_sleep_status;

    LED_INFO("enter kiv_led_set_led_wifi_status wifi_status=%d, cur_led_sleep_status=%d\n", status, asleep);
    if (asleep != AWAKE || status == 0) {
        show_wifi_off();
    } else if (status == 1) {
        show_wifi_on("wifi blue on\n");
    }
}

void kiv_led_set_led_wps_status(const char *wps_status_text)
{
    const int state = kiv_led_text_to_int(wps_status_text);
    const int asleep = cur_led_sleep_status;

    LED_INFO("enter kiv_led_set_led_wps_status wps_status=%d, cur_led_sleep_status=%d\n", state, asleep);
    if (asleep != AWAKE) {
        show_wifi_off();
    } else if (state == 1) {
        show_wps_pairing();
    } else {
        show_wifi_on("WPS disactive,wifi blue on\n");
    }
}

void kiv_led_set_led_wifi_init()
{
    LED_INFO("enter kiv_led_set_led_wifi_init\n");
    if (led_power_state != POWER_ON) {
        LED_INFO("enter kiv_led_set_led_wifi_init, not power on \n ");
        return;
    }
    const nv_text status = kiv_led_read_nv_text("wifi_onoff_state");

    LED_INFO("WIFI status: %s\n", status.data());
    kiv_led_set_led_wifi_status(status.data());
}

void kiv_led_set_led_wakeup_wlan()
{
    LED_INFO("enter kiv_led_set_led_wakeup_wlan\n");
    if (led_power_state != POWER_ON) {
        LED_INFO("enter kiv_led_set_led_wakeup_wlan, not power on \n ");
        return;
    }
    const nv_text status = kiv_led_read_nv_text("RadioOff");
    LED_INFO("WIFI status: %s\n", status.data());

    // Pairing that runs at wake-up shows with its next notification.
    const nv_text wps = kiv_led_read_nv_text("WscModeOption");
    LED_INFO("WPS status: %s\n", wps.data());

    kiv_led_set_led_wifi_status(status.data());
}

void kiv_led_set_wifi_wps_state()
{
    if (led_power_state != POWER_ON) {
        LED_INFO("enter kiv_led_set_wifi_wps_state, not power on \n ");
        return;
    }
    const nv_text wifi = kiv_led_read_nv_text("wifi_onoff_state");
    const nv_text chip1 = kiv_led_read_nv_text("wifi_chip1_wps_state");
    const nv_text chip2 = kiv_led_read_nv_text("wifi_chip2_wps_state");
    LED_INFO("WIFI status: %s  WPS status: %s,%s\n", wifi.data(), chip1.data(), chip2.data());

    const int status = kiv_led_text_to_int(wifi.data());
    const bool pairing = kiv_led_text_to_int(chip1.data()) == 1 || kiv_led_text_to_int(chip2.data()) == 1;
    if (cur_led_sleep_status != AWAKE) {
        LED_INFO("wifi_wps_state: sleep so wifi led off\n");
        show_wifi_off();
    } else if (status == 0) {
        LED_INFO("wifi_wps_state: wifi led off\n");
        show_wifi_off();
    } else if (status == 1 && pairing) {
        show_wps_pairing();
    } else if (status == 1) {
        show_wifi_on("WPS disactive,wifi blue on\n");
    }
}

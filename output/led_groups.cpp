#include "output/led_groups.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "kiv/adabsp.h"

#include <array>
#include <span>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led_operation";
constexpr int DIMMED_BRIGHTNESS = 1;

struct off_row {
    int led_id;
    const char *fail_text; // followed by the board's result
};

// The LEDs of a group in the order in which they are switched off.
constexpr auto sig_leds = std::array{
    off_row{LED_SIG_BLUE, "set sig blue off fail:"}
};
constexpr auto net_leds = std::array{
    off_row{LED_NET_RED,   "set net red off fail:"  },
    off_row{LED_NET_BLUE,  "set net blue off fail:" },
    off_row{LED_NET_WHITE, "set net white off fail:"},
};
constexpr auto rssi_leds = std::array{
    off_row{LED_RSSI_RED,    "set rssi red off fail: "  },
    off_row{LED_RSSI_GREEN,  "set rssi green off fail:" },
    off_row{LED_RSSI_BLUE,   "set rssi blue off fail:"  },
    off_row{LED_RSSI_YELLOW, "set rssi yellow off fail:"},
};
constexpr auto power_leds = std::array{
    off_row{LED_POWER_BLUE, "set power blue off fail:"}
};
constexpr auto bat_leds = std::array{
    off_row{LED_BAT_RED,    "set bat red off fail: "  },
    off_row{LED_BAT_GREEN,  "set bat green off fail:" },
    off_row{LED_BAT_BLUE,   "set bat blue off fail:"  },
    off_row{LED_BAT_YELLOW, "set bat yellow off fail:"},
};
constexpr auto wifi_leds = std::array{
    off_row{LED_WIFI_BLUE, "set wifi blue off fail:"}
};
constexpr auto sms_leds = std::array{
    off_row{LED_SMS_GREEN, "set sms green off fail:"},
    off_row{LED_SMS_BLUE,  "set sms blue off fail:" },
};
constexpr auto flow_leds = std::array{
    off_row{LED_FLOW_RED,    "set flow red off fail: "  },
    off_row{LED_FLOW_YELLOW, "set flow yellow off fail:"},
    off_row{LED_FLOW_GREEN,  "set flow green off fail:" },
    off_row{LED_FLOW_BLUE,   "set flow blue off fail:"  },
};
constexpr auto voicemail_leds = std::array{
    off_row{LED_VOICEMAIL_RED,    "set voicemail red off fail: "  },
    off_row{LED_VOICEMAIL_GREEN,  "set voicemail green off fail:" },
    off_row{LED_VOICEMAIL_BLUE,   "set voicemail blue off fail:"  },
    off_row{LED_VOICEMAIL_YELLOW, "set voicemail yellow off fail:"},
};
constexpr auto voice_leds = std::array{
    off_row{LED_VOICE_RED,    "set voice red off fail: "  },
    off_row{LED_VOICE_GREEN,  "set voice green off fail:" },
    off_row{LED_VOICE_BLUE,   "set voice blue off fail:"  },
    off_row{LED_VOICE_YELLOW, "set voice yellow off fail:"},
};
constexpr std::array<int32_t, 16> sigbar_leds = {66, 67, 68, 69, 70, 71, 72, 73, 74, 75, 76, 77, 78, 79, 80, 81};

// The one place where a step becomes the board's record, which has another order.
static led_request request_of(const led_step &step)
{
    return {.led_id = step.led_id,
            .led_operation = step.led_operation,
            .brightness = step.brightness,
            .blink_time1 = step.blink_time1,
            .blink_time2 = step.blink_time2};
}

// Makes one request; the board's result, 0 when it was carried out. A board may write the result on failure only.
static int set_led(const led_step &step)
{
    int result = 0;

    kiv_bsp_set_leds_sync(request_of(step), &result);
    return result;
}

static int set_led_off(int led_id)
{
    return set_led({led_id, LED_OP_OFF, 0, 0, 0});
}

static void set_led_or_log(const led_step &step)
{
    const int result = set_led(step);

    if (result != 0) {
        LED_ERROR("set %d  fail:%d\n", step.led_id, result);
    }
}

static void switch_off(std::span<const off_row> leds)
{
    for (const off_row &row : leds) {
        const int result = set_led_off(row.led_id);

        if (result != 0) {
            LED_ERROR("%s%d\n", row.fail_text, result);
        }
    }
}

static bool stays_lit_at_night(int led_id)
{
    return led_id == LED_NET_RED || led_id == LED_NET_BLUE || led_id == LED_NET_WHITE;
}

// The night-mode gate: the one place where night mode changes a request on its way to the board.
static void kiv_led_night_mode_check(int led_id, int *led_operation, int *brightness)
{
    if (is_night_mode != 1) {
        return;
    }
    if (stays_lit_at_night(led_id) && night_mode_close_all_led == 0) {
        *brightness = DIMMED_BRIGHTNESS;
    } else {
        *led_operation = LED_OP_OFF;
        *brightness = 0;
    }
    LED_INFO("Night mode check: led_id=%d brightness=%d", led_id, *brightness);
}

static led_step pass_night_mode_gate(led_step step)
{
    kiv_led_night_mode_check(step.led_id, &step.led_operation, &step.brightness);
    return step;
}

// Some lines begin with "enter " and end in a newline, some are the bare name: field logs are searched for them.
void kiv_led_set_sig_led_off()
{
    LED_INFO("enter kiv_led_set_sig_led_off\n");
    switch_off(sig_leds);
}

void kiv_led_set_net_led_off()
{
    LED_INFO("enter kiv_led_set_net_led_off\n");
    switch_off(net_leds);
}

void kiv_led_set_rssi_led_off()
{
    LED_INFO("kiv_led_set_rssi_led_off");
    switch_off(rssi_leds);
}

void kiv_led_set_power_led_off()
{
    LED_INFO("enter kiv_led_set_power_led_off\n");
    switch_off(power_leds);
}

void kiv_led_set_bat_led_off()
{
    LED_INFO("kiv_led_set_bat_led_off");
    switch_off(bat_leds);
}

void kiv_led_set_wifi_led_off()
{
    LED_INFO("kiv_led_set_wifi_led_off");
    switch_off(wifi_leds);
}

void kiv_led_set_sms_led_off()
{
    LED_INFO("kiv_led_set_sms_led_off");
    switch_off(sms_leds);
}

void kiv_led_set_flow_led_off()
{
    LED_INFO("kiv_led_set_flow_led_off");
    switch_off(flow_leds);
}

void kiv_led_set_voicemail_led_off()
{
    LED_INFO("kiv_led_set_voicemail_led_off");
    switch_off(voicemail_leds);
}

void kiv_led_set_voice_led_off()
{
    LED_INFO("kiv_led_set_voice_led_off");
    switch_off(voice_leds);
}

void kiv_led_set_sigbar_led_off()
{
    LED_INFO("kiv_led_set_sigbar_led_off");
    for (const int32_t led_id : sigbar_leds) {
        const int result = set_led_off(led_id);

        if (result != 0) {
            LED_ERROR("set sigbar %d off fail:%d\n", led_id, result);
        }
    }
}

void kiv_led_set_sig_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    const led_step step = pass_night_mode_gate({led_id, led_operation, blink_time1, blink_time2, brightness});

    LED_INFO("enter kiv_led_set_sig_led_operation led_id=%d,led_operation=%d\n", step.led_id, step.led_operation);

    const int result = set_led(step);
    if (result != 0) {
        LED_ERROR("set sig blue led fail: %d\n", result);
    }
}

void kiv_led_set_net_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    const led_step step = pass_night_mode_gate({led_id, led_operation, blink_time1, blink_time2, brightness});

    LED_INFO("enter kiv_led_set_net_led_operation led_id=%d,led_operation=%d\n", step.led_id, step.led_operation);
    kiv_led_set_net_led_off();

    const int result = set_led(step);
    if (result != 0) {
        LED_ERROR("set net led fail: %d\n", result);
    }
}

void kiv_led_set_rssi_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    LED_INFO("kiv_led_set_rssi_led_operation led_id=%d,led_operation=%d\n", led_id, led_operation);
    kiv_led_set_rssi_led_off();
    set_led_or_log({led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_power_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    const led_step step = pass_night_mode_gate({led_id, led_operation, blink_time1, blink_time2, brightness});

    LED_INFO("enter kiv_led_set_power_led_operation led_id=%d,led_operation=%d\n", step.led_id, step.led_operation);
    if (led_id != LED_POWER_BLUE) {
        LED_ERROR("led id error!\n");
        return;
    }
    const int result = set_led(step);
    if (result != 0) {
        LED_ERROR("set power led fail: %d\n", result);
    }
}

void kiv_led_set_bat_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    LED_INFO("enter kiv_led_set_bat_led_operation led_id=%d,led_operation=%d\n", led_id, led_operation);
    kiv_led_set_bat_led_off();
    set_led_or_log({led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_wifi_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    const led_step step = pass_night_mode_gate({led_id, led_operation, blink_time1, blink_time2, brightness});

    LED_INFO("enter kiv_led_set_wifi_led_operation led_id=%d,led_operation=%d\n", step.led_id, step.led_operation);
    set_led_or_log(step);
}

void kiv_led_set_sms_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    kiv_led_set_sms_led_off();
    LED_INFO("enter kiv_led_set_sms_led_operation led_id=%d,led_operation=%d\n", led_id, led_operation);
    set_led_or_log({led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_flow_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    kiv_led_set_flow_led_off();
    LED_INFO("enter kiv_led_set_flow_led_operation led_id=%d,led_operation=%d\n", led_id, led_operation);
    set_led_or_log({led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_voicemail_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2,
                                         int brightness)
{
    if (led_id < LED_VOICEMAIL_RED || led_id > LED_VOICEMAIL_YELLOW) {
        LED_ERROR("kiv_led_set_voicemail_led_operation led_id error\n");
        return;
    }
    if (led_operation == LED_OP_OFF) {
        const int result = set_led({led_id, led_operation, blink_time1, blink_time2, brightness});

        if (result != 0) {
            LED_ERROR("set %d  off fail:%d\n", led_id, result);
        }
        return;
    }
    kiv_led_set_voicemail_led_off();
    LED_INFO("kiv_led_set_voicemail_led_operation led_id=%d,led_operation=%d\n", led_id, led_operation);
    set_led_or_log({led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_voice_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    kiv_led_set_voice_led_off();
    LED_INFO("kiv_led_set_voice_led_operation led_id=%d,led_operation=%d\n", led_id, led_operation);
    set_led_or_log({led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_sigbar_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    kiv_led_set_sigbar_led_off();
    LED_INFO("kiv_led_set_sigbar_led_operation led_id = %d , led_operation=%d\n", led_id, led_operation);
    set_led_or_log({led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    set_led_or_log({led_id, led_operation, blink_time1, blink_time2, brightness});
}

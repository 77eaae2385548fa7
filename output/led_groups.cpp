#include "output/led_groups.h"

#include "core/led_log.h"
#include "kiv/adabsp.h"
#include "output/night_mode_gate.h"

#include <array>
#include <span>

constexpr char led_log_source[] = "kiv_mirta_led_operation";

struct off_row {
    int led_id;
    const char *fail_text; // followed by the board's result
};

enum class group_off { never, before_entry, after_entry };

struct led_group {
    std::span<const off_row> leds; // in the order in which they are switched off
    const char *off_entry;
    const char *entry; // followed by the LED id
    group_off switched_off = group_off::never;
    bool gated = false;
    const char *fail_text = nullptr; // followed by the board's result; without it the line names the LED
};

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

// Some entry lines begin with "enter " and end in a newline, some are the bare name: field logs are searched for them.
constexpr led_group sig_group = {
    .leds = sig_leds,
    .off_entry = "enter kiv_led_set_sig_led_off\n",
    .entry = "enter kiv_led_set_sig_led_operation led_id=",
    .gated = true,
    .fail_text = "set sig blue led fail: ",
};
constexpr led_group net_group = {
    .leds = net_leds,
    .off_entry = "enter kiv_led_set_net_led_off\n",
    .entry = "enter kiv_led_set_net_led_operation led_id=",
    .switched_off = group_off::after_entry,
    .gated = true,
    .fail_text = "set net led fail: ",
};
constexpr led_group rssi_group = {
    .leds = rssi_leds,
    .off_entry = "kiv_led_set_rssi_led_off",
    .entry = "kiv_led_set_rssi_led_operation led_id=",
    .switched_off = group_off::after_entry,
};
constexpr led_group power_group = {
    .leds = power_leds,
    .off_entry = "enter kiv_led_set_power_led_off\n",
    .entry = "enter kiv_led_set_power_led_operation led_id=",
    .gated = true,
    .fail_text = "set power led fail: ",
};
constexpr led_group bat_group = {
    .leds = bat_leds,
    .off_entry = "kiv_led_set_bat_led_off",
    .entry = "enter kiv_led_set_bat_led_operation led_id=",
    .switched_off = group_off::after_entry,
};
constexpr led_group wifi_group = {
    .leds = wifi_leds,
    .off_entry = "kiv_led_set_wifi_led_off",
    .entry = "enter kiv_led_set_wifi_led_operation led_id=",
    .gated = true,
};
constexpr led_group sms_group = {
    .leds = sms_leds,
    .off_entry = "kiv_led_set_sms_led_off",
    .entry = "enter kiv_led_set_sms_led_operation led_id=",
    .switched_off = group_off::before_entry,
};
constexpr led_group flow_group = {
    .leds = flow_leds,
    .off_entry = "kiv_led_set_flow_led_off",
    .entry = "enter kiv_led_set_flow_led_operation led_id=",
    .switched_off = group_off::before_entry,
};
constexpr led_group voicemail_group = {
    .leds = voicemail_leds,
    .off_entry = "kiv_led_set_voicemail_led_off",
    .entry = "kiv_led_set_voicemail_led_operation led_id=",
    .switched_off = group_off::before_entry,
};
constexpr led_group voice_group = {
    .leds = voice_leds,
    .off_entry = "kiv_led_set_voice_led_off",
    .entry = "kiv_led_set_voice_led_operation led_id=",
    .switched_off = group_off::before_entry,
};

// Makes one request; the board's result, 0 when it was carried out.
static int set_led(const led_step &step)
{
    int result = 0;

    kiv_bsp_set_leds_sync({step.led_id, step.led_operation, step.brightness, step.blink_time1, step.blink_time2},
                          &result);
    return result;
}

static void set_led_or_log(const led_step &step)
{
    const int result = set_led(step);

    if (result != 0) {
        LED_ERROR("set %d  fail:%d\n", step.led_id, result);
    }
}

static void switch_off(const led_group &group)
{
    int result = 0;
    led_request request = {
        .led_id = 0, .led_operation = LED_OP_OFF, .brightness = 0, .blink_time1 = 0, .blink_time2 = 0};

    LED_INFO("%s", group.off_entry);
    for (const off_row &row : group.leds) {
        request.led_id = row.led_id;
        kiv_bsp_set_leds_sync(request, &result);
        if (result != 0) {
            LED_ERROR("%s%d\n", row.fail_text, result);
        }
    }
}

static void log_entry(const led_group &group, const led_step &step)
{
    LED_INFO("%s%d,led_operation=%d\n", group.entry, step.led_id, step.led_operation);
}

static void pass_night_mode_gate(led_step &step)
{
    kiv_led_night_mode_check(step.led_id, &step.led_operation, &step.brightness);
}

static void set_and_log(const led_group &group, const led_step &step)
{
    if (group.fail_text == nullptr) {
        set_led_or_log(step);
        return;
    }
    const int result = set_led(step);
    if (result != 0) {
        LED_ERROR("%s%d\n", group.fail_text, result);
    }
}

static void operate(const led_group &group, led_step step)
{
    if (group.gated) {
        pass_night_mode_gate(step);
    }
    if (group.switched_off == group_off::before_entry) {
        switch_off(group);
    }
    log_entry(group, step);
    if (group.switched_off == group_off::after_entry) {
        switch_off(group);
    }
    set_and_log(group, step);
}

void kiv_led_set_sig_led_off()
{
    switch_off(sig_group);
}

void kiv_led_set_net_led_off()
{
    switch_off(net_group);
}

void kiv_led_set_rssi_led_off()
{
    switch_off(rssi_group);
}

void kiv_led_set_power_led_off()
{
    switch_off(power_group);
}

void kiv_led_set_bat_led_off()
{
    switch_off(bat_group);
}

void kiv_led_set_wifi_led_off()
{
    switch_off(wifi_group);
}

void kiv_led_set_sms_led_off()
{
    switch_off(sms_group);
}

void kiv_led_set_flow_led_off()
{
    switch_off(flow_group);
}

void kiv_led_set_voicemail_led_off()
{
    switch_off(voicemail_group);
}

void kiv_led_set_voice_led_off()
{
    switch_off(voice_group);
}

void kiv_led_set_sigbar_led_off()
{
    int result = 0;

    LED_INFO("kiv_led_set_sigbar_led_off");
    for (const int32_t led_id : sigbar_leds) {
        kiv_bsp_set_leds_sync({led_id, LED_OP_OFF, 0, 0, 0}, &result);
        if (result != 0) {
            LED_ERROR("set sigbar %d off fail:%d\n", led_id, result);
        }
    }
}

void kiv_led_set_sig_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    operate(sig_group, {led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_net_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    operate(net_group, {led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_rssi_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    operate(rssi_group, {led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_power_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    led_step step = {led_id, led_operation, blink_time1, blink_time2, brightness};

    pass_night_mode_gate(step);
    log_entry(power_group, step);
    if (led_id != LED_POWER_BLUE) {
        LED_ERROR("led id error!\n");
        return;
    }
    set_and_log(power_group, step);
}

void kiv_led_set_bat_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    operate(bat_group, {led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_wifi_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    operate(wifi_group, {led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_sms_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    operate(sms_group, {led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_flow_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    operate(flow_group, {led_id, led_operation, blink_time1, blink_time2, brightness});
}

void kiv_led_set_voicemail_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2,
                                         int brightness)
{
    const led_step step = {led_id, led_operation, blink_time1, blink_time2, brightness};

    if (led_id < LED_VOICEMAIL_RED || led_id > LED_VOICEMAIL_YELLOW) {
        LED_ERROR("kiv_led_set_voicemail_led_operation led_id error\n");
        return;
    }
    if (led_operation != LED_OP_OFF) {
        operate(voicemail_group, step);
        return;
    }
    const int result = set_led(step);
    if (result != 0) {
        LED_ERROR("set %d  off fail:%d\n", led_id, result);
    }
}

void kiv_led_set_voice_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness)
{
    operate(voice_group, {led_id, led_operation, blink_time1, blink_time2, brightness});
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

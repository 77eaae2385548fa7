// The input of the receive target: the product, one byte a state word, then steps. A step is a letter and its operands.
#pragma once

#include <array>

enum receive_step : char {
    STEP_MESSAGE = 'm',      // length (2 bytes, little end first, up to 1100), bytes
    STEP_NO_MESSAGE = 'x',   // the receive call fails
    STEP_NV = 'n',           // key, length, text; length 255: the key goes
    STEP_TIMER = 't',        // which of the running timers fires
    STEP_INDICATION = 'i',   // low four bits: id from 1348; top bit: a null record
    STEP_SENSOR = 's',       // sensor, temperature; -128: it does not answer
    STEP_QUERY = 'q',        // 0 charger or 1 battery, ret, data; ret -128: the query fails
    STEP_LED_RESULT = 'l',   // LED, the result of its next requests
    STEP_CLOCK = 'c',        // minute of the day (2 bytes)
    STEP_NO_TIMERS = 'f',    // how many timers cannot be created
    STEP_ROLLING_LEDS = 'r', // first character of the animation file; 0: no file
    STEP_ENABLED = 'e',      // lowest bit: the LED function
};

constexpr int INPUT_STATE_WORDS = 20;
constexpr unsigned LONGEST_INPUT_MESSAGE = 1100;
constexpr int FIRST_INPUT_INDICATION = 1348;
constexpr unsigned MISSING_NV = 255;

constexpr std::array input_nv_keys = {
    "battery_charging",
    "battery_exist",
    "battery_value",
    "data_volume_alert_percent",
    "data_volume_limit_size",
    "data_volume_limit_unit",
    "monthly_rx_bytes",
    "data_volume_limit_switch",
    "monthly_time",
    "monthly_tx_bytes",
    "network_type",
    "night_mode_close_all_led",
    "night_mode_end_time",
    "night_mode_start_time",
    "night_mode_switch",
    "nitz_sync_flag",
    "q6_ppp_status",
    "signalbar",
    "sim_states",
    "simcard_roam",
    "sms_nv_capability",
    "sms_nvtotal_count",
    "sms_nvunread_count",
    "syn_done",
    "systime_mode",
    "thermal_led_enable",
    "wifi_chip1_wps_state",
    "wifi_chip2_wps_state",
    "wifi_onoff_state",
    "RadioOff",
    "WscModeOption",
};

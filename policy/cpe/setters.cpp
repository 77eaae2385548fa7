#include "policy/cpe/setters.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"
#include "painters/net_led.h"
#include "policy/common/voice.h"
#include "policy/cpe/state.h"

#include <array>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led_set_status";

struct net_row {
    int type;
    led_step home;
    led_step roaming;
};

constexpr auto net_rows = std::array{
    net_row{NET_NO_SERVICE, {LED_NET_RED, LED_OP_ON, 0, 0, 1}, {LED_NET_RED, LED_OP_ON, 0, 0, 1}        },
    net_row{NET_2G,         {LED_NET_16, LED_OP_ON, 0, 0, 1},  {LED_NET_16, LED_OP_BLINK, 1000, 1000, 1}},
    net_row{NET_3G,         {LED_NET_16, LED_OP_ON, 0, 0, 1},  {LED_NET_16, LED_OP_BLINK, 1000, 1000, 1}},
    net_row{NET_4G,         {LED_NET_14, LED_OP_ON, 0, 0, 1},  {LED_NET_14, LED_OP_BLINK, 1000, 1000, 1}},
};

constexpr led_step no_service_step = {LED_VOICE_RED, LED_OP_ON, 0, 0, 1};
constexpr led_step weak_step = {LED_VOICE_YELLOW, LED_OP_ON, 0, 0, 1};
constexpr led_step strong_step = {LED_VOICE_GREEN, LED_OP_ON, 0, 0, 1};

// By signal bars.
constexpr auto signal_steps = std::array{weak_step, weak_step, weak_step, strong_step, strong_step, strong_step};

struct battery_row {
    int status;
    led_step step;
};

// The two statuses without a row here switch the group off.
constexpr auto battery_rows = std::array{
    battery_row{CPE_BAT_HIGH,            {LED_BAT_GREEN, LED_OP_ON, 0, 0, 1}          },
    battery_row{CPE_BAT_MIDDLE,          {LED_BAT_YELLOW, LED_OP_ON, 0, 0, 1}         },
    battery_row{CPE_BAT_LOW,             {LED_BAT_RED, LED_OP_ON, 0, 0, 1}            },
    battery_row{CPE_BAT_CHARGING_HIGH,   {LED_BAT_GREEN, LED_OP_BLINK, 1000, 1000, 1} },
    battery_row{CPE_BAT_CHARGING_MIDDLE, {LED_BAT_YELLOW, LED_OP_BLINK, 1000, 1000, 1}},
    battery_row{CPE_BAT_CHARGING_LOW,    {LED_BAT_RED, LED_OP_BLINK, 1000, 1000, 1}   },
};

// By phone_state.
constexpr auto voice_steps = std::array{
    led_step{LED_VOICE_BLUE, LED_OP_OFF,   0,    0,    0},
    led_step{LED_VOICE_BLUE, LED_OP_ON,    0,    0,    4},
    led_step{LED_VOICE_BLUE, LED_OP_BLINK, 1000, 1000, 4},
};

void kiv_cpe_set_led_net_led_status(int type, int roam)
{
    LED_INFO("kiv_cpe_set_led_net_led_status: type = %d, roam = %d", type, roam);
    for (const net_row &row : net_rows) {
        if (row.type == type) {
            kiv_led_set_net_led_operation(roam == 0 ? row.home : row.roaming);
        }
    }
}

void kiv_cpe_set_led_sig_led_status(int type, int sig, int roam)
{
    LED_INFO("kiv_cpe_set_led_sig_led_status: type = %d, sig = %d,roam = %d", type, sig, roam);
    if (type == NET_NO_SERVICE) {
        kiv_led_set_voice_led_operation(no_service_step);
    } else if (static_cast<unsigned>(sig) < signal_steps.size()) {
        kiv_led_set_voice_led_operation(signal_steps[static_cast<unsigned>(sig)]);
    }
}

void kiv_cpe_led_set_bat_status(int status, int power_state)
{
    LED_INFO("enter kiv_cpe_led_set_bat_status cur_cpe_battery_status=%d\n", status);
    if (power_state != POWER_ON || status == CPE_BAT_NOTHING || status == CPE_BAT_NONE) {
        kiv_led_set_bat_led_off();
        return;
    }
    for (const battery_row &row : battery_rows) {
        if (row.status == status) {
            kiv_led_set_bat_led_operation(row.step);
        }
    }
}

// The power group accepts LED_POWER_BLUE only, so a connected charger is refused there and shows nothing.
void kiv_cpe_led_set_power_status(int charger)
{
    if (charger == CHARGER_CONNECTED) {
        kiv_led_set_power_led_operation(LED_POWER_54, LED_OP_ON, 0, 0, 1);
    } else {
        kiv_led_set_power_led_off();
    }
}

void kiv_cpe_led_set_voicemail_status(int voicemail)
{
    if (voicemail == 1) {
        kiv_led_set_voicemail_led_operation(LED_VOICEMAIL_GREEN, LED_OP_BLINK, 1000, 1000, 1);
    } else {
        kiv_led_set_voicemail_led_operation(LED_VOICEMAIL_GREEN, LED_OP_OFF, 0, 0, 0);
    }
}

void kiv_cpe_led_set_voice_status(int phone)
{
    if (static_cast<unsigned>(phone) < voice_steps.size()) {
        kiv_led_set_voice_led_operation(voice_steps[static_cast<unsigned>(phone)]);
    }
}

void kiv_cpe_led_set_all_leds_off()
{
    LED_INFO("enter kiv_led_set_all_leds_off\n");
    kiv_led_set_bat_led_off();
    kiv_led_set_net_led_off();
    kiv_led_set_voice_led_off();
    kiv_led_set_voicemail_led_off();
}

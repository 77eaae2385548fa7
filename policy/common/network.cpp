#include "policy/common/network.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "output/led_groups.h"
#include "painters/net_led.h"
#include "policy/products.h"

#include <array>
#include <string_view>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

struct net_type_row {
    std::string_view text;
    net_class type;
};

// Every other text, the empty one among them, is limited or no service.
constexpr auto net_type_rows = std::array{
    net_type_row{"GSM",        NET_2G},
    net_type_row{"GPRS",       NET_2G},
    net_type_row{"EDGE",       NET_2G},
    net_type_row{"CDMA",       NET_2G},
    net_type_row{"HSDPA",      NET_3G},
    net_type_row{"HSUPA",      NET_3G},
    net_type_row{"UMTS",       NET_3G},
    net_type_row{"HSPA",       NET_3G},
    net_type_row{"HSPA+",      NET_3G},
    net_type_row{"DC-HSPA+",   NET_3G},
    net_type_row{"EVDO",       NET_3G},
    net_type_row{"EVDO_EHRPD", NET_3G},
    net_type_row{"CDMA_EVDO",  NET_3G},
    net_type_row{"TDSCDMA",    NET_3G},
    net_type_row{"LTE",        NET_4G},
    net_type_row{"ENDC",       NET_5G},
    net_type_row{"SA",         NET_5G},
    net_type_row{"LTE-NSA",    NET_5G},
};

static net_class classify(std::string_view text)
{
    for (const net_type_row &row : net_type_rows) {
        if (row.text == text) {
            return row.type;
        }
    }
    return NET_NO_SERVICE;
}

void recv_nwNetType()
{
    const nv_text text = kiv_led_read_nv_text("network_type");

    LED_ERROR("recv nettype %s\n", text.data());
    kiv_led_net_type_dispatch(classify(text.data()));
}

void recv_nwRoamStatus()
{
    const nv_text text = kiv_led_read_nv_text("simcard_roam");

    LED_ERROR("recv roam state:%s...\n", text.data());
    kiv_led_roaming_dispatch(std::string_view(text.data()) == "Home" ? 0 : 1);
}

void recv_nwSigStatus()
{
    const int bars = kiv_led_read_nv_int("signalbar");

    LED_INFO("recv_nwSigStatus :%d", bars);
    kiv_led_signal_dispatch(bars);
}

void kiv_led_handle_nwinfoStatus(int net_type)
{
    LED_INFO("enter kiv_led_handle_nwinfoStatus : %d\n ", net_type);
    if (led_power_state != POWER_ON) {
        LED_INFO("enter kiv_led_handle_nwinfoStatus, not power on \n ");
        return;
    }
    if (cur_led_sleep_status == ASLEEP) {
        LED_INFO("enter kiv_led_handle_nwinfoStatus, sleep mode \n ");
        kiv_led_set_net_led_off();
        return;
    }
    if (net_type != led_net_type) {
        LED_INFO("kiv_set_net_led_state :state changed!\n");
        kiv_set_net_led_state(net_type, led_ppp_state);
    } else {
        LED_INFO("kiv_set_net_led_state :state same!\n");
    }
    led_net_type = net_type;
}

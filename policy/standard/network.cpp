#include "policy/standard/network.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "core/nv_read.h"
#include "core/product_route.h"
#include "policy/cpe/indicators.h"
#include "policy/standard/net_led.h"
#include "policy/standard/signal_led.h"

#include <array>
#include <string_view>

constexpr char led_log_source[] = "kiv_mirta_led";

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

constexpr product_route net_type_route = {
    .ufi = kiv_led_handle_nwinfoStatus,
    .data_card = kiv_led_handle_nwinfoStatus,
    .paper_kite = kiv_led_handle_nwinfoStatus,
    .module = kiv_cpe_led_handle_nwinfoStatus,
    .uni_core_cpe = kiv_led_handle_nwinfoStatus,
};
constexpr product_route roaming_route = {
    .module = kiv_cpe_led_handle_nwRoamStatus,
};
constexpr product_route signal_route = {
    .data_card = kiv_led_handle_signal_state,
    .module = kiv_cpe_led_handle_signal_state,
    .uni_core_cpe = kiv_singlechip_led_handle_signal_state,
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
    kiv_led_route(net_type_route, classify(text.data()));
}

void recv_nwRoamStatus()
{
    const nv_text text = kiv_led_read_nv_text("simcard_roam");

    LED_ERROR("recv roam state:%s...\n", text.data());
    kiv_led_route(roaming_route, std::string_view(text.data()) == "Home" ? 0 : 1);
}

void recv_nwSigStatus()
{
    const int bars = kiv_led_read_nv_int("signalbar");

    LED_INFO("recv_nwSigStatus :%d", bars);
    kiv_led_route(signal_route, bars);
}

#include "alarms/kiv_led_data_limit.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "core/nv_read.h"
#include "core/product_route.h"
#include "kiv/adabsp.h"
#include "kiv/ipc.h"
#include "output/led_groups.h"
#include "policy/cpe/indicators.h"
#include "policy/standard/net_led.h"

#include <cstdint>
#include <cstdlib>
#include <string_view>

constexpr char led_log_source[] = "kiv_led_data_limit";

constexpr int check_period_ms = 5000;
constexpr int remind_period_ms = 1000;
constexpr double bytes_per_kib = 1024;

using limit_text = std::array<char, 128>;

constexpr product_route ppp_route = {
    .ufi = kiv_led_handle_pppStatus,
    .data_card = kiv_led_handle_pppStatus,
    .paper_kite = kiv_led_handle_pppStatus,
    .module = kiv_cpe_led_handle_pppStatus,
    .uni_core_cpe = kiv_led_handle_pppStatus,
};

struct size_unit_row {
    uint64_t code; // behind the underscore of NV "data_volume_limit_size"
    double bytes;
};

// Any other code, or none: the size is in bytes.
constexpr auto size_unit_rows = std::array{
    size_unit_row{1,       bytes_per_kib *bytes_per_kib                              },
    size_unit_row{1024,    bytes_per_kib *bytes_per_kib *bytes_per_kib               },
    size_unit_row{1048576, bytes_per_kib *bytes_per_kib *bytes_per_kib *bytes_per_kib},
};

static led_word data_limit_check_timer; // 0 when none
static led_word data_remind_timer;
static led_word data_remind_active; // 1 while the reminder plays
static led_word data_remind_phase;  // never reset: a new reminder goes on where the last one stopped
static char no_argument[] = "";

static bool product_has_reminder()
{
    return led_product_type == LED_PRODUCT_UFI || led_product_type == LED_PRODUCT_PAPER_KITE ||
           led_product_type == LED_PRODUCT_UNI_CORE_CPE;
}

static void delete_check_timer()
{
    if (data_limit_check_timer != 0) {
        kiv_delete_timer(data_limit_check_timer);
        data_limit_check_timer = 0;
    }
}

static limit_text read_text(const char *key)
{
    limit_text text;

    kiv_led_read_nv(key, text);
    return text;
}

// A number beyond 64 bits is the largest one.
static uint64_t read_u64(const char *key)
{
    return std::strtoull(read_text(key).data(), nullptr, 10);
}

static int reaches_alert(uint64_t used, double limit)
{
    const uint64_t alert = read_u64("data_volume_alert_percent");
    // Usage is rounded to single precision first. A limit of 0 gives infinity, which reaches every level, or with no
    // usage not-a-number, which reaches none.
    const double share = static_cast<double>(static_cast<float>(used)) / limit * 100.0;

    return share >= static_cast<double>(alert) ? 1 : 0;
}

static double bytes_of_unit(uint64_t code)
{
    for (const size_unit_row &row : size_unit_rows) {
        if (row.code == code) {
            return row.bytes;
        }
    }
    return 1;
}

// SIZE_CODE, such as "4_1024" for 4 GB; without a code SIZE is in bytes.
static double parse_limit_size(const char *text)
{
    char *end = nullptr;
    const double size = std::strtod(text, &end);

    if (end == text || *end != '_') {
        return size;
    }
    return size * bytes_of_unit(std::strtoull(end + 1, nullptr, 10));
}

void recv_pppStatus(const char *p_data)
{
    LED_ERROR("[info] enter the pppStatus fun p_data:%s\n", p_data);
    kiv_led_route(ppp_route, kiv_led_text_to_int(p_data) == 1 ? 1 : 0);
}

void get_pppStatus()
{
    const nv_text status = kiv_led_read_nv_text("q6_ppp_status");

    LED_ERROR("q6_ppp_status %s\n", status.data());
    kiv_led_route(ppp_route, std::string_view(status.data()) == "q6_ppp_connected" ? 1 : 0);
}

void kiv_led_handle_pppStatus(int ppp)
{
    LED_INFO("[info] enter the pppStatus fun p_data:%d\n", ppp);
    if (led_power_state != POWER_ON) {
        LED_INFO("enter kiv_led_handle_pppStatus, not power on \n ");
        led_ppp_state = ppp;
        return;
    }
    if (cur_led_sleep_status == 1) {
        LED_INFO("enter kiv_led_handle_pppStatus, sleep mode \n ");
        led_ppp_state = ppp;
        kiv_led_set_net_led_off();
        delete_check_timer();
        return;
    }
    if (ppp != led_ppp_state) {
        kiv_set_net_led_state(led_net_type, ppp);
    }
    led_ppp_state = ppp;
    if (!product_has_reminder()) {
        return;
    }
    if (ppp == 1) {
        LED_INFO("[info]PPP connect, start check data remind\n");
        kiv_led_start_remind_data_limit_check();
    } else if (ppp == 0) {
        LED_INFO("[info]PPP disconnect, stop data remind\n");
        kiv_led_stop_data_limit_remind();
        delete_check_timer();
    }
}

void kiv_led_start_remind_data_limit_check()
{
    LED_INFO("[IN FUNC]:kiv_led_start_remind_data_limit_check\n");
    if (data_limit_check_timer == 0) {
        data_limit_check_timer = kiv_timer(get_dstStatus, no_argument, check_period_ms, 1);
    }
}

void kiv_led_stop_remind_data_limit_check()
{
    LED_INFO("[IN FUNC]:kiv_led_stop_remind_data_limit_check\n");
    delete_check_timer();
}

void kiv_led_start_data_limit_remind()
{
    if (data_remind_active == 1) {
        return;
    }
    data_remind_timer = kiv_timer(kiv_led_remind_data_limit_proc, no_argument, remind_period_ms, 1);
    data_remind_active = 1;
}

void kiv_led_stop_data_limit_remind()
{
    if (data_remind_active == 0) {
        return;
    }
    kiv_delete_timer(data_remind_timer);
    data_remind_active = 0;
    kiv_set_net_led_state(led_net_type, led_ppp_state);
}

void kiv_led_end_data_limit()
{
    kiv_led_stop_data_limit_remind();
    kiv_led_stop_remind_data_limit_check();
}

void get_dstStatus(void *)
{
    std::array<char, 2> text;
    kiv_led_read_nv("data_volume_limit_switch", text);
    const std::string_view limit_switch = text.data();

    LED_INFO("[info] enter  get_dstStatus status:%s\n", text.data());
    if (led_power_state != POWER_ON) {
        LED_INFO("get_dstStatus, not power on \n ");
        return;
    }
    if (cur_led_sleep_status == 1) {
        LED_INFO("get_dstStatus, sleep mode \n ");
        delete_check_timer();
        return;
    }
    if (limit_switch == "0") {
        LED_INFO("[info] disable data overflow remind, stop remind\n");
        kiv_led_stop_data_limit_remind();
        return;
    }
    if (limit_switch != "1" || led_ppp_state != 1) {
        return;
    }
    if (kiv_led_check_data_limit() == 1) {
        LED_INFO("[info] data overflow start remind\n");
        kiv_led_start_data_limit_remind();
    } else if (led_ppp_state == 1 && kiv_led_check_data_limit() == 0) { // the call may have ended meanwhile
        LED_INFO("[info]  data not overflow , stop remind\n");
        kiv_led_stop_data_limit_remind();
    }
}

// Four seconds of the normal indication, one dark, one of red blinking, one dark.
void kiv_led_remind_data_limit_proc(void *)
{
    LED_INFO("[IN FUNC]:kiv_led_remind_data_limit_proc\n");
    if (data_remind_active == 0) {
        return;
    }
    const int phase = data_remind_phase;
    switch (phase) {
    case 1:
        kiv_set_net_led_state(led_net_type, led_ppp_state);
        break;
    case 5:
    case 7:
        kiv_led_set_net_led_off();
        break;
    case 6:
        kiv_led_set_net_led_operation(LED_NET_RED, LED_OP_BLINK, 400, 400, 2);
        break;
    default: // the LED stays as it is
        break;
    }
    data_remind_phase = phase == 7 ? 1 : phase + 1;
}

int kiv_led_check_data_limit()
{
    if (std::string_view(read_text("data_volume_limit_switch").data()) == "0") {
        return 0;
    }
    const limit_text unit_text = read_text("data_volume_limit_unit");
    const std::string_view unit = unit_text.data();

    if (unit == "time") {
        return kiv_led_check_data_limit_by_time();
    }
    return unit == "data" ? kiv_led_check_data_limit_by_data() : 0;
}

int kiv_led_check_data_limit_by_data()
{
    const uint64_t sent = read_u64("monthly_tx_bytes");
    const uint64_t received = read_u64("monthly_rx_bytes");
    const double limit = parse_limit_size(read_text("data_volume_limit_size").data());

    return reaches_alert(sent + received, limit);
}

int kiv_led_check_data_limit_by_time()
{
    const uint64_t used = read_u64("monthly_time");
    const double hours = std::strtod(read_text("data_volume_limit_size").data(), nullptr);

    return reaches_alert(used, hours * 60 * 60);
}

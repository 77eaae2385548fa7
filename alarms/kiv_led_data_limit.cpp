#include "alarms/kiv_led_data_limit.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "ground/timer.h"
#include "kiv/adabsp.h"
#include "kiv/ipc.h"
#include "output/led_groups.h"
#include "painters/net_led.h"

#include <array>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string_view>

constexpr char LED_LOG_SOURCE[] = "kiv_led_data_limit";

constexpr int CHECK_PERIOD_MS = 5000;
constexpr int REMIND_PERIOD_MS = 1000;

// Ticks of the reminder's cycle, a second each; those between show what the one before shows.
enum remind_phase : int { REMIND_NORMAL = 1, REMIND_DARK = 5, REMIND_BLINK = 6, REMIND_DARK_AGAIN = 7 };

constexpr double BYTES_PER_KIB = 1024;

using limit_text = std::array<char, 128>;

struct size_unit_row {
    uint64_t code; // behind the underscore of NV "data_volume_limit_size"
    double bytes;
};

// Any other code, or none: the size is in bytes.
constexpr auto size_unit_rows = std::array{
    size_unit_row{1,       BYTES_PER_KIB *BYTES_PER_KIB                              },
    size_unit_row{1024,    BYTES_PER_KIB *BYTES_PER_KIB *BYTES_PER_KIB               },
    size_unit_row{1048576, BYTES_PER_KIB *BYTES_PER_KIB *BYTES_PER_KIB *BYTES_PER_KIB},
};

static led_word data_limit_check_timer; // 0 when none
static led_word data_remind_timer;
static led_word data_remind_active; // 1 while the reminder plays
static led_word
    data_remind_phase; // remind_phase, 0 at first; never reset: a new reminder goes on where the last one stopped
static char no_argument[] = "";

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

// NV "data_volume_limit_size" is SIZE_CODE, such as "4_1024" for 4 GB; without a code SIZE is in bytes.
static double read_limit_in_bytes()
{
    double size = 0;
    unsigned long long code = 0;

    std::sscanf(read_text("data_volume_limit_size").data(), "%lf_%llu", &size, &code);
    return size * bytes_of_unit(code);
}

static double read_limit_in_hours()
{
    return std::strtod(read_text("data_volume_limit_size").data(), nullptr);
}

static int kiv_led_check_data_limit_by_data()
{
    const uint64_t sent = read_u64("monthly_tx_bytes");
    const uint64_t received = read_u64("monthly_rx_bytes");

    return reaches_alert(sent + received, read_limit_in_bytes());
}

static int kiv_led_check_data_limit_by_time()
{
    const uint64_t used = read_u64("monthly_time");

    return reaches_alert(used, read_limit_in_hours() * 60 * 60);
}

// 1 once the used share reaches the alert level, else 0.
static int kiv_led_check_data_limit()
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

// Four seconds of the normal indication, one dark, one of red blinking, one dark. A stop on the receive thread that
// comes behind the look at data_remind_active is overtaken: this tick then has the LED once more.
static void kiv_led_remind_data_limit_proc(void *)
{
    LED_INFO("[IN FUNC]:kiv_led_remind_data_limit_proc\n");
    if (data_remind_active == 0) {
        return;
    }
    const int phase = data_remind_phase;
    switch (phase) {
    case REMIND_NORMAL:
        kiv_set_net_led_state(led_net_type, led_ppp_state);
        break;
    case REMIND_DARK:
    case REMIND_DARK_AGAIN:
        kiv_led_set_net_led_off();
        break;
    case REMIND_BLINK:
        kiv_led_set_net_led_operation(LED_NET_RED, LED_OP_BLINK, 400, 400, 2);
        break;
    default: // the LED stays as it is
        break;
    }
    data_remind_phase = phase == REMIND_DARK_AGAIN ? REMIND_NORMAL : phase + 1;
}

// A scene that ends the reminder while the check is on its way here finds none to end: it then plays in the dark, until
// the call ends or the next scene.
static void kiv_led_start_data_limit_remind()
{
    if (data_remind_active == 1) {
        return;
    }
    kiv_led_start_timer(data_remind_timer, kiv_led_remind_data_limit_proc, no_argument, REMIND_PERIOD_MS);
    data_remind_active = 1;
}

// The check, every 5 s on the timer thread.
static void get_dstStatus(void *)
{
    std::array<char, 2> text;
    kiv_led_read_nv("data_volume_limit_switch", text);
    const std::string_view limit_switch = text.data();

    LED_INFO("[info] enter  get_dstStatus status:%s\n", text.data());
    if (led_power_state != POWER_ON) {
        LED_INFO("get_dstStatus, not power on \n ");
        return;
    }
    if (cur_led_sleep_status == ASLEEP) {
        LED_INFO("get_dstStatus, sleep mode \n ");
        kiv_led_end_data_limit_check();
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

void kiv_led_start_remind_data_limit_check()
{
    LED_INFO("[IN FUNC]:kiv_led_start_remind_data_limit_check\n");
    kiv_led_start_timer(data_limit_check_timer, get_dstStatus, no_argument, CHECK_PERIOD_MS);
}

void kiv_led_end_data_limit_check()
{
    kiv_led_end_timer(data_limit_check_timer);
}

static void kiv_led_stop_remind_data_limit_check()
{
    LED_INFO("[IN FUNC]:kiv_led_stop_remind_data_limit_check\n");
    kiv_led_end_data_limit_check();
}

void kiv_led_stop_data_limit_remind()
{
    if (data_remind_active == 0) {
        return;
    }
    kiv_delete_timer(kiv_led_take_timer(data_remind_timer));
    data_remind_active = 0;
    kiv_set_net_led_state(led_net_type, led_ppp_state);
}

void kiv_led_end_data_limit()
{
    kiv_led_stop_data_limit_remind();
    kiv_led_stop_remind_data_limit_check();
}

#include "nightmode/kiv_led_night_mode.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "ground/timer.h"
#include "kiv/ipc.h"
#include "kiv/led.h"
#include "kiv/nv.h"
#include "painters/net_led.h"

#include <cstdio>
#include <cstring>
#include <ctime>
#include <pthread.h>
#include <string_view>

constexpr char LED_LOG_SOURCE[] = "kiv_led_night_mode";

constexpr int CHECK_PERIOD_MS = 20000;
constexpr int MINUTES_PER_HOUR = 60;
constexpr int MINUTES_PER_DAY = 1440;

enum night_switch_value : int { NIGHT_SWITCH_OFF = 0, NIGHT_SWITCH_ON = 1, NIGHT_SWITCH_SUSPENDED = 2 };

using night_text = std::array<char, 8>;

static pthread_mutex_t night_mode_mutex = PTHREAD_MUTEX_INITIALIZER; // held for the whole of every check
static led_word night_switch;                                        // night_switch_value; any other counts as off
static led_word night_start_minute;                                  // minutes after midnight, UTC
static led_word night_end_minute;
static led_word night_window_entered; // 1 after a check has acted on being inside the window
static led_word night_check_timer;    // 0 when none

static char first_check[] = "1";
static char timer_check[] = "";

static night_text read_text(const char *key)
{
    night_text text;

    kiv_led_read_nv(key, text);
    return text;
}

static int read_int(const char *key)
{
    return kiv_led_text_to_int(read_text(key).data());
}

// NV says it before the daemon does, for whoever reads NV at the relight; the relight comes last, because each LED that
// it shows afresh passes the night-mode gate, which asks is_night_mode.
static void set_night_mode(int on)
{
    kiv_nvconfig_write("is_night_mode", on == 1 ? "1" : "0", 1);
    is_night_mode = on;
    kiv_lib_led_relight_msg();
}

static bool clock_is_synchronised()
{
    const int nitz = read_int("nitz_sync_flag");
    const int syn_done = read_int("syn_done");
    const night_text mode = read_text("systime_mode");

    if (nitz == 1 || syn_done == 1 || std::string_view(mode.data()) == "manual") {
        return true;
    }
    LED_INFO("Time not sync![%d,%d,%s]", nitz, syn_done, mode.data());
    return false;
}

// Start equal to end is the whole day.
static bool is_inside(int start, int end, int now)
{
    if (start < end) {
        return start <= now && now < end;
    }
    return (start <= now && now < MINUTES_PER_DAY) || (0 <= now && now < end);
}

static bool is_in_window()
{
    const std::time_t seconds = std::time(nullptr);
    std::tm utc = {};
    gmtime_r(&seconds, &utc);
    const int now = MINUTES_PER_HOUR * utc.tm_hour + utc.tm_min;

    if (!clock_is_synchronised()) {
        return false;
    }
    std::printf("minutes:%d\n", now);
    return is_inside(night_start_minute, night_end_minute, now);
}

static void enter_window()
{
    if (night_switch == NIGHT_SWITCH_ON) {
        LED_ERROR("Night mode, LED OFF!\n");
        set_night_mode(1);
    } else {
        LED_ERROR("Normal mode, LED ON!\n");
    }
    night_window_entered = 1;
}

static void leave_window()
{
    if (night_switch == NIGHT_SWITCH_SUSPENDED) {
        night_switch = NIGHT_SWITCH_ON;
        kiv_nvconfig_write("night_mode_switch", "1", 1);
        LED_ERROR("Next time will Enable Night mode\n");
    }
    LED_ERROR("Now is Normal mode, LED ON!\n");
    set_night_mode(0);
    night_window_entered = 0;
}

static void check(const char *arg)
{
    const bool first = arg != nullptr && std::strlen(arg) == 1;
    const bool in_window = is_in_window();

    LED_ERROR("[%lu]First check night mode[arg, is in night, mode switch]:%s,%d,%d",
              static_cast<unsigned long>(pthread_self()), arg == nullptr ? "(null)" : arg, in_window ? 1 : 0,
              int{night_switch});
    if (in_window && (first || night_window_entered == 0)) {
        enter_window();
    } else if (!in_window && (first || night_window_entered == 1)) {
        leave_window();
    }
}

// One check of the clock against the window, at a set-up and every 20 s. Timer, main and receive thread, one at a time.
// arg: text of one character for the first check after a set-up, "" or null for the timer's.
static void kiv_led_night_mode_proc(void *arg)
{
    pthread_mutex_lock(&night_mode_mutex);
    check(static_cast<const char *>(arg));
    pthread_mutex_unlock(&night_mode_mutex);
}

static void read_times()
{
    // One hour and one minute for both: what the end time's text does not say, it takes over from the start time.
    int hour = 0;
    int minute = 0;

    const night_text start = read_text("night_mode_start_time");
    LED_INFO("Night mode: start_time:%s\n", start.data());
    std::sscanf(start.data(), "%d:%d", &hour, &minute);
    night_start_minute = MINUTES_PER_HOUR * hour + minute;

    const night_text end = read_text("night_mode_end_time");
    LED_INFO("Night mode: end_time:%s\n", end.data());
    std::sscanf(end.data(), "%d:%d", &hour, &minute);
    night_end_minute = MINUTES_PER_HOUR * hour + minute;
}

static void read_close_all_led()
{
    const int close_all = read_int("night_mode_close_all_led");

    LED_INFO("Need close all led:%d\n", close_all);
    if (close_all != night_mode_close_all_led) {
        night_mode_close_all_led = close_all;
        kiv_set_net_led_state(led_net_type, led_ppp_state);
    }
}

// A check that is under way on the timer thread may still enter the window behind this; the next set-up lifts it.
static void switch_off()
{
    kiv_delete_timer(kiv_led_take_timer(night_check_timer));
    kiv_nvconfig_write("is_night_mode", "0", 1);
    night_window_entered = 0;
    is_night_mode = 0;
    kiv_lib_led_relight_msg();
    LED_ERROR("Delete night mode check timer AND EXIT night mode\n");
}

void kiv_led_night_mode_init()
{
    read_times();

    const int value = read_int("night_mode_switch");
    night_switch = value;
    LED_INFO("Cur night mode switch:%d\n", value);

    read_close_all_led();
    if (value == NIGHT_SWITCH_ON || value == NIGHT_SWITCH_SUSPENDED) {
        kiv_led_night_mode_proc(first_check);
        if (kiv_led_start_timer(night_check_timer, kiv_led_night_mode_proc, timer_check, CHECK_PERIOD_MS)) {
            LED_INFO("Creat night mode check timer SUCCESS\n");
        }
    } else {
        switch_off();
    }
}

// The whole receive path over the fake platform: messages, timers and indications in any order and state.
#include "fake_platform.h"
#include "receive_input.h"

#include "alarms/kiv_led_data_limit.h"
#include "alarms/kiv_led_over_temp.h"
#include "core/bsp_ind.h"
#include "core/channel.h"
#include "core/led_ctx.h"
#include "nightmode/kiv_led_night_mode.h"
#include "policy/cpe/state.h"
#include "policy/standard/sms.h"
#include "policy/standard/voice.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <set>

extern "C" int LLVMFuzzerInitialize(int *argc, char ***argv);
extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size);

struct input {
    const uint8_t *at;
    const uint8_t *end;
};

struct state_word {
    led_word &word;
    int values; // 0: any signed byte
};

static const std::array<state_word, input_state_words> state_words = {
    {
     {led_bsp_ready, 2},
     {led_power_state, 8},
     {cur_led_sleep_status, 0},
     {led_net_type, 6},
     {led_signal_level, 0},
     {led_sms_state, 4},
     {led_ppp_state, 2},
     {is_night_mode, 2},
     {night_mode_close_all_led, 0},
     {over_temp_enable, 2},
     {is_over_temp, 2},
     {cur_cpe_power_state, 8},
     {cur_cpe_net_type, 6},
     {cur_cpe_charger_state, 3},
     {cur_cpe_ppp_status, 2},
     {cur_cpe_roam_status, 2},
     {cur_cpe_signal_state, 0},
     {cur_cpe_voicemail_state, 0},
     {cur_cpe_battery_status, 8},
     {led_enable, 0},
     }
};

static received_message received;
static unsigned long messages;

static int take(input &in)
{
    return in.at == in.end ? 0 : *in.at++;
}

static int take_signed(input &in)
{
    return static_cast<int8_t>(take(in));
}

static unsigned take_two(input &in)
{
    const unsigned low = static_cast<unsigned>(take(in));
    return low | static_cast<unsigned>(take(in)) << 8;
}

static std::string take_text(input &in, unsigned length)
{
    const size_t there = std::min<size_t>(length, static_cast<size_t>(in.end - in.at));
    const std::string text(reinterpret_cast<const char *>(in.at), there);
    in.at += there;
    return text;
}

// Brings the modules' own state back to what it was, so that an input means the same wherever it stands in a run.
static void reset_daemon()
{
    fake_platform() = {};
    kiv_led_end_data_limit();
    kiv_led_over_temp_init();
    kiv_led_night_mode_init();
    kiv_led_del_new_sms_timer();
    recv_voicePhoneStatus("");
}

static void set_states(input &in)
{
    led_product_type = take(in) % (LED_PRODUCT_COUNT + 1);
    for (const state_word &state : state_words) {
        const int value = take_signed(in);
        state.word = state.values == 0 ? value : (value & 0x7f) % state.values;
    }
    led_enable = 1;
}

static void set_nv(input &in)
{
    const char *key = input_nv_keys[static_cast<size_t>(take(in)) % input_nv_keys.size()];
    const unsigned length = static_cast<unsigned>(take(in));
    fake_platform().nv.erase(key);
    if (length != missing_nv) {
        fake_platform().nv[key] = take_text(in, length).c_str();
    }
}

static void receive(std::optional<std::string> message)
{
    fake_platform().inbox.push_back(std::move(message));
    kiv_led_receive_message(received);
    ++messages;
}

static void fire(size_t which)
{
    const std::map<int, fake_timer> &timers = fake_platform().timers;
    if (!timers.empty()) {
        fake_fire(std::next(timers.begin(), static_cast<long>(which % timers.size()))->first);
    }
}

static void indicate(int choice)
{
    char record[1] = {};
    kiv_led_bspIpcCallBack(first_input_indication + (choice & 0xf), 0, (choice & 0x80) != 0 ? nullptr : record);
}

static void set_query(input &in)
{
    std::optional<bsp_query_result> &query = (take(in) & 1) == 0 ? fake_platform().charger : fake_platform().battery;
    const int ret = take_signed(in);
    const int data = take_signed(in);
    query = ret == INT8_MIN ? std::nullopt : std::optional(bsp_query_result{ret, data});
}

static void set_sensor(input &in)
{
    std::optional<int> &sensor = fake_platform().sensors[static_cast<size_t>(take(in)) % BSP_SENSOR_COUNT];
    const int temperature = take_signed(in);
    sensor = temperature == INT8_MIN ? std::nullopt : std::optional(temperature);
}

static void step(input &in)
{
    fake_device &device = fake_platform();
    switch (take(in)) {
    case STEP_MESSAGE:
        receive(take_text(in, take_two(in) % (longest_input_message + 1)));
        break;
    case STEP_NO_MESSAGE:
        receive(std::nullopt);
        break;
    case STEP_NV:
        set_nv(in);
        break;
    case STEP_TIMER:
        fire(static_cast<size_t>(take(in)));
        break;
    case STEP_INDICATION:
        indicate(take(in));
        break;
    case STEP_SENSOR:
        set_sensor(in);
        break;
    case STEP_QUERY:
        set_query(in);
        break;
    case STEP_LED_RESULT: {
        const int led = take(in);
        device.led_results[led] = take_signed(in);
        break;
    }
    case STEP_CLOCK:
        device.clock = static_cast<std::time_t>(take_two(in)) * 60;
        break;
    case STEP_NO_TIMERS:
        device.failing_timers = take(in);
        break;
    case STEP_ROLLING_LEDS: {
        const char first = static_cast<char>(take(in));
        device.rolling_leds.assign(first == 0 ? 0 : 1, std::string(1, first));
        break;
    }
    case STEP_ENABLED:
        led_enable = take(in) & 1;
        break;
    default:
        break;
    }
}

// A second repeating timer of one purpose has no handle any more: it would run until the device restarts.
static void check_timers()
{
    std::set<void (*)(void *)> seen;
    for (const auto &[handle, timer] : fake_platform().timers) {
        if (timer.repeats && !seen.insert(timer.callback).second) {
            std::fprintf(stderr, "timer %d repeats beside another of its purpose\n", handle);
            std::abort();
        }
    }
}

int LLVMFuzzerInitialize(int *, char ***)
{
    // The night-mode check writes to standard output.
    if (std::freopen("/dev/null", "w", stdout) == nullptr) {
        return 1;
    }
    return std::atexit([] { std::fprintf(stderr, "%lu messages received\n", messages); });
}

int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    input in = {data, data + size};

    reset_daemon();
    set_states(in);
    while (in.at != in.end) {
        step(in);
        check_timers();
    }
    return 0;
}

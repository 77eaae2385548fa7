// The whole receive path over the fake platform: messages, timers and indications in any order and state.
#include "fake_platform.h"
#include "receive_input.h"

#include "boot.h"
#include "core/channel.h"
#include "ground/led_ctx.h"
#include "kiv/reg.h"
#include "policy/cpe/state.h"

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

static const std::array<state_word, INPUT_STATE_WORDS> state_words = {
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
static bsp_ind_callback board_callback;

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

static void receive(std::optional<std::string> message)
{
    fake_platform().inbox.push_back(std::move(message));
    kiv_led_receive_message(received);
    ++messages;
}

static void send(uint16_t us_cmd, uint16_t source, uint32_t event)
{
    svc_msg message = {};
    message.us_cmd = us_cmd;
    message.us_dest_module_id = KIV_MODULE_LED;
    message.us_source_module_id = source;
    message.ul_event_mask = event;
    receive(std::string(reinterpret_cast<const char *>(&message), sizeof message));
}

// Brings the modules' own state back to what it was, so that an input means the same wherever it stands in a run: a
// shut-down ends the reminder and a new message's blink, alarm and night are switched off by empty settings, the phone
// is quiet.
static void reset_daemon()
{
    fake_platform() = {};
    led_enable = 1;
    led_product_type = LED_PRODUCT_UFI;
    led_power_state = POWER_ON;
    led_sms_state = SMS_NEW;
    send(MSG_CMD_SERVICE_NOTIFY, KIV_MODULE_MAIN, REG_MC_EVENT_SHUTTING_DOWN);
    send(KIV_MSG_CMD_LED_OVER_TEMP_MSG, KIV_MODULE_MAIN, 0);
    send(KIV_MSG_CMD_LED_NIGHT_MODE_MSG, KIV_MODULE_MAIN, 0);
    send(MSG_CMD_SERVICE_NOTIFY, KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE);
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
    if (length != MISSING_NV) {
        fake_platform().nv[key] = take_text(in, length).c_str();
    }
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
    board_callback(FIRST_INPUT_INDICATION + (choice & 0xf), 0, (choice & 0x80) != 0 ? nullptr : record);
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
        receive(take_text(in, take_two(in) % (LONGEST_INPUT_MESSAGE + 1)));
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
    boot("MODULE"); // the one product that registers for the board's indications
    board_callback = fake_platform().indication;
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

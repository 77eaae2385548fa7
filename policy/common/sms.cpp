#include "policy/common/sms.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "ground/timer.h"
#include "kiv/adabsp.h"
#include "kiv/ipc.h"
#include "kiv/reg.h"
#include "output/led_groups.h"

#include <array>
#include <string_view>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";
constexpr int NEW_SMS_PERIOD_MS = 10000;

// By sms_state.
constexpr auto sms_steps = std::array{
    led_step{LED_SMS_BLUE, LED_OP_OFF,   0,   0,    0},
    led_step{LED_SMS_BLUE, LED_OP_ON,    0,   0,    4},
    led_step{LED_SMS_BLUE, LED_OP_BLINK, 800, 1200, 4},
    led_step{LED_SMS_BLUE, LED_OP_BLINK, 800, 1200, 4},
};
static_assert(sms_steps.size() == SMS_STORE_FULL + 1, "an SMS state has no row");

static led_word new_sms_timer; // 0 when none; keeps the handle after the timer has fired
static char no_argument[] = "";

static void show_sms_state(sms_state state)
{
    kiv_led_set_sms_led_operation(sms_steps[static_cast<unsigned>(state)]);
}

// Looks at neither power nor sleep: a message that came before a charging power-off turns steady all the same, and a
// timeout that runs while the sleep scene deletes its timer lights the LED of a sleeping device.
static void kiv_led_new_sms_timeout_proc(void *)
{
    LED_INFO("enter kiv_led_new_sms_timeout_proc");
    show_sms_state(SMS_UNREAD);
    led_sms_state = SMS_UNREAD;
}

static void kiv_led_set_new_sms_timer()
{
    LED_INFO("enter kiv_led_set_new_sms_timer");
    new_sms_timer = kiv_timer(kiv_led_new_sms_timeout_proc, no_argument, NEW_SMS_PERIOD_MS, 0);
}

static void kiv_led_del_new_sms_timer()
{
    LED_INFO("enter kiv_led_del_new_sms_timer");
    kiv_led_end_timer(new_sms_timer);
}

static sms_state read_unread_state()
{
    const nv_text count = kiv_led_read_nv_text("sms_nvunread_count");

    LED_INFO("recv REG_WMS_SMS_NV_UNREAD_SMS p_data=%s\n", count.data());
    return std::string_view(count.data()) == "0" ? SMS_NONE : SMS_UNREAD;
}

static sms_state state_of_event(uint32_t event)
{
    switch (event) {
    case REG_WMS_SMS_NEW_SMS:
        return SMS_NEW;
    case REG_WMS_SMS_MEMORY_FULL:
        return SMS_STORE_FULL;
    case REG_WMS_SMS_NV_UNREAD_SMS:
        return read_unread_state();
    default:
        return SMS_NONE;
    }
}

static bool store_is_still_full()
{
    const int capacity = kiv_led_read_nv_int("sms_nv_capability");
    const int count = kiv_led_read_nv_int("sms_nvtotal_count");

    LED_INFO("sms_nv_capability= %d ,sms_nvtotal_count= %d \n", capacity, count);
    return count >= capacity;
}

static void leave_new_sms_blink()
{
    if (led_sms_state == SMS_NEW) {
        kiv_led_del_new_sms_timer();
    }
}

void recv_SMSstatus(uint32_t event)
{
    LED_INFO("recv_SMSstatus");

    const sms_state state = state_of_event(event);
    const int shown = led_sms_state;
    LED_INFO("recv recv_SMSstatus status from %d to %d \n", shown, state);

    if (led_power_state != POWER_ON) {
        led_sms_state = state;
        LED_INFO("recv recv_SMSstatus not power on \n");
        return;
    }
    if (cur_led_sleep_status == ASLEEP) {
        led_sms_state = state;
        LED_INFO("recv recv_SMSstatus : sleep mode \n");
        return;
    }
    if (state == shown) {
        if (state == SMS_NEW) { // another message: ten seconds from now
            kiv_led_del_new_sms_timer();
            kiv_led_set_new_sms_timer();
        }
        return;
    }
    if (shown == SMS_STORE_FULL && store_is_still_full()) {
        return;
    }
    kiv_led_handle_sms_state(state);
}

void kiv_led_handle_sms_state(int state)
{
    LED_INFO("kiv_led_handle_sms_state:sms_state=: %d \n ", state);
    switch (state) {
    case SMS_NONE:
        leave_new_sms_blink();
        show_sms_state(SMS_NONE);
        break;
    case SMS_UNREAD:
        if (led_sms_state == SMS_NEW) { // the blink runs on; its timer turns it steady
            return;
        }
        show_sms_state(SMS_UNREAD);
        break;
    case SMS_NEW:
        show_sms_state(SMS_NEW);
        kiv_led_set_new_sms_timer();
        break;
    case SMS_STORE_FULL:
        leave_new_sms_blink();
        show_sms_state(SMS_STORE_FULL);
        break;
    default:
        return;
    }
    led_sms_state = state;
}

void kiv_led_settle_new_sms()
{
    if (led_sms_state == SMS_NEW) {
        kiv_led_del_new_sms_timer();
        led_sms_state = SMS_UNREAD;
    }
}

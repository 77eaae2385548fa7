// The words that several modules share: one instance each, zero at start unless said otherwise, alive as long as the
// process. Each names its writers. This header includes nothing of ours; everything may include it.
#pragma once

#include <atomic>

// One word between threads: relaxed loads and stores, on the target the same machine code as a plain int.
struct led_word {
    std::atomic<int> word{0};

    constexpr led_word() = default;
    constexpr explicit led_word(int start) : word{start} {}
    operator int() const { return word.load(std::memory_order_relaxed); }
    void operator=(int value) { word.store(value, std::memory_order_relaxed); }
};

enum led_product : int {
    LED_PRODUCT_UFI = 0,
    LED_PRODUCT_DATA_CARD = 1,
    LED_PRODUCT_PAPER_KITE = 2,
    LED_PRODUCT_MODULE = 3,
    LED_PRODUCT_UNI_CORE_CPE = 4
};
constexpr int LED_PRODUCT_COUNT = LED_PRODUCT_UNI_CORE_CPE + 1;

enum power_state : int {
    POWER_NOT_YET = 0,
    POWER_ON = 1,
    POWER_OFF = 2,
    POWER_OFF_CHARGE = 3,
    POWER_OFF_UNREAL = 4,
    POWER_OFF_QUICKEN = 5,
    POWER_OFF_CHARGE_QUICKEN = 6,
    POWER_RESETTING = 7
};

// cur_led_sleep_status may hold any other number, as the sleep module sent it, until the product's handler settles it.
enum sleep_state : int { AWAKE = 0, ASLEEP = 1 };

enum sms_state : int { SMS_NONE = 0, SMS_UNREAD = 1, SMS_NEW = 2, SMS_STORE_FULL = 3 };

// Set at start, before any other thread exists.
extern led_word led_product_type;  // led_product, LED_PRODUCT_DATA_CARD at first; kiv_led_get_cfg
extern char product_type_str[128]; // configuration item 6000 as read; kiv_led_get_cfg
extern led_word led_enable;        // configuration item 531: 1 runs the LED logic; kiv_led_get_cfg
extern int msg_handle;             // the daemon's queue; kiv_led_wait_for_daemon

extern led_word led_bsp_ready;        // 1 once the rolling-LED animation is over; start-up and the UFI power-on scene
extern led_word led_power_state;      // power_state; the UFI and single-chip power scenes, two initial scenes
extern led_word cur_led_sleep_status; // sleep_state; dispatch (raw), the sleep handlers, two initial scenes

extern led_word led_net_type;     // 0 none shown, else network-type class 1 to 5; net LED handler, UFI power-off scene
extern led_word led_signal_level; // last signal value handled; signal handlers
extern led_word led_sms_state;    // sms_state; SMS indication, on the receive and the timer thread
extern led_word led_ppp_state;    // 1 while a data call is up; PPP handler

extern led_word is_night_mode;            // 1 while night mode holds the LEDs; night-mode check and set-up
extern led_word night_mode_close_all_led; // 0 keeps the net LEDs lit, dimmed, at night; night-mode set-up
extern led_word over_temp_enable;         // 1 while the temperature is watched; over-temperature set-up
extern led_word is_over_temp;             // 1 while a sensor is above the limit; over-temperature alarm

// The product that this device is.
inline led_product this_product()
{
    return static_cast<led_product>(int{led_product_type});
}

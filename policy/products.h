// Which product shows what: the one place that tells the products apart. Each function hands its value to this device's
// product, or drops it where the product shows nothing. The receivers of notifications, the board's indications and the
// set-up at start call them; a policy that has to know the product asks here.
#pragma once

#include <cstdint>

// At start, before any other thread exists. Main thread.
void kiv_led_init();          // the initial scene
bool kiv_led_hears_bsp_ind(); // whether the product registers for the board's battery and charger indications

// From the bus, on the receive thread; those from NV also on the main thread, in an initial scene.
void kiv_led_mc_event_dispatch(uint32_t event);        // event: REG_MC_*
void kiv_led_sleep_status_dispatch(int sleep_status);  // as the sleep module sent it
void kiv_led_net_type_dispatch(int net_type);          // net_class, from NV "network_type"
void kiv_led_roaming_dispatch(int roaming);            // 0 home, 1 roaming, from NV "simcard_roam"
void kiv_led_signal_dispatch(int bars);                // from NV "signalbar", unchecked
void kiv_led_ppp_status_dispatch(int ppp);             // 1 while a data call is up, else 0
void kiv_led_wlan_status_dispatch(const char *p_data); // decimal text
void kiv_led_wps_status_dispatch(const char *p_data);  // decimal text
void kiv_led_sms_dispatch(uint32_t event);             // REG_WMS_SMS_NV_UNREAD_SMS, _NEW_SMS or _MEMORY_FULL
void kiv_led_voicemail_dispatch(int flag);             // 1 voicemail waiting
void kiv_led_voice_status_dispatch(int state);         // phone_state
void kiv_led_over_temp_dispatch();                     // re-reads the over-temperature limit; also at start
void kiv_led_relight_dispatch();                       // shows the LEDs afresh

// Recomputes the battery LEDs. Main and receive thread, and the IPC listen thread.
void kiv_led_battery_query_dispatch();

// The board's indications, on the IPC listen thread. What a battery's indication says is not used: the state is asked
// for.
void kiv_led_battery_ind_dispatch(int present);
void kiv_led_charger_ind_dispatch(int connected); // 1 connected, 0 disconnected

// Whether the product reminds of a used-up data volume. Any thread.
bool kiv_led_has_data_limit_reminder();

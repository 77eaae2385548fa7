// Voicemail, phone and SIM notifications.
#pragma once

enum phone_state : int { PHONE_LED_OFF = 0, PHONE_LED_ON = 1, PHONE_LED_BLINK = 2 };

// text: voicemail flag as decimal text. Shown on the module CPE. Receive thread.
void recv_VoiceMailStatus(const char *text);

// text: "PHONE LED ON", "PHONE BLINK", or anything else for off. Shown on both CPEs, also off and asleep. Receive
// thread.
void recv_voicePhoneStatus(const char *text);

// Logs NV "sim_states"; shows nothing. Main (initial scene) and receive thread.
void recv_simStatus();

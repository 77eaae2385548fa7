// Voicemail, phone and SIM notifications. Receive thread; recv_simStatus also on the main thread.
#pragma once

void recv_VoiceMailStatus(const char *text); // voicemail flag as decimal text; shown on the module CPE
void recv_voicePhoneStatus(
    const char *text); // "PHONE LED ON", "PHONE BLINK", else off; shown on both CPEs, also asleep
void recv_simStatus(); // NV "sim_states", logged only

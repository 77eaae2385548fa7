// The network module's notifications. They carry nothing: each handler reads its value from NV and hands it to the
// product's indication. Also run by the initial, power-on and wake-up scenes. Main and receive thread.
#pragma once

void recv_nwNetType();    // NV "network_type": the radio technology as text
void recv_nwRoamStatus(); // NV "simcard_roam": "Home" or anything else
void recv_nwSigStatus();  // NV "signalbar": bars, 0 to 5

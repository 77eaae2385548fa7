// The network module's notifications, and the network-type indication of every product but the module CPE.
#pragma once

// The notifications carry nothing: each function reads its value from NV and hands it to the product's indication. The
// initial, power-on and wake-up scenes run them too. Main and receive thread.
void recv_nwNetType();    // NV "network_type": the radio technology as text; an unknown one is no service
void recv_nwRoamStatus(); // NV "simcard_roam": "Home", or anything else is roaming
void recv_nwSigStatus();  // NV "signalbar": bars, 0 to 5

// net_type: net_class. Lights the LED of a new class while on and awake; while off or asleep the class is dropped, and
// power-on and wake-up read it again. Main (initial scene) and receive thread.
void kiv_led_handle_nwinfoStatus(int net_type);

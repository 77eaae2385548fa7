// The net LED: shows the network-type class. Whoever borrows it gives it back through kiv_set_net_led_state.
#pragma once

enum net_class : int { NET_NO_SERVICE = 1, NET_2G = 2, NET_3G = 3, NET_4G = 4, NET_5G = 5 };

// A network-type class from NV "network_type". Lights the LED of a new class while on and awake; while off or asleep
// the class is dropped, and power-on and wake-up read it again. Main (initial scene) and receive thread.
void kiv_led_handle_nwinfoStatus(int net_type);

// Lights the net LED of a class; any value but 1 to 5 leaves it as it is. ppp (0, 1) is only logged. Any thread.
void kiv_set_net_led_state(int net_type, int ppp);

// How the net LED shows a network-type class. Whoever borrows the LED gives it back with kiv_set_net_led_state.
#pragma once

enum net_class : int { NET_NO_SERVICE = 1, NET_2G = 2, NET_3G = 3, NET_4G = 4, NET_5G = 5 };

// Lights the net LED of a class; any value but 1 to 5 leaves it as it is. ppp (0, 1) is only logged. Any thread.
void kiv_set_net_led_state(int net_type, int ppp);

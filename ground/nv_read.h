// Reading NV texts and the numbers in them.
#pragma once

#include <array>
#include <span>

using nv_text = std::array<char, 64>; // the buffer of most NV reads; a longer text is cut to 63 characters

// The decimal number at the start of a text, after white space and a sign; 0 when there is none. A number beyond
// the range of int is the nearest int.
int kiv_led_text_to_int(const char *text);

// Reads an NV key into the buffer: always terminated, empty when the key is missing, cut when it is too long.
void kiv_led_read_nv(const char *key, std::span<char> buffer);

nv_text kiv_led_read_nv_text(const char *key);
int kiv_led_read_nv_int(const char *key);

// Timer handles that two threads may take: each is taken with an exchange, so that no timer is left that nobody can
// delete.
#pragma once

#include "ground/led_ctx.h"

// Creates a periodic timer unless the word already holds one. procedure, argument, period_ms: as for kiv_timer. True
// when a timer was created; false also when the timer service refused, and the word then stays 0. Any thread.
bool kiv_led_start_timer(led_word &timer, void (*procedure)(void *), void *argument, int period_ms);

// Takes the handle out of its word, 0 when none is there; the caller deletes the timer. Any thread.
int kiv_led_take_timer(led_word &timer);

// Deletes the word's timer, if there is one. Any thread.
void kiv_led_end_timer(led_word &timer);

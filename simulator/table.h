// What each LED of a product shows in each state, as the real daemon shows it when it is brought there.
#pragma once

#include "player.h"

#include <array>
#include <string>
#include <vector>

struct table_row {
    bool heading = false; // begins a group of states; nothing is lit
    std::string state;
    std::array<led_look, LED_ID_COUNT> leds = {};
};

// The statements that furnish the product with nothing to tell, start it and switch it on.
std::string switched_on(const product_name &product);

// Plays every state of the product. Returns 0, or what the program shall end with, after a message on standard error.
int play_table(const product_name &product, const daemon_options &options, std::vector<table_row> &rows);

void print_table(const product_name &product, const std::vector<table_row> &rows); // in Markdown

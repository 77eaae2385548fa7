// What the LEDs of a product mean, as a table with drawn LEDs for a user's manual.
#pragma once

#include "table.h"

#include <string>

// False with the cause in error: a state lights an LED that the front of the product does not have.
bool draw_table(const product_name &product, const std::vector<table_row> &rows, std::string &svg, std::string &error);

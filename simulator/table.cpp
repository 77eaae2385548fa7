#include "table.h"

int print_table(std::string_view, const daemon_options &)
{
    return 2;
}

#include "panel/panel.h"

#include <cstdio>

int run_panel(const panel_options &)
{
    fputs("this build has no panel\n", stderr);
    return 2;
}

#include "kiv/cfg.h"

#include "standin.h"
#include "trace/calls.h"

#include <cstdint>
#include <cstdio>

// The LED switch is kept as readable text and handed over as the byte that the device stores.
static int get_byte(const char *name, void *buffer)
{
    char text[16];
    int value = 0;
    if (standin_read_text("cfg", name, text, sizeof text) < 0) {
        return -1;
    }
    if (standin_parse_ints(text, &value, 1) != 1 || value < 0 || value > UINT8_MAX) {
        standin_error("cfg/%s: not a number from 0 to 255: %s", name, text);
        return -1;
    }
    *static_cast<uint8_t *>(buffer) = static_cast<uint8_t>(value);
    return 0;
}

static int get_item(int item, void *buffer, int size)
{
    char name[16];
    if (buffer == nullptr || size <= 0) {
        return -1;
    }
    snprintf(name, sizeof name, "%d", item);
    if (item == KIV_CFG_9X15_LED_ID) {
        return get_byte(name, buffer);
    }
    return standin_read_text("cfg", name, static_cast<char *>(buffer), size) < 0 ? -1 : 0;
}

int kiv_cfg_get_item(int item, void *buffer, int size)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_cfg_get(line, item, size); },
        [&] { return get_item(item, buffer, size); },
        [&](trace_line &line, int result) { trace_cfg_get_result(line, result, item, buffer, size); });
}

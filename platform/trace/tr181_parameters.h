// The parameters of the TR-181 tables, and where each stands in a record.
#pragma once

#include "kiv/tr181.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>

enum { TR181_NAME_SIZE = 68, TR181_TEXT_SIZE = 36, TR181_FLAG_SET = 1 };

struct tr181_parameter {
    int table_id;
    const char *name;
    size_t flag_at;
    size_t value_at;
    size_t size; // 0: an int32
};

inline constexpr std::array tr181_parameters = {
    tr181_parameter{KIV_TR181_TBL_LEDS,     "LEDNumberOfEntries", KIV_TR181_PARAM1_FLAG, KIV_TR181_PARAM1, 0              },
    tr181_parameter{KIV_TR181_TBL_LEDS_LED, "Name",               KIV_TR181_PARAM1_FLAG, KIV_TR181_PARAM1, TR181_NAME_SIZE},
    tr181_parameter{KIV_TR181_TBL_LEDS_LED, "Status",             KIV_TR181_PARAM2_FLAG, KIV_TR181_PARAM2, TR181_TEXT_SIZE},
    tr181_parameter{KIV_TR181_TBL_LEDS_LED, "Location",           KIV_TR181_PARAM3_FLAG, KIV_TR181_PARAM3, TR181_TEXT_SIZE},
};

inline int tr181_int(const char *record, size_t at)
{
    int32_t value = 0;
    memcpy(&value, record + at, sizeof value);
    return value;
}

inline bool tr181_is_set(const char *record, const tr181_parameter &parameter)
{
    uint16_t flag = 0;
    memcpy(&flag, record + parameter.flag_at, sizeof flag);
    return flag == TR181_FLAG_SET;
}

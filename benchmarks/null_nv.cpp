#include "null_nv.h"

#include <cstring>

struct nv_row {
    const char *key;
    const char *text;
};

constexpr nv_row nv_rows[] = {
    {"network_type",         "LTE"             },
    {"simcard_roam",         "Home"            },
    {"signalbar",            "4"               },
    {"battery_charging",     "0"               },
    {"battery_exist",        "1"               },
    {"battery_value",        "45"              },
    {"q6_ppp_status",        "q6_ppp_connected"},
    {"sms_nvunread_count",   "3"               },
    {"sms_nv_capability",    "100"             },
    {"sms_nvtotal_count",    "3"               },
    {"wifi_onoff_state",     "1"               },
    {"RadioOff",             "1"               },
    {"WscModeOption",        "0"               },
    {"wifi_chip1_wps_state", "0"               },
    {"wifi_chip2_wps_state", "0"               },
    {"sim_states",           "ready"           },
};

int null_nv_read(const char *key, char *buffer, int size)
{
    for (const nv_row &row : nv_rows) {
        if (std::strcmp(row.key, key) == 0) {
            std::strncpy(buffer, row.text, static_cast<size_t>(size - 1));
            return 0;
        }
    }
    return -1;
}

#include "boot.h"

#include "core/bsp_ind.h"
#include "core/channel.h"
#include "core/start.h"
#include "fake_platform.h"
#include "nightmode/kiv_led_tr181.h"

static const std::string START_RECORD("\2\0\0\0", 4);

int boot(const std::string &product_type, char led_function)
{
    fake_device &device = fake_platform();
    device.inbox.emplace_back(START_RECORD);
    device.cfg = {
        {531, std::string(1, led_function)},
        {6000, product_type + '\0'}
    };
    device.threads = {
        {kiv_led_socket_server_thread, "receive"},
        {kiv_led_ipc_server_thread,    "ipc"    },
        {kiv_tr181_led_init,           "tr181"  }
    };
    return kiv_led_start();
}

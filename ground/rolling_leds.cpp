#include "ground/rolling_leds.h"

#include "ground/led_log.h"
#include "ground/nv_read.h"

#include <cstdlib>
#include <fcntl.h>
#include <unistd.h>

#define ROLLING_LEDS_FILE "/sys/class/leds/led:rolling_leds/brightness"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";
constexpr int ROLLING_LEDS_OVER = 2;

int kiv_led_bsp_ready()
{
    const int file = open(ROLLING_LEDS_FILE, O_RDONLY | O_CLOEXEC);
    if (file < 0) {
        LED_ERROR("open file %s failed\n", ROLLING_LEDS_FILE);
        LED_ERROR("no rolling leds, neednit wait for bsp\n");
        return 1;
    }

    char text[2] = {};
    if (read(file, text, sizeof text) <= 0) {
        LED_ERROR("read file %s failed\n", ROLLING_LEDS_FILE);
    }
    text[1] = '\0';
    close(file);

    if (kiv_led_text_to_int(text) != ROLLING_LEDS_OVER) {
        return 0;
    }
    LED_INFO("kiv_led_bsp_ready\n");
    return 1;
}

void kiv_led_stop_rolling_leds()
{
    // The caller polls for the outcome, so the shell's own result says nothing more.
    // NOLINTNEXTLINE(cert-env33-c): the command is a constant, and the shell is how the board wants it written.
    [[maybe_unused]] const int result = std::system("echo 1 > " ROLLING_LEDS_FILE);
}

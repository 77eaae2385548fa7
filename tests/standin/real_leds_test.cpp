#include "led_class.h"
#include "standin_device.h"

#include "kiv/adabsp.h"

#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <filesystem>
#include <unistd.h>

struct real_leds : standin_device {
    void SetUp() override
    {
        standin_device::SetUp();
        std::filesystem::create_directory(path("class"));
        if (!mount_led_class(path("class"), {
                                                {"net:green", 255},
                                                {"net:blue",  3  },
                                                {"status",    1  },
        })) {
            GTEST_SKIP() << "no file system of our own can be mounted here";
        }
        write("map",
              "# LED of the scenarios, LED of the board\nnet_red net:green\nnet_blue net:blue\nbat_green status\n");
        mounted = true;
    }
    void TearDown() override
    {
        if (mounted) {
            unmount_led_class();
        }
        unsetenv("KIV_LED_MAP");
        standin_device::TearDown();
    }
    int run(const std::string &scenario) const
    {
        write("story.scn", scenario);
        const std::string command = std::string(SIMULATOR) + " run --led-dir " + path("class") + " --led-map " +
                                    path("map") + " " + path("story.scn") + " >" + path("shown") + " 2>" + path("told");
        return WEXITSTATUS(std::system(command.c_str()));
    }
    bool mounted = false;
};

static int request(const led_request &wanted)
{
    int result = 99;
    kiv_bsp_set_leds_sync(wanted, &result);
    return result;
}

TEST_F(real_leds, ShowEveryRequestOrTheNearestLevel)
{
    const struct {
        led_request wanted;
        const char *led;
        const char *shows;
    } rows[] = {
        {{LED_NET_RED, LED_OP_ON, 4, 0, 0},         "net:green", "on 255"            },
        {{LED_NET_RED, LED_OP_ON, 1, 0, 0},         "net:green", "on 64"             },
        {{LED_NET_RED, LED_OP_BLINK, 4, 800, 1200}, "net:green", "blink 255 800/1200"},
        {{LED_NET_RED, LED_OP_BLINK, 2, 300, 5000}, "net:green", "blink 128 300/5000"},
        {{LED_NET_RED, LED_OP_ON, 2, 0, 0},         "net:green", "on 128"            },
        {{LED_NET_RED, LED_OP_BLINK, 4, 400, 400},  "net:green", "blink 255 400/400" },
        {{LED_NET_RED, LED_OP_OFF, 4, 0, 0},        "net:green", "off"               },
        {{LED_NET_BLUE, LED_OP_ON, 2, 0, 0},        "net:blue",  "on 2"              },
        {{LED_NET_BLUE, LED_OP_ON, 1, 0, 0},        "net:blue",  "on 1"              },
        {{LED_BAT_GREEN, LED_OP_ON, 1, 0, 0},       "status",    "on 1"              },
        {{LED_BAT_GREEN, LED_OP_BLINK, 3, 50, 950}, "status",    "blink 1 50/950"    },
        {{LED_BAT_GREEN, LED_OP_ON, 0, 0, 0},       "status",    "off"               },
    };
    setenv("KIV_LED_MAP", path("map").c_str(), 1);
    set("KIV_LED_DIR", path("class"));
    for (const auto &row : rows) {
        EXPECT_EQ(request(row.wanted), 0);
        EXPECT_EQ(class_led_shows(row.led), row.shows);
    }
}

TEST_F(real_leds, ScenarioLightsThem)
{
    EXPECT_EQ(run("product UFI\nstart\nnv battery_exist=1\nnv battery_value=80\nnotify MAIN POWERON\n"
                  "expect bat_green on 4\nnotify SLEEP 1\nexpect bat_green blink 300/5000 4\n"),
              0)
        << read("told");
    EXPECT_EQ(class_led_shows("status"), "blink 1 300/5000");
}

TEST_F(real_leds, MissingOneIsNamed)
{
    write("map", "bat_green missing\nnet_red net:green\nnet_rde net:green\n");
    EXPECT_EQ(run("product UFI\nstart\nnotify MAIN POWERON\nexpect bat_green on 4\n"), 1);
    EXPECT_NE(read("told").find("the LED bat_green, KIV_LED_DIR/missing, cannot be set: No such file"),
              std::string::npos)
        << read("told");
    EXPECT_NE(read("told").find("map:3: not a line of LED FOLDER"), std::string::npos);
    EXPECT_EQ(class_led_shows("net:green"), "on 128");
}

struct kernel_leds : standin_device {
};

// LEDs that a program makes in the kernel: it reads each brightness that they are given.
TEST_F(kernel_leds, ShowARequest)
{
    struct {
        char name[64] = "kiv:test";
        int max_brightness = 100;
    } led;
    const int kernel = open("/dev/uleds", O_RDWR | O_NONBLOCK | O_CLOEXEC);
    if (kernel < 0) {
        GTEST_SKIP() << "this machine has no /dev/uleds";
    }
    ASSERT_EQ(::write(kernel, &led, sizeof led), static_cast<ssize_t>(sizeof led));
    write("map", "net_red kiv:test\n");
    setenv("KIV_LED_MAP", path("map").c_str(), 1);
    set("KIV_LED_DIR", "/sys/class/leds");
    EXPECT_EQ(request({LED_NET_RED, LED_OP_ON, 2, 0, 0}), 0);
    int brightness = 0;
    while (::read(kernel, &brightness, sizeof brightness) > 0) {
        continue; // every change since it was made; the last one counts
    }
    EXPECT_EQ(brightness, 50);
    unsetenv("KIV_LED_MAP");
    close(kernel);
}

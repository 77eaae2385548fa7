#include "standin_device.h"

#include "kiv/cfg.h"
#include "kiv/nv.h"
#include "kiv/socket.h"
#include "kiv/tr181.h"
#include "standin.h"

#include <array>
#include <cstring>
#include <filesystem>
#include <sys/stat.h>
#include <thread>
#include <unistd.h>

struct store : standin_device {
};

TEST_F(store, NvReadIsCutAndTerminated)
{
    struct {
        const char *file;
        int size;
        const char *text;
    } const rows[] = {
        {"45\n",     64, "45"  },
        {"45",       64, "45"  },
        {"",         64, ""    },
        {"\n",       64, ""    },
        {"a\n\n",    64, "a\n" },
        {"abcdef\n", 4,  "abc" },
        {"abc\n",    4,  "abc" },
        {"abc",      4,  "abc" },
        {"ab\ncd",   4,  "ab\n"},
        {"abc",      1,  ""    },
    };
    for (const auto &row : rows) {
        std::array<char, 80> buffer;
        buffer.fill('#');
        write("nv/key", row.file);
        EXPECT_EQ(kiv_nvconfig_read("key", buffer.data(), row.size), 0) << row.file;
        EXPECT_STREQ(buffer.data(), row.text) << row.file;
        EXPECT_EQ(buffer[static_cast<size_t>(row.size)], '#') << row.file;
    }
}

TEST_F(store, NvRefusesKeysThatLeaveItsFolder)
{
    const std::string longest(255, 'k');
    const std::string too_long(256, 'k');
    char buffer[8] = "as was";
    write("secret", "x\n");
    for (const char *key : {"", ".", "..", ".hidden", "a/b", "../secret", "/etc/hostname", too_long.c_str()}) {
        EXPECT_EQ(kiv_nvconfig_write(key, "1", 1), -1) << key;
        EXPECT_EQ(kiv_nvconfig_read(key, buffer, sizeof buffer), -1) << key;
    }
    std::filesystem::create_directory(path("nv/folder"));
    EXPECT_EQ(kiv_nvconfig_read("folder", buffer, sizeof buffer), -1);
    EXPECT_EQ(kiv_nvconfig_read("missing", buffer, sizeof buffer), -1);
    EXPECT_EQ(kiv_nvconfig_read("missing", buffer, 0), -1);
    EXPECT_STREQ(buffer, "as was") << "a failed read touches nothing";
    EXPECT_EQ(kiv_nvconfig_write(longest.c_str(), "1", 1), 0);
    EXPECT_EQ(kiv_nvconfig_write("key", "1", -1), -1);
    EXPECT_EQ(kiv_nvconfig_write("key", nullptr, 1), -1);
}

TEST_F(store, NvWriteStoresLengthCharacters)
{
    struct {
        const char *value;
        int length;
        const char *text;
    } const rows[] = {
        {"0",      1, "0"  },
        {"abcdef", 3, "abc"},
        {"a\n",    2, "a\n"},
        {"",       0, ""   },
    };
    for (const auto &row : rows) {
        char buffer[64] = "#";
        EXPECT_EQ(kiv_nvconfig_write("key", row.value, row.length), 0);
        EXPECT_EQ(kiv_nvconfig_read("key", buffer, sizeof buffer), 0);
        EXPECT_STREQ(buffer, row.text);
    }
}

TEST_F(store, NvReaderNeverSeesHalfAValue)
{
    const std::string shown[] = {std::string(1000, 'a'), std::string(500, 'b')};
    std::atomic<bool> stop{false};
    ASSERT_EQ(kiv_nvconfig_write("key", shown[0].data(), 1000), 0);
    std::thread writer([&] {
        for (size_t turn = 0; !stop; turn++) {
            kiv_nvconfig_write("key", shown[turn % 2].data(), static_cast<int>(shown[turn % 2].size()));
        }
    });
    for (int turn = 0; turn < 1000; turn++) {
        char buffer[1100] = "";
        ASSERT_EQ(kiv_nvconfig_read("key", buffer, sizeof buffer), 0);
        ASSERT_TRUE(buffer == shown[0] || buffer == shown[1]) << strlen(buffer) << " characters";
    }
    stop = true;
    writer.join();
}

TEST_F(store, CfgItems)
{
    struct {
        int item;
        const char *file; // null: missing
        int size;
        int result;
        const char *bytes;
    } const rows[] = {
        {531,  "1\n",          1,   0,  "\x01###"   },
        {531,  "0",            1,   0,  {"\0###"}   },
        {531,  "255\n",        4,   0,  "\xff###"   },
        {531,  "256\n",        1,   -1, "####"      },
        {531,  "on\n",         1,   -1, "####"      },
        {531,  "",             1,   -1, "####"      },
        {531,  nullptr,        1,   -1, "####"      },
        {6000, "DRIVER_UFI\n", 128, 0,  "DRIVER_UFI"},
        {6000, "DRIVER_UFI\n", 4,   0,  {"DRI\0##"} },
        {6000, "DRIVER_UFI\n", 0,   -1, "####"      },
        {6000, nullptr,        128, -1, "####"      },
    };
    for (const auto &row : rows) {
        char buffer[129];
        memset(buffer, '#', sizeof buffer);
        const std::string file = "cfg/" + std::to_string(row.item);
        std::filesystem::remove(path(file));
        if (row.file != nullptr) {
            write(file, row.file);
        }
        const std::string what = file + " " + (row.file ? row.file : "missing");
        EXPECT_EQ(kiv_cfg_get_item(row.item, buffer, row.size), row.result) << what;
        EXPECT_EQ(memcmp(buffer, row.bytes, 4), 0) << what;
    }
}

TEST_F(store, DeviceDirectoryIsMadePrivate)
{
    struct stat info {
    };
    unsetenv("KIV_DEVICE_DIR");
    set("XDG_RUNTIME_DIR", path("run/user"));
    ASSERT_EQ(kiv_nvconfig_write("key", "1", 1), 0);
    ASSERT_EQ(stat(path("run/user/kiv").c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 07777, 0700U);
    EXPECT_EQ(read("run/user/kiv/nv/key"), "1\n");
}

TEST_F(store, DeviceDirectoryOfOthersIsRefused)
{
    struct {
        mode_t mode;
        uid_t owner;
        const char *reason;
    } const rows[] = {
        {0777, geteuid(), "others can write to it (mode 0777)"},
        {0720, geteuid(), "others can write to it (mode 0720)"},
        {0700, 54321,     "it belongs to user 54321"          },
    };
    const std::string shared = path("shared");
    std::filesystem::create_directory(shared);
    for (const auto &row : rows) {
        char buffer[8] = "";
        int handle = -1;
        if (row.owner != geteuid() && geteuid() != 0) {
            continue;
        }
        ASSERT_EQ(chmod(shared.c_str(), row.mode), 0);
        ASSERT_EQ(chown(shared.c_str(), row.owner, getegid()), 0);
        set("KIV_DEVICE_DIR", shared);
        testing::internal::CaptureStderr();
        EXPECT_LT(kiv_init_msg("MSG_ID_LED", &handle), 0);
        EXPECT_EQ(kiv_nvconfig_write("key", "1", 1), -1);
        EXPECT_EQ(kiv_nvconfig_read("key", buffer, sizeof buffer), -1);
        EXPECT_EQ(testing::internal::GetCapturedStderr(),
                  "platform: device directory " + shared + " is refused: " + row.reason + "\n");
    }
    EXPECT_TRUE(std::filesystem::is_empty(shared));
}

TEST_F(store, FoldersOfOthersAndLinksAreRefused)
{
    char buffer[8] = "";
    const std::string device = path("device");
    for (const char *folder : {"nv", "bus", "faults", "reg", "tr181"}) {
        std::filesystem::create_directory(device);
        std::filesystem::create_directory(device + "/" + folder);
        ASSERT_EQ(chmod((device + "/" + folder).c_str(), 0770), 0);
        testing::internal::CaptureStderr();
        set("KIV_DEVICE_DIR", device);
        EXPECT_EQ(kiv_nvconfig_write("key", "1", 1), -1) << folder;
        EXPECT_EQ(testing::internal::GetCapturedStderr(), "platform: device directory " + device + "/" + folder +
                                                              " is refused: others can write to it (mode 0770)\n");
        std::filesystem::remove_all(device + "/" + folder);
        std::filesystem::create_directory_symlink(directory, device + "/" + folder);
        standin_reload();
        EXPECT_EQ(kiv_nvconfig_write("key", "1", 1), -1) << folder << " is a link";
        std::filesystem::remove_all(device);
    }
    set("KIV_DEVICE_DIR", directory);
    write("secret", "1\n");
    std::filesystem::create_symlink(path("secret"), path("nv/key"));
    EXPECT_EQ(kiv_nvconfig_read("key", buffer, sizeof buffer), -1);
    EXPECT_EQ(kiv_nvconfig_write("key", "2", 1), 0) << "the link is replaced";
    EXPECT_EQ(read("secret"), "1\n");
}

TEST_F(store, RemovedDirectoryIsNoticed)
{
    char buffer[8] = "";
    std::filesystem::remove_all(directory);
    testing::internal::CaptureStderr();
    EXPECT_EQ(kiv_nvconfig_read("key", buffer, sizeof buffer), -1);
    EXPECT_EQ(kiv_nvconfig_write("key", "1", 1), -1);
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "platform: device directory " + directory + " has been removed\n");
}

static std::vector<char> led_record(int instance, const char *object_path)
{
    std::vector<char> record(KIV_TR181_RECORD_SIZE);
    memcpy(record.data(), &instance, sizeof instance);
    memcpy(record.data() + 4, object_path, std::min<size_t>(strlen(object_path), 34));
    return record;
}

TEST_F(store, Tr181RecordsAreReadable)
{
    std::vector<char> leds = led_record(1, "DEV.LEDS");
    leds[38] = 1;
    leds[64] = 10;
    std::vector<char> led = led_record(10, "DEV.LEDS.LED10");
    led[38] = led[134] = led[198] = 1;
    memset(led.data() + 64, 'n', 68); // fills its field to the end
    memcpy(led.data() + 160, "InUse", 5);
    memcpy(led.data() + 224, "Front", 5);

    EXPECT_EQ(libkiv_tr181_set_tbl(141, leds.data(), 1, 0), -1) << "not connected yet";
    ASSERT_EQ(libkiv_tr181_Init(), 0);
    EXPECT_EQ(libkiv_tr181_set_tbl(141, leds.data(), 1, 0), 0);
    EXPECT_EQ(read("tr181/DEV.LEDS"), "Instance: 1\nLEDNumberOfEntries: 10\n");
    EXPECT_EQ(libkiv_tr181_set_tbl(142, led.data(), 1, 0), 0);
    EXPECT_EQ(read("tr181/DEV.LEDS.LED10"),
              "Instance: 10\nName: " + std::string(68, 'n') + "\nStatus: InUse\nLocation: Front\n");
    led[198] = 0;
    EXPECT_EQ(libkiv_tr181_set_tbl(142, led.data(), 1, 0), 0);
    EXPECT_EQ(read("tr181/DEV.LEDS.LED10"), "Instance: 10\nName: " + std::string(68, 'n') + "\nStatus: InUse\n");
}

TEST_F(store, Tr181RefusesPathsThatLeaveItsFolder)
{
    const std::string endless(40, 'P'); // no terminator inside its field
    ASSERT_EQ(libkiv_tr181_Init(), 0);
    for (const char *object_path : {"", "../nv/key", ".hidden", "DEV/LEDS", "DEV LEDS", endless.c_str()}) {
        EXPECT_LT(libkiv_tr181_set_tbl(141, led_record(1, object_path).data(), 1, 0), 0) << object_path;
    }
    EXPECT_LT(libkiv_tr181_set_tbl(143, led_record(1, "DEV.LEDS").data(), 1, 0), 0);
    EXPECT_LT(libkiv_tr181_set_tbl(141, nullptr, 1, 0), 0);
    EXPECT_TRUE(std::filesystem::is_empty(path("tr181")));
}

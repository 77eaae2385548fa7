#include "core/bsp_ind.h"
#include "core/bsp_ready.h"
#include "core/channel.h"
#include "core/config.h"
#include "core/dispatch.h"
#include "core/registration.h"
#include "core/reverser.h"
#include "harness.h"

#include <gtest/gtest.h>

template <led_product product> static void register_on()
{
    led_product_type = product;
    kiv_led_regNotifyMsg();
}

static void decode(int source, uint32_t event, const std::string &payload = "")
{
    const std::string bytes = message_bytes(0, 0, source, event, payload);
    received_message received = {};
    bytes.copy(reinterpret_cast<char *>(&received.message), sizeof received.message);
    regDecodeMsg(&received.message);
}

static void receive_nothing()
{
    received_message received = {};
    kiv_led_receive_message(received);
}

static void configure(const char *enable, const std::string &product)
{
    fake_platform().cfg = {
        {531,  enable },
        {6000, product}
    };
    kiv_led_get_cfg();
    fake_note("enable " + std::to_string(led_enable) + ", product " + std::to_string(led_product_type));
}

static void bsp_ready(std::deque<std::string> content)
{
    fake_platform().rolling_leds = std::move(content);
    fake_note("ready " + std::to_string(kiv_led_bsp_ready()));
}

// Calls and what they cause stand side by side.
// clang-format off
TEST(core, RegistrationByProduct)
{
    const std::string common = "reg 16 38 1 0 0 0 | reg 23 38 43 0 0 0 | reg 3 38 5 0 0 0 |";
    expect_effects("UFI",
        "reg 1 38 fe2 40004610 0 0 |" + common + "reg 24 38 1 0 0 0 | reg 10 38 14 0 0 0 | reg 5 38 1006 0 0 0",
        register_on<LED_PRODUCT_UFI>);
    expect_effects("data card", common, register_on<LED_PRODUCT_DATA_CARD>);
    expect_effects("paper-kite", common + "reg 10 38 190 0 0 0", register_on<LED_PRODUCT_PAPER_KITE>);
    expect_effects("module", "reg 1 38 d62 40000010 0 0 |" + common + "reg 5 38 2000 0 0 0 | reg 43 38 2 0 0 0",
        register_on<LED_PRODUCT_MODULE>);
    expect_effects("single chip", "reg 1 38 de2 40000010 0 0 |" + common + "reg 10 38 190 0 0 0 | reg 43 38 2 0 0 0",
        register_on<LED_PRODUCT_UNI_CORE_CPE>);
    expect_logs("UFI lines", R"(
        6 "kiv_led_regNotifyMsg" | 6 "reg mc resetting msg!" | 6 "reg mc quick power on/off msg!")",
        register_on<LED_PRODUCT_UFI>);
    expect_logs("module lines", R"(
        6 "kiv_led_regNotifyMsg" | 0 "reg SMS notify msg begin!" | 0 "reg SMS notify msg end!"
        0 "reg voice phone notify msg begin!" | 0 "reg voice phone notify msg end!")",
        register_on<LED_PRODUCT_MODULE>);
    expect_logs("single chip lines", R"(
        6 "kiv_led_regNotifyMsg" | 6 "reg mc resetting msg!" | 0 "reg voice phone notify msg!")",
        register_on<LED_PRODUCT_UNI_CORE_CPE>);
}

TEST(core, Configuration)
{
    expect_calls("off and unknown product", R"(
        cfg 531 1 | 6 "get led cfg success,led_enable: 0\n" | 6 "led function disable, return!!!\n" | cfg 6000 128
        6 "get modem type cfg success: module\n" | enable 0, product 1)", [] { configure("", "module"); });
    expect_calls("unreadable", R"(
        cfg 531 1 | 0 "get KIV_CFG_9X15_LED_ID error!!!\n" | cfg 6000 128
        0 "get KIV_CFG_PRODUCT_TYPE_ID error!!!\n")",
        kiv_led_get_cfg);
    expect_logs("a text without a terminator", R"(
        6 "get led cfg success,led_enable: 2\n" | 6 "get modem type cfg success: x{127}\n")",
        [] { configure("\2", std::string(300, 'x')); });
    expect_effects("each product", R"(
        cfg 531 1 | cfg 6000 128 | enable 1, product 0 | cfg 531 1 | cfg 6000 128 | enable 1, product 0 | cfg 531 1
        cfg 6000 128 | enable 1, product 2 | cfg 531 1 | cfg 6000 128 | enable 1, product 3 | cfg 531 1 | cfg 6000 128
        enable 1, product 4 | cfg 531 1 | cfg 6000 128 | enable 1, product 1)",
        [] { configure("\1", std::string("DRIVER_UFI", 11)); configure("\1", std::string("NO_DRIVER_UFI", 14));
             configure("\1", std::string("PAPER_KITE", 11)); configure("\1", std::string("MODULE", 7));
             configure("\1", std::string("UNI_CORE_CPE", 13)); configure("\1", std::string("DRIVER_DATA_CARD", 17)); });
    expect_effects("rolling LEDs", "ready 1 | ready 1 | ready 0 | ready 0 | ready 1",
        [] { bsp_ready({"2\n"}); bsp_ready({"25"}); bsp_ready({"1"}); bsp_ready({""}); bsp_ready({}); });
}

TEST(core, DecodeTable)
{
    expect_logs("every source and event, on a card that is off", R"(
        6 "regDecodeMsg source_id 1, mask1 64" | 6 "[info] source msg KIV_MODULE_MAIN\n"
        6 "regDecodeMsg source_id 16, mask1 1" | 6 "[info] source msg KIV_MODULE_MDM\n" | 6 "recv REG_SIM_STATUS\n"
        6 "[NVinfo]sim_states: \n" | 6 "regDecodeMsg source_id 23, mask1 2"
        6 "[info] source msg KIV_MODULE_NWINFO\n" | 6 "recv  REG_NWINFO_ROAMING_STATUS \n" | 0 "recv roam state:...\n"
        6 "regDecodeMsg source_id 23, mask1 64" | 6 "[info] source msg KIV_MODULE_NWINFO\n"
        6 "recv  REG_NWINFO_NETTYPE \n" | 0 "recv nettype \n" | 6 "enter kiv_led_handle_nwinfoStatus : 1\n "
        6 "enter kiv_led_handle_nwinfoStatus, not power on \n " | 6 "regDecodeMsg source_id 23, mask1 1"
        6 "[info] source msg KIV_MODULE_NWINFO\n" | 6 "recv  REG_NWINFO_SIG_BAR \n" | 6 "recv_nwSigStatus :0"
        6 "kiv_led_handle_signal_state :0" | 6 "regDecodeMsg source_id 3, mask1 1"
        6 "[info] source msg KIV_MODULE_PPP\n" | 6 "recv REG_PPP_STATUS p_data=1\n"
        0:kiv_led_data_limit "[info] enter the pppStatus fun p_data:1\n"
        6:kiv_led_data_limit "[info] enter the pppStatus fun p_data:1\n"
        6:kiv_led_data_limit "enter kiv_led_handle_pppStatus, not power on \n "
        6 "regDecodeMsg source_id 3, mask1 4" | 6 "[info] source msg KIV_MODULE_PPP\n"
        6 "recv REG_Q6_PPP_STATUS p_data=1\n" | 0:kiv_led_data_limit "q6_ppp_status \n"
        6:kiv_led_data_limit "[info] enter the pppStatus fun p_data:0\n"
        6:kiv_led_data_limit "enter kiv_led_handle_pppStatus, not power on \n "
        6 "regDecodeMsg source_id 5, mask1 4096" | 6 "[info] source msg KIV_MODULE_SMS\n" | 6 "recv_SMSstatus"
        6 "recv recv_SMSstatus status from 0 to 3 \n" | 6 "recv recv_SMSstatus not power on \n"
        6 "regDecodeMsg source_id 5, mask1 8192" | 6 "[info] source msg KIV_MODULE_SMS\n"
        6 "recv REG_WMS_SMS_VOCEMAIL_SET_FLAG: 1\n" | 6 "recv_VoiceMailStatus:1\n"
        6 "regDecodeMsg source_id 27, mask1 1" | 6 "[info] source msg KIV_MODULE_SLEEP\n"
        6 "recv REG_SLEEP_STATUS_EVENT p_data=1\n" | 6 "regDecodeMsg source_id 24, mask1 1"
        6 "[info] source msg KIV_MODULE_DST\n" | 6 "recv REG_DST_FLOW_STATUS p_data=9\n"
        6 "regDecodeMsg source_id 43, mask1 2" | 6 "[info] source msg KIV_MODULE_VOICE\n"
        6 "recv REG_VOICE_PHONE_LED_STATE p_data=PHONE BLINK\n" | 6 "recv_voicePhoneStatus, not power on \n "
        6 "set voice phone led from 0 to 2\n")",
        [] { decode(1, 0x40); decode(16, 1); decode(23, 2); decode(23, 0x40); decode(23, 1); decode(3, 1, "1");
             decode(3, 4, "1"); decode(5, 0x1000); decode(5, 0x2000, "1"); decode(27, 1, "1"); decode(24, 1, "9");
             decode(43, 2, "PHONE BLINK"); });
    expect_logs("strangers and two events at once", R"(
        6 "regDecodeMsg source_id 99, mask1 1" | 6 "regDecodeMsg source_id 23, mask1 67"
        6 "[info] source msg KIV_MODULE_NWINFO\n" | 6 "regDecodeMsg source_id 10, mask1 -2147483648"
        6 "[info] source msg KIV_MODULE_WLAN\n")", [] { decode(99, 1); decode(23, 0x43); decode(10, 0x80000000); });
    expect_logs("Wi-Fi guard", R"(
        6 "regDecodeMsg source_id 10, mask1 16" | 6 "[info] source msg KIV_MODULE_WLAN\n"
        6 "not power on or wakeup, ignore WLAN message\n" | 6 "regDecodeMsg source_id 10, mask1 256"
        6 "[info] source msg KIV_MODULE_WLAN\n" | 6 "not power on or wakeup, ignore WPS message\n"
        6 "regDecodeMsg source_id 10, mask1 128" | 6 "[info] source msg KIV_MODULE_WLAN\n"
        6 "recv REG_WLAN_AP_WPS_STATE p_data=1\n" | 6 "regDecodeMsg source_id 10, mask1 16"
        6 "[info] source msg KIV_MODULE_WLAN\n" | 6 " recv REG_WLAN_CURRENT_STATUS wifi status= p_data=1\n")",
        [] { decode(10, 0x10, "1"); led_power_state = POWER_ON; cur_led_sleep_status = 5; decode(10, 0x100, "1");
             cur_led_sleep_status = 0; decode(10, 0x80, "1"); decode(10, 0x10, "1"); });
}

TEST(core, MessagesFromOutside)
{
    expect_calls("one whole message", R"(
        recv 7 1036 | 6 "[info] enter messageParse fun\n" | 6 "recv_msg.us_source_module_id is 24"
        6 "recv_msg.us_cmd is 12034" | 6 "[info] msg MSG_CMD_SERVICE_NOTIFY \n"
        6 "regDecodeMsg source_id 24, mask1 1" | 6 "[info] source msg KIV_MODULE_DST\n"
        6 "recv REG_DST_FLOW_STATUS p_data=x{1020}\n")",
        [] { led_enable = 1; msg_handle = 7; notify(24, 1, std::string(1020, 'x')); });
    expect_logs("short ones after a long one, and one too long", R"(
        6 "[info] enter messageParse fun\n" | 0 "messageParse us_dest_module_id is not KIV_MODULE_LED"
        6 "[info] enter messageParse fun\n" | 6 "recv_msg.us_source_module_id is 24" | 6 "recv_msg.us_cmd is 12034"
        6 "[info] msg MSG_CMD_SERVICE_NOTIFY \n" | 6 "regDecodeMsg source_id 24, mask1 0"
        6 "[info] source msg KIV_MODULE_DST\n" | 6 "[info] enter messageParse fun\n"
        6 "recv_msg.us_source_module_id is 24" | 6 "recv_msg.us_cmd is 12034"
        6 "[info] msg MSG_CMD_SERVICE_NOTIFY \n" | 6 "regDecodeMsg source_id 24, mask1 1"
        6 "[info] source msg KIV_MODULE_DST\n" | 6 "recv REG_DST_FLOW_STATUS p_data=\n"
        6 "[info] enter messageParse fun\n" | 6 "recv_msg.us_source_module_id is 24" | 6 "recv_msg.us_cmd is 12034"
        6 "[info] msg MSG_CMD_SERVICE_NOTIFY \n" | 6 "regDecodeMsg source_id 24, mask1 1"
        6 "[info] source msg KIV_MODULE_DST\n" | 6 "recv REG_DST_FLOW_STATUS p_data=x{1020}\n")",
        [] { led_enable = 1;
             notify(24, 1, std::string(1020, 'x')); forget(); 
             const std::string message = message_bytes(12034, 38, 24, 1); receive(message.substr(0, 1));
             receive(message.substr(0, 11)); receive(message); notify(24, 1, std::string(3000, 'x')); });
    expect_logs("refused", R"(
        0 "LED function disable and not receive message!\n" | 6 "[info] enter messageParse fun\n"
        0 "messageParse pointer NULL" | 6 "[info] enter messageParse fun\n"
        0 "messageParse us_dest_module_id is not KIV_MODULE_LED")",
        [] { command(6932); led_enable = 1; messageParse(nullptr); receive(message_bytes(6932, 39, 1, 0));
             receive_nothing(); });
    expect_logs("commands, and a registration that comes too late", R"(
        6 "[info] enter messageParse fun\n" | 6 "recv_msg.us_source_module_id is 1" | 6 "recv_msg.us_cmd is 6914"
        6 "[info] msg KIV_MSG_CMD_LED_CPE_CIRCLE_LED_CTRL \n" | 6 "[info] enter messageParse fun\n"
        6 "recv_msg.us_source_module_id is 1" | 6 "recv_msg.us_cmd is 6915"
        6 "[info] msg KIV_MSG_CMD_LED_CPE_DATA_LIMIT_MSG \n" | 6 "[info] enter messageParse fun\n"
        6 "recv_msg.us_source_module_id is 1" | 6 "recv_msg.us_cmd is 6916"
        6 "[info] msg KIV_MSG_CMD_LED_CPE_RESET_MSG \n" | 6 "[info] enter messageParse fun\n"
        6 "recv_msg.us_source_module_id is 1" | 6 "recv_msg.us_cmd is 12033")",
        [] { led_enable = 2; command(6914); command(6915); command(6916); command(12033); });
}

TEST(core, ReverserMessage)
{
    expect_calls("sent, then not", R"(
        send 1 8 0:"\x02/" 4:"\x01" 6:"&" 8:"\x08" 15:" 4096"
        6 "kiv_led_send_common_reverser_msg: send common reverser success.\n"
        send 1 8 0:"\x02/" 4:"\x01" 6:"&" 8:"\x08" 15:" 4104"
        6 "kiv_led_send_common_reverser_msg: send common reverser fail.\n")",
        [] { kiv_led_send_common_reverser_msg(1, 4096); fake_platform().send_result = -1;
             kiv_led_send_common_reverser_msg(1, 4104); });
}

TEST(core, BoardIndications)
{
    expect_effects("registered on the module CPE only",
        "ind battery_online | ind battery_offline | ind charger_connect | ind charger_disconnect",
        [] { for (const int product : {0, 1, 2, 4, 3}) { led_product_type = product, kiv_led_register_bsp_ind(); } });
    expect_calls("null record, strangers", R"(
        0/14 "[info] current bspIpcCallBack ind_msg_struct is null.....\n" | returned -1
        6 "[info] kiv_led_bspIpcCallBack : event id = 1352  \n" | returned 0)",
        [] { led_product_type = LED_PRODUCT_MODULE;
             fake_note("returned " + std::to_string(kiv_led_bspIpcCallBack(1350, 0, nullptr)));
             fake_note("returned " + std::to_string(kiv_led_bspIpcCallBack(1352, 0, &msg_handle))); });
    expect_effects("charger and battery", "battery 0 0 | led 52 off",
        [] { led_product_type = LED_PRODUCT_MODULE; notify(1, 0); led_enable = 1;
             mc(0x400); forget();
             for (const int event : {1350, 1356, 1357}) { kiv_led_bspIpcCallBack(event, 0, &msg_handle); }
             led_product_type = LED_PRODUCT_DATA_CARD; kiv_led_bspIpcCallBack(1357, 0, &msg_handle); });
}
// clang-format on

// The daemon's queue: messages from outside, whatever they hold, and what it sends itself.
#include "core/channel.h"
#include "core/dispatch.h"

#include "harness.h"

constexpr size_t PAYLOAD_SIZE = KIV_SVC_MSG_TEXT_SIZE;

static std::string whole_notification(const std::string &payload)
{
    return message_bytes(MSG_CMD_SERVICE_NOTIFY, KIV_MODULE_LED, KIV_MODULE_DST, REG_DST_FLOW_STATUS, payload);
}

DEVICE_TEST(channel, EveryCallOfANotification)
{
    switched_on(LED_PRODUCT_DATA_CARD);
    msg_handle = 9;
    receive(whole_notification(std::string(PAYLOAD_SIZE, 'x')));
    expect_trace(R"(
        receive 9 1036
        info kiv_mirta_led "[info] enter messageParse fun\n"
        info kiv_mirta_led "recv_msg.us_source_module_id is 24"
        info kiv_mirta_led "recv_msg.us_cmd is 12034"
        info kiv_mirta_led "[info] msg MSG_CMD_SERVICE_NOTIFY \n"
        info kiv_mirta_led "regDecodeMsg source_id 24, mask1 1"
        info kiv_mirta_led "[info] source msg KIV_MODULE_DST\n"
        info kiv_mirta_led "recv REG_DST_FLOW_STATUS p_data=x{1020}\n")");
}

DEVICE_TEST(channel, ShortAndLongMessages)
{
    switched_on(LED_PRODUCT_DATA_CARD);
    receive(whole_notification(std::string(PAYLOAD_SIZE, 'x')));
    expect_log("kiv_mirta_led", R"(
        info "recv REG_DST_FLOW_STATUS p_data=x{1020}\n")");
    receive(whole_notification("").substr(0, 1));
    expect_trace(R"(
        receive 0 1036
        info kiv_mirta_led "[info] enter messageParse fun\n"
        error kiv_mirta_led "messageParse us_dest_module_id is not KIV_MODULE_LED")");
    receive(whole_notification("").substr(0, 11)); // the header, without the event
    expect_trace(R"(
        receive 0 1036
        info kiv_mirta_led "[info] enter messageParse fun\n"
        info kiv_mirta_led "recv_msg.us_source_module_id is 24"
        info kiv_mirta_led "recv_msg.us_cmd is 12034"
        info kiv_mirta_led "[info] msg MSG_CMD_SERVICE_NOTIFY \n"
        info kiv_mirta_led "regDecodeMsg source_id 24, mask1 0"
        info kiv_mirta_led "[info] source msg KIV_MODULE_DST\n")");
    receive(whole_notification(""));
    expect_log("kiv_mirta_led", R"(
        info "recv REG_DST_FLOW_STATUS p_data=\n")");
    receive(whole_notification(std::string(3 * PAYLOAD_SIZE, 'x')));
    expect_log("kiv_mirta_led", R"(
        info "recv REG_DST_FLOW_STATUS p_data=x{1020}\n")");
}

DEVICE_TEST(channel, RefusesWhatIsNotForIt)
{
    switched_on(LED_PRODUCT_UFI);
    receive(message_bytes(KIV_MSG_CMD_LED_RELIGHT_MSG, KIV_MODULE_LED + 1, KIV_MODULE_MAIN, 0));
    expect_trace(R"(
        receive 0 1036
        info kiv_mirta_led "[info] enter messageParse fun\n"
        error kiv_mirta_led "messageParse us_dest_module_id is not KIV_MODULE_LED")");
    step([] { messageParse(nullptr); });
    expect_trace(R"(
        info kiv_mirta_led "[info] enter messageParse fun\n"
        error kiv_mirta_led "messageParse pointer NULL")");
    step([] {
        received_message received;
        kiv_led_receive_message(received); // there is none: receiving fails
    });
    expect_trace("receive 0 1036");
}

DEVICE_TEST(channel, HearsNothingWhileTheLedFunctionIsOff)
{
    switched_on(LED_PRODUCT_UFI);
    led_enable = 0;
    for (const int us_cmd : {KIV_MSG_CMD_LED_OVER_TEMP_MSG, KIV_MSG_CMD_LED_NIGHT_MODE_MSG, KIV_MSG_CMD_LED_RELIGHT_MSG,
                             MSG_CMD_SERVICE_NOTIFY}) {
        command(us_cmd);
        expect_trace(R"(
            receive 0 1036
            error kiv_mirta_led "LED function disable and not receive message!\n")");
    }
    led_enable = 2; // not on, but the queue is heard
    command(KIV_MSG_CMD_LED_RELIGHT_MSG);
    expect_effects(R"(
        sig_blue on 0
        power_blue on 2
        wifi_blue off)");
}

DEVICE_TEST(channel, CommandsThatAreOnlyLogged)
{
    switched_on(LED_PRODUCT_UFI);
    command(KIV_MSG_CMD_LED_CPE_CIRCLE_LED_CTRL);
    expect_trace(R"(
        receive 0 1036
        info kiv_mirta_led "[info] enter messageParse fun\n"
        info kiv_mirta_led "recv_msg.us_source_module_id is 1"
        info kiv_mirta_led "recv_msg.us_cmd is 6914"
        info kiv_mirta_led "[info] msg KIV_MSG_CMD_LED_CPE_CIRCLE_LED_CTRL \n")");
    command(KIV_MSG_CMD_LED_CPE_DATA_LIMIT_MSG);
    expect_trace(R"(
        receive 0 1036
        info kiv_mirta_led "[info] enter messageParse fun\n"
        info kiv_mirta_led "recv_msg.us_source_module_id is 1"
        info kiv_mirta_led "recv_msg.us_cmd is 6915"
        info kiv_mirta_led "[info] msg KIV_MSG_CMD_LED_CPE_DATA_LIMIT_MSG \n")");
    command(KIV_MSG_CMD_LED_CPE_RESET_MSG);
    expect_trace(R"(
        receive 0 1036
        info kiv_mirta_led "[info] enter messageParse fun\n"
        info kiv_mirta_led "recv_msg.us_source_module_id is 1"
        info kiv_mirta_led "recv_msg.us_cmd is 6916"
        info kiv_mirta_led "[info] msg KIV_MSG_CMD_LED_CPE_RESET_MSG \n")");
    command(MSG_CMD_SERVICE_REG); // too late: nothing is registered
    expect_trace(R"(
        receive 0 1036
        info kiv_mirta_led "[info] enter messageParse fun\n"
        info kiv_mirta_led "recv_msg.us_source_module_id is 1"
        info kiv_mirta_led "recv_msg.us_cmd is 12033")");
}

DEVICE_TEST(channel, AnAnswerThatCannotBeSent)
{
    switched_on(LED_PRODUCT_UFI);
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_QUICKEN_ACK);
    expect_effects(R"(
        handheld off
        sent MAIN cmd 12034 source 38 len 8 event 0x20000000 "4104" 8)");
    expect_log("kiv_mirta_led", R"(
        info "enter kiv_led_set_led_when_power_off_quicken\n"
        info "enter kiv_led_set_all_leds_off\n"
        info "kiv_led_send_common_reverser_msg: send common reverser success.\n")");
    fake_platform().send_result = -1;
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_QUICKEN_ACK);
    expect_log("kiv_mirta_led", R"(
        info "enter kiv_led_set_led_when_power_off_quicken\n"
        info "enter kiv_led_set_all_leds_off\n"
        info "kiv_led_send_common_reverser_msg: send common reverser fail.\n")");
}

// A queue that another process holds, a receive that fails, a registration that fails, two strangers of which one
// begins with the bytes of a start record, the start record.
DEVICE_TEST(channel, Handshake)
{
    const std::string masks("\x10\0\0\x40\0\0\0\0\xff\xff\xff\xff", 12);
    fake_platform().failing_queue_opens = 2;
    fake_platform().reg_proc_result = 0;
    fake_platform().inbox = {std::nullopt,
                             message_bytes(MSG_CMD_SERVICE_REG, KIV_MODULE_LED, KIV_MODULE_NWINFO, 3, masks),
                             "\3stranger", std::string("\2\0\1\0", 4), std::string("\2\0\0\0whatever else", 17)};
    step(kiv_led_wait_for_daemon);
    expect_trace(R"(
        info kiv_mirta_led "kiv_led_wait_for_daemon start...\n"
        open MSG_ID_LED
        error kiv_mirta_led "socket error: kiv_init_msg failed!"
        sleep 1 s
        open MSG_ID_LED
        error kiv_mirta_led "socket error: kiv_init_msg failed!"
        sleep 1 s
        open MSG_ID_LED
        info kiv_mirta_led "led init msg success!\n"
        sent MSG_ID_DAEMON 104 bytes 4:"kiv_mirta_led" 68:"MSG_ID_LED"
        receive 7 1036
        receive 7 1036
        info kiv_mirta_led "[kiv_mirta_led,main]reg, soure=[23],mask1=[3],mask2=[1073741840],mask3=[0],mask4=[4294967295]\n"
        registered NWINFO 0x3 0x40000010 0x0 0xffffffff
        error kiv_mirta_led "kiv_mirta_led,main:kiv_reg_proc failed\n"
        receive 7 1036
        fill 0 104
        copy 104
        receive 7 1036
        fill 0 104
        copy 104
        receive 7 1036
        fill 0 104
        copy 104
        info kiv_mirta_led "recive daemon message to start!!!!\n")");
}

DEVICE_TEST(channel, ARegistrationThatIsTakenIsNoFault)
{
    fake_platform().inbox = {
        message_bytes(MSG_CMD_SERVICE_REG, KIV_MODULE_LED, KIV_MODULE_SMS, 1, std::string(12, '\0')),
        std::string("\2\0\0\0", 4)};
    step(kiv_led_wait_for_daemon);
    expect_log("kiv_mirta_led", R"(
        info "kiv_led_wait_for_daemon start...\n"
        info "led init msg success!\n"
        info "[kiv_mirta_led,main]reg, soure=[5],mask1=[1],mask2=[0],mask3=[0],mask4=[0]\n"
        info "recive daemon message to start!!!!\n")");
}

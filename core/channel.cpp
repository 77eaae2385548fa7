#include "core/channel.h"

#include "alarms/kiv_led_over_temp.h"
#include "core/dispatch.h"
#include "core/led_ctx.h"
#include "core/led_log.h"
#include "kiv/mem.h"
#include "kiv/reg.h"
#include "nightmode/kiv_led_night_mode.h"
#include "policy/singlechip/relight.h"

#include <array>
#include <cstring>
#include <unistd.h>

constexpr char led_log_source[] = "kiv_mirta_led";
constexpr char led_queue[] = "MSG_ID_LED";
constexpr char daemon_queue[] = "MSG_ID_DAEMON";
constexpr char process_name[] = "kiv_mirta_led";
constexpr unsigned open_retry_s = 1;
constexpr int receive_failed = -1;

static daemon_record record_of(int32_t record_type)
{
    daemon_record record = {};

    record.record_type = record_type;
    std::memcpy(record.process_name, process_name, sizeof process_name);
    std::memcpy(record.queue_name, led_queue, sizeof led_queue);
    return record;
}

static void open_queue()
{
    while (kiv_init_msg(led_queue, &msg_handle) < 0) {
        LED_ERROR("socket error: kiv_init_msg failed!");
        sleep(open_retry_s);
    }
    LED_INFO("led init msg success!\n");
}

static void serve_registration(const svc_msg &request)
{
    std::array<uint32_t, 4> masks;
    std::memcpy(masks.data(), &request.ul_event_mask, sizeof masks[0]);
    std::memcpy(masks.data() + 1, request.p_data, sizeof masks - sizeof masks[0]);

    LED_INFO("[kiv_mirta_led,main]reg, soure=[%d],mask1=[%lu],mask2=[%lu],mask3=[%lu],mask4=[%lu]\n",
             request.us_source_module_id, static_cast<unsigned long>(masks[0]), static_cast<unsigned long>(masks[1]),
             static_cast<unsigned long>(masks[2]), static_cast<unsigned long>(masks[3]));
    if (kiv_reg_proc(request.us_source_module_id, masks.data()) != 1) {
        LED_ERROR("kiv_mirta_led,main:kiv_reg_proc failed\n");
    }
}

static bool is_start_record(const svc_msg &message)
{
    daemon_record record;

    kiv_mem_set(&record, 0, sizeof record);
    kiv_mem_cpy(&record, &message, sizeof record);
    return record.record_type == DAEMON_RECORD_START;
}

void kiv_led_wait_for_daemon()
{
    const daemon_record hello = record_of(DAEMON_RECORD_HELLO);
    svc_msg message = {};

    LED_INFO("kiv_led_wait_for_daemon start...\n");
    open_queue();
    if (kiv_send_msg(daemon_queue, &hello, sizeof hello) == -1) {
        LED_ERROR("error: kiv_send_msg failed!\n");
    }
    for (;;) {
        if (kiv_recv_msg(msg_handle, &message, sizeof message) == receive_failed) {
            continue;
        }
        if (message.us_cmd == MSG_CMD_SERVICE_REG) {
            serve_registration(message);
        } else if (is_start_record(message)) {
            LED_INFO("recive daemon message to start!!!!\n");
            return;
        }
    }
}

int kiv_led_send_reg_complete()
{
    const daemon_record record = record_of(DAEMON_RECORD_REG_COMPLETE);

    return kiv_send_msg(daemon_queue, &record, sizeof record);
}

void *kiv_led_socket_server_thread(void *)
{
    received_message received;

    for (;;) {
        kiv_led_receive_message(received);
    }
}

void kiv_led_receive_message(received_message &received)
{
    received = {};
    if (kiv_recv_msg(msg_handle, &received.message, sizeof received.message) == receive_failed) {
        return;
    }
    if (led_enable == 0) {
        LED_ERROR("LED function disable and not receive message!\n");
        return;
    }
    messageParse(&received.message);
}

void messageParse(const svc_msg *msg)
{
    LED_INFO("[info] enter messageParse fun\n");
    if (msg == nullptr) {
        LED_ERROR("messageParse pointer NULL");
        return;
    }
    if (msg->us_dest_module_id != KIV_MODULE_LED) {
        LED_ERROR("messageParse us_dest_module_id is not KIV_MODULE_LED");
        return;
    }
    LED_INFO("recv_msg.us_source_module_id is %d", msg->us_source_module_id);
    LED_INFO("recv_msg.us_cmd is %d", msg->us_cmd);
    switch (msg->us_cmd) {
    case KIV_MSG_CMD_LED_CPE_CIRCLE_LED_CTRL:
        LED_INFO("[info] msg KIV_MSG_CMD_LED_CPE_CIRCLE_LED_CTRL \n");
        break;
    case KIV_MSG_CMD_LED_CPE_DATA_LIMIT_MSG:
        LED_INFO("[info] msg KIV_MSG_CMD_LED_CPE_DATA_LIMIT_MSG \n");
        break;
    case KIV_MSG_CMD_LED_CPE_RESET_MSG:
        LED_INFO("[info] msg KIV_MSG_CMD_LED_CPE_RESET_MSG \n");
        break;
    case KIV_MSG_CMD_LED_OVER_TEMP_MSG:
        kiv_led_over_temp_init();
        break;
    case KIV_MSG_CMD_LED_NIGHT_MODE_MSG:
        kiv_led_night_mode_init();
        break;
    case KIV_MSG_CMD_LED_RELIGHT_MSG:
        kiv_led_handle_relight_msg();
        break;
    case MSG_CMD_SERVICE_NOTIFY:
        LED_INFO("[info] msg MSG_CMD_SERVICE_NOTIFY \n");
        regDecodeMsg(msg);
        break;
    default: // another daemon's command, or a registration request that comes too late
        break;
    }
}

#include "core/channel.h"

#include "core/dispatch.h"
#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "kiv/mem.h"
#include "kiv/reg.h"

#include <array>
#include <cstring>
#include <unistd.h>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";
constexpr char LED_QUEUE[] = "MSG_ID_LED";
constexpr char DAEMON_QUEUE[] = "MSG_ID_DAEMON";
constexpr char PROCESS_NAME[] = "kiv_mirta_led";
constexpr unsigned OPEN_RETRY_S = 1;
constexpr int RECEIVE_FAILED = -1;

static daemon_record record_of(int32_t record_type)
{
    daemon_record record = {};

    record.record_type = record_type;
    std::memcpy(record.process_name, PROCESS_NAME, sizeof PROCESS_NAME);
    std::memcpy(record.queue_name, LED_QUEUE, sizeof LED_QUEUE);
    return record;
}

static void open_queue()
{
    while (kiv_init_msg(LED_QUEUE, &msg_handle) < 0) {
        LED_ERROR("socket error: kiv_init_msg failed!");
        sleep(OPEN_RETRY_S);
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
    if (kiv_send_msg(DAEMON_QUEUE, &hello, sizeof hello) == -1) {
        LED_ERROR("error: kiv_send_msg failed!\n");
    }
    for (;;) {
        if (kiv_recv_msg(msg_handle, &message, sizeof message) == RECEIVE_FAILED) {
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

    return kiv_send_msg(DAEMON_QUEUE, &record, sizeof record);
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
    if (kiv_recv_msg(msg_handle, &received.message, sizeof received.message) == RECEIVE_FAILED) {
        return;
    }
    if (led_enable == 0) {
        LED_ERROR("LED function disable and not receive message!\n");
        return;
    }
    messageParse(&received.message);
}

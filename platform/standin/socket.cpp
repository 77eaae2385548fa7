#include "kiv/socket.h"

#include "standin.h"
#include "trace/calls.h"

#include <cerrno>
#include <climits>
#include <cstdio>
#include <sys/socket.h>

enum { HEADER_SIZE = offsetof(svc_msg, ul_event_mask), DATA_MAX = KIV_SVC_MSG_SIZE - HEADER_SIZE };

static int open_queue(const char *queue_name, int *handle)
{
    char file[NAME_MAX + 8];
    if (!standin_is_plain_name(queue_name) || handle == nullptr) {
        return -1;
    }
    snprintf(file, sizeof file, "bus/%s", queue_name);
    const int fd = standin_bind(file);
    if (fd < 0) {
        return -1;
    }
    *handle = fd;
    return 0;
}

static int send_raw(const char *queue_name, const void *data, int length)
{
    if (data == nullptr || length < 1 || length > KIV_SVC_MSG_SIZE) {
        return -1;
    }
    return standin_send(queue_name, data, static_cast<size_t>(length), STANDIN_SEND_WAIT_MS) == 0 ? 0 : -1;
}

static int receive(int handle, void *buffer, int size)
{
    if (handle < 0 || buffer == nullptr || size <= 0) {
        return -1;
    }
    for (;;) {
        const ssize_t length = recv(handle, buffer, static_cast<size_t>(size), 0);
        if (length >= 0) {
            return static_cast<int>(length);
        }
        if (errno != EINTR) {
            return -1;
        }
    }
}

static int send_message(const svc_msg *message, int data_len)
{
    if (message == nullptr || data_len < 0 || data_len > DATA_MAX) {
        return -1;
    }
    const char *queue_name = standin_module_queue(message->us_dest_module_id);
    return queue_name == nullptr ? -1 : send_raw(queue_name, message, HEADER_SIZE + data_len);
}

int kiv_init_msg(const char *queue_name, int *handle)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_init_msg(line, queue_name); },
        [&] { return open_queue(queue_name, handle); },
        [&](trace_line &line, int result) { trace_init_msg_result(line, result, handle); });
}

int kiv_send_msg(const char *queue_name, const void *data, int length)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_send_msg(line, queue_name, length); },
        [&] { return send_raw(queue_name, data, length); },
        [&](trace_line &line, int result) { trace_send_msg_result(line, result, data, length); });
}

int kiv_recv_msg(int handle, void *buffer, int size)
{
    if (standin_watched != 0) {
        trace_label_receiver();
    }
    return standin_call(
        __func__, [&](trace_line &line) { trace_recv_msg(line, handle, size); },
        [&] { return receive(handle, buffer, size); },
        [&](trace_line &line, int result) { trace_recv_msg_result(line, result, buffer); });
}

int kiv_msg_send(const svc_msg *message, int data_len)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_msg_send(line, message, data_len); },
        [&] { return send_message(message, data_len); });
}

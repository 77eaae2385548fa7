#include "kiv/socket.h"

#include "standin.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <sys/socket.h>

enum { HEADER_SIZE = offsetof(svc_msg, ul_event_mask), DATA_MAX = KIV_SVC_MSG_SIZE - HEADER_SIZE };

static int open_queue(const char *queue_name, int *handle)
{
    char file[NAME_MAX + 8];
    if (!standin_is_plain_name(queue_name) || handle == nullptr)
        return -1;
    snprintf(file, sizeof file, "bus/%s", queue_name);
    const int fd = standin_bind(file);
    if (fd < 0)
        return -1;
    *handle = fd;
    return 0;
}

static int send_raw(const char *queue_name, const void *data, int length)
{
    if (data == nullptr || length < 1 || length > KIV_SVC_MSG_SIZE)
        return -1;
    return standin_send(queue_name, data, static_cast<size_t>(length), STANDIN_SEND_WAIT_MS) == 0 ? 0 : -1;
}

static int receive(int handle, void *buffer, int size)
{
    if (handle < 0 || buffer == nullptr || size <= 0)
        return -1;
    for (;;) {
        const ssize_t length = recv(handle, buffer, static_cast<size_t>(size), 0);
        if (length >= 0)
            return static_cast<int>(length);
        if (errno != EINTR)
            return -1;
    }
}

static int send_message(const svc_msg *message, int data_len)
{
    if (message == nullptr || data_len < 0 || data_len > DATA_MAX)
        return -1;
    const char *queue_name = standin_module_queue(message->us_dest_module_id);
    return queue_name == nullptr ? -1 : send_raw(queue_name, message, HEADER_SIZE + data_len);
}

int kiv_init_msg(const char *queue_name, int *handle)
{
    if (standin_watched == 0)
        return open_queue(queue_name, handle);
    trace_line line;
    int result = 0;
    trace_begin(line, "kiv_init_msg");
    trace_text(line, queue_name);
    if (trace_fault(line, &result))
        return result;
    result = open_queue(queue_name, handle);
    trace_result(line, result);
    if (result >= 0)
        trace_add(line, ", %d", *handle);
    trace_end(line);
    return result;
}

int kiv_send_msg(const char *queue_name, const void *data, int length)
{
    if (standin_watched == 0)
        return send_raw(queue_name, data, length);
    trace_line line;
    int result = 0;
    trace_begin(line, "kiv_send_msg");
    trace_text(line, queue_name);
    trace_add(line, ", %d", length);
    if (trace_fault(line, &result))
        return result;
    result = send_raw(queue_name, data, length);
    trace_result(line, result);
    if (result == 0)
        trace_message(line, static_cast<const unsigned char *>(data), static_cast<size_t>(length));
    trace_end(line);
    return result;
}

int kiv_recv_msg(int handle, void *buffer, int size)
{
    if (standin_watched == 0)
        return receive(handle, buffer, size);
    trace_line line;
    int result = 0;
    trace_label_receiver();
    trace_begin(line, "kiv_recv_msg");
    trace_add(line, "%d, %d", handle, size);
    if (trace_fault(line, &result))
        return result;
    result = receive(handle, buffer, size);
    trace_result(line, result);
    if (result > 0)
        trace_message(line, static_cast<const unsigned char *>(buffer), static_cast<size_t>(result));
    trace_end(line);
    return result;
}

static void trace_sent(trace_line &line, const svc_msg *message, int data_len)
{
    if (message == nullptr) {
        trace_add(line, "null, %d", data_len);
        return;
    }
    const size_t event_size = sizeof message->ul_event_mask;
    const auto data = static_cast<size_t>(std::clamp<int>(data_len, 0, DATA_MAX));
    trace_add(line, "dest %u cmd %u source %u len %u", message->us_dest_module_id, message->us_cmd,
              message->us_source_module_id, message->us_data_len);
    if (data >= event_size) {
        trace_add(line, " event 0x%x ", message->ul_event_mask);
        trace_text_of(line, message->p_data, data - event_size);
    }
    trace_add(line, ", %d", data_len);
}

int kiv_msg_send(const svc_msg *message, int data_len)
{
    if (standin_watched == 0)
        return send_message(message, data_len);
    trace_line line;
    int result = 0;
    trace_begin(line, "kiv_msg_send");
    trace_sent(line, message, data_len);
    if (trace_fault(line, &result))
        return result;
    result = send_message(message, data_len);
    trace_result(line, result);
    trace_end(line);
    return result;
}

#include "kiv/led.h"

#include "kiv/socket.h"
#include "standin.h"

#include <cerrno>
#include <cstddef>
#include <pthread.h>
#include <unistd.h>

// Requests that found the queue full. The helper delivers them, so that no caller ever waits: the daemon's own
// receive thread may be among the callers, and it is the one that makes room.
static pthread_mutex_t lock = PTHREAD_MUTEX_INITIALIZER;
static pthread_cond_t wake = PTHREAD_COND_INITIALIZER;
static int pending;         // under lock
static bool helper_started; // under lock

static int send_relight(int wait_ms)
{
    svc_msg message{};
    message.us_cmd = KIV_MSG_CMD_LED_RELIGHT_MSG;
    message.us_dest_module_id = KIV_MODULE_LED;
    message.us_source_module_id = KIV_MODULE_LED;
    return standin_send(standin_module_queue(KIV_MODULE_LED), &message, offsetof(svc_msg, ul_event_mask), wait_ms);
}

// An accepted request outlives the queue: while there is none, the helper looks again every second.
static void deliver()
{
    for (;;) {
        const int result = send_relight(STANDIN_SEND_WAIT_MS);
        if (result == 0) {
            return;
        }
        if (result != -EAGAIN) {
            sleep(1);
        }
    }
}

static void *run_helper(void *)
{
    trace_label("relight");
    for (;;) {
        pthread_mutex_lock(&lock);
        while (pending == 0) {
            pthread_cond_wait(&wake, &lock);
        }
        pthread_mutex_unlock(&lock);
        deliver();
        standin_event("kiv_lib_led_relight_deliver", [](trace_line &line) { trace_result(line, 0); });
        pthread_mutex_lock(&lock);
        pending--;
        pthread_mutex_unlock(&lock);
    }
    return nullptr;
}

static bool start_helper()
{
    pthread_t thread;
    if (!helper_started && pthread_create(&thread, nullptr, run_helper, nullptr) == 0) {
        pthread_detach(thread);
        helper_started = true;
    }
    return helper_started;
}

static int request_relight()
{
    pthread_mutex_lock(&lock);
    int result = pending > 0 ? -EAGAIN : send_relight(0);
    if (result == -EAGAIN && start_helper()) {
        pending++;
        pthread_cond_signal(&wake);
        result = 0;
    }
    pthread_mutex_unlock(&lock);
    return result == 0 ? 0 : -1;
}

int kiv_lib_led_relight_msg(void)
{
    return standin_call(__func__, no_arguments, request_relight);
}

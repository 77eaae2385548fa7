/* libkivipc: the IPC layer that feeds the process's uloop, and the timer service. */
#ifndef KIV_IPC_H
#define KIV_IPC_H

#ifdef __cplusplus
extern "C" {
#endif

/* Sets up the IPC layer for the process; its events arrive through uloop_run(). Called once, before the loop runs.
 * log_id: the module's log id; flag: 0. Returns 0, or -1. */
int kiv_ipc_init(int log_id, int flag);

/* Starts a timer. The callback runs on the timer service's thread with the argument, after period_ms milliseconds:
 * once when repeat is 0, otherwise every period_ms. Callbacks never overlap one another and may call both functions.
 * Any thread. Returns the handle, above 0, or 0 on failure. */
int kiv_timer(void (*callback)(void *), void *argument, int period_ms, int repeat);

/* Stops a timer. Any thread, also from the timer's own callback. Handle 0, a handle that has already fired and an
 * unknown handle are accepted and do nothing. A callback that is already running is not waited for. Returns 0. */
int kiv_delete_timer(int handle);

#ifdef __cplusplus
}
#endif
#endif

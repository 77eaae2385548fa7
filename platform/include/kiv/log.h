/* libkivlog: the device's system log. */
#ifndef KIV_LOG_H
#define KIV_LOG_H

#ifdef __cplusplus
extern "C" {
#endif

enum {
    KIV_LOG_ERROR = 0, /* errors and a few start-up milestones */
    KIV_LOG_INFO = 6,
};

/* Appends one line to the system log. Any thread.
 * level: KIV_LOG_ERROR or KIV_LOG_INFO; file, line: where the line was written;
 * log_id: the module's log id (31 for the LED daemon). Cannot fail. */
#if defined(__GNUC__)
__attribute__((format(printf, 5, 6)))
#endif
void kiv_syslog_append(int level, const char *file, int line, int log_id, const char *format, ...);

#ifdef __cplusplus
}
#endif
#endif

// The daemon's log lines. A source says once, as `led_log_source`, under which name its lines appear.
#pragma once

#include "kiv/log.h"

constexpr int led_log_id = 31;

#define LED_LOG(level, ...) kiv_syslog_append((level), led_log_source, __LINE__, led_log_id, __VA_ARGS__)
#define LED_INFO(...) LED_LOG(KIV_LOG_INFO, __VA_ARGS__)
#define LED_ERROR(...) LED_LOG(KIV_LOG_ERROR, __VA_ARGS__)

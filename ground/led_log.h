// The daemon's log lines. A source says once, as `LED_LOG_SOURCE`, under which name its lines appear.
#pragma once

#include "kiv/log.h"

constexpr int LED_LOG_ID = 31;

#define LED_LOG(level, ...) kiv_syslog_append((level), LED_LOG_SOURCE, __LINE__, LED_LOG_ID, __VA_ARGS__)
#define LED_INFO(...) LED_LOG(KIV_LOG_INFO, __VA_ARGS__)
#define LED_ERROR(...) LED_LOG(KIV_LOG_ERROR, __VA_ARGS__)

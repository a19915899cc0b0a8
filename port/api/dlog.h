/* SPDX-License-Identifier: Apache-2.0 */
/* The platform log. */
#ifndef PORT_API_DLOG_H
#define PORT_API_DLOG_H

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    LOG_ID_MAIN = 0,
    LOG_ID_RADIO = 1,
    LOG_ID_SYSTEM = 2,
    LOG_ID_APPS = 3,
    LOG_ID_MAX = 4
} log_id_t;

typedef enum {
    DLOG_UNKNOWN = 0,
    DLOG_DEFAULT = 1,
    DLOG_VERBOSE = 2,
    DLOG_DEBUG = 3,
    DLOG_INFO = 4,
    DLOG_WARN = 5,
    DLOG_ERROR = 6,
    DLOG_FATAL = 7,
    DLOG_SILENT = 8,
    DLOG_PRIO_MAX = 9
} log_priority;

typedef enum {
    DLOG_ERROR_NONE = 0,
    DLOG_ERROR_NOT_PERMITTED = -1,
    DLOG_ERROR_INVALID_PARAMETER = -22
} dlog_error_e;

/* Writes one line, printf style; the length of the text, or a negative code. Any thread. */
int __dlog_print(log_id_t log_id, int prio, const char* tag, const char* fmt, ...);

#ifdef __cplusplus
}
#endif

#endif

/* SPDX-License-Identifier: GPL-2.0-only */
/*
 * The vibrator driver as a real kernel module. Its parts: nodes below
 * /sys/class (nodes.c), a force-feedback input device (motor.c), and a report
 * of every call that reaches either (report.c).
 */
#ifndef QVX_VIBRATOR_H
#define QVX_VIBRATOR_H

#include <linux/compiler_attributes.h>
#include <linux/types.h>

/**
 * qvx_report - report one call as a line of the report device
 * @format: the line's members after "uid", as JSON, without braces
 *
 * The line reads {"pid":<of the caller>,"uid":<of the caller>,<members>}. May
 * be called in any context; the members must fit in 200 bytes.
 */
__printf(1, 2) void qvx_report(const char *format, ...);

/**
 * qvx_report_bytes - the same for a call that brings bytes
 * @bytes: shown in hexadecimal, in quotes, at the line's end
 * @size: how many
 * @format: members; the last one is a key with its colon, for the bytes
 *
 * Process context only; the members must fit in 580 bytes.
 */
__printf(3, 4) void qvx_report_bytes(const void *bytes, size_t size,
				     const char *format, ...);

/*
 * Each part's beginning, 0 or a negative error, and its end, which is harmless
 * without a beginning.
 */
int qvx_report_init(void);
void qvx_report_exit(void);
int qvx_nodes_init(void);
void qvx_nodes_exit(void);
int qvx_motor_init(void);
void qvx_motor_exit(void);

#endif /* QVX_VIBRATOR_H */

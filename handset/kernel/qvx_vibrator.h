/* SPDX-License-Identifier: GPL-2.0-only */
/*
 * The vibrator driver as a real kernel module. Its parts: nodes below
 * /sys/class (nodes.c), a force-feedback input device (motor.c), and a report
 * of every call that reaches either (report.c), and what goes wrong (faults.c).
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
 * be called in any context; the members must fit in 260 bytes.
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

struct work_struct;

/* Whose calls faults strike: a node or the motor. */
struct qvx_target {
	bool gone; /* unplugged: calls fail */
	bool lost; /* a motor unplugged by request: a delayed call ends */
	struct work_struct *unplug; /* takes the motor away; null for a node */
};

/* The calls, in the order of their names in faults.c. */
enum qvx_op { QVX_READ, QVX_WRITE, QVX_UPLOAD, QVX_ERASE };

/* What a fault does to a call that does not fail. */
struct qvx_strike {
	unsigned int most; /* bytes it may transfer */
	int shown;	   /* bytes of other contents in the buffer, or -1 */
	char members[64];  /* for the end of its report line; empty: none */
};

/**
 * qvx_meet_fault - count a call and let it meet the fault that is due, if any
 * @buffer: a page for a read's other contents; null for other calls
 *
 * May sleep as long as the fault says. Returns 0 or the call's negative error.
 */
int qvx_meet_fault(struct qvx_target *target, enum qvx_op op, char *buffer,
		   struct qvx_strike *strike);

/* The node CLASS/DEVICE/NAME, or "motor"; null where there is none. */
struct qvx_target *qvx_target_of(const char *name);
struct qvx_target *qvx_motor_target(void);

/*
 * Each part's beginning, 0 or a negative error, and its end, which is harmless
 * without a beginning.
 */
int qvx_report_init(void);
void qvx_report_exit(void);
int qvx_nodes_init(void);
void qvx_nodes_exit(void);
int qvx_motor_init(void); /* also brings an unplugged motor back */
void qvx_motor_exit(void);
void qvx_faults_exit(void); /* first: no call is kept waiting any more */

#endif /* QVX_VIBRATOR_H */

// SPDX-License-Identifier: GPL-2.0-only
/*
 * /dev/qvx_vibrator_report: what the driver was asked, one JSON object a line,
 * with the members of the handset's journal.
 *
 *   {"pid":71,"uid":1000,"op":"write",
 *    "node":"/sys/class/leds/vibrator/duration","result":4,
 *    "hex":"3530300a"}                                         (on one line)
 *
 * A line is there before its caller has the answer. Reading takes lines away
 * and never waits: nothing left reads as the end of a file; poll(2) waits. When
 * lines were lost because nobody read them, the next read fails with EOVERFLOW,
 * once.
 */
#include <linux/cred.h>
#include <linux/fs.h>
#include <linux/kernel.h>
#include <linux/kfifo.h>
#include <linux/miscdevice.h>
#include <linux/mm.h>
#include <linux/module.h>
#include <linux/mutex.h>
#include <linux/poll.h>
#include <linux/sched.h>
#include <linux/slab.h>
#include <linux/spinlock.h>
#include <linux/wait.h>

#include "qvx_vibrator.h"

#define QVX_REPORT_SIZE (1U << 18) /* bytes of lines nobody has read yet */
#define QVX_SHORT_LINE 320
#define QVX_LONG_HEAD 640 /* of a line with bytes: all before them */

static DEFINE_SPINLOCK(report_lock); /* writers, among them the input core */
static DEFINE_MUTEX(reader_lock);
static DECLARE_WAIT_QUEUE_HEAD(readers);
static struct kfifo report;
static bool lost;

static bool reporting = true;
module_param_named(report, reporting, bool, 0644);
MODULE_PARM_DESC(report, "Whether calls are reported, which costs them time");

/* A line's first members. */
#define HEAD "{\"pid\":%d,\"uid\":%u,"
#define CALLER                                                                 \
	task_tgid_nr(current), from_kuid_munged(&init_user_ns, current_fsuid())

static void put_line(const char *line, size_t length)
{
	unsigned long flags;

	spin_lock_irqsave(&report_lock, flags);
	if (kfifo_avail(&report) < length)
		lost = true;
	else
		kfifo_in(&report, line, length);
	spin_unlock_irqrestore(&report_lock, flags);
	wake_up_interruptible(&readers);
}

void qvx_report(const char *format, ...)
{
	char line[QVX_SHORT_LINE];
	struct va_format members = {.fmt = format};
	va_list arguments;

	if (!reporting)
		return;
	va_start(arguments, format);
	members.va = &arguments;
	put_line(line, scnprintf(line, sizeof(line), HEAD "%pV}\n", CALLER,
				 &members));
	va_end(arguments);
}

void qvx_report_bytes(const void *bytes, size_t size, const char *format, ...)
{
	struct va_format members = {.fmt = format};
	va_list arguments;
	char *line;
	char *end;

	if (!reporting)
		return;
	line = kvmalloc(QVX_LONG_HEAD + 2 * size, GFP_KERNEL);
	if (!line) {
		lost = true;
		return;
	}
	va_start(arguments, format);
	members.va = &arguments;
	end = line + scnprintf(line, QVX_LONG_HEAD - 4, HEAD "%pV\"", CALLER,
			       &members);
	va_end(arguments);
	end = bin2hex(end, bytes, size);
	memcpy(end, "\"}\n", 3);
	put_line(line, end + 3 - line);
	kvfree(line);
}

static ssize_t report_read(struct file *file, char __user *buffer, size_t size,
			   loff_t *position)
{
	unsigned int copied = 0;
	int error;

	error = mutex_lock_interruptible(&reader_lock);
	if (error)
		return error;
	if (lost) {
		lost = false;
		error = -EOVERFLOW;
	} else {
		error = kfifo_to_user(&report, buffer, size, &copied);
	}
	mutex_unlock(&reader_lock);
	return error ? error : copied;
}

static __poll_t report_poll(struct file *file, poll_table *wait)
{
	poll_wait(file, &readers, wait);
	return lost || !kfifo_is_empty(&report) ? EPOLLIN | EPOLLRDNORM : 0;
}

static const struct file_operations report_operations = {
	.owner = THIS_MODULE,
	.read = report_read,
	.poll = report_poll,
	.llseek = no_llseek,
};

static struct miscdevice report_device = {
	.minor = MISC_DYNAMIC_MINOR,
	.name = "qvx_vibrator_report",
	.fops = &report_operations,
	.mode = 0400,
};

int qvx_report_init(void)
{
	int error = kfifo_alloc(&report, QVX_REPORT_SIZE, GFP_KERNEL);

	if (error)
		return error;
	error = misc_register(&report_device);
	if (error)
		kfifo_free(&report);
	return error;
}

void qvx_report_exit(void)
{
	misc_deregister(&report_device);
	kfifo_free(&report);
}

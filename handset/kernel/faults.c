// SPDX-License-Identifier: GPL-2.0-only
/*
 * What goes wrong: the module's parameter "fault" takes one request a write.
 *
 *   fault TARGET OP ERROR MOST DELAY UNPLUG AFTER EVERY TIMES [=HEX]
 *   unplug TARGET
 *   plug TARGET
 *   clear                                     (forgets all faults)
 *
 * TARGET is "motor" or a node's CLASS/DEVICE/NAME; OP is read, write, upload or
 * erase. The rest are the keys of a fault of the handset, as numbers. Reading
 * the parameter gives "SEEN STRUCK" for each fault, in the order of adding.
 */
#include <linux/kernel.h>
#include <linux/ktime.h>
#include <linux/list.h>
#include <linux/minmax.h>
#include <linux/module.h>
#include <linux/mutex.h>
#include <linux/slab.h>
#include <linux/string.h>
#include <linux/wait.h>
#include <linux/workqueue.h>

#include "qvx_vibrator.h"

struct qvx_fault {
	struct list_head link;
	struct qvx_target *target;
	enum qvx_op op;
	int error, unplug;
	unsigned int most, delay, after, every, times;
	u64 seen, struck;
	int size; /* bytes in text; -1: no other contents */
	char text[];
};

static DEFINE_MUTEX(fault_lock); /* the faults, and every target's gone */
static LIST_HEAD(faults);
static DECLARE_WAIT_QUEUE_HEAD(delayed);
static bool leaving;

/* The fault that strikes this call, and its number, from 1; or null. */
static struct qvx_fault *next_fault(struct qvx_target *target, enum qvx_op op,
				    int *number)
{
	struct qvx_fault *fault, *decided = NULL;
	int at = 0;

	list_for_each_entry(fault, &faults, link) {
		at++;
		if (fault->target != target || fault->op != op)
			continue;
		fault->seen++;
		if (decided || fault->seen <= fault->after ||
		    (fault->times && fault->struck == fault->times) ||
		    (fault->seen - fault->after) % fault->every)
			continue;
		fault->struck++;
		decided = fault;
		*number = at;
	}
	return decided;
}

static void unplug(struct qvx_target *target)
{
	target->gone = true;
	if (target->unplug)
		schedule_work(target->unplug);
}

int qvx_meet_fault(struct qvx_target *target, enum qvx_op op, char *buffer,
		   struct qvx_strike *strike)
{
	const struct qvx_fault *fault = NULL;
	unsigned long delay = 0;
	int error = 0, number = 0;
	ktime_t arrival;

	strike->most = UINT_MAX;
	strike->shown = -1;
	*strike->members = '\0';
	if (list_empty(&faults) && !target->gone)
		return 0;
	arrival = ktime_get();
	mutex_lock(&fault_lock);
	if (target->gone)
		error = -ENODEV;
	else
		fault = next_fault(target, op, &number);
	if (fault) {
		error = fault->unplug && !fault->error ? -ENODEV
						       : -fault->error;
		delay = fault->delay;
		strike->most = fault->most;
		strike->shown = fault->size;
		if (fault->size > 0)
			memcpy(buffer, fault->text, fault->size);
		if (fault->unplug)
			unplug(target);
	}
	mutex_unlock(&fault_lock);
	if (!error && !fault)
		return 0;
	/* One tick more: the one that runs has begun already. */
	if (delay && wait_event_interruptible_timeout(
			     delayed, leaving || target->lost,
			     msecs_to_jiffies(delay) + 1))
		error = target->lost ? -ENODEV : -EINTR;
	snprintf(strike->members, sizeof(strike->members),
		 ",\"fault\":%d,\"took\":%lld", number,
		 ktime_us_delta(ktime_get(), arrival));
	return error;
}

static int add_fault(struct qvx_target *target, char *rest)
{
	static const char *const ops[] = {"read", "write", "upload", "erase"};
	const int op = match_string(ops, ARRAY_SIZE(ops), strsep(&rest, " "));
	char *text = strchr(rest ? rest : "", '=');
	size_t size = text ? strlen(text + 1) / 2 : 0;
	struct qvx_fault *fault = kzalloc(sizeof(*fault) + size, GFP_KERNEL);

	if (!fault)
		return -ENOMEM;
	if (op < 0 || !rest || (text && op != QVX_READ) ||
	    sscanf(rest, "%d %u %u %d %u %u %u", &fault->error, &fault->most,
		   &fault->delay, &fault->unplug, &fault->after, &fault->every,
		   &fault->times) != 7 ||
	    !fault->every || size >= PAGE_SIZE ||
	    (text && hex2bin(fault->text, text + 1, size))) {
		kfree(fault);
		return -EINVAL;
	}
	fault->target = target;
	fault->op = op;
	fault->size = text ? size : -1;
	mutex_lock(&fault_lock);
	list_add_tail(&fault->link, &faults);
	mutex_unlock(&fault_lock);
	return 0;
}

static int clear_faults(void)
{
	struct qvx_fault *fault, *next;

	mutex_lock(&fault_lock);
	list_for_each_entry_safe(fault, next, &faults, link)
		kfree(fault);
	INIT_LIST_HEAD(&faults);
	mutex_unlock(&fault_lock);
	return 0;
}

/* Outside fault_lock, which callers of the motor wait for. */
static int set_plugged(struct qvx_target *target, bool plugged)
{
	int error = plugged && target->unplug ? qvx_motor_init() : 0;

	if (error)
		return error;
	mutex_lock(&fault_lock);
	if (plugged)
		target->gone = false;
	else
		unplug(target);
	mutex_unlock(&fault_lock);
	if (!target->unplug)
		return 0;
	/* A motor in a call goes when that has ended. */
	target->lost = !plugged;
	wake_up_all(&delayed);
	if (!plugged)
		flush_work(target->unplug);
	return 0;
}

static int do_request(char *words)
{
	const char *verb = strsep(&words, " ");
	const char *name = strsep(&words, " ");
	struct qvx_target *target = name ? qvx_target_of(name) : NULL;

	if (!strcmp(verb, "clear"))
		return clear_faults();
	if (target && !strcmp(verb, "fault"))
		return add_fault(target, words);
	if (target && (!strcmp(verb, "plug") || !strcmp(verb, "unplug")))
		return set_plugged(target, *verb == 'p');
	return -EINVAL;
}

static int take_request(const char *value, const struct kernel_param *parameter)
{
	char *words = kstrdup(value, GFP_KERNEL);
	int error = -ENODEV;

	if (!words)
		return -ENOMEM;
	if (!leaving)
		error = do_request(strim(words));
	kfree(words);
	return error;
}

static int show_counts(char *buffer, const struct kernel_param *parameter)
{
	const struct qvx_fault *fault;
	int size = 0;

	mutex_lock(&fault_lock);
	list_for_each_entry(fault, &faults, link)
		size += scnprintf(buffer + size, PAGE_SIZE - size,
				  "%llu %llu\n", fault->seen, fault->struck);
	mutex_unlock(&fault_lock);
	return size;
}

static const struct kernel_param_ops request_operations = {
	.set = take_request,
	.get = show_counts,
};
module_param_cb(fault, &request_operations, NULL, 0600);
MODULE_PARM_DESC(fault, "What goes wrong; see README.md");

void qvx_faults_exit(void)
{
	leaving = true;
	wake_up_all(&delayed);
	clear_faults();
}

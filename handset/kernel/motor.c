// SPDX-License-Identifier: GPL-2.0-only
/*
 * The force-feedback input device. The input core (drivers/input/ff-core.c)
 * owns ids, access and order; here arrives what it lets through.
 */
#include <linux/err.h>
#include <linux/input.h>
#include <linux/minmax.h>
#include <linux/mm.h>
#include <linux/module.h>
#include <linux/string.h>
#include <linux/workqueue.h>

#include "qvx_vibrator.h"

#define QVX_MOST_SAMPLES 32768 /* of one custom waveform */

static unsigned int effects_max = 16;
module_param(effects_max, uint, 0444);
MODULE_PARM_DESC(effects_max, "Effects the motor holds at once, 1 to 96");

static char *motor_name = "";
module_param_named(motor, motor_name, charp, 0444);
MODULE_PARM_DESC(motor, "Name of the input device; empty: no motor");

static struct input_dev *motor;
static void remove_motor(struct work_struct *work);
static DECLARE_WORK(unplugging, remove_motor);
static struct qvx_target motor_target = {.unplug = &unplugging};

/* A client has closed the motor: the core erases its effects. */
static bool closing;

/* The motor's waveform memory: each effect's samples, at its id. */
static s16 *samples[FF_MAX_EFFECTS];

/* The client's buffer is only there during the upload: copy it now. */
static s16 *copy_samples(const struct ff_effect *effect)
{
	const struct ff_periodic_effect *periodic = &effect->u.periodic;

	if (periodic->waveform != FF_CUSTOM)
		return NULL;
	if (periodic->custom_len > QVX_MOST_SAMPLES)
		return ERR_PTR(-EINVAL);
	return vmemdup_user(periodic->custom_data,
			    periodic->custom_len * sizeof(s16));
}

static int motor_upload(struct input_dev *device, struct ff_effect *effect,
			struct ff_effect *old)
{
	const struct ff_periodic_effect *periodic = &effect->u.periodic;
	const struct ff_envelope *envelope = &periodic->envelope;
	s16 *copy = copy_samples(effect);
	struct qvx_strike strike;
	int error;

	if (IS_ERR(copy))
		return PTR_ERR(copy);
	error = qvx_meet_fault(&motor_target, QVX_UPLOAD, NULL, &strike);
	qvx_report_bytes(
		copy, copy ? periodic->custom_len * sizeof(s16) : 0,
		"\"op\":\"upload\",\"node\":\"motor\",\"id\":%d,\"result\":%d,"
		"\"type\":%u,\"waveform\":%u,\"length\":%u,\"delay\":%u,"
		"\"direction\":%u,\"button\":%u,\"interval\":%u,\"period\":%u,"
		"\"magnitude\":%d,\"offset\":%d,\"phase\":%u,"
		"\"attack_length\":%u,\"attack_level\":%u,"
		"\"fade_length\":%u,\"fade_level\":%u,"
		"\"custom_len\":%u%s,\"custom_hex\":",
		old ? effect->id : -1, error ? error : effect->id, effect->type,
		periodic->waveform, effect->replay.length, effect->replay.delay,
		effect->direction, effect->trigger.button,
		effect->trigger.interval, periodic->period, periodic->magnitude,
		periodic->offset, periodic->phase, envelope->attack_length,
		envelope->attack_level, envelope->fade_length,
		envelope->fade_level, periodic->custom_len, strike.members);
	if (!error)
		swap(samples[effect->id], copy);
	kvfree(copy);
	return error;
}

static int motor_erase(struct input_dev *device, int id)
{
	struct qvx_strike strike = {};
	int error = 0;

	if (!closing)
		error = qvx_meet_fault(&motor_target, QVX_ERASE, NULL, &strike);
	qvx_report("\"op\":\"erase\",\"node\":\"motor\",\"id\":%d,"
		   "\"result\":%d%s",
		   id, error, strike.members);
	if (!error) {
		kvfree(samples[id]);
		samples[id] = NULL;
	}
	return error;
}

/* Evdev calls this and all that uploads and erases under one lock. */
static int motor_flush(struct input_dev *device, struct file *file)
{
	int error;

	if (!file)
		return 0; /* the motor goes, and its effects with it */
	closing = true;
	error = input_ff_flush(device, file);
	closing = false;
	return error;
}

static void report_event(unsigned int code, int value)
{
	qvx_report("\"op\":\"event\",\"node\":\"motor\",\"type\":%u,"
		   "\"code\":%u,\"value\":%d,\"result\":%zu",
		   EV_FF, code, value, sizeof(struct input_event));
}

/* The core calls these two with interrupts off. */
static int motor_playback(struct input_dev *device, int id, int value)
{
	report_event(id, value);
	return 0;
}

static void motor_set_gain(struct input_dev *device, u16 gain)
{
	report_event(FF_GAIN, gain);
}

static int create_effects(struct input_dev *device)
{
	int error;

	if (effects_max < 1 || effects_max > FF_MAX_EFFECTS)
		return -EINVAL;
	error = input_ff_create(device, effects_max);
	if (error)
		return error;
	device->ff->upload = motor_upload;
	device->ff->erase = motor_erase;
	device->ff->playback = motor_playback;
	device->ff->set_gain = motor_set_gain;
	device->flush = motor_flush;
	return 0;
}

int qvx_motor_init(void)
{
	int error;

	flush_work(&unplugging);
	if (!*motor_name || motor)
		return 0;
	motor = input_allocate_device();
	if (!motor)
		return -ENOMEM;
	motor->name = motor_name;
	motor->phys = "qvx/input0";
	motor->id.bustype = BUS_VIRTUAL;
	input_set_capability(motor, EV_FF, FF_PERIODIC);
	input_set_capability(motor, EV_FF, FF_CUSTOM);
	input_set_capability(motor, EV_FF, FF_GAIN);
	error = create_effects(motor);
	if (!error)
		error = input_register_device(motor);
	if (error) {
		input_free_device(motor);
		motor = NULL;
	}
	return error;
}

static void remove_motor(struct work_struct *work)
{
	int id;

	if (motor)
		input_unregister_device(motor);
	motor = NULL;
	for (id = 0; id < FF_MAX_EFFECTS; id++) {
		kvfree(samples[id]);
		samples[id] = NULL;
	}
}

struct qvx_target *qvx_motor_target(void)
{
	return *motor_name ? &motor_target : NULL;
}

void qvx_motor_exit(void)
{
	cancel_work_sync(&unplugging);
	remove_motor(NULL);
}

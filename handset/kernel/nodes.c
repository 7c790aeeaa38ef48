// SPDX-License-Identifier: GPL-2.0-only
/*
 * The driver's nodes below /sys/class. Each shows the text last stored in it,
 * or its first one; a node that holds takes a store and forgets it.
 */
#include <linux/device.h>
#include <linux/err.h>
#include <linux/kernel.h>
#include <linux/leds.h>
#include <linux/minmax.h>
#include <linux/module.h>
#include <linux/mutex.h>
#include <linux/string.h>

#include "qvx_vibrator.h"

struct qvx_node {
	struct device_attribute attribute;
	const char *first_text;
	bool hold;
	size_t length;
	char text[PAGE_SIZE];
};

/* One device: /sys/class/<class>/<name> and the nodes in it. */
struct qvx_directory {
	const char *class_name;
	const char *name;
	struct qvx_node *nodes;
	size_t node_count;
	struct class *class; /* null for the LED, whose class is there */
	struct device *device;
};

static DEFINE_MUTEX(text_lock); /* every node's text and length */

static ssize_t node_show(struct device *device,
			 struct device_attribute *attribute, char *buffer);
static ssize_t node_store(struct device *device,
			  struct device_attribute *attribute, const char *bytes,
			  size_t size);

#define NODE(_name, _mode, _show, _store, _text, _hold)                        \
	{                                                                      \
		.attribute = __ATTR(_name, _mode, _show, _store),              \
		.first_text = _text, .hold = _hold                             \
	}
#define RW(name, text) NODE(name, 0664, node_show, node_store, text, false)
#define RO(name, text) NODE(name, 0444, node_show, NULL, text, false)
#define WO(name) NODE(name, 0220, NULL, node_store, "", false)
#define HOLD(name, text) NODE(name, 0664, node_show, node_store, text, true)

static struct qvx_node timed_output_nodes[] = {
	RW(enable, "0\n"),
	RW(intensity, "10000\n"),
	RW(force_touch_intensity, "10000\n"),
	RW(multi_freq, "0\n"),
	RW(haptic_engine, "\n"),
	HOLD(motor_type, "LINEAR_1040\n"),
	RO(intensities, "0,2000,4000,6000,8000,10000\n"),
	RO(haptic_intensities, "0,2500,5000,7500,10000\n"),
};

static struct qvx_node led_nodes[] = {
	RW(activate, "0\n"),
	RW(duration, "0\n"),
	RW(state, "0\n"),
	RW(intensity, "10000\n"),
	RW(force_touch_intensity, "10000\n"),
	RW(multi_freq, "0\n"),
	RW(haptic_engine, "\n"),
	RW(cp_trigger_index, "0\n"),
	RW(cp_trigger_queue, "\n"),
	RO(num_waves, "137\n"),
	HOLD(motor_type, "LINEAR_1040\n"),
	RW(event_cmd, "NONE\n"),
	RW(ext_control, "0\n"),
	RO(intensities, "0,2000,4000,6000,8000,10000\n"),
	RO(haptic_intensities, "0,2500,5000,7500,10000\n"),
	WO(reset),
};

static struct qvx_node control_nodes[] = {
	RW(use_kyp_index, "0\n"),
	RW(f0_stored, "0\n"),
	RW(event_cmd, "NONE\n"),
};

static struct qvx_node info_nodes[] = {
	RO(functions, "INTENSITY\nINDEX_HAPTIC_PATTERN\n"),
	RO(intensities, "0,1800,3600,5400,7200,10000\n"),
	RO(haptic_intensities, "0,2200,4400,6600,10000\n"),
};

static struct qvx_directory directories[] = {
	{"timed_output", "vibrator", timed_output_nodes,
	 ARRAY_SIZE(timed_output_nodes)},
	{"qvx_vib_inputff", "control", control_nodes,
	 ARRAY_SIZE(control_nodes)},
	{"vib_info_class", "vib_support_info", info_nodes,
	 ARRAY_SIZE(info_nodes)},
};

static struct qvx_directory led_directory = {"leds", "vibrator", led_nodes,
				       ARRAY_SIZE(led_nodes)};

static struct qvx_node *node_of(struct device_attribute *attribute)
{
	return container_of(attribute, struct qvx_node, attribute);
}

/* A node's path as a member of a report line. */
#define NODE_PATH "\"node\":\"/sys/class/%s/%s/%s\""
#define NODE_PATH_OF(device, attribute)                                        \
	(device)->class->name, dev_name(device), (attribute)->attr.name

static ssize_t node_show(struct device *device,
			 struct device_attribute *attribute, char *buffer)
{
	struct qvx_node *node = node_of(attribute);
	size_t shown;

	mutex_lock(&text_lock);
	/* A page filled to its end is more than sysfs lets a node show. */
	shown = min_t(size_t, node->length, PAGE_SIZE - 1);
	memcpy(buffer, node->text, shown);
	mutex_unlock(&text_lock);
	qvx_report("\"op\":\"read\"," NODE_PATH ",\"result\":%zu",
		   NODE_PATH_OF(device, attribute), shown);
	return shown;
}

static ssize_t node_store(struct device *device,
			  struct device_attribute *attribute, const char *bytes,
			  size_t size)
{
	struct qvx_node *node = node_of(attribute);

	mutex_lock(&text_lock);
	if (!node->hold) {
		/* sysfs hands over a page at most. */
		memcpy(node->text, bytes, size);
		node->length = size;
	}
	mutex_unlock(&text_lock);
	qvx_report_bytes(bytes, size,
			 "\"op\":\"write\"," NODE_PATH
			 ",\"result\":%zu,\"hex\":",
			 NODE_PATH_OF(device, attribute), size);
	return size;
}

static int add_nodes(struct qvx_directory *directory)
{
	size_t i;
	int error;

	for (i = 0; i < directory->node_count; i++) {
		struct qvx_node *node = &directory->nodes[i];

		node->length = strscpy(node->text, node->first_text,
				       sizeof(node->text));
		error = device_create_file(directory->device, &node->attribute);
		if (error)
			return error;
	}
	return 0;
}

/* The nodes go with their device. */
static void remove_directory(struct qvx_directory *directory)
{
	if (!IS_ERR_OR_NULL(directory->device))
		device_unregister(directory->device);
	if (!IS_ERR_OR_NULL(directory->class))
		class_destroy(directory->class);
	directory->device = NULL;
	directory->class = NULL;
}

static int add_directory(struct qvx_directory *directory)
{
	directory->class = class_create(THIS_MODULE, directory->class_name);
	if (IS_ERR(directory->class))
		return PTR_ERR(directory->class);
	directory->device =
		device_create(directory->class, NULL, 0, NULL, "%s", directory->name);
	if (IS_ERR(directory->device))
		return PTR_ERR(directory->device);
	return add_nodes(directory);
}

/* The LED class insists on a brightness; a vibrator has none. */
static void set_brightness(struct led_classdev *led,
			   enum led_brightness brightness)
{
}

static struct led_classdev led = {
	.name = "vibrator",
	.max_brightness = 1,
	.brightness_set = set_brightness,
};

static int add_led(void)
{
	int error = led_classdev_register(NULL, &led);

	if (error)
		return error;
	led_directory.device = led.dev;
	error = add_nodes(&led_directory);
	if (error)
		led_classdev_unregister(&led);
	return error;
}

int qvx_nodes_init(void)
{
	size_t i;
	int error;

	for (i = 0; i < ARRAY_SIZE(directories); i++) {
		error = add_directory(&directories[i]);
		if (error)
			goto failed;
	}
	error = add_led();
	if (error)
		goto failed;
	return 0;

failed:
	for (i = 0; i < ARRAY_SIZE(directories); i++)
		remove_directory(&directories[i]);
	return error;
}

void qvx_nodes_exit(void)
{
	size_t i;

	led_classdev_unregister(&led);
	for (i = 0; i < ARRAY_SIZE(directories); i++)
		remove_directory(&directories[i]);
}

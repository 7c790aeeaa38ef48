// SPDX-License-Identifier: GPL-2.0-only
/*
 * The driver's nodes below /sys/class: those that the module's parameter names.
 * Each shows the text last stored in it, or its first one; a node that holds
 * takes a store and forgets it.
 */
#include <linux/device.h>
#include <linux/err.h>
#include <linux/kernel.h>
#include <linux/leds.h>
#include <linux/list.h>
#include <linux/minmax.h>
#include <linux/module.h>
#include <linux/mutex.h>
#include <linux/slab.h>
#include <linux/string.h>

#include "qvx_vibrator.h"

struct qvx_node {
	struct list_head link;
	struct device_attribute attribute;
	struct qvx_target target;
	bool hold;
	size_t length;
	char text[PAGE_SIZE];
};

/* One device: /sys/class/<class_name>/<name> and the nodes in it. */
struct qvx_directory {
	struct list_head link;
	struct list_head nodes;
	const char *class_name;
	const char *name;
	struct class *class; /* null for an LED, whose class is there */
	struct device *device;
	struct led_classdev led;
};

static DEFINE_MUTEX(text_lock); /* every node's text and length */
static LIST_HEAD(directories);

/* The parameter, cut up: names of nodes and directories lie in it. */
static char *words;

/* Without the limit that a plain string parameter has. */
static int keep_words(const char *value, const struct kernel_param *parameter)
{
	kfree(words);
	words = kstrdup(value, GFP_KERNEL);
	return words ? 0 : -ENOMEM;
}

static const struct kernel_param_ops words_operations = {.set = keep_words};
module_param_cb(nodes, &words_operations, NULL, 0);
MODULE_PARM_DESC(nodes, "Nodes, each CLASS/DEVICE/NAME:rw|ro|wo|hold:TEXT IN HEX,");

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
	struct qvx_strike strike;
	ssize_t shown;
	int error = qvx_meet_fault(&node->target, QVX_READ, buffer, &strike);

	mutex_lock(&text_lock);
	if (strike.shown < 0) {
		/* A page filled to its end is more than sysfs shows. */
		strike.shown = min_t(size_t, node->length, PAGE_SIZE - 1);
		memcpy(buffer, node->text, strike.shown);
	}
	mutex_unlock(&text_lock);
	shown = min_t(unsigned int, strike.shown, strike.most);
	if (error)
		shown = error;
	qvx_report("\"op\":\"read\"," NODE_PATH ",\"result\":%zd%s",
		   NODE_PATH_OF(device, attribute), shown, strike.members);
	return shown;
}

static ssize_t node_store(struct device *device,
			  struct device_attribute *attribute, const char *bytes,
			  size_t size)
{
	struct qvx_node *node = node_of(attribute);
	struct qvx_strike strike;
	int error = qvx_meet_fault(&node->target, QVX_WRITE, NULL, &strike);
	ssize_t taken = min_t(size_t, size, strike.most);

	if (error)
		taken = error;
	mutex_lock(&text_lock);
	if (!node->hold && !error) {
		/* sysfs hands over a page at most. */
		memcpy(node->text, bytes, taken);
		node->length = taken;
	}
	mutex_unlock(&text_lock);
	qvx_report_bytes(bytes, size,
			 "\"op\":\"write\"," NODE_PATH
			 ",\"result\":%zd%s,\"hex\":",
			 NODE_PATH_OF(device, attribute), taken,
			 strike.members);
	return taken;
}

struct qvx_target *qvx_target_of(const char *name)
{
	struct qvx_directory *directory;
	struct qvx_node *node;
	char path[256];

	list_for_each_entry(directory, &directories, link) {
		list_for_each_entry(node, &directory->nodes, link) {
			snprintf(path, sizeof(path), "%s/%s/%s",
				 directory->class_name, directory->name,
				 node->attribute.attr.name);
			if (!strcmp(path, name))
				return &node->target;
		}
	}
	return strcmp(name, "motor") ? NULL : qvx_motor_target();
}

/* What a node may be asked for: the third word of its description. */
static const struct {
	const char *word;
	umode_t mode;
	bool hold;
} accesses[] = {
	{"rw", 0664, false},
	{"ro", 0444, false},
	{"wo", 0220, false},
	{"hold", 0664, true},
};

static int set_access(struct qvx_node *node, const char *word)
{
	size_t i;

	for (i = 0; i < ARRAY_SIZE(accesses); i++) {
		umode_t mode = accesses[i].mode;

		if (!word || strcmp(word, accesses[i].word))
			continue;
		node->attribute.attr.mode = mode;
		node->attribute.show = mode & 0444 ? node_show : NULL;
		node->attribute.store = mode & 0222 ? node_store : NULL;
		node->hold = accesses[i].hold;
		return 0;
	}
	return -EINVAL;
}

static int set_first_text(struct qvx_node *node, const char *digits)
{
	size_t length = digits ? strlen(digits) : 0;

	if (length % 2 || length / 2 >= PAGE_SIZE)
		return -EINVAL;
	node->length = length / 2;
	return hex2bin(node->text, digits, node->length);
}

static struct qvx_directory *directory_of(const char *class_name,
					  const char *name)
{
	struct qvx_directory *directory;

	list_for_each_entry(directory, &directories, link) {
		if (!strcmp(directory->class_name, class_name) &&
		    !strcmp(directory->name, name))
			return directory;
	}
	directory = kzalloc(sizeof(*directory), GFP_KERNEL);
	if (!directory)
		return NULL;
	INIT_LIST_HEAD(&directory->nodes);
	directory->class_name = class_name;
	directory->name = name;
	list_add_tail(&directory->link, &directories);
	return directory;
}

/* Takes in one description, CLASS/DEVICE/NAME:ACCESS:HEX. */
static int add_node(char *description)
{
	const char *class_name = strsep(&description, "/");
	const char *device = strsep(&description, "/");
	const char *name = strsep(&description, ":");
	struct qvx_directory *directory;
	struct qvx_node *node;
	int error;

	if (!name || strchr(name, '/'))
		return -EINVAL;
	directory = directory_of(class_name, device);
	node = kzalloc(sizeof(*node), GFP_KERNEL);
	if (!directory || !node) {
		kfree(node);
		return -ENOMEM;
	}
	list_add_tail(&node->link, &directory->nodes);
	sysfs_attr_init(&node->attribute.attr);
	node->attribute.attr.name = name;
	error = set_access(node, strsep(&description, ":"));
	return error ? error : set_first_text(node, description);
}

/* The LED class insists on a brightness; a vibrator has none. */
static void set_brightness(struct led_classdev *led,
			   enum led_brightness brightness)
{
}

static int show_led(struct qvx_directory *directory)
{
	struct led_classdev *led = &directory->led;
	int error;

	led->name = directory->name;
	led->max_brightness = 1;
	led->brightness_set = set_brightness;
	error = led_classdev_register(NULL, led);
	directory->device = error ? NULL : led->dev;
	return error;
}

static int show_device(struct qvx_directory *directory)
{
	directory->class = class_create(THIS_MODULE, directory->class_name);
	if (IS_ERR(directory->class))
		return PTR_ERR(directory->class);
	directory->device = device_create(directory->class, NULL, 0, NULL, "%s",
					  directory->name);
	return PTR_ERR_OR_ZERO(directory->device);
}

static int show_directory(struct qvx_directory *directory)
{
	bool is_led = !strcmp(directory->class_name, "leds");
	int error = is_led ? show_led(directory) : show_device(directory);
	struct qvx_node *node;

	list_for_each_entry(node, &directory->nodes, link) {
		if (error)
			break;
		error = device_create_file(directory->device, &node->attribute);
	}
	return error;
}

/* The nodes go with their device. */
static void remove_directory(struct qvx_directory *directory)
{
	struct qvx_node *node, *next;

	if (IS_ERR_OR_NULL(directory->device))
		;
	else if (directory->class)
		device_unregister(directory->device);
	else
		led_classdev_unregister(&directory->led);
	if (!IS_ERR_OR_NULL(directory->class))
		class_destroy(directory->class);
	list_for_each_entry_safe(node, next, &directory->nodes, link)
		kfree(node);
	list_del(&directory->link);
	kfree(directory);
}

int qvx_nodes_init(void)
{
	struct qvx_directory *directory;
	char *rest = words;
	char *description;
	int error = 0;

	while (!error && (description = strsep(&rest, ",")))
		error = *description ? add_node(description) : 0;
	list_for_each_entry(directory, &directories, link) {
		if (error)
			break;
		error = show_directory(directory);
	}
	if (error)
		qvx_nodes_exit();
	return error;
}

void qvx_nodes_exit(void)
{
	struct qvx_directory *directory, *next;

	list_for_each_entry_safe(directory, next, &directories, link)
		remove_directory(directory);
	kfree(words);
	words = NULL;
}

// SPDX-License-Identifier: GPL-2.0-only
/*
 * A vibrator driver without a vibrator: it takes everything a phone's driver
 * takes, moves nothing and tells what it was asked. What it sees is what the
 * kernel hands to any driver behind sysfs and the input core, so it is the
 * measure for the handset's driver in user space.
 */
#include <linux/init.h>
#include <linux/module.h>

#include "qvx_vibrator.h"

static int __init qvx_vibrator_init(void)
{
	int error = qvx_report_init();

	if (error)
		return error;
	error = qvx_nodes_init();
	if (error)
		goto no_nodes;
	error = qvx_motor_init();
	if (error)
		goto no_motor;
	return 0;

no_motor:
	qvx_nodes_exit();
no_nodes:
	qvx_report_exit();
	return error;
}

static void __exit qvx_vibrator_exit(void)
{
	qvx_faults_exit();
	qvx_motor_exit();
	qvx_nodes_exit();
	qvx_report_exit();
}

module_init(qvx_vibrator_init);
module_exit(qvx_vibrator_exit);

MODULE_DESCRIPTION("Vibrator driver that reports what it is asked");
MODULE_LICENSE("GPL");

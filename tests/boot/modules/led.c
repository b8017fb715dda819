// SPDX-License-Identifier: GPL-2.0
/* An LED named "vibrator", which stands for a motor that a GPIO switches. */
#include <linux/leds.h>
#include <linux/module.h>

static unsigned int lasted;
module_param(lasted, uint, 0444);
MODULE_PARM_DESC(lasted, "how long the last run was, in ms");

static void set(struct led_classdev *led, enum led_brightness brightness)
{
	static enum led_brightness now;
	static ktime_t start;

	if (brightness && !now)
		start = ktime_get();
	if (!brightness && now)
		lasted = ktime_ms_delta(ktime_get(), start);
	now = brightness;
}

static struct led_classdev motor = {
	.name = "vibrator",
	.max_brightness = 1,
	.brightness_set = set,
};

static int __init motor_init(void)
{
	return led_classdev_register(NULL, &motor);
}
module_init(motor_init);

static void __exit motor_exit(void)
{
	led_classdev_unregister(&motor);
}
module_exit(motor_exit);

/* A device that the virtual machine has, so that udev loads this. */
MODULE_ALIAS("platform:pcspkr");
MODULE_DESCRIPTION("LED of the boot test");
MODULE_LICENSE("GPL");

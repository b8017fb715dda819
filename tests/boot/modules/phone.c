// SPDX-License-Identifier: GPL-2.0
/* A phone's force-feedback motor, whose effects the kernel times as it does for most of them. */
#include <linux/input.h>
#include <linux/module.h>

static struct input_dev *device;

static int strength;
module_param(strength, int, 0444);
MODULE_PARM_DESC(strength, "how strongly it moves now, to 65535");

static int play(struct input_dev *dev, void *data, struct ff_effect *effect)
{
	strength = max(effect->u.rumble.strong_magnitude, effect->u.rumble.weak_magnitude);
	return 0;
}

static int __init phone_init(void)
{
	int error;

	device = input_allocate_device();
	if (!device)
		return -ENOMEM;
	device->name = "test-phone";
	input_set_capability(device, EV_FF, FF_RUMBLE);
	error = input_ff_create_memless(device, NULL, play);
	if (!error)
		error = input_register_device(device);
	if (error)
		input_free_device(device);
	return error;
}
module_init(phone_init);

static void __exit phone_exit(void)
{
	input_unregister_device(device);
}
module_exit(phone_exit);

MODULE_DESCRIPTION("force-feedback motor of the boot test");
MODULE_LICENSE("GPL");

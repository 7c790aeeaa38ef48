# SPDX-License-Identifier: Apache-2.0
#
# The vibrator service in a product: the program with its init script and its VINTF fragment, the
# interface library it loads, and the policy it runs under. A device's makefile inherits this file,
# having said which of the init scripts for the driver's nodes it takes:
#
#   QVX_VIBRATOR_CLASS := leds        (legacy, leds or inputff; more than one, separated by spaces)
QVX_VIBRATOR_DIRECTORY := $(patsubst %/,%,$(dir $(lastword $(MAKEFILE_LIST))))

PRODUCT_PACKAGES += android.hardware.vibrator-service.quorvan

PRODUCT_COPY_FILES += $(foreach class,$(QVX_VIBRATOR_CLASS), \
    $(QVX_VIBRATOR_DIRECTORY)/init/init.vibrator-$(class).rc:$(TARGET_COPY_OUT_VENDOR)/etc/init/init.vibrator-$(class).rc)

BOARD_VENDOR_SEPOLICY_DIRS += $(QVX_VIBRATOR_DIRECTORY)/sepolicy

# SPDX-License-Identifier: Apache-2.0
#
# The vibrator service in a product: the program with its init script and its VINTF fragment, the
# interface library it loads, and the policy it runs under. A device's makefile inherits this file.
QVX_VIBRATOR_FOLDER := $(patsubst %/,%,$(dir $(lastword $(MAKEFILE_LIST))))

PRODUCT_PACKAGES += android.hardware.vibrator-service.quorvan

BOARD_VENDOR_SEPOLICY_DIRS += $(QVX_VIBRATOR_FOLDER)/sepolicy

# SPDX-License-Identifier: Apache-2.0
"""The rooms of the service and which may include which. A file of default/ itself is named here; the
others belong to the room that their directory is."""

import unittest

import project

ROOMS = {"main.cpp": "entry", "Vibrator.cpp": "standard", "Vibrator.h": "standard",
         "Vibrator_vendor.cpp": "extension", "Vibrator_vendor.h": "extension",
         "ServiceStatus.h": "status", "HwApi.h": "hwapi", "Constants.h": "constants"}

# From each room to those below it that it may include; from the constants to none.
ARROWS = {
    "entry": {"standard", "extension", "hwapi"},
    "standard": {"hwapi", "constants", "status"},
    "extension": {"hwapi", "constants", "status"},
    "hwapi": {"driver", "constants"},
    "driver": set(),
    "status": set(),
    "constants": set(),
}
BINDER = ("android/binder_", "aidl/")


def room_of(name):
    """The room of a file, by its name below default/."""
    return ROOMS.get(name) or name.split("/")[0]


class Rooms(unittest.TestCase):
    def setUp(self):
        self.files = {str(path.relative_to(project.SERVICE)): project.includes(path)
                      for path in project.service_files(".cpp", ".h")}

    def own_includes(self, name):
        return [include for quote, include in self.files[name] if quote == '"']

    def test_every_file_is_in_a_room(self):
        for name in self.files:
            self.assertIn(room_of(name), ARROWS, name)
        self.assertEqual({room_of(name) for name in self.files}, set(ARROWS))

    def test_arrows_go_down(self):
        for name in self.files:
            room = room_of(name)
            for include in self.own_includes(name):
                with self.subTest(f"{name}: {include}"):
                    self.assertIn(room_of(include), ARROWS[room] | {room})

    def test_driver_knows_no_binder(self):
        for name in self.files:
            if room_of(name) == "driver":
                for _, include in self.files[name]:
                    self.assertFalse(include.startswith(BINDER), f"{name}: {include}")

    def test_few_files_make_system_calls(self):
        callers = [name for name in self.files
                   if "driver/SystemCalls.h" in self.own_includes(name)]
        self.assertLessEqual(len(callers), 6)


if __name__ == "__main__":
    unittest.main()

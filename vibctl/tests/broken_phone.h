// SPDX-License-Identifier: Apache-2.0
//
// A healthy phone to be broken, one row of a table for each way: what is done to it, and the line of
// the doctor's that has to name the cause and the next step.
#pragma once

#include <string>

#include <gtest/gtest.h>

#include "vibctl/doctor/doctor.h"
#include "vibctl/tests/doctor_root.h"

namespace vibctl {

// A user that no file here belongs to, whatever user runs the test.
inline constexpr uid_t kStranger = 4242;
inline constexpr const char* kProgram = "/vendor/bin/hw/android.hardware.vibrator-service.quorvan";
inline constexpr const char* kFragment =
        "/vendor/etc/vintf/manifest/android.hardware.vibrator-service.quorvan.xml";
inline constexpr const char* kFunctions = "/sys/class/vib_info_class/vib_support_info/functions";
inline constexpr const char* kList = "/proc/bus/input/devices";
inline const std::string kLedsDirectory = "/sys/class/leds/vibrator/";
inline const std::string kLegacyDirectory = "/sys/class/timed_output/vibrator/";

struct Phone {
    fake::Root root;
    BinderFacts facts;

    // The service ends; nobody else is registered.
    void endService() {
        root.remove("/proc/312");
        facts.registered = false;
        facts.registrant = 0;
    }

    // A force-feedback phone instead of the LED-class one.
    void becomeForceFeedback() const {
        root.remove(kLedsDirectory);
        root.put(kList,
                 "N: Name=\"keys\"\nH: Handlers=kbd event0 \n\nN: "
                 "Name=\"qvx_vibrator_inputff\"\nH: Handlers=event3 \n\n");
        root.put("/dev/input/event3", "");
        root.putNodes("/sys/class/qvx_vib_inputff/control",
                      {"use_kyp_index", "event_cmd", "f0_stored"});
        root.put("/efs/FactoryApp/vibrator_calibration", "137\n");
    }

    // The driver says that it has the feature.
    void list(const std::string& word) const {
        root.put(kFunctions, "INTENSITY HAPTIC_ENGINE PRIMITIVE_EFFECT_COMPOSE " + word + "\n");
    }

    // A file that the service's user may not open; who owns it depends on who runs the test.
    void deny(const std::string& path) const { root.chmod(path, 0600); }
};

struct Broken {
    const char* name;
    void (*damage)(Phone& phone);
    // The line, in which an owner that depends on who runs the test is written "OWNER".
    std::string line;
};

// Its tests are instantiated with a table of rows.
class BrokenPhone : public ::testing::TestWithParam<Broken> {};

}  // namespace vibctl

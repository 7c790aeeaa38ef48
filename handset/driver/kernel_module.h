// SPDX-License-Identifier: Apache-2.0
//
// The vibrator driver as a kernel module (handset/kernel) in place of the simulated one: real nodes
// and a real input device, with the nodes, modes, texts and motor that a profile names.
#pragma once

#include <memory>
#include <optional>
#include <string>

#include <android-base/result.h>
#include <android-base/unique_fd.h>

#include "handset/driver/journal.h"
#include "handset/driver/kernel_faults.h"
#include "handset/driver/profile.h"

namespace handset {

// What the module is loaded with to be the profile's phone. An error for what it cannot be: a node
// that is not /sys/class/CLASS/DEVICE/NAME, a motor of a chosen number, faults it cannot have.
android::base::Result<std::string> moduleParameters(const Profile& profile);

// The number N of the kernel's input device of that name, as /dev/input/eventN; empty without one.
std::optional<unsigned> findEvent(const std::string& name);

class KernelModule {
  public:
    // Loads the module in `file` and gives its nodes and its motor to the platform's system user,
    // as init does on a phone. It goes with this object.
    static android::base::Result<std::unique_ptr<KernelModule>> load(const std::string& file,
                                                                     const Profile& profile);

    ~KernelModule();
    KernelModule(const KernelModule&) = delete;
    KernelModule& operator=(const KernelModule&) = delete;

    // Becomes readable when the module has been called.
    int descriptor() const { return mReport.get(); }

    // The number of the motor's /dev/input/eventN; 0 without a motor.
    unsigned event() const { return mEvent; }

    // Puts what the module has been asked since the last time into the journal, with what `faults`
    // knows of the calls it struck. Opens and closes are not among it: a driver does not learn of
    // them.
    void report(Journal& journal, KernelFaults& faults);

  private:
    KernelModule() = default;

    android::base::unique_fd mReport;
    unsigned mEvent = 0;
    std::string mRest;  // of a line that has not come whole
};

}  // namespace handset

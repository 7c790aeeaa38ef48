// SPDX-License-Identifier: Apache-2.0
//
// The binder side of the client: finding the two interfaces and the list of services without ever
// hanging where there is no service manager.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <memory>
#include <string>

#include "vibctl/arguments.h"
#include "vibctl/methods.h"
#include "vibctl/outcome.h"

namespace vibctl {

using Service = std::shared_ptr<ndk::ICInterface>;

// "android.hardware.vibrator.IVibrator/default"
std::string serviceName();

// Says why binder cannot be used, or nothing: no device to open, or no service manager that
// answers within `limit`, or two seconds when that is less. To be asked before anything else here.
Problem checkBinder(std::chrono::milliseconds limit);

// The two halves of checkBinder(). `device` becomes the one that the binder library will take.
Problem checkDevice(std::string& device);
Problem checkManager(std::chrono::milliseconds limit);

// The service behind the interface "std" or "ext", an IVibrator or an IZelVibrator; null with the
// reason in `problem`. The second has no name of its own: it is the first one's binder extension.
// Asks the service, so it takes as long as that does not answer.
Service connect(const std::string& iface, Problem& problem);

// Asks the service manager which services are registered. The result is a list of names.
Outcome listServices();

// The process that registered the service, or 0: there is no such service, or the service manager
// does not tell.
pid_t findRegistrant(const std::string& name);

}  // namespace vibctl

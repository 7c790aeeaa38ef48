// SPDX-License-Identifier: Apache-2.0
//
// What a bring-up gets stuck on, asked in the order in which one answer needs the other: binder,
// service manager, declaration, registration, user, device class, nodes, input device, extension.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

#include "arguments.h"
#include "doctor/finding.h"

namespace vibctl {

/// What was learned over binder. A problem says why the rest could not be asked.
struct BinderFacts {
    std::string device;  ///< the binder device that is used
    Problem deviceProblem;
    Problem managerProblem;
    bool declared = false;
    bool registered = false;
    pid_t registrant = 0;    ///< process that registered the service; 0 when that is not known
    Problem serviceProblem;  ///< it is registered and does not answer
    int32_t version = 0;
    Problem extensionProblem;
    int32_t extensionVersion = 0;
};

/// The findings, every check at least once. `root` stands for "/": /proc, the manifests and, where
/// no service runs whose view can be taken, the driver's nodes are looked for below it.
std::vector<Finding> diagnose(const BinderFacts& facts, const std::filesystem::path& root);

}  // namespace vibctl

// SPDX-License-Identifier: Apache-2.0
//
// What a bring-up gets stuck on, asked in the order in which one answer needs the other: binder,
// service manager, declaration, registration, user, device class, nodes, their contents, extension.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

#include "vibctl/arguments.h"
#include "vibctl/doctor/finding.h"

namespace vibctl {

// What was learned over binder. A problem says why the rest could not be asked.
struct BinderFacts {
    std::string device;  // the binder device that is used
    Problem deviceProblem;
    Problem managerProblem;
    bool declared = false;
    bool registered = false;
    pid_t registrant = 0;    // process that registered the service; 0 when that is not known
    Problem serviceProblem;  // it is registered and does not answer
    int32_t version = 0;
    Problem extensionProblem;
    int32_t extensionVersion = 0;
};

// The findings, every check at least once. `root` stands for "/": /proc and the manifests are looked
// for below it. The driver's nodes are looked for where the service sees them, when it runs; else
// where they are: below `root`, or in the view of another process.
std::vector<Finding> diagnose(const BinderFacts& facts, const std::filesystem::path& root);

}  // namespace vibctl

// SPDX-License-Identifier: Apache-2.0
//
// Plain files in place of the driver's nodes, for figures taken without a driver. This program's
// own open and ioctl stand before the C library's: a path of the driver is opened below the working
// directory, and a force-feedback request is made and then answered as a motor would. Every system
// call is really made, so that it can be counted.
#pragma once

#include <string>
#include <vector>

namespace bench {

// A kind of phone: its driver's files (paths as the service knows them) with their text.
struct PhoneFiles {
    const char* name;
    std::vector<std::pair<std::string, std::string>> files;
};

// Makes `directory` the working directory, with the phone's files in it.
void enterPhone(const PhoneFiles& phone, const std::string& directory);

// Waits for the threads that were started since the last call, detached ones too.
void joinThreads();

}  // namespace bench

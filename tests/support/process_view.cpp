// SPDX-License-Identifier: Apache-2.0
#include "tests/support/process_view.h"

#include <filesystem>
#include <fstream>
#include <system_error>

namespace qvx::test {

std::vector<std::string> entriesOf(pid_t process, const std::string& directory) {
    std::vector<std::string> entries;
    std::error_code ended;
    const std::string path = "/proc/" + std::to_string(process) + "/" + directory;
    for (const auto& entry : std::filesystem::directory_iterator(path, ended)) {
        entries.push_back(entry.path().filename());
    }
    return entries;
}

int privateMemory(pid_t process) {
    std::ifstream file("/proc/" + std::to_string(process) + "/smaps_rollup");
    int sum = 0;
    for (std::string word; file >> word;) {
        int size = 0;
        if (word.starts_with("Private_") && file >> size) sum += size;
    }
    return sum;
}

}  // namespace qvx::test

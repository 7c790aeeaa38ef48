// SPDX-License-Identifier: Apache-2.0
//
// Reads anything as a VINTF manifest. It is a manifest or one line says why not, and what the answers
// have in common they agree on.
#include <sys/mman.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <string>

#include "fuzz/input.h"
#include "platform/servicemanager/manifests.h"

namespace {

using fuzz::require;

constexpr const char* kInterface = "android.hardware.vibrator.IVibrator";

// The file, in memory, behind the name that is looked for.
struct Place {
    Place() {
        require(file >= 0 && mkdtemp(root.data()) != nullptr);
        std::filesystem::create_directories(root + "/vendor/etc/vintf");
        std::filesystem::create_symlink("/proc/self/fd/" + std::to_string(file),
                                        root + "/vendor/etc/vintf/manifest.xml");
    }
    ~Place() { std::filesystem::remove_all(root); }

    const int file = memfd_create("manifest", MFD_CLOEXEC);
    std::string root = std::filesystem::temp_directory_path() / "manifests.XXXXXX";
};

const Place& place() {
    static const Place kPlace;
    return kPlace;
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int* /*argc*/, char*** /*argv*/) {
    place();
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    require(ftruncate(place().file, 0) == 0);
    require(pwrite(place().file, data, size, 0) == static_cast<ssize_t>(size));
    int complaints = 0;
    const servicemanager::Manifests manifests(place().root, [&](const std::string& line) {
        ++complaints;
        require(line.find(" is passed over: ") != std::string::npos);
        require(line.find('\n') == std::string::npos);
    });
    const auto instances = manifests.instancesOf(kInterface);
    const bool isFaulty = complaints > 0;
    require(!isFaulty || instances.empty());
    for (const std::string& instance : instances) {
        const std::string name = std::string(kInterface) + "/" + instance;
        require(manifests.isDeclared(name));
        manifests.updatableViaApex(name);
    }
    return 0;
}

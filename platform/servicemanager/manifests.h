// SPDX-License-Identifier: Apache-2.0
//
// The VINTF manifests: which AIDL services the parts of the system image promise to offer.
#pragma once

#include <filesystem>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace servicemanager {

// Answers from the manifest files below a root directory:
//
//     device      vendor/etc/vintf/manifest.xml, vendor/etc/vintf/manifest/*.xml, then odm/...
//     framework   system/etc/vintf/..., product/..., system_ext/...
//
// The files are read anew for every question, so a test may put one there at any time. A file that
// is not a manifest is reported in one line and passed over; the others still count.
class Manifests {
  public:
    using Log = std::function<void(const std::string& line)>;

    // `root` is "/" on a phone. `log` takes one line, without its newline, per faulty file.
    Manifests(std::filesystem::path root, Log log);

    // True when a manifest lists the service `package.IFoo/instance`, in any version.
    bool isDeclared(const std::string& serviceName) const;

    // The instances of `package.IFoo` that are listed: the device's in byte order, then the
    // framework's.
    std::vector<std::string> instancesOf(const std::string& interface) const;

    // The APEX that may update the service `package.IFoo/instance`, when its entry names one.
    std::optional<std::string> updatableViaApex(const std::string& serviceName) const;

  private:
    std::filesystem::path mRoot;
    Log mLog;
};

}  // namespace servicemanager

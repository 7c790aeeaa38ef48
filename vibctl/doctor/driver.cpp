// SPDX-License-Identifier: Apache-2.0
//
// Device class and nodes: see driver.h.
#include "vibctl/doctor/driver.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <optional>

#include <android-base/strings.h>
#include <fmt/format.h>

#include "vibctl/doctor/nodes.h"

namespace vibctl {

namespace {

void add(std::vector<Access>& accesses, const std::string& directory, std::span<const Node> nodes) {
    for (const Node& node : nodes) accesses.push_back({directory + node.name, node.flags});
}

bool isDenied(int error) {
    return error == EACCES || error == EPERM;
}

class DriverCheck {
  public:
    DriverCheck(const FileView& view, const User& user) : mView(view), mUser(user) {}

    Driver run() {
        mDriver.findings.push_back(checkClass());
        checkNodes();
        return mDriver;
    }

  private:
    Finding checkClass();
    Finding checkLeds(bool& chosen) const;
    Finding checkMotor();
    void checkNodes();
    Finding unopenable(const char* check, const std::string& path, int error) const;

    const FileView& mView;
    const User& mUser;
    Driver mDriver;
    std::string mEventNode;  // of the motor; empty when it is not used
};

// A node that is there and does not open: what the driver has is hidden from the service.
Finding DriverCheck::unopenable(const char* check, const std::string& path, int error) const {
    if (isDenied(error)) {
        return bad(check,
                   fmt::format("user {} cannot open {} ({})", mUser.uid, shortName(path),
                               mView.describe(path)),
                   fmt::format("chown it to {}", mUser.uid));
    }
    if (error == ENODEV || error == ENXIO) {
        return bad(check, fmt::format("{} has no device: the motor is unplugged", shortName(path)),
                   "see the kernel log");
    }
    return bad(check, fmt::format("{}: {}", shortName(path), std::strerror(error)),
               "see the kernel log");
}

// The LED class needs all three of its nodes. Good when the driver has no LED node at all.
Finding DriverCheck::checkLeds(bool& chosen) const {
    constexpr const char* kCheck = "device class";
    std::vector<Access> leds;
    add(leds, kLedsDirectory, kLedsClass);
    const std::vector<int> errors = mView.open(mUser, leds);
    std::vector<std::string> missing;
    for (size_t i = 0; i < errors.size(); ++i) {
        if (errors[i] == ENOENT) missing.emplace_back(kLedsClass[i].name);
    }
    chosen = errors == std::vector<int>{0, 0, 0};
    if (chosen) return good(kCheck, fmt::format("LED class, {}", kLedsDirectory));
    if (missing.size() == errors.size() && mView.list(kLedsDirectory).empty()) {
        return good(kCheck, "");
    }
    if (!missing.empty()) {
        constexpr const char* kPresent[] = {"two of three LED nodes are there; ",
                                            "one of three LED nodes is there; ", "for LEDs "};
        return bad(kCheck,
                   fmt::format("{}the driver lacks {}", kPresent[missing.size() - 1],
                               fmt::join(missing, ", ")),
                   "add it");
    }
    const auto first = std::find_if(errors.begin(), errors.end(), [](int e) { return e != 0; });
    return unopenable(kCheck, leds[static_cast<size_t>(first - errors.begin())].path, *first);
}

// Looks for the motor among the input devices.
Finding DriverCheck::checkMotor() {
    constexpr const char* kCheck = "device class";
    const std::optional<std::string> list = mView.read(kInputDeviceList);
    if (!list) {
        return bad(kCheck, fmt::format("no node, and no {}", kInputDeviceList),
                   "enable CONFIG_INPUT");
    }
    const std::vector<InputDevice> devices = parseInputDevices(*list);
    const auto motor = std::find_if(devices.begin(), devices.end(),
                                    [](const InputDevice& one) { return one.name == kMotorName; });
    if (motor != devices.end()) {
        mDriver.deviceClass = DeviceClass::kForceFeedback;
        mDriver.directory = kForceFeedbackDirectory;
        mEventNode = "/dev/input/" + motor->handlers;
        if (motor->handlers.empty() || motor->handlers.find(' ') != std::string::npos) {
            return bad(
                    kCheck,
                    fmt::format("the motor's handlers are \"{}\", not one event", motor->handlers),
                    "report EV_FF only");
        }
        return good(kCheck, fmt::format("force feedback, {}", mEventNode));
    }
    for (const InputDevice& device : devices) {
        if (device.name.find("vib") == std::string::npos) continue;
        return bad(kCheck, fmt::format("the motor is called \"{}\"", device.name),
                   fmt::format("call it {}", kMotorName));
    }
    if (!mView.list(kForceFeedbackDirectory).empty()) {
        return bad(kCheck, "control nodes, but no motor in the input list: it is unplugged",
                   "plug it in");
    }
    if (!mView.list(kLegacyDirectory).empty()) {
        return bad(kCheck, "timed_output nodes are there; the driver lacks enable", "add it");
    }
    return bad(kCheck, "no timed_output or leds node, no motor in the input list",
               "load the driver");
}

Finding DriverCheck::checkClass() {
    const std::vector<Access> enable = {{std::string(kLegacyDirectory) + "enable", O_RDWR}};
    const int legacyError = mView.open(mUser, enable)[0];
    if (legacyError == 0) {
        mDriver.deviceClass = DeviceClass::kLegacy;
        mDriver.directory = kLegacyDirectory;
        return good("device class", fmt::format("legacy class, {}", kLegacyDirectory));
    }
    bool isLeds = false;
    Finding leds = checkLeds(isLeds);
    if (isLeds) {
        mDriver.deviceClass = DeviceClass::kLeds;
        mDriver.directory = kLedsDirectory;
    }
    // What hides a class explains more than that there is no other.
    if (legacyError != ENOENT) return unopenable("device class", enable[0].path, legacyError);
    if (isLeds) return leds;
    const Finding motor = checkMotor();
    return motor.answer == Answer::kGood || leds.answer == Answer::kGood ? motor : leds;
}

void DriverCheck::checkNodes() {
    constexpr const char* kCheck = "nodes";
    std::vector<Access> accesses;
    switch (mDriver.deviceClass) {
        case DeviceClass::kNone:
            mDriver.findings.push_back(skipped(kCheck, "without a device class none is needed"));
            return;
        case DeviceClass::kLegacy:
            add(accesses, kLegacyDirectory, kLegacyClass);
            accesses.push_back({std::string(kLegacyDirectory) + "use_kyp_index", O_WRONLY});
            add(accesses, kLegacyDirectory, kFeatureNodes);
            break;
        case DeviceClass::kLeds:
            add(accesses, kLedsDirectory, kLedsClass);
            add(accesses, kLedsDirectory, kFeatureNodes);
            break;
        case DeviceClass::kForceFeedback:
            accesses.push_back({mEventNode, O_RDWR});
            add(accesses, "", kForceFeedbackNodes);
            break;
    }
    add(accesses, kInfoDirectory, kInfoNodes);

    const std::vector<int> errors = mView.open(mUser, accesses);
    const size_t before = mDriver.findings.size();
    size_t present = 0;
    for (size_t i = 0; i < accesses.size(); ++i) {
        const std::string& path = accesses[i].path;
        if (errors[i] == 0) mDriver.open.insert(path);
        // What a driver does not have is its own choice, but for the motor that it has announced.
        if (errors[i] == ENOENT && path != mEventNode) continue;
        ++present;
        if (errors[i] != 0) mDriver.findings.push_back(unopenable(kCheck, path, errors[i]));
    }
    if (mDriver.findings.size() > before) return;
    mDriver.findings.push_back(
            good(kCheck, fmt::format("user {} can open all {} that the driver has, of {} known{}",
                                     mUser.uid, present, accesses.size(),
                                     FileView::canBecome(mUser) ? "" : ", going by mode bits")));
}

}  // namespace

Driver checkDriver(const FileView& view, const User& user) {
    return DriverCheck(view, user).run();
}

std::vector<InputDevice> parseInputDevices(const std::string& text) {
    constexpr std::string_view kName = "N: Name=\"";
    constexpr std::string_view kHandlers = "H: Handlers=";
    std::vector<InputDevice> devices(1);
    for (std::string& line : android::base::Split(text, "\n")) {
        if (line.empty()) devices.emplace_back();
        if (line.starts_with(kName)) {
            if (line.ends_with('"')) line.pop_back();
            devices.back().name = line.substr(std::min(kName.size(), line.size()));
        } else if (line.starts_with(kHandlers)) {
            devices.back().handlers = android::base::Trim(line.substr(kHandlers.size()));
        }
    }
    std::erase_if(devices, [](const InputDevice& device) { return device.name.empty(); });
    return devices;
}

}  // namespace vibctl

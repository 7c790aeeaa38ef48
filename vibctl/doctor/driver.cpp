// SPDX-License-Identifier: Apache-2.0
//
// The vibrator driver from outside: see driver.h.
#include "doctor/driver.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <optional>
#include <string_view>

#include <fmt/format.h>
#include <fmt/ranges.h>

namespace vibctl {

namespace {

constexpr const char* kLegacyFolder = "/sys/class/timed_output/vibrator/";
constexpr const char* kLedsFolder = "/sys/class/leds/vibrator/";
constexpr const char* kInputDeviceList = "/proc/bus/input/devices";
constexpr const char* kMotorName = "qvx_vibrator_inputff";

struct Node {
    const char* name;
    int flags;
};

constexpr Node kLegacyClass[] = {{"enable", O_RDWR}};
constexpr Node kLedsClass[] = {{"activate", O_RDWR}, {"duration", O_RDWR}, {"state", O_RDWR}};

/// Which of these a driver has is its own choice; each that it has, the service must be able to
/// open. motor_type is only read, but the service opens it for writing as well.
constexpr Node kFeatures[] = {
        {"intensity", O_RDWR},
        {"force_touch_intensity", O_RDWR},
        {"multi_freq", O_RDWR},
        {"haptic_engine", O_RDWR},
        {"cp_trigger_index", O_RDWR},
        {"cp_trigger_queue", O_RDWR},
        {"num_waves", O_RDONLY},
        {"motor_type", O_RDWR},
        {"event_cmd", O_RDWR},
        {"intensities", O_RDONLY},
        {"haptic_intensities", O_RDONLY},
        {"asp_enable", O_RDWR},
        {"gpio1_fall_index", O_RDWR},
        {"gpio1_fall_dig_scale", O_RDWR},
        {"gpio1_rise_index", O_RDWR},
        {"gpio1_rise_dig_scale", O_RDWR},
        {"vibe_state", O_RDONLY},
        {"fifo", O_RDWR},
        {"hybrid_haptic_engine", O_RDWR},
};

constexpr Node kForceFeedbackNodes[] = {
        {"/sys/class/qvx_vib_inputff/control/use_kyp_index", O_WRONLY},
        {"/sys/class/qvx_vib_inputff/control/event_cmd", O_RDWR},
        {"/sys/class/qvx_vib_inputff/control/f0_stored", O_WRONLY},
        {"/efs/FactoryApp/vibrator_calibration", O_RDONLY},
};

constexpr Node kInformation[] = {
        {"/sys/class/vib_info_class/vib_support_info/functions", O_RDONLY},
        {"/sys/class/vib_info_class/vib_support_info/intensities", O_RDONLY},
        {"/sys/class/vib_info_class/vib_support_info/haptic_intensities", O_RDONLY},
};

void add(std::vector<Access>& accesses, const std::string& folder, std::span<const Node> nodes) {
    for (const Node& node : nodes) accesses.push_back({folder + node.name, node.flags});
}

const char* modeOf(int flags) {
    return flags == O_RDWR ? "read-write" : (flags == O_WRONLY ? "for writing" : "for reading");
}

/// "vibrator/intensity": the two last pieces tell every node from the others.
std::string shortName(const std::string& path) {
    const size_t last = path.rfind('/');
    return path.substr(path.rfind('/', last - 1) + 1);
}

/// The first node of a class that does not open; nothing when the class is there.
struct Obstacle {
    std::string path;
    int error = 0;

    std::string text() const { return fmt::format("{}: {}", path, std::strerror(error)); }
};

std::optional<Obstacle> obstacleIn(const FileView& view, const User& user,
                                   const std::vector<Access>& accesses) {
    const std::vector<int> errors = view.open(user, accesses);
    for (size_t i = 0; i < errors.size(); ++i) {
        if (errors[i] != 0) return Obstacle{accesses[i].path, errors[i]};
    }
    return std::nullopt;
}

enum class DeviceClass { kNone, kLegacy, kLeds, kForceFeedback };

class DriverCheck {
  public:
    DriverCheck(const FileView& view, const User& user) : mView(view), mUser(user) {}

    std::vector<Finding> run() {
        std::vector<Finding> findings = {checkClass()};
        for (Finding& finding : checkNodes()) findings.push_back(std::move(finding));
        findings.push_back(checkInputDevice());
        return findings;
    }

  private:
    Finding checkClass();
    std::vector<Finding> checkNodes() const;
    Finding checkNode(const Access& access, int error) const;
    Finding checkInputDevice() const;
    Finding unopenable(const std::string& check, const std::string& text,
                       const Obstacle& obstacle) const;
    std::string eventNode() const { return "/dev/input/" + mMotor->handlers; }

    const FileView& mView;
    const User& mUser;
    DeviceClass mClass = DeviceClass::kNone;
    std::string mListProblem;  ///< why the input-device list cannot be read; empty when it can
    std::vector<InputDevice> mInputDevices;
    std::optional<InputDevice> mMotor;
};

/// A node that is there and does not open: what the driver has is hidden from the service.
Finding DriverCheck::unopenable(const std::string& check, const std::string& text,
                                const Obstacle& obstacle) const {
    if (obstacle.error == EACCES || obstacle.error == EPERM) {
        return bad(check, text,
                   fmt::format("let user {} open {} (ueventd.rc or a udev rule), then restart the "
                               "service",
                               mUser.uid, obstacle.path));
    }
    return bad(check, text, "look into the kernel log for what the driver says");
}

Finding DriverCheck::checkClass() {
    constexpr const char* kCheck = "device class";
    std::vector<Access> legacy;
    std::vector<Access> leds;
    add(legacy, kLegacyFolder, kLegacyClass);
    add(leds, kLedsFolder, kLedsClass);
    const std::optional<Obstacle> noLegacy = obstacleIn(mView, mUser, legacy);
    if (!noLegacy) {
        mClass = DeviceClass::kLegacy;
        return good(kCheck, fmt::format("legacy class, {} opens; LED class and force feedback are "
                                        "not looked for after it",
                                        legacy[0].path));
    }
    const std::optional<Obstacle> noLeds = obstacleIn(mView, mUser, leds);
    const std::string notLegacy = "not legacy class, " + noLegacy->text();
    if (!noLeds) {
        mClass = DeviceClass::kLeds;
        const std::string text = fmt::format(
                "LED class, activate, duration and state in {} open; "
                "{}; force feedback is not looked for after it",
                kLedsFolder, notLegacy);
        if (noLegacy->error != ENOENT) return unopenable(kCheck, text, *noLegacy);
        return good(kCheck, text);
    }
    const std::string notSysfs = fmt::format("{}; not LED class, {}", notLegacy, noLeds->text());
    const std::vector<Access> list = {{kInputDeviceList, O_RDONLY}};
    const std::optional<Obstacle> noList = obstacleIn(mView, mUser, list);
    if (noList) mListProblem = noList->text();
    mInputDevices = parseInputDevices(mView.read(kInputDeviceList).value_or(""));
    const auto motor = std::find_if(mInputDevices.begin(), mInputDevices.end(),
                                    [](const auto& device) { return device.name == kMotorName; });
    if (!noList && motor != mInputDevices.end()) {
        mMotor = *motor;
        mClass = DeviceClass::kForceFeedback;
    }
    const std::string text =
            mMotor ? fmt::format("force feedback, {} lists \"{}\"; {}", kInputDeviceList,
                                 kMotorName, notSysfs)
                   : fmt::format("none; {}; not force feedback, see input device", notSysfs);
    for (const auto& obstacle : {noLegacy, noLeds}) {
        if (obstacle->error != ENOENT) return unopenable(kCheck, text, *obstacle);
    }
    if (mMotor) return good(kCheck, text);
    return bad(kCheck, text,
               "load the vibrator's driver; docs/bring-up.md tells which nodes decide");
}

Finding DriverCheck::checkNode(const Access& access, int error) const {
    std::string owner = mView.describe(access.path);
    if (!owner.empty()) owner = " (" + owner + ")";
    return unopenable("nodes",
                      fmt::format("user {} cannot open {} {}: {}{}", mUser.uid, access.path,
                                  modeOf(access.flags), std::strerror(error), owner),
                      {access.path, error});
}

std::vector<Finding> DriverCheck::checkNodes() const {
    std::vector<Access> accesses;
    switch (mClass) {
        case DeviceClass::kNone:
            return {skipped("nodes", "without a device class none is needed")};
        case DeviceClass::kLegacy:
            add(accesses, kLegacyFolder, kLegacyClass);
            accesses.push_back({std::string(kLegacyFolder) + "use_kyp_index", O_WRONLY});
            add(accesses, kLegacyFolder, kFeatures);
            break;
        case DeviceClass::kLeds:
            add(accesses, kLedsFolder, kLedsClass);
            add(accesses, kLedsFolder, kFeatures);
            break;
        case DeviceClass::kForceFeedback:
            accesses.push_back({eventNode(), O_RDWR});
            add(accesses, "", kForceFeedbackNodes);
            break;
    }
    add(accesses, "", kInformation);

    const std::vector<int> errors = mView.open(mUser, accesses);
    std::vector<Finding> findings;
    std::vector<std::string> absent;
    for (size_t i = 0; i < accesses.size(); ++i) {
        const bool isMotor = mMotor && i == 0;
        if (errors[i] == ENOENT && !isMotor) {
            absent.push_back(shortName(accesses[i].path));
        } else if (errors[i] != 0) {
            findings.push_back(checkNode(accesses[i], errors[i]));
        }
    }
    if (!findings.empty()) return findings;
    std::string text = fmt::format("user {} can open all {} that the driver has", mUser.uid,
                                   accesses.size() - absent.size());
    if (!FileView::canBecome(mUser)) text += ", going by mode bits";
    if (!absent.empty()) text += fmt::format("; it lacks {}", fmt::join(absent, ", "));
    return {good("nodes", text)};
}

Finding DriverCheck::checkInputDevice() const {
    constexpr const char* kCheck = "input device";
    constexpr const char* kNext = "give the driver's input device that name";
    if (mClass == DeviceClass::kLegacy || mClass == DeviceClass::kLeds) {
        return good(kCheck, "not needed by this device class");
    }
    if (!mListProblem.empty()) {
        return bad(kCheck, mListProblem, "the kernel needs CONFIG_INPUT; mount /proc");
    }
    if (!mMotor) {
        std::vector<std::string> names;
        for (const InputDevice& device : mInputDevices) {
            names.push_back(fmt::format("\"{}\"", device.name));
        }
        return bad(
                kCheck,
                fmt::format("no \"{}\" in {}, which lists {}", kMotorName, kInputDeviceList,
                            names.empty() ? "nothing" : fmt::format("{}", fmt::join(names, ", "))),
                kNext);
    }
    if (mMotor->handlers.find_first_of(" \t") != std::string::npos || mMotor->handlers.empty()) {
        return bad(kCheck,
                   fmt::format("\"{}\" has the handlers \"{}\", where one event node is expected",
                               kMotorName, mMotor->handlers),
                   "let the driver report force feedback and nothing else, so that only the event "
                   "handler attaches");
    }
    return good(kCheck, fmt::format("\"{}\" is {}", kMotorName, eventNode()));
}

}  // namespace

std::vector<Finding> checkDriver(const FileView& view, const User& user) {
    return DriverCheck(view, user).run();
}

std::vector<InputDevice> parseInputDevices(const std::string& text) {
    constexpr std::string_view kName = "N: Name=\"";
    constexpr std::string_view kHandlers = "H: Handlers=";
    std::vector<InputDevice> devices;
    InputDevice device;
    const auto finish = [&] {
        if (!device.name.empty()) devices.push_back(device);
        device = {};
    };
    for (size_t at = 0; at < text.size();) {
        const size_t end = std::min(text.find('\n', at), text.size());
        std::string line = text.substr(at, end - at);
        at = end + 1;
        if (line.empty()) finish();
        if (line.starts_with(kName)) {
            device.name = line.substr(kName.size());
            if (device.name.ends_with('"')) device.name.pop_back();
        } else if (line.starts_with(kHandlers)) {
            device.handlers = line.substr(kHandlers.size());
            device.handlers.erase(device.handlers.find_last_not_of(" \t\r") + 1);
        }
    }
    finish();
    return devices;
}

}  // namespace vibctl

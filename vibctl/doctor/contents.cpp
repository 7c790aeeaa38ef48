// SPDX-License-Identifier: Apache-2.0
//
// What the driver's nodes say: see contents.h.
#include "vibctl/doctor/contents.h"

#include <algorithm>
#include <string_view>
#include <utility>

#include <android-base/parseint.h>
#include <android-base/strings.h>
#include <fmt/format.h>

#include "vibctl/doctor/nodes.h"
#include "vibctl/near_words.h"

namespace vibctl {

namespace {

constexpr std::string_view kMotorTypes[] = {
        "NONE",          "COINDC",       "LINEAR",          "COINDC_PMIC", "COINDC_INDEX",
        "LINEAR_INDEX",  "LINEAR_1040",  "LINEAR_0832RC",   "LINEAR_1030", "LINEAR_RCVMOT",
        "LINEAR_ACTIVE", "LINEAR_WATCH", "LINEAR_INDEX_RC",
};

// A word of the node functions, and the node that its requests go to; null when there is none.
struct Feature {
    std::string_view word;
    const char* node;
};

constexpr Feature kFeatures[] = {
        {"INTENSITY", "intensity"},
        {"FORCE_TOUCH_INTENSITY", "force_touch_intensity"},
        {"MULTI_FREQUENCY", "multi_freq"},
        {"HAPTIC_ENGINE", "haptic_engine"},
        {"INDEX_HAPTIC_PATTERN", "cp_trigger_index"},
        {"KYPINDEX_HAPTIC_PATTERN", nullptr},
        {"ENHANCED_HAPTIC_ENGINE", nullptr},
        {"FIFO_HAPTIC_ENGINE", "fifo"},
        {"HYBRID_HAPTIC_ENGINE", "hybrid_haptic_engine"},
        {"ENHANCED_HYBRID_HAPTIC_ENGINE", nullptr},
        {"CAPABILITY_EXTERNAL_CONTROL", nullptr},
        {"COMMON_INPUTFF_INTERFACE", nullptr},
        {"PRIMITIVE_EFFECT_COMPOSE", nullptr},
};

// Of two nodes, what the first is without the second.
struct Companion {
    const char* node;
    const char* missing;
    const char* cost;
};

constexpr Companion kCompanions[] = {
        {"cp_trigger_index", "cp_trigger_queue", "no pattern is repeated or composed"},
        {"cp_trigger_index", "num_waves", "clients get no number of patterns"},
};

bool isFeature(std::string_view word) {
    return std::any_of(std::begin(kFeatures), std::end(kFeatures),
                       [word](const Feature& one) { return one.word == word; });
}

// The pieces between any of `separators`, without the empty ones.
std::vector<std::string> wordsOf(const std::string& text, const std::string& separators) {
    std::vector<std::string> words = android::base::Split(text, separators);
    std::erase(words, "");
    return words;
}

class ContentsCheck {
  public:
    ContentsCheck(const FileView& view, const Driver& driver) : mView(view), mDriver(driver) {
        mFunctions = read(std::string(kInfoDirectory) + "functions");
    }

    std::vector<Finding> run() {
        const bool isSysfs = mDriver.deviceClass != DeviceClass::kForceFeedback;
        if (isSysfs) checkMotorType();
        if (isSysfs) checkCompanions();
        checkWords();
        checkWordsAgainstNodes(isSysfs);
        checkTables();
        if (isSysfs) checkNodeNames();
        if (!isSysfs) checkCalibration();
        mFindings.push_back(good("features", features()));
        return mFindings;
    }

  private:
    bool has(const std::string& node) const {
        return mDriver.open.count(mDriver.directory + node) != 0;
    }

    bool lacks(const std::string& path) const { return mView.describe(path).empty(); }

    // What the node says; nothing when the service cannot read it either.
    std::optional<std::string> read(const std::string& path) const {
        if (mDriver.open.count(path) == 0) return std::nullopt;
        return mView.read(path);
    }

    // Words count anywhere in a line.
    bool lists(std::string_view word) const {
        return mFunctions && mFunctions->find(word) != std::string::npos;
    }

    void checkMotorType();
    void checkCompanions();
    void checkWords();
    void checkWordsAgainstNodes(bool isSysfs);
    void checkTables();
    void checkLoneTable();
    void checkNodeNames();
    void checkCalibration();
    std::string features() const;

    const FileView& mView;
    const Driver& mDriver;
    std::optional<std::string> mFunctions;
    std::vector<Finding> mFindings;
};

void ContentsCheck::checkMotorType() {
    constexpr const char* kCheck = "motor type";
    const std::string path = mDriver.directory + "motor_type";
    if (lacks(path)) {
        mFindings.push_back(note(kCheck, "without motor_type the amplitude tables are guessed",
                                 "add the node"));
    }
    const std::optional<std::string> text = read(path);
    if (!text) return;
    // The service drops the last byte, whatever it is.
    const std::string name = text->substr(0, text->empty() ? 0 : text->size() - 1);
    if (std::find(std::begin(kMotorTypes), std::end(kMotorTypes), name) != std::end(kMotorTypes)) {
        mFindings.push_back(good(kCheck, name));
    } else if (!text->ends_with('\n')) {
        mFindings.push_back(
                bad(kCheck, fmt::format("\"{}\" without a newline is read as \"{}\"", *text, name),
                    "add the newline"));
    } else {
        const std::vector<std::string> near = wordsNear(name, kMotorTypes);
        mFindings.push_back(bad(kCheck, fmt::format("\"{}\" is unknown and counts as NONE", name),
                                near.empty() ? "write a name that is known"
                                             : fmt::format("write {}", near.front())));
    }
}

void ContentsCheck::checkCompanions() {
    for (const Companion& one : kCompanions) {
        if (!has(one.node) || !lacks(mDriver.directory + one.missing)) continue;
        mFindings.push_back(
                note("nodes", fmt::format("without {} {}", one.missing, one.cost), "add it"));
    }
}

void ContentsCheck::checkWords() {
    constexpr const char* kCheck = "feature words";
    if (!mFunctions) {
        mFindings.push_back(note(kCheck, "without functions, no compositions, no external control",
                                 "add the node"));
        return;
    }
    std::vector<std::string_view> known;
    for (const Feature& feature : kFeatures) known.push_back(feature.word);
    bool hidden = false;
    for (const std::string& word : wordsOf(*mFunctions, " \t\r\n,;|:")) {
        const bool found = std::any_of(known.begin(), known.end(), [&word](std::string_view one) {
            return word.find(one) != std::string::npos;
        });
        if (found) continue;
        const std::vector<std::string> near = wordsNear(word, known);
        if (near.empty()) continue;
        mFindings.push_back(bad(kCheck, fmt::format("\"{}\" is none, so off", word),
                                fmt::format("write {}", near.front())));
    }
    // One service looks for words anywhere in a line, the other compares what single spaces
    // separate.
    for (const std::string& word : wordsOf(android::base::Trim(*mFunctions), " ")) {
        const std::vector<std::string> parts = wordsOf(word, "\t\r\n,;|:");
        hidden = hidden || (parts.size() > 1 && std::any_of(parts.begin(), parts.end(), isFeature));
    }
    if (hidden) {
        mFindings.push_back(
                note(kCheck, "hasFeature needs single spaces between them", "separate them so"));
    }
}

void ContentsCheck::checkWordsAgainstNodes(bool isSysfs) {
    if (!isSysfs || !mFunctions) return;
    const std::vector<std::string> words = wordsOf(*mFunctions, " \t\r\n,;|:");
    for (const Feature& feature : kFeatures) {
        if (feature.node == nullptr) continue;
        const bool listed = std::find(words.begin(), words.end(), feature.word) != words.end();
        if (listed && !has(feature.node)) {
            mFindings.push_back(note("feature words",
                                     fmt::format("{} is listed without a node", feature.word),
                                     fmt::format("add {}", feature.node)));
        } else if (!lists(feature.word) && has(feature.node)) {
            mFindings.push_back(note(
                    "feature words",
                    fmt::format("{} is not listed, so clients miss it", feature.word), "list it"));
        }
    }
}

void ContentsCheck::checkTables() {
    // The information class's tables come before the device's, and only both together count.
    std::string directory = kInfoDirectory;
    const auto hasBoth = [&] {
        return mDriver.open.count(directory + "intensities") != 0 &&
               mDriver.open.count(directory + "haptic_intensities") != 0;
    };
    if (!hasBoth()) directory = mDriver.directory;
    if (!hasBoth()) {
        checkLoneTable();
        return;
    }
    for (const char* name : {"intensities", "haptic_intensities"}) {
        const std::string text = android::base::Trim(read(directory + name).value_or(""));
        for (const std::string& piece : android::base::Split(text, ",")) {
            int32_t number = 0;
            if (android::base::ParseInt(android::base::Trim(piece), &number)) continue;
            mFindings.push_back(bad("intensities", fmt::format("{} holds \"{}\"", name, piece),
                                    "write numbers, commas between"));
            break;
        }
    }
}

// One of the two tables, and nowhere the other beside it.
void ContentsCheck::checkLoneTable() {
    for (const std::string& directory : {std::string(kInfoDirectory), mDriver.directory}) {
        for (const auto& [name, other] : {std::pair("intensities", "haptic_intensities"),
                                          std::pair("haptic_intensities", "intensities")}) {
            if (mDriver.open.count(directory + name) == 0 || !lacks(directory + other)) continue;
            mFindings.push_back(note("intensities",
                                     fmt::format("{} does not count without {}", name, other),
                                     "add it"));
        }
    }
}

void ContentsCheck::checkNodeNames() {
    std::vector<std::string_view> known = {"enable", "use_kyp_index",  "activate",   "duration",
                                           "state",  "pattern_length", "ext_control"};
    for (const Node& node : kFeatureNodes) known.emplace_back(node.name);
    for (const std::string& name : mView.list(mDriver.directory)) {
        if (std::find(known.begin(), known.end(), name) != known.end()) continue;
        const std::vector<std::string> near = wordsNear(name, known);
        // A driver may well have both.
        if (near.empty() || has(near.front())) continue;
        mFindings.push_back(bad("node names", fmt::format("the service never opens {}", name),
                                fmt::format("call it {}", near.front())));
    }
}

void ContentsCheck::checkCalibration() {
    const std::optional<std::string> text = read("/efs/FactoryApp/vibrator_calibration");
    if (text && android::base::Trim(*text).empty()) {
        mFindings.push_back(bad("calibration", "vibrator_calibration is empty: none is used",
                                "calibrate the phone again"));
    } else if (text && !has("f0_stored")) {
        mFindings.push_back(bad("calibration", "there is no node f0_stored to write it to",
                                "add it to the driver"));
    }
}

// "amplitude, effects by pattern, compositions, external control"
std::string ContentsCheck::features() const {
    const bool isMotor = mDriver.deviceClass == DeviceClass::kForceFeedback;
    const char* const effects = isMotor || has("cp_trigger_index") ? "effects by pattern"
                                : has("haptic_engine")             ? "effects by packets"
                                : has("intensity")                 ? "effects by timed vibration"
                                                                   : "no effects";
    std::vector<std::string> all;
    if (isMotor || has("intensity")) all.emplace_back("amplitude");
    all.emplace_back(effects);
    if (lists("PRIMITIVE_EFFECT_COMPOSE")) all.emplace_back("compositions");
    if (lists("CAPABILITY_EXTERNAL_CONTROL")) all.emplace_back("external control");
    if (has("haptic_engine")) all.emplace_back("packets");
    if (has("fifo")) all.emplace_back("FIFO");
    if (has("hybrid_haptic_engine")) all.emplace_back("hybrid");
    return fmt::format("{}", fmt::join(all, ", "));
}

}  // namespace

std::vector<Finding> checkContents(const FileView& view, const Driver& driver) {
    if (driver.deviceClass == DeviceClass::kNone) return {};
    return ContentsCheck(view, driver).run();
}

}  // namespace vibctl

// SPDX-License-Identifier: Apache-2.0
//
// All that a client can ask: see info.h.
#include "vibctl/info.h"

#include <vector>

#include <aidl/android/hardware/vibrator/CompositePrimitive.h>
#include <aidl/vendor/quorvan/hardware/vibrator/ZelAmplitudeType.h>
#include <android-base/strings.h>
#include <fmt/format.h>

#include "vibctl/methods.h"

namespace vibctl {

namespace {

using aidl::android::hardware::vibrator::CompositePrimitive;
using aidl::vendor::quorvan::hardware::vibrator::ZelAmplitudeType;

// The words that a method of one argument is asked with; none for one that is not asked.
std::vector<std::string> wordsFor(const std::string& method) {
    std::vector<std::string> words;
    const auto add = [&words](const std::vector<Enumerator>& enumerators) {
        for (const Enumerator& one : enumerators) words.push_back(one.name);
    };
    if (method == "getPrimitiveDuration") add(Argument<CompositePrimitive>::enumerators());
    if (method == "getAmplitudeList") add(Argument<ZelAmplitudeType>::enumerators());
    return words;
}

// An older service lacks methods.
bool isUnknown(const Outcome& outcome) {
    return outcome.exception == EX_TRANSACTION_FAILED &&
           outcome.status == STATUS_UNKNOWN_TRANSACTION;
}

class Survey {
  public:
    explicit Survey(const Ask& ask) : mAsk(ask) {}

    Outcome run() {
        Outcome all;
        all.result = "";
        for (const char* iface : {"std", "ext"}) {
            mText += fmt::format("{}{}\n", mText.empty() ? "" : "\n", iface);
            if (!askInterface(iface)) return mLast;
            all.result += fmt::format("{}\"{}\":{{{}}}", all.result.empty() ? "" : ",", iface,
                                      fmt::join(mMembers, ","));
        }
        all.text = mText;
        all.result = "{" + all.result + "}";
        return all;
    }

  private:
    // False when a call did not get through.
    bool askInterface(const std::string& iface) {
        mMembers.clear();
        mYes.clear();
        mNo.clear();
        for (const Method& method : methodsOf(iface)) {
            const std::vector<std::string> words = wordsFor(method.name);
            if (!words.empty()) {
                if (!askForEach(iface, method, words)) return false;
            } else if (method.hasResult && *method.parameters == '\0') {
                if (!ask(iface, method, {})) return false;
                note(method.name, mLast);
            }
        }
        addLine("true", fmt::format("{}", fmt::join(mYes, " ")));
        addLine("not offered", fmt::format("{}", fmt::join(mNo, " ")));
        return true;
    }

    bool ask(const std::string& iface, const Method& method, Words words) {
        Call call;
        method.parse(method, words, call);
        mLast = mAsk(iface, call);
        return mLast.exception != EX_TRANSACTION_FAILED || isUnknown(mLast);
    }

    // One line for all answers of the method: "CLICK 20 ms, THUD 20 ms".
    bool askForEach(const std::string& iface, const Method& method,
                    const std::vector<std::string>& words) {
        std::vector<std::string> texts;
        std::vector<std::string> results;
        for (const std::string& word : words) {
            if (!ask(iface, method, {&word, 1})) return false;
            results.push_back(fmt::format("\"{}\":{}", word, mLast.result));
            if (mLast.exception == EX_NONE) texts.push_back(word + " " + mLast.text);
        }
        Outcome joined;
        joined.exception = texts.empty() ? mLast.exception : EX_NONE;
        joined.text = fmt::format("{}", fmt::join(texts, ", "));
        joined.result = fmt::format("{{{}}}", fmt::join(results, ","));
        note(method.name, joined);
        return true;
    }

    // Yes and no are most of the answers, and go into one line each.
    void note(const std::string& name, const Outcome& outcome) {
        mMembers.push_back(fmt::format("\"{}\":{}", name, outcome.result));
        if (outcome.exception == EX_UNSUPPORTED_OPERATION || isUnknown(outcome) ||
            outcome.result == "false") {
            mNo.push_back(name);
        } else if (outcome.result == "true") {
            mYes.push_back(name);
        } else {
            addLine(name,
                    outcome.exception == EX_NONE ? outcome.text : exceptionName(outcome.exception));
        }
    }

    // As many lines as it takes, of 100 columns at most where the words allow it.
    void addLine(const std::string& name, const std::string& text) {
        constexpr size_t kColumns = 100;
        std::string head = name;
        std::string line;
        for (const std::string& word : android::base::Split(text, " ")) {
            if (!line.empty() && line.size() + 1 + word.size() > kColumns) {
                mText += line + "\n";
                line.clear();
                head.clear();
            }
            line += line.empty() ? fmt::format("  {:<32} {}", head, word) : " " + word;
        }
        if (!text.empty()) mText += line + "\n";
    }

    const Ask& mAsk;
    Outcome mLast;
    std::string mText;
    std::vector<std::string> mMembers;  // of the interface's JSON object
    std::vector<std::string> mYes;
    std::vector<std::string> mNo;
};

}  // namespace

Outcome askEverything(const Ask& ask) {
    return Survey(ask).run();
}

}  // namespace vibctl

// SPDX-License-Identifier: Apache-2.0
//
// One row of a table of methods: a method of a binder interface, callable with words. What the
// words mean follows from the C++ signature of the generated interface, so a row is little more
// than the method's name and those of its parameters.
#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <span>
#include <string>
#include <tuple>
#include <type_traits>
#include <utility>
#include <vector>

#include <aidl/android/hardware/vibrator/IVibratorCallback.h>
#include <android-base/strings.h>
#include <fmt/format.h>

#include "vibctl/arguments.h"
#include "vibctl/outcome.h"

namespace vibctl {

using Callback = std::shared_ptr<aidl::android::hardware::vibrator::IVibratorCallback>;
using Words = std::span<const std::string>;

// Makes a call of a service's interface, with the callback or null, and waits for its answer. The
// service is of the interface whose method it is.
using Call = std::function<Outcome(ndk::ICInterface& service, const Callback& callback)>;

// What a row adds to the signature.
struct Traits {
    Show show = Show::kPlain;
    bool awaitsCompletion = false;  // a callback given with the call will hear onComplete()
};

inline constexpr Traits kMilliseconds{.show = Show::kMilliseconds};

// A method. Parameters stand on the command line in the order of declaration, but for a list of
// packets, which always comes last and takes all remaining words.
struct Method {
    const char* name;
    const char* parameters;  // names as the usage shows them, separated by spaces
    bool takesCallback;
    bool hasResult;
    Traits traits;

    // Parses the arguments. On success `call` makes the call with them.
    Problem (*parse)(const Method& method, Words arguments, Call& call);

    // Per parameter what it accepts, in the order of `parameters`.
    std::vector<std::string> (*accepted)();

    std::vector<std::string> parameterNames() const {
        if (*parameters == '\0') return {};
        return android::base::Split(parameters, " ");
    }
};

namespace internal {

template <typename T>
constexpr bool kIsList = false;
template <typename T>
constexpr bool kIsList<std::vector<T>> = true;

// What a parameter of type P is to a caller.
template <typename P>
struct Parameter {
    using Value = std::remove_cvref_t<std::remove_pointer_t<P>>;

    static constexpr bool kOut = std::is_pointer_v<P>;
    static constexpr bool kCallback = !kOut && std::is_same_v<Value, Callback>;
    static constexpr bool kList = !kOut && kIsList<Value>;
    static constexpr bool kSingle = !kOut && !kCallback && !kList;
};

template <auto kMember>
struct Binding;

template <typename I, typename... P, ndk::ScopedAStatus (I::*kMember)(P...)>
struct Binding<kMember> {
    using Values = std::tuple<typename Parameter<P>::Value...>;

    static constexpr size_t kSingles = (size_t{0} + ... + (Parameter<P>::kSingle ? 1 : 0));
    static constexpr bool kHasList = (false || ... || Parameter<P>::kList);
    static constexpr bool kTakesCallback = (false || ... || Parameter<P>::kCallback);
    static constexpr bool kHasResult = (false || ... || Parameter<P>::kOut);

    static Problem parse(const Method& method, Words words, Call& call) {
        if (words.size() < kSingles || (!kHasList && words.size() > kSingles)) {
            return fmt::format("takes {}{} argument{}, got {}", kHasList ? "at least " : "",
                               kSingles, kSingles == 1 ? "" : "s", words.size());
        }
        const std::vector<std::string> names = method.parameterNames();
        Values values{};
        Problem problem;
        size_t nextSingle = 0;
        [[maybe_unused]] const auto parseParameter = [&]<typename One>(std::type_identity<One>,
                                                                       auto& value) {
            if (problem) return;
            if constexpr (Parameter<One>::kSingle) {
                problem = parseOne(names[nextSingle], words[nextSingle], value);
                ++nextSingle;
            } else if constexpr (Parameter<One>::kList) {
                problem = parseList(names.back(), words.subspan(kSingles), value);
            }
        };
        std::apply([&](auto&... value) { (parseParameter(std::type_identity<P>(), value), ...); },
                   values);
        if (problem) return problem;
        call = [values, show = method.traits.show](ndk::ICInterface& service,
                                                   const Callback& callback) mutable {
            return makeCall(static_cast<I&>(service), values, callback, show);
        };
        return std::nullopt;
    }

    static std::vector<std::string> accepted() {
        std::vector<std::string> singles;
        std::vector<std::string> list;
        [[maybe_unused]] const auto add = [&]<typename One>(std::type_identity<One>) {
            using Value = typename Parameter<One>::Value;
            if constexpr (Parameter<One>::kSingle) {
                singles.push_back(Argument<Value>::accepted());
            } else if constexpr (Parameter<One>::kList) {
                list.push_back(Argument<typename Value::value_type>::accepted());
            }
        };
        (add(std::type_identity<P>()), ...);
        singles.insert(singles.end(), list.begin(), list.end());
        return singles;
    }

  private:
    template <typename T>
    static Problem parseOne(const std::string& name, const std::string& word, T& value) {
        return Argument<T>::parse(name, word, value);
    }

    // `name` is the packet's form with three dots behind it.
    template <typename T>
    static Problem parseList(const std::string& name, Words words, std::vector<T>& values) {
        const std::string form = name.substr(0, name.size() - 3);
        for (const std::string& word : words) {
            T value{};
            if (Problem problem = Argument<T>::parse(form, word, value)) return problem;
            values.push_back(std::move(value));
        }
        return std::nullopt;
    }

    // A value as the method's parameter takes it.
    template <typename One, typename Value>
    static decltype(auto) passOn(Value& value, const Callback& callback) {
        if constexpr (Parameter<One>::kOut) {
            return &value;
        } else if constexpr (Parameter<One>::kCallback) {
            return callback;
        } else {
            return static_cast<const Value&>(value);
        }
    }

    static Outcome makeCall(I& service, Values& values, const Callback& callback, Show show) {
        const Clock::time_point before = Clock::now();
        const ndk::ScopedAStatus status = std::apply(
                [&](auto&... value) { return (service.*kMember)(passOn<P>(value, callback)...); },
                values);
        const Clock::duration taken = Clock::now() - before;

        Outcome outcome = outcomeOf(status);
        using std::chrono::duration_cast, std::chrono::microseconds;
        outcome.microseconds = duration_cast<microseconds>(taken).count();
        outcome.sentMicroseconds = duration_cast<microseconds>(before.time_since_epoch()).count();
        if (!status.isOk()) return outcome;
        [[maybe_unused]] const auto report = [&]<typename One>(std::type_identity<One>,
                                                               const auto& value) {
            if constexpr (Parameter<One>::kOut) {
                outcome.result = jsonOf(value);
                outcome.text = textOf(value, show);
            }
        };
        std::apply([&](auto&... value) { (report(std::type_identity<P>(), value), ...); }, values);
        return outcome;
    }
};

}  // namespace internal

// A row: `row<&IVibrator::on>("on", "TIMEOUT_MS")`.
template <auto kMember>
constexpr Method row(const char* name, const char* parameters = "", Traits traits = {}) {
    using Binding = internal::Binding<kMember>;
    return {name,   parameters,      Binding::kTakesCallback, Binding::kHasResult,
            traits, &Binding::parse, &Binding::accepted};
}

}  // namespace vibctl

// SPDX-License-Identifier: Apache-2.0
//
// From a command line to a method with its arguments: see usage.h.
#include "usage.h"

#include <algorithm>
#include <numeric>

#include <fmt/format.h>
#include <fmt/ranges.h>

namespace vibctl {

namespace {

/// How many letters have to be inserted, left out or replaced to make one word the other; case
/// counts for nothing.
size_t editDistance(std::string_view from, std::string_view to) {
    std::vector<size_t> row(to.size() + 1);
    std::iota(row.begin(), row.end(), size_t{0});
    for (size_t i = 0; i < from.size(); ++i) {
        size_t diagonal = std::exchange(row[0], i + 1);
        for (size_t j = 0; j < to.size(); ++j) {
            const bool same = equalIgnoringCase(from.substr(i, 1), to.substr(j, 1));
            const size_t replaced = diagonal + (same ? 0 : 1);
            diagonal = row[j + 1];
            row[j + 1] = std::min({replaced, row[j] + 1, diagonal + 1});
        }
    }
    return row.back();
}

/// The names that a slip of the finger, or stopping early, may have been meant for.
template <typename Interface>
std::vector<std::string> namesNear(std::string_view word) {
    constexpr size_t kSlips = 2;
    std::vector<std::string> near;
    for (const Method<Interface>& method : methodsOf<Interface>()) {
        const std::string_view name = method.name;
        const bool begun = word.size() > kSlips && name.size() > word.size() &&
                           equalIgnoringCase(name.substr(0, word.size()), word);
        if (begun || editDistance(word, name) <= kSlips) near.emplace_back(name);
    }
    return near;
}

template <typename Interface>
std::vector<std::string> namesThat(bool Method<Interface>::*property) {
    std::vector<std::string> names;
    for (const Method<Interface>& method : methodsOf<Interface>()) {
        if (property == nullptr || method.*property) names.emplace_back(method.name);
    }
    return names;
}

/// In front of everything said about a method.
template <typename Interface>
std::string aboutMethod(const Method<Interface>& method, const std::string& what) {
    return fmt::format("{} {}: {}; usage: {}", ifaceOf<Interface>(), method.name, what,
                       usageOf(method));
}

/// The method's name and parameters, without the program's and the interface's.
template <typename Interface>
std::string synopsisOf(const Method<Interface>& method) {
    return fmt::format("{}{}{}{}", method.name, *method.parameters == '\0' ? "" : " ",
                       method.parameters, method.takesCallback ? " [--callback]" : "");
}

}  // namespace

template <typename Interface>
Problem findMethod(const CommandLine& line, const Method<Interface>*& method) {
    const auto methods = methodsOf<Interface>();
    const auto found = std::find_if(methods.begin(), methods.end(),
                                    [&](const auto& one) { return line.method == one.name; });
    if (found != methods.end()) {
        method = &*found;
        return std::nullopt;
    }
    std::vector<std::string> names = namesNear<Interface>(line.method);
    const bool anyNear = !line.method.empty() && !names.empty();
    if (!anyNear) names = namesThat<Interface>(nullptr);
    return fmt::format("{}: {}; {} {}", ifaceOf<Interface>(),
                       line.method.empty() ? "no method given"
                                           : fmt::format("unknown method {:?}", line.method),
                       anyNear ? "did you mean" : "there are", fmt::join(names, ", "));
}

template <typename Interface>
Problem prepareCall(const CommandLine& line, const Method<Interface>& method,
                    typename Method<Interface>::Call& call) {
    if (line.callback && !method.takesCallback) {
        return aboutMethod(
                method, fmt::format("takes no --callback, unlike {}",
                                    fmt::join(namesThat(&Method<Interface>::takesCallback), ", ")));
    }
    Problem problem = method.parse(method, line.arguments, call);
    if (problem) return aboutMethod(method, *problem);
    return std::nullopt;
}

template <typename Interface>
std::string usageOf(const Method<Interface>& method) {
    return fmt::format("vibctl {} {}", ifaceOf<Interface>(), synopsisOf(method));
}

template <typename Interface>
std::string helpOf(const Method<Interface>& method) {
    std::string text = usageOf(method) + "\n";
    const std::vector<std::string_view> names = internal::splitAtBlanks(method.parameters);
    const std::vector<std::string> accepted = method.accepted();
    for (size_t i = 0; i < names.size(); ++i) {
        text += fmt::format("  {}: {}\n", names[i], accepted[i]);
    }
    return text;
}

template <typename Interface>
std::string helpOfInterface() {
    std::string text =
            fmt::format("vibctl {} METHOD [ARG...], with METHOD one of\n", ifaceOf<Interface>());
    for (const Method<Interface>& method : methodsOf<Interface>()) {
        text += fmt::format("  {}\n", synopsisOf(method));
    }
    return text + fmt::format("vibctl {} METHOD --help says what the arguments of one accept.\n",
                              ifaceOf<Interface>());
}

std::string programHelp() {
    return "usage: vibctl [--json] [--wait SECONDS] std METHOD [ARG...] [--callback]\n"
           "       vibctl [--json] ext METHOD [ARG...] [--callback]\n"
           "       vibctl [--json] list\n"
           "       vibctl [--json] doctor\n"
           "\n"
           "Calls the vibrator service over binder: std is IVibrator, ext the maker's "
           "IZelVibrator\n"
           "that is attached to it. list shows the services registered; doctor asks what keeps a "
           "phone\n"
           "from vibrating, from binder to the driver's nodes, and says what to do next.\n"
           "\n"
           "  --json          print one JSON object: iface, method, exception, status, message,\n"
           "                  result, callback, us; doctor prints one for each check: check, "
           "ok,\n"
           "                  text, next\n"
           "  --callback      pass a callback; compose and composePwle then wait for completion\n"
           "  --wait SECONDS  how long to wait for it (default 5)\n"
           "  --help          this text; after std or ext its methods, after a method its "
           "arguments\n"
           "  --version       the version of this program\n"
           "\n"
           "Options may stand anywhere; a word -- ends them. An enumerator is written by its name "
           "in\n"
           "any case, or by any number. The fields of a packet are joined by commas, packets are\n"
           "separate words and come last: vibctl ext performHapticEngine 10000 7,10000,2050,0\n"
           "\n"
           "Exit status: 0 ok, 1 the call returned an exception or the doctor found something "
           "bad,\n"
           "2 wrong usage, 3 no service or a transport failure.\n";
}

std::string unknownCommand(const std::string& word) {
    return fmt::format(
            "{}; there are std, ext, list, doctor and help",
            word.empty() ? "no command given" : fmt::format("unknown command {:?}", word));
}

template Problem findMethod(const CommandLine&, const Method<IVibrator>*&);
template Problem findMethod(const CommandLine&, const Method<IZelVibrator>*&);
template Problem prepareCall(const CommandLine&, const Method<IVibrator>&,
                             Method<IVibrator>::Call&);
template Problem prepareCall(const CommandLine&, const Method<IZelVibrator>&,
                             Method<IZelVibrator>::Call&);
template std::string usageOf(const Method<IVibrator>&);
template std::string usageOf(const Method<IZelVibrator>&);
template std::string helpOf(const Method<IVibrator>&);
template std::string helpOf(const Method<IZelVibrator>&);
template std::string helpOfInterface<IVibrator>();
template std::string helpOfInterface<IZelVibrator>();

}  // namespace vibctl

// SPDX-License-Identifier: Apache-2.0
//
// The help texts: see usage.h.
#include "vibctl/usage.h"

#include <fmt/format.h>

#include "vibctl/find_method.h"

namespace vibctl {

namespace {

constexpr const char* kHelp =
        R"(usage: vibctl [--json] [--timeout SECONDS] COMMAND [OPTION...] [WORD...]

Calls the vibrator service over binder.

  std METHOD [ARG...]     call a method of IVibrator
  ext METHOD [ARG...]     call a method of the vendor's IZelVibrator, attached to it
  info                    all that a client can ask, on one screen
  dump [std|ext]          what the service tells about itself
  raw std|ext CODE [HEX]  a transaction by its number, with these bytes behind its header
  play STEP...            vibrate for steps of milliseconds, the first a pause
  play FILE               the same for an AHAP file or a sequence of calls, - for standard input
  session                 calls that standard input names, ["std","on","500"] a line, each
                          answered with one JSON object
  list                    the services registered
  doctor                  what keeps the phone from vibrating, and what to do next
  help [std|ext [METHOD]] this text; the methods; what the arguments of one accept

  --json                  print one JSON object: iface, method, exception, status, message,
                          result, callback, us, name (the exception's) and text; doctor prints
                          one for each check: check, ok, text, next
  --timeout SECONDS       how long to wait for the answer of a call (default 5)
  --callback              pass a callback; compose and composePwle then wait for completion
  --wait SECONDS          how long to wait for it (default 5)
  --off-on-interrupt      turn the motor off when interrupted (Ctrl-C) during the call
  --amplitudes A,...      of play's steps, each from 0 to 1; a step vibrates where it is above 0
  --repeat COUNT          how often to play the steps
  --explain               say what became of each event of a file
  --help                  as the command help
  --version               the version of this program

Options may stand anywhere; a word -- ends them. An enumerator is written by its name in any
case, or by any number. The fields of a packet are joined by commas, packets are separate words
and come last: vibctl ext performHapticEngine 10000 7,10000,2050,0

Exit status: 0 ok, 1 the call returned an exception or the doctor found something bad, 2 wrong
usage, 3 no service, a transport failure or no answer in time, 4 the awaited callback did not
come.
)";

}  // namespace

std::string helpOf(const std::string& iface, const Method& method) {
    std::string text = usageOf(iface, method) + "\n";
    const std::vector<std::string> names = method.parameterNames();
    const std::vector<std::string> accepted = method.accepted();
    for (size_t i = 0; i < names.size(); ++i) {
        text += fmt::format("  {}: {}\n", names[i], accepted[i]);
    }
    return text;
}

std::string helpOfInterface(const std::string& iface) {
    const std::string prefix = fmt::format("vibctl {} ", iface);
    std::string text = prefix + "METHOD [ARG...], with METHOD one of\n";
    for (const Method& method : methodsOf(iface)) {
        text += fmt::format("  {}\n", usageOf(iface, method).substr(prefix.size()));
    }
    return text + fmt::format("{}METHOD --help says what the arguments of one accept.\n", prefix);
}

std::string programHelp() {
    return kHelp;
}

std::string unknownCommand(const std::string& word) {
    return fmt::format(
            "{}; there are std, ext, info, dump, raw, play, session, list, doctor and help",
            word.empty() ? "no command given" : "unknown command " + inQuotes(word));
}

}  // namespace vibctl

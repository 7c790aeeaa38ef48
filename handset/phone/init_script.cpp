// SPDX-License-Identifier: Apache-2.0
//
// What the service's init script says.
#include "handset/phone/init_script.h"

#include <vector>

#include <android-base/file.h>
#include <android-base/parseint.h>
#include <android-base/strings.h>
#include <fmt/format.h>

namespace handset {

using android::base::ErrnoError;
using android::base::Error;
using android::base::Result;

Result<InitScript> parseInitScript(const std::string& text) {
    InitScript script;
    for (const std::string& line : android::base::Split(text, "\n")) {
        const std::vector<std::string> words = android::base::Split(android::base::Trim(line), " ");
        const std::string value = words.size() > 1 ? words[1] : "";
        int seconds = 0;
        if (words[0] == "service") {
            script.name = value;
        } else if (words[0] == "class") {
            script.serviceClass = value;
        } else if (words[0] == "oneshot") {
            script.oneshot = true;
        } else if (words[0] == "restart_period") {
            if (!android::base::ParseInt(value, &seconds, 1)) {
                return Error() << "restart_period: seconds from 1 on expected, not \"" << value
                               << "\"";
            }
            script.period = std::chrono::seconds(seconds);
        }
    }
    if (script.name.empty()) return Error() << "no service in the init script";
    return script;
}

Result<InitScript> readInitScript(const std::string& path) {
    std::string text;
    if (!android::base::ReadFileToString(path, &text)) return ErrnoError() << path;
    return parseInitScript(text);
}

}  // namespace handset

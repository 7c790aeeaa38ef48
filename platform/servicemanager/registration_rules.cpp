// SPDX-License-Identifier: Apache-2.0
//
// Which user may register which service: see registration_rules.h.
#include "platform/servicemanager/registration_rules.h"

#include <pwd.h>

#include <optional>
#include <vector>

#include <android-base/file.h>
#include <android-base/parseint.h>
#include <android-base/strings.h>

#include "platform/servicemanager/caller.h"
#include "platform/servicemanager/service_name.h"

namespace servicemanager {

namespace {

using android::base::Error;
using android::base::Result;

std::optional<uid_t> findUser(const std::string& user) {
    uid_t number = 0;
    if (android::base::ParseUint(user, &number)) return number;
    const passwd* const entry = getpwnam(user.c_str());
    return entry == nullptr ? std::nullopt : std::optional(entry->pw_uid);
}

// A line without its comment; nothing is wrong with an empty one.
Result<void> readRule(const std::string& line, RegistrationRules& rules) {
    std::vector<std::string> words = android::base::Split(line, " \t\r");
    std::erase(words, "");
    if (words.empty()) return {};
    if (words.size() != 2) return Error() << "a rule is NAME USER, two words";
    if (!isValidServiceName(words[0])) {
        return Error() << "\"" << words[0] << "\" is no service's name: " << kServiceNameForm;
    }
    const std::optional<uid_t> user = findUser(words[1]);
    if (!user) return Error() << "no user \"" << words[1] << "\": a user's name or number";
    if (isApp(*user)) {
        return Error() << "user " << *user << " is an app, which may not register: numbers below "
                       << kFirstApp;
    }
    rules.allow(words[0], *user);
    return {};
}

}  // namespace

Result<RegistrationRules> RegistrationRules::load(const std::filesystem::path& file) {
    std::string content;
    if (!android::base::ReadFileToString(file.string(), &content)) {
        return android::base::ErrnoError() << file.string();
    }
    RegistrationRules rules;
    int number = 0;
    for (const std::string& line : android::base::Split(content, "\n")) {
        ++number;
        if (const auto read = readRule(line.substr(0, line.find('#')), rules); !read.ok()) {
            return Error() << file.string() << ": line " << number << ": " << read.error();
        }
    }
    return rules;
}

void RegistrationRules::allow(std::string name, uid_t user) {
    mAllowed.emplace(std::move(name), user);
}

bool RegistrationRules::mayRegister(uid_t user, const std::string& name) const {
    return user == 0 || mAllowed.count({name, user}) != 0;
}

}  // namespace servicemanager

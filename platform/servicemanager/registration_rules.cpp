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

}  // namespace

// A line without its comment; nothing is wrong with an empty one.
Result<void> RegistrationRules::readLine(const std::string& line) {
    std::vector<std::string> words = android::base::Split(line, " \t\r");
    std::erase(words, "");
    if (words.empty()) return {};
    if (words.size() < 2) return Error() << "a rule is NAME USER [PROGRAM ARGUMENT...]";
    if (!isValidServiceName(words[0])) {
        return Error() << "\"" << words[0] << "\" is no service's name: " << kServiceNameForm;
    }
    const std::optional<uid_t> user = findUser(words[1]);
    if (!user) return Error() << "no user \"" << words[1] << "\": a user's name or number";
    if (isApp(*user)) {
        return Error() << "user " << *user << " is an app, which may not register: numbers below "
                       << kFirstApp;
    }
    allow(words[0], *user);
    if (words.size() == 2) return {};
    if (words[2][0] != '/') {
        return Error() << "\"" << words[2] << "\" is no program: a path from / on";
    }
    if (!mCommands.try_emplace(words[0], StartCommand{*user, {words.begin() + 2, words.end()}})
                 .second) {
        return Error() << "\"" << words[0] << "\" has a program already: one for each name";
    }
    return {};
}

Result<RegistrationRules> RegistrationRules::load(const std::filesystem::path& file) {
    std::string content;
    if (!android::base::ReadFileToString(file.string(), &content)) {
        return android::base::ErrnoError() << file.string();
    }
    RegistrationRules rules;
    int number = 0;
    for (const std::string& line : android::base::Split(content, "\n")) {
        ++number;
        if (const auto read = rules.readLine(line.substr(0, line.find('#'))); !read.ok()) {
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

const StartCommand* RegistrationRules::commandFor(const std::string& name) const {
    const auto found = mCommands.find(name);
    return found == mCommands.end() ? nullptr : &found->second;
}

}  // namespace servicemanager

// SPDX-License-Identifier: Apache-2.0
//
// The phone tool's commands that print what happened.
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <functional>

#include <android-base/file.h>
#include <fmt/format.h>

#include "handset/common/control_client.h"
#include "handset/phone/commands.h"
#include "handset/phone/listing.h"
#include "handset/phone/phone_state.h"
#include "handset/phone/phone_up.h"

namespace handset {
namespace {

// The files of the phone that is up or, with `out`, of one that was.
PhoneState filesOf(const std::string& out) {
    PhoneState state = loadState().value_or(PhoneState());
    if (state.out.empty()) state.out = kDefaultOut;
    if (!out.empty()) state.out = out;
    return state;
}

// A phone that is down has settled; one that does not answer still has its files.
void settle() {
    if (!phoneThatIsUp()) return;
    (void)askDriver(kControlSocket, "settle");
    (void)askDriver(kSupervisorSocket, "log");
}

int printFile(const std::string& path) {
    std::string text;
    if (!android::base::ReadFileToString(path, &text)) {
        return failWith(kRefused, fmt::format("{}: {}", path, strerror(errno)));
    }
    fwrite(text.data(), 1, text.size(), stdout);
    return 0;
}

// Prints what is new, over and over while the phone is up.
int follow(const std::function<std::vector<std::string>()>& newLines) {
    constexpr timespec kPause{0, 100000000};
    while (true) {
        const bool isUp = phoneThatIsUp().has_value();
        settle();
        for (const std::string& line : newLines()) fmt::print("{}\n", line);
        if (fflush(stdout) != 0 || !isUp) return 0;
        nanosleep(&kPause, nullptr);
    }
}

int printLines(const std::string& path, bool follows) {
    if (access(path.c_str(), R_OK) != 0) {
        return failWith(kRefused, fmt::format("{}: {}", path, strerror(errno)));
    }
    if (!follows) return printFile(path);
    GrowingFile file(path);
    return follow([&file] { return file.newLines(); });
}

}  // namespace

int phoneJournal(const ListingOptions& options) {
    settle();
    const PhoneState state = filesOf(options.out);
    if (!options.pretty) return printLines(state.journal(), options.follow);
    if (access(state.journal().c_str(), R_OK) != 0) {
        return failWith(kRefused, fmt::format("{}: {}", state.journal(), strerror(errno)));
    }
    Listing listing(state);
    if (options.follow) return follow([&listing] { return listing.newLines(); });
    for (const std::string& line : listing.newLines()) fmt::print("{}\n", line);
    return 0;
}

int phoneLog(const ListingOptions& options) {
    settle();
    return printLines(filesOf(options.out).serviceLog(), options.follow);
}

}  // namespace handset

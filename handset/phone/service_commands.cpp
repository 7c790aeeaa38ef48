// SPDX-License-Identifier: Apache-2.0
//
// The phone tool's commands about the service.
#include <cstdio>
#include <ctime>
#include <string_view>

#include <fmt/format.h>
#include <nlohmann/json.hpp>

#include "handset/common/control_client.h"
#include "handset/phone/commands.h"
#include "handset/phone/phone_state.h"
#include "handset/phone/phone_up.h"
#include "handset/phone/process.h"
#include "handset/phone/registration.h"
#include "handset/phone/supervisor.h"

namespace handset {
namespace {

constexpr int kSlice = 50;        // milliseconds between two looks at the service
constexpr int kSlices = 20 * 60;  // a minute: emulation takes its time

// What the phone is like now, with what the service manager says.
struct Health {
    PhoneState state;
    Registration registration = Registration::kNoAnswer;

    bool isWell() const {
        if (state.starts == 0) return state.manager != 0;
        return state.service != 0 && registration == Registration::kRegistered;
    }
};

int64_t microsecondsUntil(int64_t then) {
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return then - (int64_t{now.tv_sec} * 1000000 + now.tv_nsec / 1000);
}

std::string serviceText(const Health& health) {
    const PhoneState& state = health.state;
    if (state.starts == 0) return "no service";
    if (state.stopped) return "service stopped";
    if (state.service == 0) {
        const int64_t left = microsecondsUntil(state.restartAt);
        const std::string again =
                state.restartAt == 0
                        ? ""
                        : fmt::format("; it starts again in {:.1f} s",
                                      static_cast<double>(std::max<int64_t>(left, 0)) / 1e6);
        return serviceEndText(state) + again;
    }
    const char* what = health.registration == Registration::kRegistered ? "registered"
                       : health.registration == Registration::kUnknown  ? "not registered"
                                                                        : "not to be found";
    return fmt::format("service {}, pid {}", what, state.service);
}

std::string managerText(const Health& health) {
    if (health.state.manager == 0) return "the service manager has ended, ";
    return health.registration == Registration::kNoAnswer ? "the service manager does not answer, "
                                                          : "";
}

nlohmann::ordered_json toJson(const Health& health) {
    const PhoneState& state = health.state;
    const auto pidOf = [](pid_t pid) {
        return pid != 0 ? nlohmann::ordered_json(pid) : nlohmann::ordered_json(nullptr);
    };
    nlohmann::ordered_json json{{"up", true},
                                {"well", health.isWell()},
                                {"profile", state.profile},
                                {"out", state.out},
                                {"driver", pidOf(state.driver)},
                                {"manager", pidOf(state.manager)},
                                {"service", pidOf(state.service)},
                                {"registered", health.registration == Registration::kRegistered},
                                {"starts", state.starts},
                                {"stopped", state.stopped}};
    json["exit_status"] = state.serviceStatus ? nlohmann::ordered_json(*state.serviceStatus)
                                              : nlohmann::ordered_json(nullptr);
    return json;
}

// Waits until the service that has just been started is registered, and says so.
int awaitStart() {
    for (int i = 0; i < kSlices; ++i) {
        const std::optional<PhoneState> state = phoneThatIsUp();
        if (!state) return failWith(kRefused, "the phone went down");
        if (state->service == 0) return failWith(kNotWell, serviceEndText(*state));
        if (askRegistration() == Registration::kRegistered) return phoneStatus(false);
        constexpr timespec kPause{0, kSlice * 1000000L};
        nanosleep(&kPause, nullptr);
    }
    return failWith(kNotWell, "the service did not register within 60 seconds");
}

}  // namespace

int phoneStatus(bool json) {
    const std::optional<PhoneState> state = phoneThatIsUp();
    if (!state) {
        fmt::print("{}\n", json ? R"({"up":false})" : "phone is down");
        return kNotWell;
    }
    const Health health{*state, askRegistration()};
    if (json) {
        fmt::print("{}\n", toJson(health).dump());
    } else {
        fmt::print("phone is up: profile {}, {}{}\n", state->profile, managerText(health),
                   serviceText(health));
    }
    return health.isWell() ? 0 : kNotWell;
}

int phoneService(const std::string& action) {
    if (!phoneThatIsUp()) return failWith(kRefused, kDownText);
    const auto answer = askDriver(kSupervisorSocket, "service " + action);
    if (!answer) return failWith(kRefused, answer.error().message());
    return action == "start" || action == "restart" ? awaitStart() : 0;
}

}  // namespace handset

// SPDX-License-Identifier: Apache-2.0
//
// The questions an evdev device answers.
#include "handset/driver/motor_queries.h"

#include <linux/input.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <initializer_list>

namespace handset {
namespace {

constexpr int kProtocolVersion = 0x010001;  // EV_VERSION as the kernel reports it
constexpr std::string_view kPhysicalPath = "qvx/input0";
constexpr size_t kLongBits = 64;

struct EventType {
    unsigned type;
    unsigned largestCode;
};

// For each type of event, how far its codes go: the size of its bit map follows from that.
constexpr std::array kEventTypes = {
        EventType{0, EV_MAX},       EventType{EV_KEY, KEY_MAX}, EventType{EV_REL, REL_MAX},
        EventType{EV_ABS, ABS_MAX}, EventType{EV_MSC, MSC_MAX}, EventType{EV_SW, SW_MAX},
        EventType{EV_LED, LED_MAX}, EventType{EV_SND, SND_MAX}, EventType{EV_FF, FF_MAX},
};

struct StateQuery {
    unsigned number;
    unsigned largestCode;
};

// What is pressed, lit, heard or switched now: nothing, for every code there could be.
constexpr std::array kStateQueries = {
        StateQuery{_IOC_NR(EVIOCGKEY(0)), KEY_MAX},
        StateQuery{_IOC_NR(EVIOCGLED(0)), LED_MAX},
        StateQuery{_IOC_NR(EVIOCGSND(0)), SND_MAX},
        StateQuery{_IOC_NR(EVIOCGSW(0)), SW_MAX},
};

// A bit map of whole longs for codes up to `largest`.
std::string bitMap(unsigned largest, std::initializer_list<unsigned> bits) {
    std::string map((largest + kLongBits - 1) / kLongBits * sizeof(uint64_t), '\0');
    for (const unsigned bit : bits) {
        map[bit / 8] = static_cast<char>(map[bit / 8] | 1 << bit % 8);
    }
    return map;
}

std::optional<std::string> eventBits(unsigned type) {
    const auto* known = std::find_if(kEventTypes.begin(), kEventTypes.end(),
                                     [type](const EventType& one) { return one.type == type; });
    if (known == kEventTypes.end()) return std::nullopt;
    if (type == 0) return bitMap(known->largestCode, {EV_SYN, EV_FF});
    if (type == EV_FF) {
        return bitMap(known->largestCode, {FF_RUMBLE, FF_PERIODIC, FF_CUSTOM, FF_GAIN});
    }
    return bitMap(known->largestCode, {});
}

std::optional<std::string> presentState(unsigned number) {
    const auto* known =
            std::find_if(kStateQueries.begin(), kStateQueries.end(),
                         [number](const StateQuery& one) { return one.number == number; });
    if (known == kStateQueries.end()) return std::nullopt;
    return bitMap(known->largestCode, {});
}

// An answer of whatever fits; its length is the result.
QueryAnswer cutTo(size_t room, std::string data) {
    data.resize(std::min(room, data.size()));
    return {static_cast<int>(data.size()), std::move(data)};
}

template <typename Value>
QueryAnswer whole(const Value& value) {
    return {0, std::string(reinterpret_cast<const char*>(&value), sizeof value)};
}

}  // namespace

std::optional<QueryAnswer> answerQuery(const MotorProfile& motor, unsigned command) {
    switch (command) {
        case EVIOCGVERSION:
            return whole(kProtocolVersion);
        case EVIOCGID:
            return whole(input_id{BUS_VIRTUAL, 0, 0, 0});
        case EVIOCGEFFECTS:
            return whole(static_cast<int>(motor.effectsMax));
        default:
            break;
    }
    if (_IOC_TYPE(command) != 'E' || _IOC_DIR(command) != _IOC_READ) return std::nullopt;
    const size_t room = _IOC_SIZE(command);
    switch (const unsigned number = _IOC_NR(command)) {
        case _IOC_NR(EVIOCGNAME(0)):
            return cutTo(room, motor.name + '\0');
        case _IOC_NR(EVIOCGPHYS(0)):
            return cutTo(room, std::string(kPhysicalPath) + '\0');
        case _IOC_NR(EVIOCGUNIQ(0)):
            return QueryAnswer{-ENOENT, ""};
        case _IOC_NR(EVIOCGPROP(0)):
            return cutTo(room, bitMap(INPUT_PROP_MAX, {}));
        default: {
            if (std::optional<std::string> state = presentState(number)) {
                return cutTo(room, std::move(*state));
            }
            constexpr unsigned kFirst = _IOC_NR(EVIOCGBIT(0, 0));
            if (number < kFirst || number > kFirst + EV_MAX) return std::nullopt;
            std::optional<std::string> bits = eventBits(number - kFirst);
            if (!bits) return std::nullopt;
            return cutTo(room, std::move(*bits));
        }
    }
}

}  // namespace handset

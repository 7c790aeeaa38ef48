// SPDX-License-Identifier: Apache-2.0
//
// A run in words.
#include "handset/phone/listing.h"

#include <linux/input.h>

#include <algorithm>
#include <fstream>
#include <utility>

#include <fmt/format.h>
#include <nlohmann/json.hpp>

namespace handset {
namespace {

using OrderedJson = nlohmann::ordered_json;

constexpr std::string_view kNodeRoot = "/sys/class/";
constexpr int kFullGain = 10000;     // of this driver
constexpr size_t kMostSamples = 16;  // of an upload that are shown

std::string shown(const OrderedJson& value) {
    return value.dump(-1, ' ', false, OrderedJson::error_handler_t::replace);
}

// A key's value as it stands in JSON; nothing where the key is absent.
std::string shown(const OrderedJson& line, const char* key) {
    return line.contains(key) ? shown(line[key]) : "";
}

std::string nameOf(const OrderedJson& line) {
    const std::string node = line.value("node", "");
    return node.starts_with(kNodeRoot) ? node.substr(kNodeRoot.size()) : node;
}

// The 16-bit values of a custom waveform, as the client gave them.
std::string samplesOf(const std::string& hex) {
    std::string samples;
    size_t at = 0;
    for (; at + 4 <= hex.size() && at < 4 * kMostSamples; at += 4) {
        const int low = std::stoi(hex.substr(at, 2), nullptr, 16);
        const int high = std::stoi(hex.substr(at + 2, 2), nullptr, 16);
        samples += fmt::format(" {}", static_cast<int16_t>(high << 8 | low));
    }
    if (at < hex.size()) samples += fmt::format(" ... ({} values)", hex.size() / 4);
    return samples;
}

std::string effectOf(const OrderedJson& line) {
    const int type = line.value("type", 0);
    const int waveform = line.value("waveform", 0);
    std::string kind = type == FF_PERIODIC && waveform == FF_CUSTOM ? "custom effect"
                       : type == FF_PERIODIC ? fmt::format("periodic effect {}", waveform)
                                             : fmt::format("effect of type {}", type);
    kind += fmt::format(", {} ms", line.value("length", 0));
    if (const int delay = line.value("delay", 0); delay != 0)
        kind += fmt::format(" after {} ms", delay);
    if (line.contains("custom_hex")) kind += ":" + samplesOf(line.value("custom_hex", ""));
    return kind;
}

std::string eventOf(const OrderedJson& line) {
    const int type = line.value("type", 0);
    const int code = line.value("code", 0);
    const int value = line.value("value", 0);
    if (type != EV_FF) return fmt::format("type {} code {} value {}", type, code, value);
    if (code == FF_GAIN) return fmt::format("gain {} ({} %)", value, value / (kFullGain / 100));
    if (value == 0) return fmt::format("stop effect {}", code);
    return value == 1 ? fmt::format("play effect {}", code)
                      : fmt::format("play effect {}, value {}", code, value);
}

std::string detailsOf(const OrderedJson& line) {
    const std::string op = line.value("op", "");
    if (op == "open") return fmt::format("{} {}", nameOf(line), line.value("flags", ""));
    if (op == "read") return fmt::format("{} {}", nameOf(line), shown(line, "result"));
    if (op == "write") {
        const std::string data =
                line.contains("hex") ? "hex " + line.value("hex", "") : shown(line, "data");
        return fmt::format("{} <- {}", nameOf(line), data);
    }
    if (op == "upload") {
        return fmt::format("id {} = {}: {}", shown(line, "id"), shown(line, "result"),
                           effectOf(line));
    }
    if (op == "event") return eventOf(line);
    if (op == "erase") return "effect " + shown(line, "id");
    return nameOf(line);
}

// An error, or a count that is short of what was given.
std::string failureOf(const OrderedJson& line) {
    for (const char* key : {"result", "error"}) {
        if (line.contains(key) && line[key].is_string()) return " = " + line.value(key, "");
    }
    const bool isShort = line.value("op", "") == "write" && line.contains("data") &&
                         line["result"] != line["data"].get<std::string>().size();
    return isShort ? " = " + shown(line, "result") : "";
}

// "[fault errno=EIO delay=5000 ms, took 5000.5 ms]"
std::string faultOf(const OrderedJson& line) {
    if (!line.contains("fault")) return "";
    std::string words;
    for (const auto& [key, value] : line["fault"].items()) {
        words += fmt::format(
                " {}={}{}", key,
                value.is_string() && key == "errno" ? value.get<std::string>() : shown(value),
                key == "delay" ? " ms" : "");
    }
    return fmt::format(" [fault{}, took {:.1f} ms]", words, line.value("took", 0) / 1000.0);
}

ListingLine listed(int64_t us, std::string_view kind, std::string_view text) {
    return {us, fmt::format("{:<7} {}", kind, text)};
}

std::string answerOf(const OrderedJson& answer) {
    if (std::string text = answer.value("text", ""); !text.empty()) return text;
    if (answer.value("exception", 0) != 0) {
        return fmt::format("exception {} {}", answer.value("exception", 0),
                           answer.value("message", ""));
    }
    if (answer.value("status", 0) != 0) return fmt::format("status {}", answer.value("status", 0));
    const bool isPlain = !answer.contains("result") || answer["result"].is_null();
    return isPlain ? "ok" : shown(answer["result"]);
}

}  // namespace

std::vector<ListingLine> fromJournal(std::string_view line) {
    const OrderedJson json = OrderedJson::parse(line, nullptr, false);
    if (!json.is_object()) return {};
    try {
        return {listed(json.value("us", int64_t{0}), json.value("op", ""),
                       detailsOf(json) + failureOf(json) + faultOf(json))};
    } catch (const std::exception&) {
        return {};  // no line of the driver's
    }
}

std::vector<ListingLine> fromLog(std::string_view line) {
    const size_t space = line.find(' ');
    if (space == 0 || space == std::string_view::npos || space > 18) return {};
    if (line.find_first_not_of("0123456789") != space) return {};
    return {listed(std::stoll(std::string(line.substr(0, space))), "log", line.substr(space + 1))};
}

std::vector<ListingLine> fromCalls(std::string_view line) {
    const OrderedJson json = OrderedJson::parse(line, nullptr, false);
    if (!json.is_object()) return {};
    try {
        const int64_t start = json.at("us");
        const auto words = json.at("call").get<std::vector<std::string>>();
        const OrderedJson& answer = json.at("answer");
        const int64_t took = answer.value("us", int64_t{0});
        const std::string name = fmt::format("{}", fmt::join(words, " "));
        return {listed(start, "call", name),
                listed(start + took, "answer",
                       fmt::format("{}: {}, {:.1f} ms", name, answerOf(answer),
                                   static_cast<double>(took) / 1000))};
    } catch (const std::exception&) {
        return {};  // no line of a client's
    }
}

std::vector<std::string> GrowingFile::newLines() {
    std::ifstream file(mPath, std::ios::binary | std::ios::ate);
    if (!file) return {};
    if (file.tellg() < mOffset) mOffset = 0;  // emptied
    file.seekg(mOffset);
    std::vector<std::string> lines;
    for (std::string line; std::getline(file, line) && !file.eof();) {
        mOffset += static_cast<int64_t>(line.size()) + 1;
        lines.push_back(std::move(line));
    }
    return lines;
}

std::vector<std::string> Listing::newLines() {
    std::vector<ListingLine> found;
    const auto add = [&found](GrowingFile& file, auto decode) {
        for (const std::string& line : file.newLines()) {
            for (ListingLine& one : decode(line)) found.push_back(std::move(one));
        }
    };
    add(mCalls, fromCalls);
    add(mLog, fromLog);
    add(mJournal, fromJournal);
    std::stable_sort(found.begin(), found.end(),
                     [](const auto& one, const auto& other) { return one.us < other.us; });
    std::vector<std::string> lines;
    lines.reserve(found.size());
    for (const ListingLine& one : found) {
        lines.push_back(
                fmt::format("{:>5}.{:06} {}", one.us / 1000000, one.us % 1000000, one.text));
    }
    return lines;
}

}  // namespace handset

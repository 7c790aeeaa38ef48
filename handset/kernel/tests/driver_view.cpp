// SPDX-License-Identifier: Apache-2.0
//
// What the two drivers have noted, brought to one form.
#include "handset/kernel/tests/driver_view.h"

#include <linux/input.h>

#include <set>

namespace handset
{
namespace
{

constexpr int kLargestGain = 0xffff;

std::string hexOf(const std::string &bytes)
{
	constexpr const char *kDigits = "0123456789abcdef";
	std::string hex;
	for (const char byte : bytes) {
		hex += kDigits[static_cast<unsigned char>(byte) >> 4];
		hex += kDigits[static_cast<unsigned char>(byte) & 15];
	}
	return hex;
}

Json event(const Json &uid, int code, int value)
{
	return {{"uid", uid},	 {"op", "event"}, {"node", "motor"},
		{"type", EV_FF}, {"code", code},  {"value", value},
		{"result", 24}};
}

// The input core between a client's calls, as the journal has them, and a
// driver.
class InputCore
{
      public:
	std::vector<Json> passedOn(const Json &line)
	{
		const std::string op = line.at("op");
		if (op == "upload")
			return upload(line);
		if (op == "erase")
			return erase(line);
		if (op == "event" && isPassedOn(line))
			return {line};
		return {};
	}

      private:
	// What the core refuses a driver never hears of.
	std::vector<Json> upload(const Json &line)
	{
		if (!line.at("result").is_number())
			return {};
		mLive.insert(line.at("result").get<int>());
		return {line};
	}

	// The core stops an effect before it goes.
	std::vector<Json> erase(const Json &line)
	{
		if (!line.at("result").is_number())
			return {};
		mLive.erase(line.at("id").get<int>());
		return {event(line.at("uid"), line.at("id"), 0), line};
	}

	bool isPassedOn(const Json &line) const
	{
		const int value = line.at("value");
		if (line.at("type") != EV_FF || value < 0)
			return false;
		if (line.at("code") == FF_GAIN)
			return value <= kLargestGain;
		return mLive.count(line.at("code").get<int>()) > 0;
	}

	std::set<int> mLive;
};

std::string leaf(const std::string &path)
{
	return path.substr(path.rfind('/') + 1);
}

std::string word(const Json &value)
{
	return value.is_string() ? value.get<std::string>() : value.dump();
}

std::string inShort(const Json &line)
{
	const std::string op = line.value("op", "");
	const std::string node = leaf(line.value("node", ""));
	const auto field = [&](const char *name) {
		return word(line.value(name, Json()));
	};
	if (op == "open")
		return "open " + node + " " + field("flags") + " = " +
		       field("error");
	if (op == "close")
		return "close " + node;
	if (op == "read")
		return "read " + node + " = " + field("result");
	if (op == "write") {
		const std::string hex = line.contains("data")
						? hexOf(line["data"])
						: field("hex");
		return "write " + node + " " + hex + " = " + field("result");
	}
	if (op == "upload") {
		return "upload " + field("id") + " = " + field("result") +
		       " custom " + field("custom_hex");
	}
	if (op == "erase")
		return "erase " + field("id") + " = " + field("result");
	if (op == "event") {
		return (line.at("type") == EV_FF
				? "event "
				: "event of type " + field("type") + " ") +
		       field("code") + " " + field("value");
	}
	return line.dump();
}

} // namespace

std::vector<Json> asRealDriverIsTold(const std::vector<Json> &journal)
{
	std::vector<Json> told;
	InputCore core;
	for (Json line : journal) {
		const std::string op = line.at("op");
		if (line.value("node", "") == "motor") {
			for (Json &passed : core.passedOn(line))
				told.push_back(std::move(passed));
		} else if (op == "write" && line.at("result").is_number()) {
			if (line.contains("data"))
				line["hex"] = hexOf(line["data"]);
			line.erase("data");
			told.push_back(std::move(line));
		}
	}
	return told;
}

std::vector<Json> withoutReads(const std::vector<Json> &report)
{
	std::vector<Json> rest;
	for (const Json &line : report) {
		if (line.value("op", "") != "read")
			rest.push_back(line);
	}
	return rest;
}

std::vector<std::string> inShort(const std::vector<Json> &lines)
{
	std::vector<std::string> texts;
	for (const Json &line : lines)
		texts.push_back(inShort(line));
	return texts;
}

} // namespace handset

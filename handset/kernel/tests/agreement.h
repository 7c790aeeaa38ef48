// SPDX-License-Identifier: Apache-2.0
//
// Requests to which the real and the simulated driver must answer alike, and of
// which both must have been told alike.
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "handset/kernel/tests/drivers.h"

namespace handset
{

// Whom requests come from.
using qvx::test::kRoot;
using qvx::test::kSystem;
inline constexpr uid_t kStranger = 2000;

struct Agreement {
	const char *name;
	uid_t user;
	std::string (*request)(const std::string &motor);
	const char *answers;
};

// Names the case in a failure.
std::ostream &operator<<(std::ostream &out, const Agreement &agreement);

// Performs the request with both drivers; the answers are as given in the
// table.
void expectAgreement(const Agreement &agreement);

// Performs the request with both drivers; the answers are those of the real
// one.
void expectSame(const Request &request);

// A parameterised test's name.
template <typename Row>
std::string nameOf(const testing::TestParamInfo<Row> &info)
{
	return info.param.name;
}

// Requests to the motor, in one table for each subject.
class MotorAgreement : public testing::TestWithParam<Agreement>
{
};

// Several answers, each with a space behind it.
inline std::string joined(std::initializer_list<std::string> answers)
{
	std::string text;
	for (const std::string &answer : answers)
		text += answer + " ";
	return text;
}

} // namespace handset

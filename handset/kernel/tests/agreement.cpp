// SPDX-License-Identifier: Apache-2.0
//
// Requests to which the real and the simulated driver must answer alike.
#include "handset/kernel/tests/agreement.h"

#include <gmock/gmock.h>

#include "handset/kernel/tests/driver_view.h"

namespace handset
{
namespace
{

struct Course {
	std::string problem;
	std::string answers;
	std::vector<Json> told;
};

Course courseOf(std::unique_ptr<Driver> driver, uid_t user,
		const Request &request,
		std::vector<Json> (*told)(const std::vector<Json> &))
{
	Course course;
	course.problem = driver->problem();
	if (!course.problem.empty())
		return course;
	course.answers = driver->perform(user, request);
	course.told = told(driver->noted());
	return course;
}

void compare(uid_t user, const Request &request, const char *answers)
{
	const Course real =
		courseOf(startRealDriver(), user, request, withoutReads);
	const Course simulated = courseOf(startSimulatedDriver(), user, request,
					  asRealDriverIsTold);
	ASSERT_EQ(real.problem, "");
	ASSERT_EQ(simulated.problem, "");
	if (answers != nullptr) {
		EXPECT_EQ(real.answers, answers) << "of the real driver";
	}
	EXPECT_EQ(simulated.answers, real.answers);
	EXPECT_THAT(simulated.told, testing::ElementsAreArray(real.told));
}

} // namespace

std::ostream &operator<<(std::ostream &out, const Agreement &agreement)
{
	return out << agreement.name;
}

void expectAgreement(const Agreement &agreement)
{
	compare(agreement.user, agreement.request, agreement.answers);
}

void expectSame(const Request &request)
{
	compare(0, request, nullptr);
}

} // namespace handset

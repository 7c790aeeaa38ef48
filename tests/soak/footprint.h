// SPDX-License-Identifier: Apache-2.0
//
// What a phone's processes and the kernel's binder hold, so that growth is seen.
#pragma once

#include <sys/types.h>

#include <map>
#include <string>
#include <vector>

namespace qvx::test {

// Where the binder driver tells of every node and reference.
inline constexpr const char* kBinderState = "/sys/kernel/debug/binder/state";

using Footprint = std::map<std::string, long>;

// What each of the processes (by a name of its own) holds, and what binder holds altogether.
Footprint footprintOf(const std::map<std::string, pid_t>& processes);

// What has grown from the first tenth to the last by more than what is noise, in words. The first
// sample is left out: until then memory is had for the first time. What either tenth lacks is not
// compared, nor what is not of `owner`, if one is given.
std::vector<std::string> growthOver(const std::vector<Footprint>& samples,
                                    const std::string& owner = "");

// The kernel's records since the last call, or since the object was made: those that no death of a
// process explains.
class KernelComplaints {
  public:
    KernelComplaints();
    ~KernelComplaints();
    KernelComplaints(const KernelComplaints&) = delete;
    KernelComplaints& operator=(const KernelComplaints&) = delete;

    std::vector<std::string> next() const;

  private:
    int mLog;
};

}  // namespace qvx::test

// SPDX-License-Identifier: Apache-2.0
//
// What a running driver can be asked for:
//
//   fault {JSON}         adds a fault, as a profile's "faults" has them
//   faults               the faults there are: a JSON list, each with how many calls it has "seen"
//                        and "struck"
//   clear                forgets all faults; what was unplugged is plugged in again
//   unplug NODE [MS]     takes the node (or "motor") away, now or after milliseconds
//   plug NODE [MS]       brings it back
//   reset                empties the journal; its next line is number 1 again
//   get PATH             what a read of the node would return now
//   set PATH "TEXT"      changes a node's text from the driver's side, unseen by the journal
//   settle               nothing more; see below
//   stop                 ends the driver
//
// Whatever is asked, what was done to the nodes before is in the journal first, closes included.
// The answer is "ok", with "get" and "faults" followed by JSON, or "error MESSAGE".
#pragma once

#include <chrono>
#include <functional>
#include <map>
#include <string>
#include <string_view>
#include <utility>

#include "handset/driver/fault_injector.h"
#include "handset/driver/journal.h"
#include "handset/driver/node_tree.h"
#include "handset/driver/profile.h"

namespace handset {

class ControlRequests {
  public:
    // The references outlive the object. `tree` is null where the nodes are the kernel's. `settle`
    // returns once the journal has what was done so far; it is called before each request.
    ControlRequests(const Profile& profile, const NodeTree* tree, FaultInjector& faults,
                    Journal& journal, std::function<void()> settle)
        : mProfile(profile),
          mTree(tree),
          mFaults(faults),
          mJournal(journal),
          mSettle(std::move(settle)) {}

    // Does what one request line asks for and returns the answer's line.
    std::string answer(std::string_view request);

    // Does what was asked for a time that has come, and returns the milliseconds until the next
    // such time, -1 where there is none.
    int runDue();

    // True once "stop" was asked for.
    bool isStopWanted() const { return mStopWanted; }

  private:
    using Clock = std::chrono::steady_clock;

    std::string addFault(std::string_view json);
    std::string listFaults() const;
    std::string schedule(std::string_view verb, std::string_view argument);
    std::string getNode(std::string_view path) const;
    std::string setNode(std::string_view argument) const;

    const Profile& mProfile;
    const NodeTree* mTree;
    FaultInjector& mFaults;
    Journal& mJournal;
    std::function<void()> mSettle;
    std::multimap<Clock::time_point, std::function<void()>> mDue;
    bool mStopWanted = false;
};

}  // namespace handset

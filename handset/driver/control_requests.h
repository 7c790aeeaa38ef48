// SPDX-License-Identifier: Apache-2.0
// What a running driver can be asked for:
//
//   fault {JSON}       adds a fault, as a profile's "faults" has them
//   clear              forgets all faults
//   reset              empties the journal; its next line is number 1 again
//   get PATH           what a read of the node would return now
//   set PATH "TEXT"    changes a node's text from the driver's side, unseen by the journal
//   settle             nothing more; see below
//   stop               ends the driver
//
// Whatever is asked, what was done to the nodes before is in the journal first, closes included.
// The answer is "ok", with "get" followed by the text as a JSON string, or "error MESSAGE".
#pragma once

#include <functional>
#include <string>
#include <string_view>
#include <utility>

#include "driver/fault_book.h"
#include "driver/journal.h"
#include "driver/node_tree.h"
#include "driver/profile.h"

namespace handset {

class ControlRequests {
  public:
    /// The references outlive the object. `settle` returns once the journal has what was done so
    /// far; it is called before each request.
    ControlRequests(const Profile& profile, const NodeTree& tree, FaultBook& faults,
                    Journal& journal, std::function<void()> settle)
        : profile_(profile),
          tree_(tree),
          faults_(faults),
          journal_(journal),
          settle_(std::move(settle)) {}

    /// Does what one request line asks for and returns the answer's line.
    std::string answer(std::string_view request);

    /// True once "stop" was asked for.
    bool isStopWanted() const { return stopWanted_; }

  private:
    std::string addFault(std::string_view json);
    std::string getNode(std::string_view path) const;
    std::string setNode(std::string_view argument) const;

    const Profile& profile_;
    const NodeTree& tree_;
    FaultBook& faults_;
    Journal& journal_;
    std::function<void()> settle_;
    bool stopWanted_ = false;
};

}  // namespace handset

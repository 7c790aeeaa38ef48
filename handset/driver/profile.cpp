// SPDX-License-Identifier: Apache-2.0
//
// Looking things up in a profile.
#include "handset/driver/profile.h"

#include <algorithm>

namespace handset {

const NodeProfile* Profile::findNode(std::string_view path) const {
    const auto found = std::find_if(nodes.begin(), nodes.end(),
                                    [path](const NodeProfile& node) { return node.path == path; });
    return found != nodes.end() ? &*found : nullptr;
}

}  // namespace handset

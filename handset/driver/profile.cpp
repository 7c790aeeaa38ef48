// SPDX-License-Identifier: Apache-2.0
// Looking things up in a profile.
#include "driver/profile.h"

#include <algorithm>

namespace handset {

const NodeSpec* Profile::findNode(std::string_view path) const {
    const auto found = std::find_if(nodes.begin(), nodes.end(),
                                    [path](const NodeSpec& node) { return node.path == path; });
    return found != nodes.end() ? &*found : nullptr;
}

}  // namespace handset

// SPDX-License-Identifier: Apache-2.0
//
// Permission bits.
#include "handset/driver/permission.h"

#include <fcntl.h>

#include <algorithm>

namespace handset {

unsigned wantedBy(int openFlags) {
    switch (openFlags & O_ACCMODE) {
        case O_RDONLY:
            return kMayRead;
        case O_WRONLY:
            return kMayWrite;
        default:
            return kMayRead | kMayWrite;
    }
}

unsigned neededBy(int openFlags) {
    return wantedBy(openFlags) | ((openFlags & O_TRUNC) != 0 ? kMayWrite : 0U);
}

bool grants(const Attributes& attributes, const Credentials& credentials, unsigned wanted) {
    if (credentials.uid == 0) return true;
    unsigned granted = attributes.mode;
    const std::vector<gid_t>& groups = credentials.groups;
    if (credentials.uid == attributes.uid) {
        granted >>= 6;
    } else if (credentials.gid == attributes.gid ||
               std::find(groups.begin(), groups.end(), attributes.gid) != groups.end()) {
        granted >>= 3;
    }
    return (granted & wanted) == wanted;
}

}  // namespace handset

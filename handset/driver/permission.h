// SPDX-License-Identifier: Apache-2.0
//
// Who may open a node. The driver decides by itself, instead of leaving it to the kernel, so that
// a refused open is in the journal too.
#pragma once

#include <sys/types.h>

#include <vector>

namespace handset {

// A node's owner and permission bits (no file type).
struct Attributes {
    mode_t mode = 0;
    uid_t uid = 0;
    gid_t gid = 0;
};

// A caller's credentials as far as permission bits ask for them.
struct Credentials {
    uid_t uid = 0;
    gid_t gid = 0;
    std::vector<gid_t> groups;  // supplementary
};

// Whom the phone's nodes and files belong to: the user (and the group) "system".
inline constexpr uid_t kSystemUser = 1000;

// Permission bits, as access(2) has them.
inline constexpr unsigned kMayRead = 4;
inline constexpr unsigned kMayWrite = 2;

// What an open with these flags asks for.
unsigned wantedBy(int openFlags);

// What the permission bits have to grant for it: the same, and writing where the file is to be
// truncated, even if it is opened for reading only.
unsigned neededBy(int openFlags);

// True when owner, group and mode grant `wanted`. Root is granted everything.
bool grants(const Attributes& attributes, const Credentials& credentials, unsigned wanted);

}  // namespace handset

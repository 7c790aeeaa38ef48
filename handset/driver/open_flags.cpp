// SPDX-License-Identifier: Apache-2.0
//
// The flags of an open(2), as text.
#include "handset/driver/open_flags.h"

#include <fcntl.h>

namespace handset {
namespace {

struct NamedFlag {
    int bits;
    const char* name;
};

// O_SYNC holds the bit of O_DSYNC and is tried first.
constexpr NamedFlag kFlags[] = {
        {O_CREAT, "O_CREAT"},       {O_EXCL, "O_EXCL"},           {O_NOCTTY, "O_NOCTTY"},
        {O_TRUNC, "O_TRUNC"},       {O_APPEND, "O_APPEND"},       {O_NONBLOCK, "O_NONBLOCK"},
        {O_SYNC, "O_SYNC"},         {O_DSYNC, "O_DSYNC"},         {O_DIRECT, "O_DIRECT"},
        {O_NOFOLLOW, "O_NOFOLLOW"}, {O_DIRECTORY, "O_DIRECTORY"}, {O_NOATIME, "O_NOATIME"},
};

const char* accessText(int flags) {
    switch (flags & O_ACCMODE) {
        case O_RDONLY:
            return "O_RDONLY";
        case O_WRONLY:
            return "O_WRONLY";
        case O_RDWR:
            return "O_RDWR";
        default:
            return "O_ACCMODE";
    }
}

}  // namespace

std::string openFlagsText(int flags) {
    std::string text = accessText(flags);
    for (const NamedFlag& flag : kFlags) {
        if ((flags & flag.bits) != flag.bits) continue;
        text += '|';
        text += flag.name;
        flags &= ~flag.bits;
    }
    return text;
}

}  // namespace handset

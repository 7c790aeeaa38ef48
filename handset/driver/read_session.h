// SPDX-License-Identifier: Apache-2.0
//
// What one open file of a node has been shown. As sysfs has it (seq_file in the kernel), a node
// shows its whole text once and reads that follow each other take their pieces from that; a read
// at the beginning, or anywhere but where the last one ended, has the node show its text anew.
#pragma once

#include <algorithm>
#include <cstddef>
#include <string>

namespace handset {

class ReadSession {
  public:
    // True where a read at `offset` goes on where the last one ended.
    bool continuesAt(size_t offset) const { return offset != 0 && offset == mNext; }

    // The next read's piece: at most `size` bytes at `offset`, none past the text's end.
    // `show()` returns the node's present text and is called where it has to be shown anew.
    template <typename Show>
    std::string read(size_t offset, size_t size, Show show) {
        if (!continuesAt(offset)) mText = show();
        std::string piece = mText.substr(std::min(offset, mText.size()), size);
        mNext = offset + piece.size();
        return piece;
    }

  private:
    std::string mText;
    size_t mNext = 0;
};

}  // namespace handset

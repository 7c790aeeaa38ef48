// SPDX-License-Identifier: Apache-2.0
// The names of the operations a fault applies to.
#include "driver/fault_spec.h"

namespace handset {

std::string_view faultOpName(FaultOp op) {
    switch (op) {
        case FaultOp::kOpen:
            return "open";
        case FaultOp::kRead:
            return "read";
        case FaultOp::kWrite:
            return "write";
        case FaultOp::kUpload:
            return "upload";
        case FaultOp::kErase:
            return "erase";
    }
    return "";
}

}  // namespace handset

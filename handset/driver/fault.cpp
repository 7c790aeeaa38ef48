// SPDX-License-Identifier: Apache-2.0
//
// A fault as JSON.
#include "handset/driver/fault.h"

#include "handset/driver/error_names.h"
#include "handset/driver/printable.h"

namespace handset {

using nlohmann::ordered_json;

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

ordered_json toJson(const FaultAction& action) {
    ordered_json json = ordered_json::object();
    if (action.error != 0) json["errno"] = errorName(action.error);
    if (action.shortCount) json["short"] = *action.shortCount;
    if (action.delay.count() != 0) json["delay"] = action.delay.count();
    if (action.unplug) json["unplug"] = true;
    if (action.text) putBytes(json, "text", "hex", *action.text);
    return json;
}

ordered_json toJson(const Fault& fault) {
    ordered_json json{{"node", fault.node}, {"op", faultOpName(fault.op)}};
    json.update(toJson(fault.action));
    if (fault.after != 0) json["after"] = fault.after;
    if (fault.times != 0) json["times"] = fault.times;
    if (fault.every != 1) json["every"] = fault.every;
    return json;
}

}  // namespace handset

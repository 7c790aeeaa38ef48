// SPDX-License-Identifier: Apache-2.0
//
// An uploaded effect as a journal line.
#include "handset/driver/effect_line.h"

#include "handset/driver/printable.h"

namespace handset {

JournalFields uploadLine(const ff_effect& effect, std::string_view custom, int64_t result) {
    JournalFields line{
            {"op", "upload"},      {"node", kMotorNode},
            {"id", effect.id},     {"result", resultOf(result)},
            {"type", effect.type},
    };
    const ff_periodic_effect& periodic = effect.u.periodic;
    const bool isPeriodic = effect.type == FF_PERIODIC;
    if (isPeriodic) line["waveform"] = periodic.waveform;
    line["length"] = effect.replay.length;
    line["delay"] = effect.replay.delay;
    line["direction"] = effect.direction;
    line["button"] = effect.trigger.button;
    line["interval"] = effect.trigger.interval;
    if (!isPeriodic) return line;
    line["period"] = periodic.period;
    line["magnitude"] = periodic.magnitude;
    line["offset"] = periodic.offset;
    line["phase"] = periodic.phase;
    line["attack_length"] = periodic.envelope.attack_length;
    line["attack_level"] = periodic.envelope.attack_level;
    line["fade_length"] = periodic.envelope.fade_length;
    line["fade_level"] = periodic.envelope.fade_level;
    line["custom_len"] = periodic.custom_len;
    line["custom_hex"] = hexOf(custom);
    return line;
}

}  // namespace handset

// SPDX-License-Identifier: Apache-2.0
// An uploaded effect as a journal line.
#include "driver/effect_line.h"

namespace handset {

JournalLine uploadLine(const ff_effect& effect, std::string_view custom, int64_t result) {
    JournalLine line("upload");
    line.text("node", kMotorNode).number("id", effect.id).result("result", result);
    line.number("type", effect.type);
    if (effect.type == FF_PERIODIC) line.number("waveform", effect.u.periodic.waveform);
    line.number("length", effect.replay.length)
            .number("delay", effect.replay.delay)
            .number("direction", effect.direction)
            .number("button", effect.trigger.button)
            .number("interval", effect.trigger.interval);
    if (effect.type != FF_PERIODIC) return line;
    const ff_periodic_effect& periodic = effect.u.periodic;
    line.number("period", periodic.period)
            .number("magnitude", periodic.magnitude)
            .number("offset", periodic.offset)
            .number("phase", periodic.phase)
            .number("attack_length", periodic.envelope.attack_length)
            .number("attack_level", periodic.envelope.attack_level)
            .number("fade_length", periodic.envelope.fade_length)
            .number("fade_level", periodic.envelope.fade_level)
            .number("custom_len", periodic.custom_len)
            .hex("custom_hex", custom);
    return line;
}

}  // namespace handset

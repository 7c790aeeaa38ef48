// SPDX-License-Identifier: Apache-2.0
//
// The doctor on phones whose driver is broken: its nodes, their modes, what they say.
#include "vibctl/tests/broken_phone.h"

namespace vibctl {
namespace {

const Broken kDrivers[] = {
        // the device class
        {"NoNodeAtAll",
         [](Phone& phone) {
             phone.root.remove(kLedsDirectory);
             phone.root.put(kList, "N: Name=\"keys\"\nH: Handlers=kbd event0 \n\n");
         },
         "bad  device class: no timed_output or leds node, no motor in the input list; next: load "
         "the driver"},
        {"NoInputDevices", [](Phone& phone) { phone.root.remove(kLedsDirectory); },
         "bad  device class: no node, and no /proc/bus/input/devices; next: enable CONFIG_INPUT"},
        {"NoState", [](Phone& phone) { phone.root.remove(kLedsDirectory + "state"); },
         "bad  device class: two of three LED nodes are there; the driver lacks state; next: add "
         "it"},
        {"NoActivate", [](Phone& phone) { phone.root.remove(kLedsDirectory + "activate"); },
         "bad  device class: two of three LED nodes are there; the driver lacks activate; next: "
         "add "
         "it"},
        {"NoDuration", [](Phone& phone) { phone.root.remove(kLedsDirectory + "duration"); },
         "bad  device class: two of three LED nodes are there; the driver lacks duration; next: "
         "add "
         "it"},
        {"ActivateAlone",
         [](Phone& phone) {
             phone.root.remove(kLedsDirectory + "state");
             phone.root.remove(kLedsDirectory + "duration");
         },
         "bad  device class: one of three LED nodes is there; the driver lacks duration, state; "
         "next: add it"},
        {"NoneOfTheThree",
         [](Phone& phone) {
             for (const char* name : {"activate", "duration", "state"}) {
                 phone.root.remove(kLedsDirectory + name);
             }
             phone.root.put(kList, "");
         },
         "bad  device class: for LEDs the driver lacks activate, duration, state; next: add it"},
        {"NoEnable",
         [](Phone& phone) {
             phone.root.remove(kLedsDirectory);
             phone.root.putNodes(kLegacyDirectory, {"intensity", "motor_type"});
             phone.root.put(kList, "");
         },
         "bad  device class: timed_output nodes are there; the driver lacks enable; next: add it"},
        {"MotorUnplugged",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.put(kList, "N: Name=\"keys\"\nH: Handlers=kbd event0 \n\n");
         },
         "bad  device class: control nodes, but no motor in the input list: it is unplugged; next: "
         "plug it in"},
        {"DurationDenied", [](Phone& phone) { phone.deny(kLedsDirectory + "duration"); },
         "bad  device class: user 4242 cannot open vibrator/duration (OWNER 0600); next: chown it "
         "to 4242"},
        {"EnableDenied",
         [](Phone& phone) {
             phone.root.put(kLegacyDirectory + "enable");
             phone.deny(kLegacyDirectory + "enable");
         },
         "bad  device class: user 4242 cannot open vibrator/enable (OWNER 0600); next: chown it to "
         "4242"},
        {"MotorOfAnotherName",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.edit(kList, "qvx_vibrator_inputff", "qvx_vibrator");
         },
         "bad  device class: the motor is called \"qvx_vibrator\"; next: call it "
         "qvx_vibrator_inputff"},
        {"MotorWithTwoHandlers",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.edit(kList, "=event3", "=js0 event3");
         },
         "bad  device class: the motor's handlers are \"js0 event3\", not one event; next: report "
         "EV_FF only"},

        // the nodes
        {"IntensityDenied", [](Phone& phone) { phone.deny(kLedsDirectory + "intensity"); },
         "bad  nodes: user 4242 cannot open vibrator/intensity (OWNER 0600); next: chown it to "
         "4242"},
        {"EngineReadOnly",
         [](Phone& phone) { phone.root.chmod(kLedsDirectory + "haptic_engine", 0444); },
         "bad  nodes: user 4242 cannot open vibrator/haptic_engine (OWNER 0444); next: chown it to "
         "4242"},
        {"CalibrationUnreadable",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.deny("/efs/FactoryApp/vibrator_calibration");
         },
         "bad  nodes: user 4242 cannot open FactoryApp/vibrator_calibration (OWNER 0600); next: "
         "chown it to 4242"},
        {"EventNodeMissing",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.remove("/dev/input/event3");
         },
         "bad  nodes: input/event3: No such file or directory; next: see the kernel log"},

        // what the nodes say
        {"MotorTypeUnknown",
         [](Phone& phone) { phone.root.put(kLedsDirectory + "motor_type", "LINEAR_1041\n"); },
         "bad  motor type: \"LINEAR_1041\" is unknown and counts as NONE; next: write LINEAR_1040"},
        {"MotorTypeWithoutANewline",
         [](Phone& phone) { phone.root.put(kLedsDirectory + "motor_type", "LINEAR_1040"); },
         "bad  motor type: \"LINEAR_1040\" without a newline is read as \"LINEAR_104\"; next: add "
         "the newline"},
        {"FeatureWordMisspelt",
         [](Phone& phone) {
             phone.root.put(kFunctions, "INTENSITY HAPTIC_ENGINE PRIMITVE_EFFECT_COMPOSE\n");
         },
         "bad  feature words: \"PRIMITVE_EFFECT_COMPOSE\" is none, so off; next: write "
         "PRIMITIVE_EFFECT_COMPOSE"},
        {"FeatureWordsSeparatedByCommas",
         [](Phone& phone) { phone.root.put(kFunctions, "INTENSITY,HAPTIC_ENGINE\n"); },
         "note feature words: hasFeature needs single spaces between them; next: separate them so"},
        {"FeatureWordsInLines",
         [](Phone& phone) { phone.root.put(kFunctions, "INTENSITY\nHAPTIC_ENGINE\n"); },
         "note feature words: hasFeature needs single spaces between them; next: separate them so"},
        {"FeatureWithoutItsNode",
         [](Phone& phone) { phone.root.remove(kLedsDirectory + "haptic_engine"); },
         "note feature words: HAPTIC_ENGINE is listed without a node; next: add haptic_engine"},
        {"NoIntensity", [](Phone& phone) { phone.root.remove(kLedsDirectory + "intensity"); },
         "note feature words: INTENSITY is listed without a node; next: add intensity"},
        {"NoForceTouchIntensity", [](Phone& phone) { phone.list("FORCE_TOUCH_INTENSITY"); },
         "note feature words: FORCE_TOUCH_INTENSITY is listed without a node; next: add "
         "force_touch_intensity"},
        {"NoMultiFreq", [](Phone& phone) { phone.list("MULTI_FREQUENCY"); },
         "note feature words: MULTI_FREQUENCY is listed without a node; next: add multi_freq"},
        {"NoPatternIndex", [](Phone& phone) { phone.list("INDEX_HAPTIC_PATTERN"); },
         "note feature words: INDEX_HAPTIC_PATTERN is listed without a node; next: add "
         "cp_trigger_index"},
        {"NoFifo", [](Phone& phone) { phone.list("FIFO_HAPTIC_ENGINE"); },
         "note feature words: FIFO_HAPTIC_ENGINE is listed without a node; next: add fifo"},
        {"NoHybrid", [](Phone& phone) { phone.list("HYBRID_HAPTIC_ENGINE"); },
         "note feature words: HYBRID_HAPTIC_ENGINE is listed without a node; next: add "
         "hybrid_haptic_engine"},
        {"NoMotorType", [](Phone& phone) { phone.root.remove(kLedsDirectory + "motor_type"); },
         "note motor type: without motor_type the amplitude tables are guessed; next: add the "
         "node"},
        {"NoPatternQueue",
         [](Phone& phone) {
             phone.root.putNodes(kLedsDirectory, {"cp_trigger_index", "num_waves"});
         },
         "note nodes: without cp_trigger_queue no pattern is repeated or composed; next: add it"},
        {"NoPatternCount",
         [](Phone& phone) {
             phone.root.putNodes(kLedsDirectory, {"cp_trigger_index", "cp_trigger_queue"});
         },
         "note nodes: without num_waves clients get no number of patterns; next: add it"},
        {"NoHapticIntensities",
         [](Phone& phone) { phone.root.remove(kLedsDirectory + "haptic_intensities"); },
         "note intensities: intensities does not count without haptic_intensities; next: add it"},
        {"NoIntensities", [](Phone& phone) { phone.root.remove(kLedsDirectory + "intensities"); },
         "note intensities: haptic_intensities does not count without intensities; next: add it"},
        {"NodeWithoutItsFeature", [](Phone& phone) { phone.root.put(kLedsDirectory + "fifo"); },
         "note feature words: FIFO_HAPTIC_ENGINE is not listed, so clients miss it; next: list it"},
        {"NoFeatureWords", [](Phone& phone) { phone.root.remove(kFunctions); },
         "note feature words: without functions, no compositions, no external control; next: add "
         "the node"},
        {"IntensityTableUnreadable",
         [](Phone& phone) {
             phone.root.put(kLedsDirectory + "haptic_intensities", "0;5000;10000\n");
         },
         "bad  intensities: haptic_intensities holds \"0;5000;10000\"; next: write numbers, commas "
         "between"},
        {"IntensityTableEmpty",
         [](Phone& phone) { phone.root.put(kLedsDirectory + "intensities", "\n"); },
         "bad  intensities: intensities holds \"\"; next: write numbers, commas between"},
        {"NodeMisnamed", [](Phone& phone) { phone.root.put(kLedsDirectory + "cp_trigger_indx"); },
         "bad  node names: the service never opens cp_trigger_indx; next: call it "
         "cp_trigger_index"},
        {"CalibrationEmpty",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.put("/efs/FactoryApp/vibrator_calibration", " \n");
         },
         "bad  calibration: vibrator_calibration is empty: none is used; next: calibrate the phone "
         "again"},
        {"CalibrationWithoutItsNode",
         [](Phone& phone) {
             phone.becomeForceFeedback();
             phone.root.remove("/sys/class/qvx_vib_inputff/control/f0_stored");
         },
         "bad  calibration: there is no node f0_stored to write it to; next: add it to the driver"},
};

INSTANTIATE_TEST_SUITE_P(Drivers, BrokenPhone, ::testing::ValuesIn(kDrivers),
                         [](const auto& phone) { return phone.param.name; });

}  // namespace
}  // namespace vibctl

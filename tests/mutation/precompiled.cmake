# Included into the build of the mutants alone: what every source of the service includes from
# elsewhere, compiled once. Without the logging headers, which look at each source's LOG_TAG.
cmake_language(DEFER CALL target_precompile_headers qvx_vibrator PRIVATE
    <algorithm> <array> <charconv> <chrono> <cstdio> <cstring> <fstream> <functional> <map>
    <memory> <optional> <ostream> <set> <sstream> <string> <string_view> <system_error> <thread>
    <vector> <aidl/android/hardware/vibrator/BnVibrator.h>
    <aidl/vendor/quorvan/hardware/vibrator/BnZelVibrator.h>)

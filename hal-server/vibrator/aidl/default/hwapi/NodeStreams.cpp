// SPDX-License-Identifier: Apache-2.0
//
// The six streams that stay open from start-up on: the audio stream switch, the GPIO triggers and
// the vibration state. They are unbuffered, so that one value is one write and a value that the
// driver refused is gone: a buffer would send it again with the next one, or on closing.
#define LOG_TAG "QvxVibrator-HAL-AIDL-CORE"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <string>

#include <log/log.h>

#include "HwApi.h"
#include "hwapi/DriverWriter.h"

namespace aidl::android::hardware::vibrator {

template <typename Stream>
void HwApi::openStream(const std::string& name, std::ios::openmode mode, Stream* stream) {
    mNames[stream] = name;
    const std::string path = mPath + name;
    stream->rdbuf()->pubsetbuf(nullptr, 0);
    stream->open(path, mode);  // fails on a stream that is open already
    if (stream->fail()) {
        const std::string shortPath(fromClass(path));
        ALOGE("Failed to open %s (%d): %s", shortPath.c_str(), errno, strerror(errno));
    }
}

void HwApi::HwApiopen(const std::string& name, std::fstream* stream) {
    openStream(name, std::ios::in | std::ios::out, stream);
}

void HwApi::HwApiopen(const std::string& name, std::ofstream* stream) {
    // "in" as well, although nothing is read: "out" alone would create and truncate.
    openStream(name, std::ios::in | std::ios::out, stream);
}

void HwApi::HwApiopen(const std::string& name, std::ifstream* stream) {
    openStream(name, std::ios::in, stream);
}

bool HwApi::get(bool* value, std::fstream* stream) {
    stream->seekg(0);
    *stream >> *value;
    const bool succeeded = !stream->fail();
    if (!succeeded) {
        ALOGE("Failed to read %s (%d): %s", mNames[stream].c_str(), errno, strerror(errno));
    }
    stream->clear();
    // Ends the reading where it stands: without this the next write would go out byte by byte.
    stream->rdbuf()->pubseekpos(stream->rdbuf()->pubseekoff(0, std::ios::cur));
    return succeeded;
}

bool HwApi::set(bool value, std::fstream* stream) {
    return writeNumber(value ? 1 : 0, stream);
}

bool HwApi::set(uint32_t value, std::ofstream* stream) {
    return writeNumber(value, stream);
}

bool HwApi::writeNumber(uint32_t value, std::ostream* stream) {
    const std::string text = std::to_string(value) + "\n";
    stream->write(text.data(), static_cast<std::streamsize>(text.size()));
    stream->flush();
    const bool succeeded = !stream->fail();
    if (!succeeded) {
        ALOGE("Failed to write %s (%d): %s", mNames[stream].c_str(), errno, strerror(errno));
    }
    stream->clear();
    return succeeded;
}

bool HwApi::hasAspEnable() {
    // Not by the stream's state, which every access clears: a node that was never opened stays missing.
    return mAspEnable.is_open();
}

bool HwApi::getAspEnable(bool* out) {
    return get(out, &mAspEnable);
}

bool HwApi::setAspEnable(bool value) {
    return set(value, &mAspEnable);
}

bool HwApi::setGpioFallIndex(uint32_t value) {
    return set(value, &mGpioFallIndex);
}

bool HwApi::setGpioFallScale(uint32_t value) {
    return set(value, &mGpioFallScale);
}

bool HwApi::setGpioRiseIndex(uint32_t value) {
    return set(value, &mGpioRiseIndex);
}

bool HwApi::setGpioRiseScale(uint32_t value) {
    return set(value, &mGpioRiseScale);
}

void HwApi::debug(int /*fd*/) {}

}  // namespace aidl::android::hardware::vibrator

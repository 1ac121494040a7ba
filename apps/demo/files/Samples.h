#pragma once

#include "demo/Sound.h"
#include "demo/files/ByteWriter.h"

#include <algorithm>
#include <cmath>
#include <stdexcept>

namespace qvct::demo {

/// Appends the samples as integers of the sound's width, full scale at 1.
inline void putSamples(ByteWriter& writer, const Sound& sound) {
    if (sound.bits != 16 && sound.bits != 24 && sound.bits != 32) {
        throw std::invalid_argument("cannot write samples of " + std::to_string(sound.bits) + " bits");
    }
    const double fullScale = std::ldexp(1.0, sound.bits - 1) - 1;
    for (const float sample : sound.samples) {
        const double clipped = std::clamp(static_cast<double>(sample), -1.0, 1.0);
        writer.bytes(static_cast<std::uint64_t>(std::llround(clipped * fullScale)), sound.bits / 8);
    }
}

}  // namespace qvct::demo

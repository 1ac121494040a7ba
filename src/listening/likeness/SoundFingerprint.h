#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace qvct {

/// What stays the same of a recording when its name, file format, level or sampling rate changes, when
/// silence is put before it, or when it is cut at either end: where its waveform rises or falls steepest, and
/// the phases of its partials there. Another recording of the same instrument has others.
struct SoundFingerprint {
    static constexpr std::size_t kMostLandmarks = 32;
    static constexpr double kFrameSeconds = 0.0005;

    struct Landmark {
        std::uint32_t hash = 0;  ///< Mostly the same in a copy: sounds that have one in common may be copies.
        std::uint16_t frame = 0;  ///< Half milliseconds since the sound began.

        bool operator==(const Landmark&) const = default;
    };

    std::vector<Landmark> landmarks;  ///< In order of time; none of silence.

    bool operator==(const SoundFingerprint&) const = default;
};

/// From so much on, two sounds are copies of one recording.
inline constexpr double kSharedByCopies = 0.3;

/// How many landmarks are in both of two sounds at the same distances in time, as a share of the geometric
/// mean of their numbers: 0 to 1. Hashes that differ in one or two bits count in part.
///
/// @cost  About 2 us.
double sharedPart(const SoundFingerprint& one, const SoundFingerprint& other);

}  // namespace qvct

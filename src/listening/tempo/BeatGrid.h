#pragma once

#include "listening/onsets/OnsetDetector.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

namespace qvct {

/// A tempo that a sound may have, and what speaks for it.
struct BeatGrid {
    /// Regularities and accents are values of `OnsetSpectrum`, where f is the frequency of the beats.
    enum Feature : std::size_t {
        kBeat,          ///< Regularity at f.
        kHalf,          ///< At 2 f.
        kThird,         ///< At 3 f.
        kQuick,         ///< The larger of those at 3 f and 4 f.
        kQuickest,      ///< The larger of those at 6 f and 8 f: few play that fast.
        kTwoBeats,      ///< At f / 2.
        kFourBeats,     ///< At f / 4.
        kAccentBeat,    ///< Accents at f.
        kAccentHalf,    ///< At 2 f.
        kAccentThird,   ///< At 3 f.
        kAccentFourth,  ///< At 4 f.
        kAccentTwo,     ///< At f / 2: a backbeat is less than 0.
        kAccentFour,    ///< At f / 4.
        kWhole,       ///< 1 where the sound is assumed to last a whole number of beats or half beats, else 0.
        kEven,        ///< 1 where that number is a multiple of 2.
        kWholeBars,   ///< 1 where it is a multiple of 4.
        kPowerOfTwo,  ///< 1 where it is 4, 8, 16, 32 or 64.
        kExact,       ///< 1 where the tempo that follows from it is a whole number to within a frame.
        kTail,  ///< 1 where 4, 8, 16, 32 or 64 beats end after the last onset and a tail before the sound.
        kWholeNumber,  ///< 1 where the tempo is a whole number.
        kFives,        ///< 1 where it is a multiple of 5: people like such tempos.
        kTens,         ///< 1 where it is a multiple of 10.
        kTempo,        ///< Octaves above 115 beats a minute.
        kTempoSquared,
        kFeatures
    };

    double bpm = 0;
    double beats = 0;  ///< That the sound lasts; a whole number, perhaps and a half, where it was assumed to.
    std::array<double, kFeatures> features{};

    bool isWhole() const { return features[kWhole] > 0; }

    static constexpr int kSlowest = 45, kFastest = 320;  // beats a minute

    /// The tempos worth a look: those at which the sound lasts a whole number of beats or half beats, all
    /// whole numbers, and those at which the onsets are most regular, with the grid fitted to them. At most
    /// about 650, none without an onset. Onsets in ascending order; at most 512 in the first minute count.
    static std::vector<BeatGrid> candidates(std::span<const Onset> onsets, std::int64_t frames,
                                            double sampleRate);
};

}  // namespace qvct

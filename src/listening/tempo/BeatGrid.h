#pragma once

#include <array>
#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// A tempo that a sound may have, and what speaks for it.
struct BeatGrid {
    /// Regularities are values of `OnsetSpectrum`, where f is the frequency of the beats.
    enum Feature : std::size_t {
        kBeat,        ///< At f.
        kHalf,        ///< At 2 f.
        kFinest,      ///< The larger of those at 3 f and 4 f.
        kTwoBeats,    ///< At f / 2.
        kFourBeats,   ///< At f / 4.
        kWhole,       ///< 1 where the sound lasts a whole number of beats, else 0.
        kWholeBars,   ///< 1 where that number is a multiple of 4.
        kPowerOfTwo,  ///< 1 where it is 4, 8, 16, 32 or 64.
        kTempo,       ///< Octaves above 115 beats a minute.
        kTempoSquared,
        kFeatures
    };

    double bpm = 0;
    double beats = 0;  ///< That the sound lasts; a whole number where it was assumed to.
    std::array<double, kFeatures> features{};

    static constexpr double kSlowest = 45, kFastest = 320;  // beats a minute

    /// The tempos worth a look: those at which the sound lasts a whole number of beats, and those at which
    /// the onsets are most regular, with the grid fitted to them. At most about 400, none without an onset.
    /// Times in seconds, ascending.
    static std::vector<BeatGrid> candidates(std::span<const double> onsets, double seconds);
};

}  // namespace qvct

#pragma once

#include "listening/pitch/SpectralPeaks.h"

#include <array>
#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// A candidate for the fundamental of a tone, and how well the peaks of its spectrum are that tone's
/// partials.
struct HarmonicSeries {
    /// What speaks for a candidate, where the level of a peak is the root of its amplitude over the
    /// strongest's.
    enum Feature : std::size_t {
        kLevelShare,      ///< Levels of the peaks that are partials, of those of all peaks.
        kLowLevelShare,   ///< The same of the first 8 partials.
        kEnergyShare,     ///< Like kLevelShare, of energies.
        kHarmonicSum,     ///< Levels of partials, each weighing 0.8 times the one before.
        kFundamental,     ///< Root of the level of the first partial.
        kHasFundamental,  ///< 1 or 0.
        kSecond,          ///< Level of the second partial.
        kLowest,          ///< Highest level of the first three partials.
        kGaps,            ///< Share of the first 8 partials that lack, as far as there are any above them.
        kOddShare,        ///< Levels of the odd ones of the first 10 partials, of all 10.
        kNotThirds,       ///< Levels of those of the first 11 partials that 3 does not divide, of all 11.
        kPeriodicity,     ///< Autocorrelation of the peaks at the period, by energies.
        kLevelPeriodicity,
        kOctave,  ///< Octaves above middle C.
        kFeatures
    };

    double hertz = 0;
    std::array<double, kFeatures> features{};
};

/// The candidates for the fundamental of these peaks: whole fractions, down to an eighth, of the frequencies
/// of the strongest, between 24 and 4700 Hz, ascending. At most 64.
std::vector<HarmonicSeries> harmonicSeriesOf(std::span<const SpectralPeak> peaks);

/// The fundamental by the peaks that are partials: the mean of what the first six of them say, the strongest
/// with most weight.
double refinedFundamental(std::span<const SpectralPeak> peaks, double hertz);

/// Whether a peak is a partial of a tone: 1 where it is in tune, falling to 0. Writes the partial's number, 1
/// or more.
double partialWeight(double peakHertz, double fundamental, std::size_t& number);

}  // namespace qvct

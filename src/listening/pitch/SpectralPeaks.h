#pragma once

#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// A partial of a sound.
struct SpectralPeak {
    double hertz = 0;
    double power = 0;  ///< In the units of the spectrum.
};

/// Finds the peaks of a power spectrum between two frequencies: the `most` strongest of those within
/// `rangeDb` of the strongest, ascending by frequency.
///
/// A peak exceeds two bins to either side. Its frequency and power are those of the parabola through the
/// logarithms of three bins, which for a sine under a Hann window is right to 0.02 bins.
/// `hertzPerBin` is the distance of two bins. Overwrites `peaks`.
void findPeaks(std::span<const float> powers, double hertzPerBin, double lowest, double highest,
               double rangeDb, std::size_t most, std::vector<SpectralPeak>& peaks);

}  // namespace qvct

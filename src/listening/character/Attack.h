#pragma once

#include <optional>
#include <span>

namespace qvct {

/// How a sound begins: its steepest attack, heard through a filter that favours high frequencies.
struct Attack {
    double milliseconds;  ///< in which the envelope rises by its half; 0.5 at least
    double hertz;         ///< root mean square frequency of the 20 ms after it; 20 at least

    /// Octaves above an attack of 10 ms at 1 kHz: twice as steep or twice as high is one octave harder.
    double hardness() const;
};

/// Of the samples less their mean. Nothing for silence and sounds of less than a millisecond. REQUIRES:
/// sampleRate >= 1.
///
/// @cost  15 us a second of sound.
std::optional<Attack> steepestAttack(std::span<const float> samples, float mean, double sampleRate);

}  // namespace qvct

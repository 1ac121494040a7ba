#pragma once

#include <optional>
#include <span>

namespace qvct {

/// The integrated loudness of a sound in LUFS, by EBU R 128 (ITU-R BS.1770-4): K-weighted, in blocks of 400
/// ms that overlap by three quarters, gated at -70 LUFS and at 10 LU below the mean of what is left.
///
/// A sound of less than 400 ms is measured as one block, silence after it: the loudness that a meter would
/// show for the moment in which it is played. One channel counts once, so that it measures 3 LU less than two
/// that are the same; `right` is empty then. Nothing for silence, sounds below the gate, and rates under 4
/// kHz. REQUIRES: sampleRate >= 1; `right` is empty or as long as `left`; samples finite and within 16 times
/// full scale.
///
/// @cost  About 40 us a second of each channel.
std::optional<double> integratedLoudness(std::span<const float> left, std::span<const float> right,
                                         double sampleRate);

}  // namespace qvct

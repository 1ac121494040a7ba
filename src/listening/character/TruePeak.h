#pragma once

#include <optional>
#include <span>

namespace qvct {

/// The largest value that a sound reaches between its samples too, in dB of full scale (dBTP), by ITU-R
/// BS.1770-4: four times as many samples, by a windowed sinc of 12 zeros.
///
/// What cannot become the largest by the filter's own bound is not computed, and nothing else left out.
/// `right` is empty for a sound of one channel. Nothing for silence.
///
/// @cost  10 to 150 us a second of each channel: the more samples are as loud as the loudest, the more.
std::optional<double> truePeak(std::span<const float> left, std::span<const float> right);

}  // namespace qvct

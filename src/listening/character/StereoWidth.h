#pragma once

#include <span>

namespace qvct {

/// How far the channels differ, from 0 (the same in both) to 1 (opposite): the side signal's share of the
/// energy of mid and side. 0.5 where the channels have nothing in common, or one is silent.
///
/// Both pass a filter that favours what lies above 500 Hz, since bass is heard without a direction. 0 for
/// silence. REQUIRES: sampleRate >= 1; the spans have the same length.
///
/// @cost  10 us a second of sound.
double stereoWidth(std::span<const float> left, std::span<const float> right, double sampleRate);

}  // namespace qvct

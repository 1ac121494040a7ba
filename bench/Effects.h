#pragma once

#include <vector>

namespace qvct::bench {

/// Adds white noise of a level in decibels below full scale.
void addWhiteNoise(std::vector<float>& samples, double decibels, unsigned seed = 1);
/// Adds pink noise, which has the same energy in each octave.
void addPinkNoise(std::vector<float>& samples, double decibels, unsigned seed = 1);
/// Adds a diffuse tail that begins 5 ms after each sound and falls by 60 dB in this time.
void addRoom(std::vector<float>& samples, double seconds);
/// Takes away what is above, steeply, as lossy coding does.
void lowPass(std::vector<float>& samples, double hertz);

}  // namespace qvct::bench

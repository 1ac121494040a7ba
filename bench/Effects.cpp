#include "Effects.h"

#include "Kit.h"

#include <array>
#include <cmath>
#include <numbers>
#include <random>

namespace qvct::bench {

void addWhiteNoise(std::vector<float>& samples, double decibels, unsigned seed) {
    std::mt19937 random(seed);
    std::normal_distribution<float> noise(0, static_cast<float>(std::pow(10, decibels / 20)));
    for (float& sample : samples) sample += noise(random);
}

// White noise through low-passes an octave apart, each as loud as the next: their sum falls by 3 dB an
// octave.
void addPinkNoise(std::vector<float>& samples, double decibels, unsigned seed) {
    constexpr double kLowest = 20;
    std::mt19937 random(seed);
    std::array<float, 10> bands{}, turns{}, gains{};
    for (std::size_t band = 0; band < bands.size(); ++band) {
        const double turn = 2 * std::numbers::pi * kLowest * std::exp2(double(band)) / kRate;
        turns[band] = static_cast<float>(1 - std::exp(-turn));
        gains[band] = static_cast<float>(std::sqrt(2 / turn));
    }
    std::normal_distribution<float> noise(
        0, static_cast<float>(std::pow(10, decibels / 20) / std::sqrt(double(bands.size()))));
    for (float& sample : samples) {
        for (std::size_t band = 0; band < bands.size(); ++band) {
            bands[band] += turns[band] * (noise(random) * gains[band] - bands[band]);
            sample += bands[band];
        }
    }
}

// Sparse random pulses ("velvet noise").
void addRoom(std::vector<float>& samples, double seconds) {
    std::mt19937 random(2);
    std::vector<float> wet(samples.size());
    constexpr std::size_t kSpacing = kRate / 1000;
    for (std::size_t slot = kRate / 200; slot < static_cast<std::size_t>(seconds * kRate); slot += kSpacing) {
        const std::size_t delay = slot + random() % kSpacing;
        const double gain = 0.05 * std::pow(10, -3 * double(delay) / kRate / seconds);
        const auto signedGain = static_cast<float>(random() % 2 ? gain : -gain);
        for (std::size_t i = delay; i < samples.size(); ++i) wet[i] += signedGain * samples[i - delay];
    }
    for (std::size_t i = 0; i < samples.size(); ++i) samples[i] += wet[i];
}

// A sinc of 10 ms within a Hann window; as long before a sound as after it, so that nothing moves.
void lowPass(std::vector<float>& samples, double hertz) {
    constexpr int kHalf = kRate / 200;
    std::vector<float> taps;
    for (int i = -kHalf; i <= kHalf; ++i) {
        const double x = 2 * std::numbers::pi * hertz / kRate * i;
        const double window = 0.5 + 0.5 * std::cos(std::numbers::pi * i / kHalf);
        taps.push_back(static_cast<float>((i == 0 ? 1 : std::sin(x) / x) * window * 2 * hertz / kRate));
    }
    std::vector<float> padded(samples.size() + 2 * kHalf);
    for (std::size_t i = 0; i < samples.size(); ++i) padded[i + kHalf] = samples[i];
    std::fill(samples.begin(), samples.end(), 0.0F);
    for (std::size_t k = 0; k < taps.size(); ++k) {
        for (std::size_t i = 0; i < samples.size(); ++i) samples[i] += taps[k] * padded[i + k];
    }
}

}  // namespace qvct::bench

#pragma once

#include "listening/character/SoundCharacter.h"

#include <algorithm>
#include <cmath>
#include <functional>
#include <numbers>
#include <optional>
#include <random>
#include <vector>

namespace qvct::waves {

using Samples = std::vector<float>;
using Wave = std::function<double(double)>;  // of the time in seconds

inline constexpr double kRate = 44100;

inline Samples sampled(const Wave& wave, double seconds = 0.5, double rate = kRate) {
    Samples samples;
    for (int i = 0; i < static_cast<int>(seconds * rate); ++i)
        samples.push_back(static_cast<float>(wave(i / rate)));
    return samples;
}

inline Wave sine(double hertz, double amplitude = 0.2) {
    return [=](double time) { return amplitude * std::sin(2 * std::numbers::pi * hertz * time); };
}

// A sawtooth without what a rate of 44.1 kHz cannot hold.
inline Wave sawtooth(double hertz) {
    return [=](double time) {
        double sum = 0;
        for (int k = 1; k * hertz < 10000; ++k) sum += sine(k * hertz, 0.1 / k)(time);
        return sum;
    };
}

inline Wave operator+(const Wave& one, const Wave& other) {
    return [=](double time) { return one(time) + other(time); };
}

inline Wave operator*(const Wave& one, const Wave& other) {
    return [=](double time) { return one(time) * other(time); };
}

inline Wave fadingIn(double seconds) {
    return [=](double time) { return std::min(1.0, time / seconds); };
}

inline Samples noise(unsigned seed) {
    std::mt19937 random(seed);
    std::normal_distribution<float> normal(0, 0.1F);
    Samples samples(static_cast<std::size_t>(kRate / 2));
    std::generate(samples.begin(), samples.end(), [&] { return normal(random); });
    return samples;
}

// Low-passed by 12 dB an octave.
inline Samples lowPassed(Samples samples, double hertz) {
    const auto part = static_cast<float>(1 - std::exp(-2 * std::numbers::pi * hertz / kRate));
    for (int pass = 0; pass < 2; ++pass) {
        float level = 0;
        for (float& sample : samples) sample = level += part * (sample - level);
    }
    return samples;
}

inline std::optional<SoundCharacter> characterOf(const Samples& samples, double rate = kRate) {
    CharacterMeter meter;
    return meter.measure(samples, samples, samples, rate);
}

inline Samples mixed(const Samples& one, float oneGain, const Samples& other, float otherGain) {
    Samples sum;
    for (std::size_t i = 0; i < one.size(); ++i) sum.push_back(one[i] * oneGain + other[i] * otherGain);
    return sum;
}

}  // namespace qvct::waves

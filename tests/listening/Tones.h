#pragma once

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <numbers>
#include <random>
#include <vector>

namespace qvct {

/// Adds a tone from sample `begin` on for `length` samples: partials at multiples of a frequency with the
/// given amplitudes, as far as the rate holds them, fading in and out over 5 ms.
inline void addTone(std::vector<float>& samples, std::size_t begin, std::size_t length, double rate,
                    double hertz, const std::vector<double>& amplitudes) {
    const double fade = 0.005 * rate;
    for (std::size_t i = 0; i < length && begin + i < samples.size(); ++i) {
        const auto t = static_cast<double>(i);
        double sum = 0;
        for (std::size_t p = 0; p < amplitudes.size(); ++p) {
            const double cycles = hertz * static_cast<double>(p + 1) / rate;
            if (cycles < 0.45) sum += amplitudes[p] * std::sin(2 * std::numbers::pi * cycles * t);
        }
        const double left = static_cast<double>(length - i);
        samples[begin + i] += static_cast<float>(0.2 * sum * std::min({1.0, t / fade, left / fade}));
    }
}

inline std::vector<float> toneOf(double hertz, double seconds, double rate,
                                 const std::vector<double>& amplitudes) {
    std::vector<float> samples(static_cast<std::size_t>(seconds * rate));
    addTone(samples, 0, samples.size(), rate, hertz, amplitudes);
    return samples;
}

/// White noise that falls by `decay` nepers a second.
inline std::vector<float> noiseOf(double seconds, double rate, double decay = 0) {
    std::mt19937 random(5);
    std::uniform_real_distribution<float> noise(-0.5F, 0.5F);
    std::vector<float> samples(static_cast<std::size_t>(seconds * rate));
    for (std::size_t i = 0; i < samples.size(); ++i)
        samples[i] = noise(random) * static_cast<float>(std::exp(-decay * double(i) / rate));
    return samples;
}

inline double hertzOf(double pitch) {
    return 440 * std::exp2((pitch - 69) / 12);
}

}  // namespace qvct

#include "Tones.h"
#include "listening/likeness/Fingerprinter.h"

#include <limits>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using Samples = std::vector<float>;
constexpr double kRate = 44100;

struct Partial {
    double hertz, decay, phase;
};

// A stroke on something with twelve partials, each with a frequency, a decay and a phase of its own.
Samples stroke(unsigned seed, double rate = kRate, double seconds = 0.5, double from = 0) {
    std::mt19937 random(seed);
    std::uniform_real_distribution<double> share(0, 1);
    std::vector<Partial> partials(12);
    for (Partial& each : partials)
        each = {100 * std::exp2(4.2 * share(random)), 3 + 12 * share(random),
                2 * std::numbers::pi * share(random)};
    Samples samples(static_cast<std::size_t>(seconds * rate));
    for (std::size_t i = 0; i < samples.size(); ++i) {
        const double time = from + static_cast<double>(i) / rate;
        double sum = 0;
        for (const auto& [hertz, decay, phase] : partials)
            sum += std::exp(-decay * time) * std::sin(2 * std::numbers::pi * hertz * time + phase);
        samples[i] = static_cast<float>(0.05 * sum);
    }
    return samples;
}

SoundFingerprint printOf(const Samples& samples, double rate = kRate) {
    return Fingerprinter(rate).of(samples);
}

Samples louder(Samples samples, float gain) {
    for (float& sample : samples) sample *= gain;
    return samples;
}

Samples with16Bits(Samples samples) {
    for (float& sample : samples) sample = std::round(sample * 32768) / 32768;
    return samples;
}

Samples noisy(Samples samples) {  // 30 dB below, as of a lossy format
    std::mt19937 random(3);
    std::normal_distribution<float> noise(0, 0.003F);
    for (float& sample : samples) sample += noise(random);
    return samples;
}

Samples part(const Samples& samples, double from, double end) {
    const auto at = [&](double seconds) {
        return samples.begin() + static_cast<std::ptrdiff_t>(seconds * kRate);
    };
    return {at(from), at(end)};
}

Samples delayed(const Samples& samples, double seconds) {
    Samples later(static_cast<std::size_t>(seconds * kRate), 0.0F);
    later.insert(later.end(), samples.begin(), samples.end());
    return later;
}

TEST(Fingerprinter, KnowsACopyAgain) {
    const Samples original = stroke(1);
    const SoundFingerprint print = printOf(original);
    EXPECT_GE(print.landmarks.size(), 20U);
    EXPECT_DOUBLE_EQ(sharedPart(print, print), 1);
    const struct {
        const char* how;
        SoundFingerprint copy;
        double least;
    } rows[] = {{"louder", printOf(louder(original, 2)), 1},
                {"much softer", printOf(louder(original, 0.01F)), 0.95},
                {"16 bits", printOf(with16Bits(original)), 0.95},
                {"noise", printOf(noisy(original)), 0.6},
                {"48 kHz", printOf(stroke(1, 48000), 48000), 0.8},
                {"22.05 kHz", printOf(stroke(1, 22050), 22050), 0.8},
                {"8 kHz", printOf(stroke(1, 8000), 8000), 0.6},
                {"later", printOf(delayed(original, 0.3)), 0.6},
                {"cut at the beginning", printOf(part(original, 0.03, 0.5)), 0.5},
                {"cut at the end", printOf(part(original, 0, 0.3)), 0.8},
                {"both", printOf(louder(part(original, 0.02, 0.4), 3)), 0.5}};
    for (const auto& [how, copy, least] : rows) {
        EXPECT_GE(sharedPart(print, copy), least) << how;
        EXPECT_DOUBLE_EQ(sharedPart(print, copy), sharedPart(copy, print)) << how;
    }
}

TEST(Fingerprinter, KnowsOtherSoundsApart) {
    std::vector<SoundFingerprint> prints;
    for (unsigned seed = 1; seed <= 20; ++seed) prints.push_back(printOf(stroke(seed)));
    prints.push_back(printOf(noiseOf(0.5, kRate, 8)));
    for (std::size_t i = 0; i < prints.size(); ++i) {
        for (std::size_t k = 0; k < i; ++k) EXPECT_LT(sharedPart(prints[i], prints[k]), 0.2) << i << ' ' << k;
    }
}

// The same hashes at other distances in time are another sound, and few landmarks prove little.
TEST(Fingerprinter, ComparesMomentsAndCounts) {
    SoundFingerprint one, other;
    for (std::uint16_t i = 0; i < 20; ++i) {
        one.landmarks.push_back({0x1234567U * i, static_cast<std::uint16_t>(10 * i)});
        other.landmarks.push_back({0x1234567U * i, static_cast<std::uint16_t>(60'000 + 13 * i)});
    }
    EXPECT_LE(sharedPart(one, other), 0.1);
    for (std::uint16_t i = 0; i < 20; ++i)
        other.landmarks[i].frame = static_cast<std::uint16_t>(60'000 + 10 * i);
    EXPECT_DOUBLE_EQ(sharedPart(one, other), 1);
    for (auto& landmark : other.landmarks) landmark.hash ^= 1U;  // a bit tells less
    EXPECT_NEAR(sharedPart(one, other), 0.6, 1e-9);
    for (auto& landmark : other.landmarks) landmark.hash ^= 0x80808U;
    EXPECT_LT(sharedPart(one, other), 0.1);
    one.landmarks.resize(1);
    EXPECT_LE(sharedPart(one, one), 0.2);
}

TEST(Fingerprinter, KeepsWithinBoundsWhateverTheSound) {
    Samples even(40000);  // peaks that are equally high, more than one a frame
    for (std::size_t i = 0; i < even.size(); i += 3) even[i] = 1;
    for (const double rate : {1.0, 4500.0, 8000.0, 44100.0, 64000.0}) {
        Fingerprinter fingerprinter(rate);
        EXPECT_TRUE(fingerprinter.of({}).landmarks.empty());
        EXPECT_TRUE(fingerprinter.of(Samples(1, 0.5F)).landmarks.empty());
        EXPECT_TRUE(fingerprinter.of(Samples(5000)).landmarks.empty());
        for (const Samples& samples :
             {noiseOf(40000 / rate, rate), Samples(40000, 16.0F), even, Samples(40000, 1e-38F)}) {
            const auto print = fingerprinter.of(samples);
            EXPECT_LE(print.landmarks.size(),
                      rate < Fingerprinter::kLowestRate ? 0 : SoundFingerprint::kMostLandmarks);
            for (std::size_t i = 1; i < print.landmarks.size(); ++i)
                EXPECT_LT(print.landmarks[i - 1].frame, print.landmarks[i].frame) << rate;
        }
    }
}

}  // namespace
}  // namespace qvct

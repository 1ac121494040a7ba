#include "listening/onsets/OnsetDetector.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <numbers>
#include <random>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

using Onsets = std::vector<std::int64_t>;

Onsets onsetsOf(const std::vector<float>& samples, double rate, int channels = 1,
                std::size_t blockFrames = 0) {
    OnsetDetector detector(rate, channels);
    const std::size_t block = blockFrames ? blockFrames * static_cast<std::size_t>(channels)
                                          : std::max<std::size_t>(samples.size(), 1);
    for (std::size_t at = 0; at < samples.size(); at += block) {
        detector.process(std::span(samples).subspan(at, std::min(block, samples.size() - at)));
    }
    return detector.finish();
}

// Decaying bursts of noise at the given times, in the given channels.
std::vector<float> bursts(const std::vector<double>& times, double seconds, double rate, int channels = 1) {
    std::mt19937 random(11);
    std::uniform_real_distribution<float> noise(-0.5F, 0.5F);
    std::vector<float> samples(static_cast<std::size_t>(seconds * rate) * static_cast<std::size_t>(channels));
    for (const double time : times) {
        const auto start = static_cast<std::size_t>(time * rate);
        for (std::size_t i = 0; i < static_cast<std::size_t>(0.1 * rate); ++i) {
            const float sample = noise(random) * static_cast<float>(std::exp(-50 * double(i) / rate));
            for (int c = 0; c < channels; ++c) {
                const std::size_t at =
                    (start + i) * static_cast<std::size_t>(channels) + static_cast<std::size_t>(c);
                if (at < samples.size()) samples[at] += sample;
            }
        }
    }
    return samples;
}

const std::vector<double> kTimes = {0, 0.25, 0.333, 0.5, 0.75, 0.875, 1.2};

TEST(OnsetDetector, FindsAttacksAtAnyRateAndChannelCount) {
    for (const double rate : {8000.0, 11025.0, 22050.0, 32000.0, 44100.0, 48000.0, 96000.0, 192000.0}) {
        for (const int channels : {1, 2, 6}) {
            const Onsets onsets = onsetsOf(bursts(kTimes, 1.5, rate, channels), rate, channels);
            ASSERT_EQ(onsets.size(), kTimes.size()) << rate << " Hz, " << channels;
            for (std::size_t i = 0; i < onsets.size(); ++i) {
                EXPECT_NEAR(double(onsets[i]) / rate, kTimes[i], 0.004) << rate << " Hz, " << channels;
            }
        }
    }
}

TEST(OnsetDetector, BlocksDoNotMatter) {
    const auto samples = bursts(kTimes, 1.5, 44100, 2);
    const Onsets whole = onsetsOf(samples, 44100, 2);
    for (const std::size_t block : {1U, 7U, 4095U, 5000U})
        EXPECT_EQ(onsetsOf(samples, 44100, 2, block), whole);
}

TEST(OnsetDetector, LoudnessAndOppositeChannelsDoNotMatter) {
    auto samples = bursts(kTimes, 1.5, 44100, 2);
    for (std::size_t i = 0; i < samples.size(); ++i) samples[i] *= i % 2 == 0 ? 0.03F : -0.03F;
    EXPECT_EQ(onsetsOf(samples, 44100, 2).size(), kTimes.size());
}

TEST(OnsetDetector, NothingBeginsInSilenceOffsetOrTooLittleSound) {
    EXPECT_EQ(onsetsOf({}, 44100), Onsets{});
    EXPECT_EQ(onsetsOf({1.0F}, 44100), Onsets{});
    EXPECT_EQ(onsetsOf(std::vector<float>(100000, 0.0F), 44100), Onsets{});
    EXPECT_EQ(onsetsOf(std::vector<float>(100000, 1.0F), 44100), Onsets{});
    EXPECT_EQ(onsetsOf(std::vector<float>(100001, -1.0F), 48000, 3), Onsets{});
}

TEST(OnsetDetector, TheEndOfASoundIsNoOnset) {
    std::vector<float> samples(44100);
    for (std::size_t i = 0; i < 20000; ++i) {
        samples[i + 5000] =
            static_cast<float>(0.5 * std::sin(2 * std::numbers::pi * 1000 * double(i) / 44100));
    }
    const Onsets onsets = onsetsOf(samples, 44100);
    ASSERT_EQ(onsets.size(), 1U);
    EXPECT_NEAR(double(onsets[0]), 5000, 200);
}

std::vector<float> sine(double hertz, double phase, std::size_t frames) {
    std::vector<float> samples(frames);
    for (std::size_t i = 0; i < frames; ++i) {
        const double turn = 2 * std::numbers::pi * hertz / 44100;
        samples[i] = static_cast<float>(0.5 * std::sin(turn * double(i) + phase));
    }
    return samples;
}

TEST(OnsetDetector, AnEndWithinASoundIsNoOnset) {
    for (int i = 0; i < 16; ++i) {
        const Onsets onsets = onsetsOf(sine(60 * std::pow(1.4, i), 0.4 * i, 22050), 44100);
        EXPECT_TRUE(onsets.empty() || onsets.back() < 4410) << i << ": " << onsets.back();
    }
    // A stroke shortly before the end is one nevertheless, also over the tail of another.
    EXPECT_EQ(onsetsOf(bursts({0.1, 0.34, 0.39}, 0.4, 44100), 44100).size(), 3U);
    EXPECT_EQ(onsetsOf(bursts({0}, 0.02, 44100), 44100).size(), 1U);
}

// White, or with the same energy in each octave.
std::vector<float> noise(bool pink, unsigned seed, std::size_t frames) {
    std::minstd_rand random(seed);
    std::uniform_real_distribution<float> white(-0.5F, 0.5F);
    std::vector<float> samples(frames);
    float octaves[10] = {};
    for (std::size_t i = 0; i < frames; ++i) {
        float sum = 0;
        for (int octave = 0; octave < 10; ++octave) {  // low-passes from 20 Hz to 10 kHz, equally loud
            const float turn = 0.00285F * static_cast<float>(1 << octave);
            const float share = turn / (1 + turn);
            octaves[octave] += share * (white(random) / std::sqrt(share) - octaves[octave]);
            sum += octaves[octave];
        }
        samples[i] = pink ? 0.3F * sum : white(random);
    }
    return samples;
}

TEST(OnsetDetector, NothingBeginsWithinNoise) {
    for (const bool pink : {false, true}) {
        for (unsigned seed = 1; seed <= 3; ++seed) {
            const Onsets onsets = onsetsOf(noise(pink, seed, 30 * 44100), 44100);
            EXPECT_TRUE(onsets.empty() || onsets.back() < 4410)
                << pink << ", " << seed << ": " << onsets.back();
        }
    }
}

// Strokes of sharp hiss, softer than the crash that decays below them.
TEST(OnsetDetector, SoftRideStrokesAreHeardOverACrash) {
    std::vector<float> samples = noise(true, 1, 2 * 44100);
    for (std::size_t i = 0; i < samples.size(); ++i)
        samples[i] *= static_cast<float>(std::exp(-3 * double(i) / 44100));
    const std::vector<double> times = {0.4, 0.6, 0.7, 1, 1.2, 1.5};
    std::vector<float> ride = bursts(times, 2, 44100);
    for (std::size_t i = ride.size() - 1; i > 1; --i)
        samples[i] += 0.1F * (ride[i] - 2 * ride[i - 1] + ride[i - 2]);
    const Onsets onsets = onsetsOf(samples, 44100);
    ASSERT_EQ(onsets.size(), times.size() + 1);
    for (std::size_t i = 0; i < times.size(); ++i)
        EXPECT_NEAR(double(onsets[i + 1]) / 44100, times[i], 0.005);
}

TEST(OnsetDetector, LoudnessGrowsWithTheAmplitude) {
    auto samples = bursts({0.2, 0.6, 1}, 1.4, 44100);
    for (std::size_t i = 22050; i < samples.size(); ++i) samples[i] *= i < 39690 ? 0.5F : 0.25F;
    OnsetDetector detector(44100, 1);
    detector.process(samples);
    const std::vector<Onset> onsets = detector.finishWithLoudness();
    EXPECT_EQ(framesOf(onsets), onsetsOf(samples, 44100));
    ASSERT_EQ(onsets.size(), 3U);
    EXPECT_NEAR(onsets[1].loudness / onsets[0].loudness, std::pow(0.5, 0.3), 0.05);
    EXPECT_NEAR(onsets[2].loudness / onsets[0].loudness, std::pow(0.25, 0.3), 0.05);
}

TEST(OnsetDetector, AFlamIsOneOnsetAtItsFirstStroke) {
    const Onsets onsets = onsetsOf(bursts({0.5, 0.52}, 1, 44100), 44100);
    ASSERT_EQ(onsets.size(), 1U);
    EXPECT_NEAR(double(onsets[0]) / 44100, 0.5, 0.005);
    EXPECT_EQ(onsetsOf(bursts({0.5, 0.55}, 1, 44100), 44100).size(), 2U);
}

TEST(OnsetDetector, SurvivesSamplesThatAreNoNumbersAndOddRates) {
    const float bad[] = {std::nanf(""), std::numeric_limits<float>::infinity(),
                         -std::numeric_limits<float>::infinity(), std::numeric_limits<float>::max(), 1e-42F};
    std::mt19937 random(2);
    for (const double rate : {1.0, 3.0, 100.0, 999.5, 44100.0, 768000.0, 2147483647.0}) {
        for (const int channels : {1, 2, 256}) {
            auto samples = bursts({0.1}, 0.5, 44100);
            for (int i = 0; i < 2000; ++i) samples[random() % samples.size()] = bad[i % 5];
            const Onsets onsets = onsetsOf(samples, rate, channels);
            EXPECT_TRUE(std::is_sorted(onsets.begin(), onsets.end(), std::less_equal<>()));
            const auto frames = static_cast<std::int64_t>(samples.size()) / channels;
            for (const std::int64_t onset : onsets) EXPECT_TRUE(onset >= 0 && onset < frames) << onset;
        }
    }
    // One bad sample must not deafen the detector for what follows.
    auto samples = bursts(kTimes, 1.5, 44100);
    samples[4000] = std::nanf("");
    EXPECT_GE(onsetsOf(samples, 44100).size(), kTimes.size());
}

}  // namespace
}  // namespace qvct

#include "listening/sound/SoundExcerpt.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <numbers>
#include <string>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using Samples = std::vector<float>;

// A sine of 1 kHz in the channels that have a gain; silence first.
Samples sine(double rate, const std::vector<float>& gains, double seconds, double silence = 0) {
    Samples samples;
    const auto before = static_cast<std::size_t>(silence * rate);
    const auto frames = static_cast<std::size_t>(seconds * rate);
    samples.resize(before * gains.size());
    for (std::size_t i = 0; i < frames; ++i) {
        const double phase = 2 * std::numbers::pi * 1000 * (double(i) + 0.5) / rate;
        for (const float gain : gains) samples.push_back(gain * static_cast<float>(std::sin(phase)));
    }
    return samples;
}

void fill(SoundExcerpt& excerpt, const Samples& samples, int channels, std::size_t blockFrames = 1000) {
    const std::size_t block = blockFrames * static_cast<std::size_t>(channels);
    for (std::size_t at = 0; at < samples.size(); at += block) {
        if (!excerpt.process(std::span(samples).subspan(at, std::min(block, samples.size() - at)))) break;
    }
    excerpt.finish();
}

SoundExcerpt excerptOf(const Samples& samples, double rate, int channels, double mostSeconds = 2,
                       std::size_t blockFrames = 1000) {
    SoundExcerpt excerpt(rate, channels, mostSeconds);
    fill(excerpt, samples, channels, blockFrames);
    return excerpt;
}

double rootMeanSquare(std::span<const float> samples) {
    double sum = 0;
    for (const float sample : samples) sum += double(sample) * double(sample);
    return samples.empty() ? 0 : std::sqrt(sum / double(samples.size()));
}

TEST(SoundExcerpt, KeepsLengthAndLevelAtAnyRate) {
    for (const double rate : {8000.0, 44100.0, 64000.0, 64001.0, 96000.0, 192000.0, 1e7}) {
        const SoundExcerpt excerpt = excerptOf(sine(rate, {0.5F}, 0.25), rate, 1);
        EXPECT_LE(excerpt.sampleRate(), SoundExcerpt::kHighestRate) << rate;
        EXPECT_GE(excerpt.sampleRate(), std::min(rate, 32000.0)) << rate;
        EXPECT_NEAR(excerpt.seconds(), 0.25, 1e-3) << rate;
        EXPECT_NEAR(rootMeanSquare(excerpt.mono()), 0.5 / std::numbers::sqrt2, 2e-3) << rate;
        EXPECT_FALSE(excerpt.isCut() || excerpt.isStereo()) << rate;
    }
}

TEST(SoundExcerpt, MixesChannels) {
    const struct {
        std::vector<float> gains;
        bool stereo;
        double left, right, mono;
    } cases[] = {
        {{0.5F}, false, 0.5, 0.5, 0.5},           {{0.5F, 0.5F}, false, 0.5, 0.5, 0.5},
        {{0.5F, 0.25F}, true, 0.5, 0.25, 0.375},  {{0.5F, -0.5F}, true, 0.5, 0.5, 0.5},
        {{0.25F, -0.5F}, true, 0.25, 0.5, 0.125}, {{0.2F, -0.25F}, true, 0.2, 0.25, 0.25},
        {{0, 0.5F}, true, 0, 0.5, 0.25},          {{0.6F, 0.3F, 0, 0.1F, 0}, true, 0.2, 0.2, 0.2},
    };
    for (const auto& c : cases) {
        const std::string what = ::testing::PrintToString(c.gains);
        const SoundExcerpt excerpt =
            excerptOf(sine(44100, c.gains, 0.1), 44100, static_cast<int>(c.gains.size()));
        EXPECT_EQ(excerpt.left().size(), excerpt.right().size()) << what;
        EXPECT_EQ(excerpt.left().size(), excerpt.mono().size()) << what;
        EXPECT_NEAR(rootMeanSquare(excerpt.left()) * std::numbers::sqrt2, c.left, 1e-3) << what;
        EXPECT_NEAR(rootMeanSquare(excerpt.right()) * std::numbers::sqrt2, c.right, 1e-3) << what;
        EXPECT_NEAR(rootMeanSquare(excerpt.mono()) * std::numbers::sqrt2, c.mono, 1e-3) << what;
        EXPECT_EQ(excerpt.isStereo(), c.stereo) << what;
    }
}

TEST(SoundExcerpt, BeginsWithTheSoundAndEndsWhereAsked) {
    for (const std::size_t block : {1U, 777U, 100000U}) {
        const SoundExcerpt excerpt = excerptOf(sine(44100, {0.5F, 0.1F}, 3, 1.5), 44100, 2, 2, block);
        EXPECT_EQ(excerpt.begin(), 66150);
        EXPECT_EQ(excerpt.mono().size(), 88200U);
        EXPECT_TRUE(excerpt.isCut());
    }
    const SoundExcerpt whole = excerptOf(sine(44100, {0.5F}, 2), 44100, 1);
    EXPECT_FALSE(whole.isCut());
    const SoundExcerpt late = excerptOf(sine(8000, {0.5F}, 1, SoundExcerpt::kMostSilence + 1), 8000, 1);
    EXPECT_TRUE(late.mono().empty());
    EXPECT_TRUE(late.isCut());
}

TEST(SoundExcerpt, HoldsOnlyFiniteSamplesWithinBounds) {
    const float infinite = std::numeric_limits<float>::infinity();
    const Samples samples = {0.5F, infinite, -infinite, std::nanf(""), 1e30F, -1e30F, 0.25F, 1e-30F};
    for (const int channels : {1, 2, 4, 8}) {
        for (const double rate : {1.0, 44100.0, 1e7}) {
            const SoundExcerpt excerpt = excerptOf(samples, rate, channels);
            for (const auto& channel : {excerpt.left(), excerpt.right(), excerpt.mono()}) {
                for (const float sample : channel) EXPECT_LE(std::abs(sample), 16) << rate << ' ' << channels;
            }
        }
    }
    const SoundExcerpt silence = excerptOf(Samples(1000), 44100, 2);
    EXPECT_TRUE(silence.mono().empty() && silence.left().empty() && silence.right().empty());
}

TEST(SoundExcerpt, RestartsAsIfNothingHadBeen) {
    SoundExcerpt excerpt = excerptOf(sine(96000, {0.5F, 0.1F, 0.3F}, 3, 0.5), 96000, 3);
    for (const std::vector<float>& gains : {std::vector{0.5F}, {0.5F, 0.1F}, {0.0F}, {0.5F}}) {
        const int channels = static_cast<int>(gains.size());
        const Samples samples = sine(44100, gains, 0.1, 0.02);
        excerpt.restart(44100, channels);
        fill(excerpt, samples, channels);
        const SoundExcerpt fresh = excerptOf(samples, 44100, channels);
        EXPECT_TRUE(std::ranges::equal(excerpt.left(), fresh.left()));
        EXPECT_TRUE(std::ranges::equal(excerpt.right(), fresh.right()));
        EXPECT_TRUE(std::ranges::equal(excerpt.mono(), fresh.mono()));
        EXPECT_EQ(excerpt.begin(), fresh.begin());
        EXPECT_EQ(excerpt.isStereo(), fresh.isStereo());
        EXPECT_FALSE(excerpt.isCut());
        EXPECT_EQ(excerpt.sampleRate(), 44100);
    }
}

}  // namespace
}  // namespace qvct

#include "Tones.h"
#include "listening/pitch/LoopKey.h"

#include <array>
#include <cmath>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using Mode = LoopKey::Mode;

constexpr double kRate = 11025;
const std::vector<double> kPartials = {1, 0.5, 0.3, 0.15, 0.1};

std::optional<LoopKey> keyOf(const std::vector<float>& samples, double rate = kRate) {
    LoopKeyDetector detector;
    return detector.keyOf(samples, rate);
}

// A bar of half a second for each chord: I IV V I or i iv V i, with the roots in the bass.
std::vector<float> cadence(int tonic, Mode mode, double cents = 0, double rate = kRate) {
    const auto bar = static_cast<std::size_t>(rate / 2);
    std::vector<float> samples(4 * bar);
    const int third = mode == Mode::kMajor ? 4 : 3;
    for (std::size_t i = 0; i < 4; ++i) {
        const int root = std::array{0, 5, 7, 0}[i];
        for (const int tone : {0, root == 7 ? 4 : third, 7})
            addTone(samples, i * bar, bar, rate, hertzOf(60 + (tonic + root + tone) % 12 + cents / 100),
                    kPartials);
        addTone(samples, i * bar, bar, rate, hertzOf(36 + (tonic + root) % 12 + cents / 100), kPartials);
    }
    return samples;
}

TEST(LoopKey, TellsTheTwentyFourKeys) {
    for (int tonic = 0; tonic < 12; ++tonic) {
        for (const Mode mode : {Mode::kMajor, Mode::kMinor}) {
            const auto key = keyOf(cadence(tonic, mode));
            ASSERT_TRUE(key) << tonic;
            EXPECT_EQ(key->tonic, tonic);
            EXPECT_EQ(key->mode, mode) << tonic;
            EXPECT_NEAR(key->tuning, 0, 3) << tonic;
            EXPECT_GT(key->confidence, 0.5) << tonic;
            EXPECT_LE(key->confidence, 1);
        }
    }
}

TEST(LoopKey, FollowsTheTuningOfTheLoop) {
    for (const double cents : {-45.0, -20.0, 30.0, 45.0}) {
        const auto key = keyOf(cadence(9, Mode::kMinor, cents));
        ASSERT_TRUE(key) << cents;
        EXPECT_EQ(key->tonic, 9) << cents;
        EXPECT_NEAR(key->tuning, cents, 4);
    }
}

TEST(LoopKey, RatesAndLoudnessDoNotMatter) {
    for (const double rate : {5512.0, 8000.0, 11025.0, 44100.0, 48000.0}) {
        auto samples = cadence(4, Mode::kMajor, 0, rate);
        for (float& sample : samples) sample *= 1e-3F;
        const auto key = keyOf(samples, rate);
        ASSERT_TRUE(key) << rate;
        EXPECT_EQ(key->tonic, 4) << rate;
        EXPECT_EQ(key->mode, Mode::kMajor) << rate;
    }
}

TEST(LoopKey, TellsNothingOfSilenceAndNoise) {
    EXPECT_FALSE(keyOf(noiseOf(4, kRate)));
    EXPECT_FALSE(keyOf(noiseOf(4, kRate, 5)));
    EXPECT_FALSE(keyOf(std::vector<float>(50000)));
    for (const double rate : {1.0, 50.0, 3000.0, 44100.0}) {
        EXPECT_FALSE(keyOf({}, rate));
        EXPECT_FALSE(keyOf({1.0F}, rate));
        keyOf(noiseOf(1, 44100), rate);
    }
}

}  // namespace
}  // namespace qvct

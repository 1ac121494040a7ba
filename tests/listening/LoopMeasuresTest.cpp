#include "listening/instrument/LoopMeasures.h"

#include <cmath>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

constexpr double kRate = 1000;

// Fades by that many times its level in a second.
std::vector<float> fading(double seconds, double times) {
    std::vector<float> samples(static_cast<std::size_t>(seconds * kRate));
    for (std::size_t i = 0; i < samples.size(); ++i) {
        const double at = static_cast<double>(i) / kRate;
        samples[i] = static_cast<float>((i % 2 == 0 ? 1 : -1) * std::pow(times, -at));
    }
    return samples;
}

TEST(LoopMeasures, TellHowOnsetsLieAndHowTheSoundEnds) {
    const auto even = LoopMeasures::of(fading(2, 1), kRate, std::vector<std::int64_t>{0, 500, 1000, 1200});
    EXPECT_THAT(even.values, testing::Pointwise(testing::FloatNear(1e-5F), {2.0F, 0.6F, 0.4F, 1.0F, 0.0F}));
    const auto gap = LoopMeasures::of(fading(1, 1), kRate, std::vector<std::int64_t>{700});
    EXPECT_THAT(gap.values, testing::Pointwise(testing::FloatNear(1e-5F), {0.0F, 0.7F, 0.7F, 0.0F, 0.0F}));
    const auto faded = LoopMeasures::of(fading(1, 1e9), kRate, {});
    EXPECT_THAT(faded.values, testing::Pointwise(testing::FloatNear(1e-5F), {0.0F, 0.0F, 1.0F, 0.0F, -6.0F}));
}

TEST(LoopMeasures, LoopsAreLikelyAndHitsAreNot) {
    std::vector<std::int64_t> sixteenths;
    for (int i = 0; i < 16; ++i) sixteenths.push_back(125 * i);
    EXPECT_GT(LoopMeasures::of(fading(2, 1), kRate, sixteenths).likelihood(), 0.9);
    EXPECT_LT(LoopMeasures::of(fading(0.5, 1000), kRate, std::vector<std::int64_t>{0}).likelihood(), 0.1);
}

TEST(LoopMeasures, AreFiniteForSilenceAndOnsetsOutOfPlace) {
    const std::vector<std::int64_t> odd = {-5, 7, 3, 1'000'000};
    for (const auto& samples : {std::vector<float>{}, std::vector<float>(10, 0.0F), std::vector<float>{1}}) {
        const auto measures = LoopMeasures::of(samples, 1, odd);
        for (const float value : measures.values) EXPECT_TRUE(std::isfinite(value));
        EXPECT_TRUE(measures.likelihood() >= 0 && measures.likelihood() <= 1);
    }
}

}  // namespace
}  // namespace qvct

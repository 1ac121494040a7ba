// What the measures of character are in their units, and what they do not depend on.
#include "Waves.h"

#include <algorithm>
#include <cmath>
#include <vector>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using namespace waves;

double levelOn(CharacterScale scale, const Samples& samples) {
    return (*characterOf(samples))[scale].level;
}

double width(const Samples& left, const Samples& right) {
    CharacterMeter meter;
    const auto character = meter.measure(left, right, mixed(left, 0.5F, right, 0.5F), kRate);
    return (*character)[CharacterScale::kNarrowWide].level;
}

TEST(CharacterTest, MeasuresHaveTheirUnits) {
    const auto sineMeasures = *characterOf(sampled(sine(1000), 1));
    EXPECT_NEAR(sineMeasures[CharacterScale::kLowHigh].measure, 1000, 5);
    EXPECT_NEAR(sineMeasures[CharacterScale::kSimpleComplex].measure, 1, 0.05);
    EXPECT_LT(sineMeasures[CharacterScale::kTonalNonTonal].measure, -30);
    EXPECT_LT((*characterOf(sampled(sine(50), 1)))[CharacterScale::kTonalNonTonal].measure, -30);
    // 0.5 ms at 1 kHz.
    EXPECT_NEAR(sineMeasures[CharacterScale::kSoftHard].measure, std::log2(20), 0.2);
    const auto swinging =
        *characterOf(sampled(sine(1000) * ([](double time) { return 1 + sine(70, 1)(time); }), 1));
    EXPECT_NEAR(swinging[CharacterScale::kSmoothRough].measure, 1, 0.1);
    const auto hissing =
        *characterOf(sampled(sine(9000) * ([](double time) { return 1 + sine(70, 1)(time); }), 1));
    EXPECT_LT(hissing[CharacterScale::kSmoothRough].measure, 0.2);
    // Of n exponential values the geometric mean is 2.5 dB below the arithmetic one.
    EXPECT_NEAR((*characterOf(noise(1)))[CharacterScale::kTonalNonTonal].measure, -2.5, 0.3);
    const auto three = *characterOf(sampled(sine(262) + sine(330) + sine(392)));
    EXPECT_NEAR(three[CharacterScale::kSimpleComplex].measure, 3, 0.1);
}

// A tone in the ninth band spreads down by a factor of 0.002 of energy a band, and up by 0.1.
TEST(CharacterTest, SharpnessCountsWhatBandsSpread) {
    double sum = 0, sharp = 0;
    for (int band = 0; band < 24; ++band) {
        const double loudness =
            std::pow(band < 8 ? std::pow(0.002, 8 - band) : std::pow(0.1, band - 8), 0.23);
        const double z = band + 0.5;
        sum += loudness;
        sharp += 0.11 * loudness * z * (z < 15.8 ? 1 : 0.15 * std::exp(0.42 * (z - 15.8)) + 0.85);
    }
    const auto character = *characterOf(sampled(sine(1000) * sine(0.5), 1));
    EXPECT_NEAR(character[CharacterScale::kBrightDark].measure, sharp / sum, 0.01);
}

TEST(CharacterTest, WindowsWeighByTheirAmplitude) {
    Samples sound = sampled(sine(220));
    const Samples quiet = sampled(sine(880, 0.05));
    sound.insert(sound.end(), quiet.begin(), quiet.end());
    // A quarter of the amplitude for as long, two octaves higher.
    const auto mean = [&] { return (*characterOf(sound))[CharacterScale::kLowHigh].measure; };
    const double forward = mean();
    EXPECT_NEAR(forward, 220 * std::exp2(2 * 0.25 / 1.25), 5);
    // The end counts like the beginning.
    std::reverse(sound.begin(), sound.end());
    EXPECT_NEAR(mean(), forward, 0.5);
}

TEST(CharacterTest, PanningAndDecorrelationWiden) {
    const Samples one = noise(1), other = noise(2);
    std::vector<double> widths = {width(one, one)};
    for (const float gain : {0.7F, 0.4F, 0.0F}) widths.push_back(width(one, mixed(one, gain, one, 0)));
    EXPECT_TRUE(std::is_sorted(widths.begin(), widths.end(), std::less_equal<>()))
        << testing::PrintToString(widths);
    EXPECT_EQ(widths.front(), 0);

    widths.clear();
    for (const float share : {0.1F, 0.3F, 0.6F, 1.0F})
        widths.push_back(width(one, mixed(one, 1 - share, other, share)));
    widths.push_back(width(one, mixed(one, -1, other, 0.2F)));
    EXPECT_TRUE(std::is_sorted(widths.begin(), widths.end(), std::less_equal<>()))
        << testing::PrintToString(widths);
    CharacterMeter meter;
    const auto apart = *meter.measure(one, other, one, kRate);
    EXPECT_NEAR(apart[CharacterScale::kNarrowWide].measure, 0.5, 0.02);
    // Bass alone on one side widens less than treble does.
    const Samples bass = sampled(sine(60)), treble = sampled(sine(3000)), none(bass.size());
    EXPECT_LT(width(mixed(bass, 1, treble, 1), treble), width(mixed(bass, 1, treble, 1), bass));
}

TEST(CharacterTest, LouderChangesNothing) {
    const Samples sound = mixed(sampled(sawtooth(220) * fadingIn(0.05)), 1, noise(1), 0.1F);
    const Samples other = mixed(sound, 0.7F, noise(2), 0.1F);
    CharacterMeter meter;
    const auto plain = *meter.measure(sound, other, sound, kRate);
    for (const float gain : {1e-3F, 0.1F, 0.7F, 16.0F}) {
        const Samples louder = mixed(sound, gain, sound, 0), louderOther = mixed(other, gain, other, 0);
        const auto character = *meter.measure(louder, louderOther, louder, kRate);
        for (std::size_t i = 0; i < kCharacterScales; ++i)
            EXPECT_NEAR(character.values[i].level, plain.values[i].level, 1e-4)
                << nameOf(characterScale(i)) << gain;
    }
}

// A sound is the same at another rate, with silence or an offset added, and whichever came before on the same
// meter.
TEST(CharacterTest, TheSameSoundIsTheSame) {
    const Wave wave = sawtooth(330) * fadingIn(0.02) + sine(70);
    CharacterMeter meter;
    const auto plain = *characterOf(sampled(wave));
    struct Variant {
        Samples samples;
        double rate, tolerance;
    };
    std::vector<Variant> variants = {
        {sampled(wave + [](double) { return 0.5; }), kRate, 0.002},
        // Above 11 kHz there is nothing, and near it the attack's filter favours frequencies less.
        {sampled(wave, 0.5, 22050), 22050, 0.07},
    };
    for (const double rate : {32000.0, 48000.0, 64000.0})
        variants.push_back({sampled(wave, 0.5, rate), rate, 0.03});
    for (const auto& [samples, rate, tolerance] : variants) {
        const auto character = *meter.measure(samples, samples, samples, rate);
        for (std::size_t i = 0; i < kCharacterScales; ++i)
            EXPECT_NEAR(character.values[i].level, plain.values[i].level, tolerance)
                << nameOf(characterScale(i)) << rate;
    }
}

TEST(CharacterTest, OnlyTheFirstTenSecondsCount) {
    const Samples first = sampled(sine(440), 10);
    Samples longer = first;
    longer.resize(longer.size() + 44100, 0.3F);
    const Samples hiss = noise(1);
    longer.insert(longer.end(), hiss.begin(), hiss.end());
    EXPECT_EQ(levelOn(CharacterScale::kTonalNonTonal, longer),
              levelOn(CharacterScale::kTonalNonTonal, first));
}

TEST(CharacterTest, NothingToSay) {
    CharacterMeter meter;
    const auto says = [&meter](const Samples& samples, double rate) {
        return meter.measure(samples, samples, samples, rate).has_value();
    };
    for (const double rate : {1.0, 8.0, 999.0, 2000.0, 8000.0, 44100.0, 64000.0}) {
        for (const std::size_t length : {0U, 1U, 2U, 3U, 5000U}) {
            EXPECT_FALSE(says(Samples(length, 0), rate)) << length << " " << rate;
            EXPECT_FALSE(says(Samples(length, 0.5F), rate)) << length << " " << rate;
            EXPECT_FALSE(says(Samples(length, 16), rate)) << length << " " << rate;
        }
    }
    EXPECT_FALSE(says(noise(1), 1));
    // All lengths that could end a block or a window too late.
    const Samples sound = noise(1);
    for (std::size_t length = 0; length < 10000; length = length * 5 / 4 + 1) {
        const Samples part(sound.begin(), sound.begin() + static_cast<std::ptrdiff_t>(length));
        for (const double rate : {2000.0, 2345.6, 8000.0, 44100.0, 64000.0}) {
            const auto character = meter.measure(part, part, part, rate);
            for (std::size_t i = 0; character && i < kCharacterScales; ++i) {
                EXPECT_GE(character->values[i].level, 0) << nameOf(characterScale(i)) << length;
                EXPECT_LE(character->values[i].level, 1) << nameOf(characterScale(i)) << length;
            }
        }
    }
}

// After its attack nothing moves any more: there is no frequency whose logarithm could be taken.
TEST(CharacterTest, OfASoundThatStandsStillIsFinite) {
    const Samples still = {1, 1, 1, 1, 1, 1, -1};
    CharacterMeter meter;
    const auto character = meter.measure(still, still, still, 2000);
    ASSERT_TRUE(character.has_value());
    for (const auto& value : character->values) EXPECT_TRUE(std::isfinite(value.measure));
}

TEST(CharacterScaleTest, LevelsFollowTheMeasures) {
    for (std::size_t i = 0; i < kCharacterScales; ++i) {
        const CharacterScale scale = characterScale(i);
        // "Bright" is the pole at 0, but more of its measure.
        const bool rises = scale != CharacterScale::kBrightDark;
        EXPECT_EQ(levelOf(scale, 1e9), rises ? 1 : 0) << nameOf(scale);
        EXPECT_EQ(levelOf(scale, -1e9), rises ? 0 : 1) << nameOf(scale);
        double before = levelOf(scale, -100);
        for (double measure = -99.99; measure < 300; measure += 0.01) {
            const double level = levelOf(scale, measure);
            EXPECT_TRUE(rises ? level >= before : level <= before) << nameOf(scale) << measure;
            EXPECT_LT(std::abs(level - before), 0.15) << nameOf(scale) << measure;  // no jumps
            before = level;
        }
    }
}

}  // namespace
}  // namespace qvct

// Loudness and true peak by the signals of EBU Tech 3341 and others whose levels are known.
#include "listening/character/Loudness.h"
#include "listening/character/TruePeak.h"

#include <algorithm>
#include <cmath>
#include <numbers>
#include <random>
#include <span>
#include <vector>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using Samples = std::vector<float>;

struct Part {
    double decibels, seconds;
};

Samples sine(double hertz, const std::vector<Part>& parts, double rate, double phase = 0) {
    Samples samples;
    for (const Part& part : parts) {
        const double amplitude = std::pow(10, part.decibels / 20);
        for (int i = 0; i < static_cast<int>(std::lround(part.seconds * rate)); ++i)
            samples.push_back(static_cast<float>(
                amplitude *
                std::sin(2 * std::numbers::pi * hertz * static_cast<double>(samples.size()) / rate + phase)));
    }
    return samples;
}

struct Case {
    const char* name;
    double hertz;
    std::vector<Part> parts;
    bool isStereo;
    double expected;
};

void PrintTo(const Case& tested, std::ostream* out) {
    *out << tested.name;
}

class LoudnessTest : public testing::TestWithParam<Case> {};

TEST_P(LoudnessTest, IsAsDefined) {
    const auto& [name, hertz, parts, isStereo, expected] = GetParam();
    double seconds = 0;
    for (const Part& part : parts) seconds += part.seconds;
    const std::vector<double> rates = {48000, 22050, 44100, 64000};
    for (const double rate : std::span(rates).first(seconds > 5 ? 1 : rates.size())) {
        const Samples channel = sine(hertz, parts, rate);
        const auto loudness = integratedLoudness(channel, isStereo ? channel : Samples(), rate);
        ASSERT_TRUE(loudness) << name << rate;
        EXPECT_NEAR(*loudness, expected, 0.1) << name << rate;
    }
}

INSTANTIATE_TEST_SUITE_P(
    Loudness, LoudnessTest,
    testing::Values(Case{"997 Hz", 997, {{-23, 5}}, true, -23.0},
                    Case{"1 kHz at full scale", 997, {{0, 2}}, false, -3.01},
                    Case{"case 1", 1000, {{-23, 20}}, true, -23.0},
                    Case{"case 2", 1000, {{-33, 20}}, true, -33.0},
                    Case{"case 3", 1000, {{-36, 10}, {-23, 60}, {-36, 10}}, true, -23.0},
                    Case{
                        "case 4", 1000, {{-72, 10}, {-36, 10}, {-23, 60}, {-36, 10}, {-72, 10}}, true, -23.0},
                    Case{"case 5", 1000, {{-26, 20}, {-20, 20.1}, {-26, 20}}, true, -23.0},
                    Case{"one channel", 997, {{-23, 5}}, false, -26.0},
                    // What the standard's table of coefficients for 48 kHz gives: -24.63 and -16.66.
                    Case{"bass", 50, {{-20, 5}}, true, -24.6}, Case{"treble", 6000, {{-20, 5}}, true, -16.7},
                    // As one block of 400 ms, three quarters of it silence.
                    Case{"100 ms", 1000, {{-20, 0.1}}, true, -26.0}));

TEST(LoudnessTest, BothChannelsCount) {
    const Samples channel = sine(997, {{-20, 1}}, 48000), silence(channel.size());
    EXPECT_NEAR(integratedLoudness(silence, channel, 48000).value(), -23, 0.1);
    EXPECT_NEAR(integratedLoudness(channel, silence, 48000).value(), -23, 0.1);
}

TEST(LoudnessTest, OffsetsDoNotCount) {
    Samples samples = sine(997, {{-23, 5}}, 48000);
    for (float& sample : samples) sample += 0.5F;
    // But for the step at the beginning.
    const auto loudness = integratedLoudness(samples, samples, 48000);
    EXPECT_NEAR(*loudness, -23, 0.3);
}

TEST(LoudnessTest, NothingToSay) {
    for (const double rate : {1.0, 100.0, 4000.0, 44100.0}) {
        for (const std::size_t length : {0U, 1U, 4410U, 100000U})
            EXPECT_FALSE(integratedLoudness(Samples(length), {}, rate)) << length << " " << rate;
    }
    EXPECT_FALSE(integratedLoudness(sine(997, {{-72, 2}}, 48000), {}, 48000));
    EXPECT_FALSE(integratedLoudness(Samples(1000, 0.5F), {}, 2000));
}

// Tones that come and go, whose samples miss the largest value by up to 3 dB.
TEST(TruePeakTest, LiesBetweenTheSamples) {
    constexpr double kRate = 48000;
    const double pi = std::numbers::pi;
    struct {
        double hertz, phase;
    } const tones[] = {{kRate / 4, pi / 4}, {kRate / 4, 0}, {kRate / 6, pi / 3}, {997, 0}};
    for (const auto& [hertz, phase] : tones) {
        Samples samples = sine(hertz, {{0, 0.1}}, kRate, phase);
        for (std::size_t i = 0; i < samples.size(); ++i) {
            const double place = static_cast<double>(i) / static_cast<double>(samples.size());
            samples[i] *= static_cast<float>(std::sin(pi * place));
        }
        EXPECT_NEAR(truePeak(samples, {}).value(), 0, 0.05) << hertz;
        EXPECT_EQ(truePeak(Samples(samples.size()), samples).value(), truePeak(samples, {}).value()) << hertz;
    }
}

// A pulse whose largest value lies between any two samples, at the ends and anywhere else.
TEST(TruePeakTest, IsFoundAnywhere) {
    for (std::size_t place = 0; place + 1 < 100; ++place) {
        Samples samples(100);
        samples[place] = samples[place + 1] = 0.5F;
        const double expected = 20 * std::log10(4 / std::numbers::pi / 2);  // of two sincs, halfway
        EXPECT_NEAR(truePeak(samples, {}).value(), expected, 0.2) << place;
        samples[place + 1] = -0.5F;
        EXPECT_NEAR(truePeak(samples, {}).value(), 20 * std::log10(0.5), 0.5) << place;
    }
}

// The same without passing anything over.
double plainTruePeak(const Samples& samples) {
    double peak = 0;
    const auto count = static_cast<int>(samples.size());
    for (int quarter = 0; quarter < 4 * count; ++quarter) {
        double value = 0;
        for (int at = std::max(0, quarter / 4 - 5); at < std::min(count, quarter / 4 + 7); ++at) {
            const double time = quarter / 4.0 - at;
            const double angle = std::numbers::pi * time;
            value += samples[static_cast<std::size_t>(at)] * (time == 0 ? 1 : std::sin(angle) / angle) *
                     (0.5 + 0.5 * std::cos(angle / 6));
        }
        peak = std::max(peak, std::abs(value));
    }
    return 20 * std::log10(peak);
}

TEST(TruePeakTest, NothingThatCountsIsPassedOver) {
    std::mt19937 random(1);
    std::uniform_real_distribution<float> value(-1, 1);
    for (int round = 0; round < 500; ++round) {
        Samples samples(1 + random() % 100);
        const float power = static_cast<float>(1 + round % 8);  // a few large ones among small ones
        for (float& sample : samples)
            sample = std::copysign(std::pow(std::abs(value(random)), power), value(random));
        EXPECT_NEAR(truePeak(samples, {}).value(), plainTruePeak(samples), 1e-4) << round;
    }
}

TEST(TruePeakTest, NothingToSay) {
    EXPECT_FALSE(truePeak({}, {}));
    EXPECT_FALSE(truePeak(Samples(100), Samples(100)));
    const Samples one = {0.5F};
    EXPECT_NEAR(truePeak(one, {}).value(), 20 * std::log10(0.5), 0.01);
}

}  // namespace
}  // namespace qvct

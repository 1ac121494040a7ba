#include "Tones.h"
#include "listening/pitch/NotePitch.h"

#include <cmath>

#include <gtest/gtest.h>

namespace qvct {
namespace {

const std::vector<double> kSine = {1};
const std::vector<double> kSaw = {1, 1 / 2., 1 / 3., 1 / 4., 1 / 5., 1 / 6., 1 / 7., 1 / 8., 1 / 9., 1 / 10.};
const std::vector<double> kSquare = {1, 0, 1 / 3., 0, 1 / 5., 0, 1 / 7., 0, 1 / 9.};
const std::vector<double> kNoFundamental = {0, 0.5, 1, 0.8, 0.6, 0.5, 0.4, 0.3};

std::optional<NotePitch> pitchOf(const std::vector<float>& samples, double rate) {
    NotePitchDetector detector;
    return detector.pitchOf(samples, rate);
}

void expectPitch(const std::vector<float>& samples, double rate, double pitch, const char* what) {
    const auto found = pitchOf(samples, rate);
    ASSERT_TRUE(found) << what << ' ' << pitch << " at " << rate;
    EXPECT_EQ(found->note, std::lround(pitch)) << what << ' ' << pitch << " at " << rate;
    EXPECT_NEAR(found->note + found->cents / 100, pitch, 0.03) << what << ' ' << pitch << " at " << rate;
    EXPECT_NEAR(found->hertz / hertzOf(pitch), 1, 0.002) << what;
    EXPECT_GT(found->confidence, 0.8) << what << ' ' << pitch << " at " << rate;
    EXPECT_LE(found->confidence, 1);
}

TEST(NotePitch, TellsTonesOfManyKindsFromLowToHigh) {
    struct Case {
        const char* what;
        std::vector<double> amplitudes;
        double pitch;
    };
    const Case cases[] = {
        {"sine", kSine, 69},     {"sine", kSine, 96.25},    {"saw", kSaw, 33},
        {"saw", kSaw, 45.3},     {"saw", kSaw, 60},         {"saw", kSaw, 83.7},
        {"square", kSquare, 50}, {"square", kSquare, 72.4}, {"no fundamental", kNoFundamental, 55}};
    for (const Case& c : cases)
        expectPitch(toneOf(hertzOf(c.pitch), 0.6, 44100, c.amplitudes), 44100, c.pitch, c.what);
}

TEST(NotePitch, RatesLengthsAndLoudnessDoNotMatter) {
    for (const double rate : {8000.0, 11025.0, 22050.0, 32000.0, 48000.0, 64000.0})
        expectPitch(toneOf(hertzOf(57), 0.5, rate, kSaw), rate, 57, "rate");
    for (const double seconds : {0.1, 0.25, 5.0})
        expectPitch(toneOf(hertzOf(64), seconds, 44100, kSaw), 44100, 64, "length");
    auto quiet = toneOf(hertzOf(64), 0.5, 44100, kSaw);
    for (float& sample : quiet) sample *= 1e-4F;
    expectPitch(quiet, 44100, 64, "quiet");
}

TEST(NotePitch, TheNoiseOfAnAttackAndALongSilenceAfterwardsDoNotMatter) {
    auto samples = toneOf(hertzOf(62), 0.4, 44100, kSaw);
    const auto attack = noiseOf(0.03, 44100, 100);
    for (std::size_t i = 0; i < attack.size(); ++i) samples[i] += attack[i];
    samples.resize(44100 * 4);
    expectPitch(samples, 44100, 62, "attack");
}

TEST(NotePitch, TellsNothingOfNoiseClicksSilenceAndTooLittleSound) {
    for (const double decay : {0.0, 4.0, 20.0})
        EXPECT_FALSE(pitchOf(noiseOf(0.7, 44100, decay), 44100)) << decay;
    EXPECT_FALSE(pitchOf(noiseOf(0.7, 16000), 16000));
    std::vector<float> click(30000);
    EXPECT_FALSE(pitchOf(click, 44100));
    click[100] = 1;
    EXPECT_FALSE(pitchOf(click, 44100));
    EXPECT_FALSE(pitchOf(std::vector<float>(30000, 0.5F), 44100));
    EXPECT_FALSE(pitchOf(toneOf(3000, 0.018, 44100, kSine), 44100));
    for (const double rate : {1.0, 20.0, 100.0, 44100.0, 64000.0}) {
        EXPECT_FALSE(pitchOf({}, rate));
        EXPECT_FALSE(pitchOf({0.7F}, rate));
        EXPECT_FALSE(pitchOf(noiseOf(0.5, 64000), rate)) << rate;
    }
}

TEST(NotePitch, IsLessSureOfABell) {
    // Partials in no simple ratio, as a church bell's without its tuned ones.
    std::vector<float> bell(44100);
    for (const double ratio : {1.0, 1.37, 1.83, 2.41, 3.19, 4.43, 5.71})
        addTone(bell, 0, bell.size(), 44100, 311 * ratio, {1});
    const auto pitch = pitchOf(bell, 44100);
    const auto saw = pitchOf(toneOf(311, 1, 44100, kSaw), 44100);
    ASSERT_TRUE(saw);
    EXPECT_LT(pitch ? pitch->confidence : 0, saw->confidence - 0.01);
}

}  // namespace
}  // namespace qvct

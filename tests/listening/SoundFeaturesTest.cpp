#include "listening/instrument/BandPicture.h"
#include "listening/instrument/Decimator.h"
#include "listening/instrument/EnvelopeShape.h"
#include "listening/instrument/PartialTones.h"
#include "listening/instrument/SoundFeatures.h"

#include <algorithm>
#include <cmath>
#include <functional>
#include <numbers>
#include <random>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

using Sound = std::vector<float>;
constexpr double kRate = 44100;

Sound sound(double seconds, const std::function<double(double)>& wave, double rate = kRate) {
    Sound samples(static_cast<std::size_t>(seconds * rate));
    for (std::size_t i = 0; i < samples.size(); ++i)
        samples[i] = static_cast<float>(wave(static_cast<double>(i) / rate));
    return samples;
}

double sine(double turns) {
    return std::sin(2 * std::numbers::pi * turns);
}

Sound drum(double rate = kRate) {
    std::mt19937 random(3);
    std::uniform_real_distribution<double> noise(-1, 1);
    return sound(
        0.4,
        [&](double t) {
            return 0.6 * sine(90 * t) * std::exp(-9 * t) + 0.2 * noise(random) * std::exp(-40 * t);
        },
        rate);
}

// Measures a sound with the zeros around it that a picture wants.
void show(BandPicture& picture, const Sound& samples) {
    Sound padded(picture.lead(), 0);
    padded.insert(padded.end(), samples.begin(), samples.end());
    padded.resize(padded.size() + picture.trail());
    picture.measure(padded);
}

float rms(const Sound& samples, std::size_t from) {
    float sum = 0;
    for (std::size_t i = from; i + from < samples.size(); ++i) sum += samples[i] * samples[i];
    return std::sqrt(sum / static_cast<float>(samples.size() - 2 * from));
}

TEST(Decimator, KeepsWhatIsBelowTheNewRateAndDropsTheRest) {
    const Decimator decimator(kRate, 5512);
    EXPECT_DOUBLE_EQ(decimator.sampleRate(), kRate / 8);
    const std::pair<double, double> cases[] = {
        {0.0, 1}, {100, 0.7071}, {1200, 0.7071}, {4000, 0}, {11025, 0}};
    for (const auto& [hertz, level] : cases) {
        Sound lower;
        decimator.append(sound(0.5, [h = hertz](double t) { return h == 0 ? 1 : sine(h * t); }), lower);
        EXPECT_EQ(lower.size(), (22050U + 7) / 8) << hertz;
        EXPECT_NEAR(rms(lower, 20), level, 0.02) << hertz;
    }
}

TEST(Decimator, LeavesALowRateAlone) {
    const Decimator decimator(4000, 5512);
    Sound lower = {9};
    decimator.append(Sound{1, 2}, lower);
    EXPECT_EQ(lower, (Sound{9, 1, 2}));
}

TEST(BandPicture, ShowsWhereAndWhenASoundIs) {
    const auto late = sound(0.5, [](double t) { return t < 0.3 ? 0 : sine(1000 * t); });
    BandPicture picture(kRate, 0.0116, 2, {100, 500, 900, 1200, 3000, 40'000, 50'000});
    show(picture, late);
    EXPECT_NEAR(static_cast<double>(picture.frames()) / picture.framesPerSecond(), 0.5, 0.02);
    float before = 0, after = 0, others = 0;
    for (std::size_t i = 0; i < picture.frames(); ++i) {
        const double at = static_cast<double>(i) / picture.framesPerSecond();
        if (at < 0.29)
            before = std::max(before, *std::max_element(picture.frame(i).begin(), picture.frame(i).end()));
        if (at < 0.31 || at > 0.48) continue;
        after = picture.frame(i)[2];
        for (const std::size_t band : {0U, 1U, 3U, 4U, 5U}) others = std::max(others, picture.frame(i)[band]);
    }
    EXPECT_LT(before, 1e-6F);
    EXPECT_NEAR(after, 1.5F, 0.2F);  // a window spreads a sine over three bins
    EXPECT_LT(others, 0.01F);
    EXPECT_THAT(picture.meanSpectrum(0), testing::Each(testing::Lt(1e-6F)));
    EXPECT_THAT(picture.meanSpectrum(2), testing::Contains(testing::Gt(0.1F)));
}

TEST(EnvelopeShape, TellsAttackDecayAndStrokes) {
    const auto shapeOf = [](const Sound& samples) {
        std::vector<float> values;
        EnvelopeShape::append(samples, kRate, values);
        return values;
    };
    const auto fading = [](double rise, double fall) {
        return sound(
            0.6, [=](double t) { return std::min(1.0, t / rise) * sine(3000 * t) * std::exp(-t * fall); });
    };
    const auto quick = shapeOf(fading(0.001, 40)), slow = shapeOf(fading(0.2, 40)),
               rung = shapeOf(fading(0.001, 4));
    ASSERT_EQ(quick.size(), EnvelopeShape::kValues);
    EXPECT_GT(slow[0], quick[0] + 1);  // attack
    EXPECT_GT(rung[6], quick[6] + 2);  // time to -20 dB
    EXPECT_NEAR(std::exp2(static_cast<double>(quick[6]) - 5), 20 / (40 * 8.686), 0.006);
    const auto strokes = [](std::vector<double> starts) {
        return sound(0.3, [=](double t) {
            double sum = 0;
            for (const double start : starts) sum += t < start ? 0 : std::exp(-400 * (t - start));
            return sum * sine(3000 * t);
        });
    };
    const std::size_t count = 3 + 6 + 9 + 2;
    EXPECT_EQ(shapeOf(strokes({0}))[count], 0.5F);
    EXPECT_EQ(shapeOf(strokes({0, 0.012, 0.024}))[count], 1.5F);
}

TEST(PartialTones, FindsTheFundamentalAndWhatIsHarmonic) {
    const auto tonesOf = [](const Sound& samples) {
        PartialTones tones(kRate);
        std::vector<float> values;
        tones.append(samples, values);
        EXPECT_EQ(values.size(), PartialTones::kValues);
        return values;
    };
    const auto harmonic = tonesOf(sound(1, [](double t) {
        return 0.3 * sine(220 * t) + 0.5 * sine(440 * t) + 0.3 * sine(660 * t) + 0.2 * sine(880 * t);
    }));
    EXPECT_NEAR(harmonic[0], 0, 0.02);   // the strongest partial, in octaves above 440 Hz
    EXPECT_NEAR(harmonic[1], -1, 0.02);  // the fundamental
    EXPECT_GT(harmonic[2], -0.1F);       // the harmonics' share
    std::mt19937 random(5);
    std::normal_distribution<double> noise;
    EXPECT_LT(tonesOf(sound(1, [&](double) { return noise(random); }))[2], -0.5F);
    EXPECT_EQ(tonesOf({}), std::vector<float>(PartialTones::kValues, -7));
}

TEST(SoundFeatures, LoudnessAndSilenceBeforeDoNotMatter) {
    SoundFeatures features(kRate);
    Sound loud = drum();
    loud.front() = 0;  // where it is off the middle, that is taken for an offset
    Sound quiet(1000, 0), opposite;
    for (const float sample : loud) quiet.push_back(0.05F * sample);
    for (const float sample : loud) opposite.push_back(-sample);
    const auto expected = features.of(loud);
    ASSERT_EQ(expected.size(), SoundFeatures::count());
    EXPECT_THAT(features.of(quiet), testing::Pointwise(testing::FloatNear(0.02F), expected));
    EXPECT_THAT(features.of(opposite), testing::Pointwise(testing::FloatNear(0.02F), expected));
    EXPECT_EQ(features.of(loud), expected);  // nothing is left of the sounds before
}

TEST(SoundFeatures, AnOffsetFromTheFirstSampleOnDoesNotMatter) {
    SoundFeatures features(kRate);
    Sound rest(200, 0);
    for (const float sample : drum()) rest.push_back(sample);
    rest.resize(rest.size() + 2'205);
    const auto expected = features.of(rest);
    for (const float offset : {0.02F, -0.05F}) {
        Sound shifted;
        for (const float sample : rest) shifted.push_back(sample + offset);
        EXPECT_THAT(features.of(shifted), testing::Pointwise(testing::FloatNear(0.02F), expected)) << offset;
    }
}

TEST(SoundFeatures, SayNothingOfSilence) {
    SoundFeatures features(kRate);
    for (const Sound& silence : {Sound{}, Sound(1, 0.0F), Sound(100'000, 0.0F), Sound(100, 1e-6F)})
        EXPECT_THAT(features.of(silence), testing::IsEmpty()) << silence.size();
}

TEST(SoundFeatures, AreFiniteWhateverTheSoundAndTheRate) {
    std::mt19937 random(7);
    std::uniform_real_distribution<float> noise(-16, 16);
    Sound loudest(3000);
    for (float& sample : loudest) sample = noise(random);
    Sound click(5000, 0);
    click[4999] = 1;
    const Sound cases[] = {{1}, {1, -1}, Sound(50'000, 1.0F), Sound(200'000, -16.0F), loudest, click, drum()};
    for (const double rate : {SoundFeatures::kLowestRate, 8000.0, 11'025.0, 44'100.0, 48'000.0, 64'000.0}) {
        SoundFeatures features(rate);
        for (const Sound& samples : cases) {
            const auto values = features.of(samples);
            ASSERT_EQ(values.size(), SoundFeatures::count()) << rate << " Hz, " << samples.size();
            for (const float value : values)
                ASSERT_TRUE(std::abs(value) <= 20) << rate << " Hz, " << samples.size();
        }
    }
}

TEST(SoundFeatures, HardlyDependOnTheRate) {
    const auto at = [](double rate) { return SoundFeatures(rate).of(drum(rate)); };
    const auto low = at(44'100), high = at(48'000);
    double sum = 0;
    for (std::size_t i = 0; i < low.size(); ++i) sum += static_cast<double>(std::abs(low[i] - high[i]));
    EXPECT_LT(sum / static_cast<double>(low.size()), 0.25);
}

}  // namespace
}  // namespace qvct

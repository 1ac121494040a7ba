#include "listening/Listener.h"
#include "listening/sound/SoundExcerpt.h"
#include "resources/DefaultListeningModels.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <numbers>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using Samples = std::vector<float>;
constexpr double kRate = 44100;

// Decaying tones of eight partials, one every `period` seconds.
Samples tones(double hertz, double seconds, double period) {
    Samples samples(static_cast<std::size_t>(seconds * kRate));
    for (std::size_t i = 0; i < samples.size(); ++i) {
        const double time = std::fmod(double(i) / kRate, period);
        for (int partial = 1; partial <= 8; ++partial)
            samples[i] += static_cast<float>(0.2 * std::exp(-8 * time) / partial *
                                             std::sin(2 * std::numbers::pi * hertz * partial * time));
    }
    return samples;
}

Samples interleaved(const Samples& mono, std::size_t channels) {
    Samples samples;
    for (const float sample : mono) samples.insert(samples.end(), channels, sample);
    return samples;
}

Listener& listener() {
    static Listener its(defaultListeningModels());
    return its;
}

TEST(Listener, TellsALoopFromASingleSound) {
    const HeardSound single = listener().listen(tones(220, 1, 10), kRate, 1);
    ASSERT_TRUE(single.note);
    EXPECT_EQ(single.note->number, 57);
    EXPECT_LT(single.loopConfidence.value_or(1), 0.1);
    EXPECT_FALSE(single.instruments.empty());
    EXPECT_TRUE(single.tempos.empty());

    const HeardSound loop = listener().listen(tones(220, 8, 0.5), kRate, 1);
    EXPECT_GT(loop.loopConfidence.value_or(0), 0.9);
    EXPECT_EQ(loop.onsets.size(), 16U);
    ASSERT_FALSE(loop.tempos.empty());
    EXPECT_NEAR(loop.tempos.front().bpm, 120, 0.1);
    EXPECT_FALSE(loop.note);
    EXPECT_TRUE(loop.instruments.empty());
}

TEST(Listener, SilenceBeforeALoopIsNoPartOfItUnlessItIsShort) {
    const Samples loop = tones(220, 8 * 60 / 118.0, 60 / 118.0);
    for (const double silence : {0.01, 0.7}) {
        Samples samples(static_cast<std::size_t>(silence * kRate));
        const bool isShort = silence < 0.05;
        samples.insert(samples.end(), loop.begin(),
                       loop.end() - (isShort ? std::lround(silence * kRate) : 0));
        const HeardSound heard = listener().listen(samples, kRate, 1);
        ASSERT_FALSE(heard.tempos.empty()) << silence;
        EXPECT_NEAR(heard.tempos.front().bpm, 118, 0.01) << silence;
        EXPECT_NEAR(heard.tempos.front().beats, 8, 1e-3) << silence;
    }
}

TEST(Listener, CountsBothChannelsOfWhatIsTwiceTheSame) {
    const Samples mono = tones(220, 1, 10);
    const HeardSound one = listener().listen(mono, kRate, 1);
    const HeardSound two = listener().listen(interleaved(mono, 2), kRate, 2);
    EXPECT_NEAR(*two.loudness - *one.loudness, 3.01, 0.02);
    EXPECT_NEAR(*two.truePeak, *one.truePeak, 1e-6);
    EXPECT_FALSE(two.isStereo);
    EXPECT_EQ(two.note->number, one.note->number);
}

TEST(Listener, TellsTheSameAtEveryRateThatHoldsTheSound) {
    const Samples high = interleaved(tones(220, 1, 10), 2);  // every sample twice: one channel of 88.2 kHz
    const HeardSound heard = listener().listen(high, 2 * kRate, 1);
    EXPECT_EQ(listener().excerpt().sampleRate(), kRate);
    ASSERT_TRUE(heard.note);
    EXPECT_EQ(heard.note->number, 57);
}

TEST(Listener, TellsWhatASoundIsLike) {
    const HeardSound one = listener().listen(tones(220, 1, 10), kRate, 1);
    const HeardSound loop = listener().listen(tones(220, 8, 0.5), kRate, 1);
    const HeardSound other = listener().listen(tones(900, 0.3, 10), kRate, 1);
    ASSERT_TRUE(one.likeness && other.likeness);
    ASSERT_TRUE(loop.likeness);
    EXPECT_LT(squaredDistance(*one.likeness, *loop.likeness),
              squaredDistance(*loop.likeness, *other.likeness))
        << "a loop is like its strokes";
    EXPECT_LT(squaredDistance(*loop.likeness, *listener().listen(tones(220, 12, 0.5), kRate, 1).likeness),
              squaredDistance(*one.likeness, *loop.likeness) / 4)
        << "and like a longer one";
    EXPECT_LT(squaredDistance(*one.likeness,
                              *listener().listen(interleaved(tones(220, 0.9, 10), 2), kRate, 2).likeness),
              squaredDistance(*one.likeness, *other.likeness));
    EXPECT_EQ(one.fingerprint, listener().listen(tones(220, 1, 10), kRate, 1).fingerprint);
    EXPECT_FALSE(loop.fingerprint.landmarks.empty());

    Listener withoutModels({});
    const HeardSound heard = withoutModels.listen(tones(220, 1, 10), kRate, 1);
    EXPECT_FALSE(heard.likeness);
    EXPECT_TRUE(heard.instruments.empty());
    EXPECT_EQ(heard.fingerprint, one.fingerprint);
    // Another rate than the last one's needs other tables.
    EXPECT_EQ(withoutModels.listen(tones(220, 1, 10), 32000, 1).fingerprint,
              Listener({}).listen(tones(220, 1, 10), 32000, 1).fingerprint);
}

TEST(Listener, ListensToTheBeginningOfALongSound) {
    Samples samples = tones(220, 1, 10);
    samples.resize(static_cast<std::size_t>(40 * kRate), 0.25F);
    const HeardSound heard = listener().listen(samples, kRate, 1);
    EXPECT_TRUE(heard.isCut);
    EXPECT_DOUBLE_EQ(heard.seconds, Listener::kMostSeconds);
    EXPECT_TRUE(heard.tempos.empty());
}

TEST(Listener, HasNothingToSayOfWhatIsNoSound) {
    const float infinite = std::numeric_limits<float>::infinity();
    const struct {
        const char* what;
        Samples samples;
    } rows[] = {{"nothing", {}},
                {"silence", Samples(100000)},
                {"one sample", {0.5F}},
                {"a constant", Samples(100000, 0.5F)},
                {"not finite", Samples(100000, infinite)},
                {"no number", Samples(100000, std::nanf(""))}};
    for (const auto& [what, samples] : rows) {
        for (const double rate : {1.0, 44100.0, 1e7}) {
            for (const int channels : {1, 2, 32}) {
                const HeardSound heard = listener().listen(samples, rate, channels);
                EXPECT_TRUE(heard.traits.empty()) << what << ' ' << rate << ' ' << channels;
                EXPECT_FALSE(heard.note || heard.key || heard.loopConfidence || !heard.instruments.empty() ||
                             heard.likeness || !heard.fingerprint.landmarks.empty())
                    << what << ' ' << rate << ' ' << channels;
                EXPECT_TRUE(std::isfinite(heard.loudness.value_or(0)) &&
                            std::isfinite(heard.truePeak.value_or(0)))
                    << what;
            }
        }
    }
}

}  // namespace
}  // namespace qvct

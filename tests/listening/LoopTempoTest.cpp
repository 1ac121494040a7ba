#include "listening/tempo/LoopTempo.h"

#include <cmath>
#include <cstdint>
#include <vector>

#include <gtest/gtest.h>

namespace qvct {
namespace {

constexpr double kRate = 22050;

struct Loop {
    std::vector<std::int64_t> onsets;
    std::int64_t frames;
};

// A stroke on every beat, and on the halves between the second and the third and before the first.
Loop rockBeat(double bpm, int beats, double tail = 0) {
    Loop loop;
    const double beat = 60 / bpm * kRate;
    loop.frames = std::lround(beats * beat + tail * kRate);
    for (int bar = 0; bar < beats / 4; ++bar) {
        for (const double stroke : {0.0, 1.0, 1.5, 2.0, 3.0, 3.5})
            loop.onsets.push_back(std::lround((4 * bar + stroke) * beat));
    }
    return loop;
}

LoopTempo tempoOf(const Loop& loop) {
    return LoopTempo::of(loop.onsets, loop.frames, kRate);
}

TEST(LoopTempo, TellsTheTempoOfWholeBars) {
    for (const double bpm : {84.0, 100.0, 120.0, 128.5, 140.0}) {
        for (const int bars : {1, 2, 4, 8}) {
            const LoopTempo tempo = tempoOf(rockBeat(bpm, 4 * bars));
            ASSERT_FALSE(tempo.candidates.empty());
            EXPECT_NEAR(tempo.candidates[0].bpm, bpm, 0.01) << bars;
            EXPECT_EQ(tempo.candidates[0].beats, 4 * bars) << bpm;
            EXPECT_TRUE(tempo.isWhole()) << bpm << ' ' << bars;
        }
    }
}

TEST(LoopTempo, ATailIsNotTakenForBeats) {
    for (const double bpm : {90.0, 120.0, 132.0}) {
        for (const double tail : {0.23, 0.61}) {
            const LoopTempo tempo = tempoOf(rockBeat(bpm, 16, tail));
            ASSERT_FALSE(tempo.candidates.empty());
            EXPECT_NEAR(tempo.candidates[0].bpm, bpm, 0.005 * bpm) << tail;
            EXPECT_FALSE(tempo.isWhole()) << bpm << ' ' << tail;
        }
    }
}

TEST(LoopTempo, CandidatesDifferAndTheirConfidencesDescend) {
    const LoopTempo tempo = tempoOf(rockBeat(120, 16));
    ASSERT_GE(tempo.candidates.size(), 3U);
    EXPECT_LE(tempo.candidates.size(), 5U);
    double sum = 0;
    for (std::size_t i = 0; i < tempo.candidates.size(); ++i) {
        sum += tempo.candidates[i].confidence;
        for (std::size_t k = 0; k < i; ++k) {
            EXPECT_GT(std::abs(tempo.candidates[i].bpm / tempo.candidates[k].bpm - 1), 0.009);
            EXPECT_LE(tempo.candidates[i].confidence, tempo.candidates[k].confidence);
        }
    }
    EXPECT_LE(sum, 1 + 1e-9);
    EXPECT_GT(tempo.candidates[0].confidence, 0.3);
}

TEST(LoopTempo, IsUnsureOfOneClickAndSaysNothingOfNone) {
    Loop loop = rockBeat(120, 8);
    loop.onsets = {0};
    const LoopTempo one = tempoOf(loop);
    for (const TempoCandidate& candidate : one.candidates) EXPECT_LT(candidate.confidence, 0.9);
    loop.onsets.clear();
    EXPECT_TRUE(tempoOf(loop).candidates.empty());
}

TEST(LoopTempo, OnsetsOutsideOfTheLoopDoNotCount) {
    const Loop loop = rockBeat(120, 8);
    Loop more = loop;
    more.onsets.insert(more.onsets.begin(), -4321);
    more.onsets.push_back(loop.frames);
    more.onsets.push_back(loop.frames + 1234);
    const LoopTempo tempo = tempoOf(loop), same = tempoOf(more);
    ASSERT_EQ(same.candidates.size(), tempo.candidates.size());
    for (std::size_t i = 0; i < tempo.candidates.size(); ++i) {
        EXPECT_EQ(same.candidates[i].bpm, tempo.candidates[i].bpm);
        EXPECT_EQ(same.candidates[i].confidence, tempo.candidates[i].confidence);
    }
}

TEST(LoopTempo, OddPositionsLengthsAndRatesDoNoHarm) {
    const std::vector<std::int64_t> odd = {-5, 0, 7, 7, 7, 20000, 1LL << 60};
    for (const double rate : {0.001, 1.0, 30.0, 44100.0, 64000.0}) {
        for (const std::int64_t frames : {std::int64_t{-1}, std::int64_t{0}, std::int64_t{1},
                                          std::int64_t{10}, std::int64_t{100'000}, std::int64_t{1} << 62}) {
            const LoopTempo tempo = LoopTempo::of(odd, frames, rate);
            for (const TempoCandidate& candidate : tempo.candidates) {
                EXPECT_TRUE(candidate.bpm >= 40 && candidate.bpm <= 340) << candidate.bpm;
                EXPECT_TRUE(candidate.confidence >= 0 && candidate.confidence <= 1) << rate << ' ' << frames;
            }
        }
    }
    std::vector<std::int64_t> many(1'000'000);
    for (std::size_t i = 0; i < many.size(); ++i) many[i] = static_cast<std::int64_t>(i);
    LoopTempo::of(many, 1'000'000'000, 10'000);
}

}  // namespace
}  // namespace qvct

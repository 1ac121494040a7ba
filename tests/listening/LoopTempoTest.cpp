#include "listening/tempo/BeatGrid.h"
#include "listening/tempo/LoopTempo.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <iterator>
#include <vector>

#include <gtest/gtest.h>

namespace qvct {
namespace {

constexpr double kRate = 22050;

struct Loop {
    std::vector<Onset> onsets;
    std::int64_t frames;
};

struct Beat {
    double position;  // in beats
    float loudness;
};

// A bar that is repeated.
Loop repeated(const std::vector<Beat>& bar, double beatsOfBar, double bpm, int bars, double tail = 0) {
    Loop loop;
    const double beat = 60 / bpm * kRate;
    loop.frames = std::lround(bars * beatsOfBar * beat + tail * kRate);
    for (int i = 0; i < bars; ++i) {
        for (const auto& [position, loudness] : bar)
            loop.onsets.push_back({std::lround((i * beatsOfBar + position) * beat), loudness});
    }
    return loop;
}

// A stroke on every beat, and on the halves between the second and the third and before the first.
Loop rockBeat(double bpm, int beats, double tail = 0) {
    return repeated({{0, 0.4F}, {1, 0.4F}, {1.5, 0.4F}, {2, 0.4F}, {3, 0.4F}, {3.5, 0.4F}}, 4, bpm, beats / 4,
                    tail);
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

TEST(LoopTempo, ATempoAtWhichBarsEndBeforeATailCountsForMore) {
    const struct {
        double tail, bpm;
        bool fits;
    } rows[] = {
        {0.4, 120, true},   // 16 beats, the last stroke half a beat before their end
        {0.4, 60, true},    // 8 beats
        {0.4, 90, false},   // 8 beats before the last stroke, 16 after the sound
        {0.4, 116, true},   // 16 beats in 8.28 of 8.4 s
        {0.4, 115, false},  // hardly a tail
        {0.4, 124, true},   // the last stroke is a little late
        {0.4, 125, false},  // too late
        {1.9, 120, true},   //
        {2.1, 120, false},  // no tail is that long
    };
    for (const auto& [tail, bpm, fits] : rows) {
        const Loop loop = rockBeat(120, 16, tail);
        bool isFound = false;
        for (const BeatGrid& grid : BeatGrid::candidates(loop.onsets, loop.frames, kRate)) {
            if (grid.isWhole() || grid.bpm != bpm) continue;
            isFound = true;
            EXPECT_EQ(grid.features[BeatGrid::kTail], fits ? 1 : 0) << tail << ' ' << bpm;
        }
        EXPECT_TRUE(isFound) << bpm;
    }
    for (const BeatGrid& grid :
         BeatGrid::candidates(rockBeat(120, 16).onsets, rockBeat(120, 16).frames, kRate))
        EXPECT_FALSE(grid.isWhole() && grid.features[BeatGrid::kTail] > 0) << grid.bpm;
}

TEST(LoopTempo, TellsTheTempoOfBarsThatAreNotFourBeats) {
    const std::vector<Beat> eighths = {{0, 0.5F},   {0.5, 0.3F}, {1, 0.45F},  {1.5, 0.3F}, {2, 0.45F},
                                       {2.5, 0.3F}, {3, 0.45F},  {3.5, 0.3F}, {4, 0.4F},   {4.5, 0.3F}};
    for (const double beats : {2.5, 3.0, 3.5, 5.0}) {
        std::vector<Beat> bar;
        std::copy_if(eighths.begin(), eighths.end(), std::back_inserter(bar),
                     [&](const Beat& beat) { return beat.position < beats; });
        const LoopTempo tempo = tempoOf(repeated(bar, beats, 113, 1));
        ASSERT_FALSE(tempo.candidates.empty());
        EXPECT_NEAR(tempo.candidates[0].bpm, 113, 0.01) << beats;
        EXPECT_EQ(tempo.candidates[0].beats, beats);
    }
}

TEST(LoopTempo, ABackbeatTellsWhichStrokesAreBeats) {
    constexpr float kKick = 0.3F, kSnare = 0.5F;
    const std::vector<Beat> bar = {{0, kKick}, {1, kSnare}, {2, kKick}, {3, kSnare}};
    const std::vector<Beat> twice = {{0, kKick}, {0.5, kSnare}, {1, kKick}, {1.5, kSnare}};
    const LoopTempo backbeat = tempoOf(repeated(bar, 4, 150, 4)), same = tempoOf(repeated(twice, 2, 75, 8));
    ASSERT_FALSE(backbeat.candidates.empty());
    EXPECT_NEAR(backbeat.candidates[0].bpm, 150, 0.01);
    EXPECT_NEAR(same.candidates[0].bpm, 150, 0.01) << "the same strokes";
    const std::vector<Beat> even = {{0, kSnare}, {1, kKick}, {2, kSnare}, {3, kKick}};
    EXPECT_NEAR(tempoOf(repeated(even, 4, 150, 4)).candidates[0].bpm, 75, 0.01);
}

TEST(LoopTempo, ALengthThatMakesTheTempoAWholeNumberCountsForMore) {
    // 16 beats to within a frame, and a hundredth of a second less.
    const Loop exact = rockBeat(117, 16);
    Loop shorter = exact;
    shorter.frames -= std::lround(0.01 * kRate);
    const LoopTempo its = tempoOf(exact), other = tempoOf(shorter);
    EXPECT_TRUE(its.isWhole());
    EXPECT_GT(its.candidates[0].confidence, other.candidates[0].confidence);
    EXPECT_NEAR(other.candidates[0].bpm, 117, 1);
}

TEST(LoopTempo, CandidatesDifferAndTheirConfidencesDescend) {
    for (const Loop& loop : {rockBeat(120, 16), rockBeat(97, 4, 0.4), rockBeat(143, 8, 0.77)}) {
        const LoopTempo tempo = tempoOf(loop);
        ASSERT_GE(tempo.candidates.size(), 3U);
        EXPECT_LE(tempo.candidates.size(), 5U);
        double sum = 0;
        for (std::size_t i = 0; i < tempo.candidates.size(); ++i) {
            sum += tempo.candidates[i].confidence;
            for (std::size_t k = 0; k < i; ++k) {
                EXPECT_GT(std::abs(tempo.candidates[i].bpm / tempo.candidates[k].bpm - 1), 0.0195);
                EXPECT_LE(tempo.candidates[i].confidence, tempo.candidates[k].confidence);
            }
        }
        EXPECT_LE(sum, 1 + 1e-9);
        EXPECT_GT(tempo.candidates[0].confidence, 0.3);
    }
}

TEST(LoopTempo, IsUnsureOfOneClickAndSaysNothingOfNone) {
    Loop loop = rockBeat(120, 8);
    loop.onsets = {{0, 0.4F}};
    const LoopTempo one = tempoOf(loop);
    for (const TempoCandidate& candidate : one.candidates) EXPECT_LT(candidate.confidence, 0.9);
    loop.onsets.clear();
    EXPECT_TRUE(tempoOf(loop).candidates.empty());
}

TEST(LoopTempo, OnsetsOutsideOfTheLoopDoNotCount) {
    const Loop loop = rockBeat(120, 8);
    Loop more = loop;
    more.onsets.insert(more.onsets.begin(), {-4321, 9});
    more.onsets.push_back({loop.frames, 9});
    more.onsets.push_back({loop.frames + 1234, 9});
    const LoopTempo tempo = tempoOf(loop), same = tempoOf(more);
    ASSERT_EQ(same.candidates.size(), tempo.candidates.size());
    for (std::size_t i = 0; i < tempo.candidates.size(); ++i) {
        EXPECT_EQ(same.candidates[i].bpm, tempo.candidates[i].bpm);
        EXPECT_EQ(same.candidates[i].confidence, tempo.candidates[i].confidence);
    }
}

TEST(LoopTempo, OddPositionsLengthsAndRatesDoNoHarm) {
    for (const float loudness : {0.4F, std::nanf(""), HUGE_VALF, -3.0F}) {
        const std::vector<Onset> odd = {{-5, 1},       {0, loudness}, {7, 0.3F},     {7, 0},
                                        {7, loudness}, {20000, 0.1F}, {1LL << 60, 1}};
        for (const double rate : {0.001, 1.0, 30.0, 44100.0, 64000.0}) {
            for (const std::int64_t frames :
                 {std::int64_t{-1}, std::int64_t{0}, std::int64_t{1}, std::int64_t{10}, std::int64_t{100'000},
                  std::int64_t{1} << 62}) {
                for (const TempoCandidate& candidate : LoopTempo::of(odd, frames, rate).candidates) {
                    EXPECT_TRUE(candidate.bpm >= 40 && candidate.bpm <= 340) << candidate.bpm;
                    EXPECT_TRUE(candidate.confidence >= 0 && candidate.confidence <= 1)
                        << rate << ' ' << frames;
                }
            }
        }
    }
    std::vector<Onset> many(1'000'000);
    for (std::size_t i = 0; i < many.size(); ++i) many[i].frame = static_cast<std::int64_t>(i);
    LoopTempo::of(many, 1'000'000'000, 10'000);
}

}  // namespace
}  // namespace qvct

#include "listening/rhythm/LoopRhythm.h"
#include "listening/rhythm/QVCTMidiAnalysis.h"
#include "media/midi/MidiSequence.h"
#include "support/ProcessorClock.h"

#include <chrono>
#include <cmath>
#include <limits>
#include <random>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

struct Golden {
    const char* name;
    int beats, top, bottom;
    float density, complexity;
    std::vector<double> levelScores;
    std::vector<std::pair<double, int>> notes;
};

const Golden kGolden[] = {
#include "GoldenRhythm.inc"
};

std::shared_ptr<QVCTMidiAnalysis> analysisOf(int beats, int top, int bottom,
                                             const std::vector<std::pair<double, int>>& notes) {
    const auto analysis = QVCTMidiAnalysis::initWithTempo(120, beats, top, bottom);
    for (const auto& [start, velocity] : notes) analysis->addNote({start, start + 0.1, 60, velocity});
    return analysis;
}

TEST(QVCTMidiAnalysis, AgreesWithTheGoldenValuesToTheLastBit) {
    for (const Golden& golden : kGolden) {
        SCOPED_TRACE(golden.name);
        const auto analysis = analysisOf(golden.beats, golden.top, golden.bottom, golden.notes);
        RhythmDetail detail;
        EXPECT_EQ(analysis->computeRhythmicComplexity(&detail), golden.complexity);
        EXPECT_EQ(analysis->computeRhythmicDensity(), golden.density);
        EXPECT_EQ(detail.reasonForZero.empty(), golden.complexity > 0) << detail.reasonForZero;
        ASSERT_EQ(detail.levelScores.size(), golden.levelScores.size());
        for (std::size_t i = 0; i < detail.levelScores.size(); ++i) {
            EXPECT_THAT(detail.levelScores[i],
                        testing::NanSensitiveFloatEq(static_cast<float>(golden.levelScores[i])))
                << "level " << i;
        }
    }
}

TEST(QVCTMidiAnalysis, CutsBeatsIntoHalvesAndThirds) {
    const std::pair<int, std::vector<int>> cases[] = {
        {4, {2, 2, 2, 2, 2}}, {6, {2, 3, 2, 2, 2}}, {3, {3, 2, 2, 2}}, {9, {3, 3, 2, 2, 2}}};
    for (const auto& [beats, divisions] : cases) {
        RhythmDetail detail;
        analysisOf(beats, 3, 4, {{0, 100}})->computeRhythmicComplexity(&detail);
        EXPECT_EQ(detail.divisions, divisions) << beats;
    }
}

TEST(QVCTMidiAnalysis, MeasuresNoLoopThatIsTooLong) {
    const std::string withoutTracks("MThd\0\0\0\6\0\1\0\0\0\x60", 14);
    const auto sequence = MidiSequence::parse(
        {reinterpret_cast<const std::uint8_t*>(withoutTracks.data()), withoutTracks.size()});
    ASSERT_TRUE(sequence);
    EXPECT_TRUE(notesOfFirstTrack(*sequence).empty());
    RhythmDetail detail;
    const auto analysis = analysisOf(QVCTMidiAnalysis::kLongestLoop + 4, 4, 4, {{0, 100}, {1, 90}});
    EXPECT_EQ(analysis->computeRhythmicComplexity(&detail), 0);
    EXPECT_EQ(detail.reasonForZero, "it is longer than 16384 beats");
}

TEST(QVCTMidiAnalysis, ShiftsOnlyOnce) {
    const auto analysis = analysisOf(4, 4, 4, {{8, 100}, {9, 100}});
    analysis->computeRhythmicDensity();
    analysis->addNote({9, 9.5, 60, 100});
    analysis->computeRhythmicDensity();
    EXPECT_EQ(analysis->notes()[1].startTime, 1);
    EXPECT_EQ(analysis->notes()[2].startTime, 9);
}

TEST(QVCTMidiAnalysis, PrintsTempoMetreAndNotes) {
    const auto analysis = QVCTMidiAnalysis::initWithTempo(123.456F, 4, 3, 8);
    analysis->addNote({0.123456789, 2, 61, 7});
    testing::internal::CaptureStdout();
    analysis->printNotes();
    EXPECT_EQ(testing::internal::GetCapturedStdout(),
              "\nbpm 123.46\nbeatCount 4\ntimeSigTop 3\ntimeSigBottom 8\n0.12346\n2\n61\n7\n");
}

TEST(QVCTMidiAnalysis, GivesANumberInRangeForAnyMetreAndNotes) {
    constexpr double kInfinite = std::numeric_limits<double>::infinity();
    const std::vector<std::pair<double, int>> noteSets[] = {{},
                                                            {{0, 127}},
                                                            {{-3, 1}, {1e300, 127}},
                                                            {{std::nan(""), 100}, {1, 100}, {kInfinite, 100}},
                                                            {{1, std::numeric_limits<int>::max()}, {2, -5}},
                                                            {{1, 100}, {1e18, 100}}};
    constexpr int kMost = std::numeric_limits<int>::max();
    const auto start = test::ProcessorClock::now();
    for (const auto& notes : noteSets) {
        for (const int beats : {0, 1, -1, 3, 1000, kMost, -kMost}) {
            for (const auto& [top, bottom] :
                 {std::pair{4, 4}, {0, 0}, {3, 8}, {-4, -4}, {12, kMost}, {6, 64}}) {
                const auto analysis = analysisOf(beats, top, bottom, notes);
                const float complexity = analysis->computeRhythmicComplexity();
                const float density = analysis->computeRhythmicDensity();
                EXPECT_TRUE(complexity >= 0 && complexity <= 1) << complexity;
                EXPECT_TRUE(density >= 0 && density <= 1) << density;
            }
        }
    }
    EXPECT_LT(test::ProcessorClock::now() - start, std::chrono::seconds(60));
}

}  // namespace
}  // namespace qvct

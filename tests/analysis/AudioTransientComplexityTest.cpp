#include "analysis/AudioTransientComplexity.h"
#include "analysis/QVCTMidiAnalysis.h"

#include <vector>

#include <gtest/gtest.h>

namespace qvct {
namespace {

const LoopMetre kFourBeats{120, 4, 4, 4};

TEST(AudioTransientComplexity, MeasuresOnsetsAsNotesOfEqualLoudness) {
    // 1001 frames over 4 beats: 250 frames a beat, so that frame 500 is beat 2 and frame 1000 is the next
    // loop's.
    const std::vector<std::int64_t> onsets = {0, 125, 500, 875, 1000};
    AudioTransientComplexity audio;
    ASSERT_TRUE(audio.computeRhythmicDensityAndComplexity(onsets, 1001, kFourBeats));

    const auto midi = QVCTMidiAnalysis::initWithTempo(120, 4, 4, 4);
    for (const double beat : {0.0, 0.5, 2.0, 3.5, 4.0}) midi->addNote({beat, beat, 60, 127});
    EXPECT_EQ(audio.getComplexity(), midi->computeRhythmicComplexity());
    EXPECT_EQ(audio.getDensity(), midi->computeRhythmicDensity());
    EXPECT_GT(audio.getDensity(), 0);
}

TEST(AudioTransientComplexity, KeepsTheFirstSuccess) {
    AudioTransientComplexity audio;
    ASSERT_TRUE(audio.computeRhythmicDensityAndComplexity(std::vector<std::int64_t>{0}, 400, kFourBeats));
    const float density = audio.getDensity();
    EXPECT_TRUE(audio.computeRhythmicDensityAndComplexity(std::vector<std::int64_t>{}, 0, {}));
    EXPECT_EQ(audio.getDensity(), density);
}

TEST(AudioTransientComplexity, RefusesWhatCannotBeMeasured) {
    const std::vector<std::int64_t> onsets = {0, 100};
    const LoopMetre refused[] = {{0, 4, 4, 4},   {120, 0, 4, 4}, {120, 4, 0, 4},  {120, 4, 4, 0},
                                 {120, 5, 5, 4}, {120, 7, 7, 8}, {120, -4, 4, 4}, {120, 1000, 4, 4}};
    for (const LoopMetre& metre : refused) {
        AudioTransientComplexity audio;
        EXPECT_FALSE(audio.computeRhythmicDensityAndComplexity(onsets, 400, metre)) << metre.beatCount;
        EXPECT_EQ(audio.getDensity(), 0);
    }
    AudioTransientComplexity audio;
    EXPECT_FALSE(audio.computeRhythmicDensityAndComplexity({}, 400, kFourBeats));
    EXPECT_TRUE(audio.computeRhythmicDensityAndComplexity(onsets, 400, kFourBeats))
        << "a refusal is not kept";
}

}  // namespace
}  // namespace qvct

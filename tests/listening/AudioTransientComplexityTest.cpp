#include "listening/onsets/OnsetDetector.h"
#include "listening/rhythm/AudioTransientComplexity.h"
#include "listening/rhythm/QVCTMidiAnalysis.h"
#include "media/loopfile/LCFileData.h"
#include "media/loopfile/LCFileParser.h"
#include "media/loopfile/LCFileWriter.h"
#include "support/AudioFixtures.h"
#include "support/TemporaryFolder.h"

#include <cmath>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using test::Aiff;

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

TEST(AudioTransientComplexity, AccentedNotesAreAsLoudAsTheirOnsets) {
    const std::vector<Onset> onsets = {{0, 0.1F}, {125, 0.2F}, {500, 0}, {875, 0.15F}};
    const auto equal = notesOfOnsets(framesOf(onsets), 1001, 4);
    const auto accented = accentedNotesOfOnsets(onsets, 1001, 4);
    const std::int32_t velocities[] = {64, 127, 1, 95};
    ASSERT_EQ(accented.size(), 4U);
    for (std::size_t i = 0; i < 4; ++i) {
        EXPECT_EQ(accented[i].startTime, equal[i].startTime);
        EXPECT_EQ(accented[i].velocity, velocities[i]);
    }
    EXPECT_TRUE(accentedNotesOfOnsets(onsets, 3, 4).empty()) << "no frames in a beat";
    EXPECT_EQ(accentedNotesOfOnsets({{0, 0}}, 1001, 4).at(0).velocity, 127) << "the loudest of all";
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

// Two seconds at 8000 Hz, a click every half second from the first quarter on.
std::string clicksAsAiff() {
    constexpr std::uint32_t kFrames = 16000;
    std::string sound;
    for (std::uint32_t i = 0; i < kFrames; ++i) {
        const std::uint32_t since = (i + 2000) % 4000;
        const double sample = 20000 * std::exp(-0.01 * since) * (since % 2 ? -1 : 1);
        sound += test::big(static_cast<std::uint64_t>(static_cast<int>(sample)), 2);
    }
    return Aiff::file(Aiff::common(1, kFrames, 16, Aiff::rate(8000)) +
                      Aiff::chunk("SSND", test::big(0, 8) + sound));
}

URL writeLoop(const test::TemporaryFolder& folder, const std::string& name, int top) {
    const URL url = URL::fileURLWithPath(folder.write(name, clicksAsAiff()));
    const auto data = LCFileParser::fileParserForURL(url)->fileData();
    data->setTavioLoopType(0);
    data->setBpm(120);
    data->setBeatCount(4);
    data->setSignatureTop(top);
    data->setSignatureBottom(4);
    data->setTransientMarkers({0, 2000, 16000});
    EXPECT_TRUE(LCFileWriter::fileWriterForURL(url)->writeFileData(data));
    return url;
}

TEST(AudioTransientComplexity, MeasuresALoopFileByItsSoundOrItsMarkers) {
    const test::TemporaryFolder folder;
    const URL url = writeLoop(folder, "clicks.aif", 4);
    const auto densityOf = [](std::vector<double> beats) {
        const auto midi = QVCTMidiAnalysis::initWithTempo(120, 4, 4, 4);
        for (const double beat : beats) midi->addNote({beat, beat, 60, 127});
        return midi->computeRhythmicDensity();
    };
    AudioTransientComplexity fresh;
    ASSERT_TRUE(fresh.computeRhythmicDensityAndComplexityUsingTransients(url, true));
    EXPECT_EQ(fresh.getDensity(), densityOf({0.5, 1.5, 2.5, 3.5}));
    AudioTransientComplexity stored;
    ASSERT_TRUE(stored.computeRhythmicDensityAndComplexityUsingTransients(url, false));
    EXPECT_EQ(stored.getDensity(), densityOf({0.5})) << "the markers at both edges are dropped";
}

TEST(AudioTransientComplexity, RefusesOtherExtensionsMetresAndUnreadableFiles) {
    const test::TemporaryFolder folder;
    const URL refused[] = {writeLoop(folder, "a.aiff", 4), writeLoop(folder, "b.AIF", 4),
                           writeLoop(folder, "c.aif", 5), URL::fileURLWithPath(folder.path("absent.aif")),
                           URL::fileURLWithPath(folder.write("no.caf", "caff"))};
    for (const URL& url : refused) {
        AudioTransientComplexity audio;
        EXPECT_FALSE(audio.computeRhythmicDensityAndComplexityUsingTransients(url, true)) << url.path();
    }
}

}  // namespace
}  // namespace qvct

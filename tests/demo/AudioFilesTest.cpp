#include "demo/Library.h"
#include "demo/files/AudioFiles.h"
#include "support/TemporaryFolder.h"

#include <cmath>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sndfile.hh>

// The writers are held against a reader that is not ours.
namespace qvct::demo {
namespace {

using test::TemporaryFolder;

/// Ten frames that reach both ends of the range; the channels differ.
Sound ramp(int channels, int rate, int bits) {
    Sound sound{.channels = channels, .rate = rate, .bits = bits};
    for (int frame = 0; frame < 10; ++frame) {
        for (int channel = 0; channel < channels; ++channel) {
            sound.samples.push_back(channel == 0 ? 1 - static_cast<float>(frame) / 4.5F : -1);
        }
    }
    return sound;
}

int majorFormat(const std::string& extension) {
    if (extension == "wav") return SF_FORMAT_WAV;
    return extension == "caf" ? SF_FORMAT_CAF : SF_FORMAT_AIFF;
}

int subtype(int bits) {
    if (bits == 16) return SF_FORMAT_PCM_16;
    return bits == 24 ? SF_FORMAT_PCM_24 : SF_FORMAT_PCM_32;
}

TEST(AudioFiles, HoldTheSamplesExactlyInEveryContainerWidthAndRate) {
    const TemporaryFolder folder;
    for (const std::string extension : {"wav", "aiff", "caf"}) {
        for (const int bits : {16, 24, 32}) {
            for (const int rate : {8000, 22050, 44100, 48000, 192000}) {
                const int channels = rate % 3 == 0 ? 2 : 1;
                SCOPED_TRACE(extension + " " + std::to_string(bits) + " " + std::to_string(rate));
                const Sound sound = ramp(channels, rate, bits);
                const std::string path = folder.path("sound." + extension);
                writeSound(path, sound);

                SndfileHandle file(path);
                ASSERT_EQ(file.error(), SF_ERR_NO_ERROR) << file.strError();
                EXPECT_EQ(file.frames(), 10);
                EXPECT_EQ(file.samplerate(), rate);
                EXPECT_EQ(file.channels(), channels);
                EXPECT_EQ(file.format() & SF_FORMAT_TYPEMASK, majorFormat(extension));
                EXPECT_EQ(file.format() & SF_FORMAT_SUBMASK, subtype(bits));
                std::vector<double> read(sound.samples.size());
                file.readf(read.data(), 10);
                for (std::size_t i = 0; i < read.size(); ++i) {
                    EXPECT_NEAR(read[i], sound.samples[i], 1.5 * std::ldexp(1, 1 - bits)) << "sample " << i;
                }
            }
        }
    }
}

Sound loopOfThreeBars() {
    Sound sound = ramp(1, 44100, 16);
    sound.name = "Bassline";
    sound.rootNote = 33;
    sound.mode = Mode::minor;
    sound.loop = LoopFacts{.tempo = 98.5, .beats = 9, .meterTop = 3};
    sound.markers = {{2, "Bar 2"}, {7, "Bar III"}};
    return sound;
}

TEST(AudioFiles, WavTellsTempoMeterAndRootNote) {
    const TemporaryFolder folder;
    writeWav(folder.path("loop.wav"), loopOfThreeBars());
    SndfileHandle file(folder.path("loop.wav"));

    SF_LOOP_INFO loop{};
    ASSERT_EQ(file.command(SFC_GET_LOOP_INFO, &loop, sizeof(loop)), SF_TRUE);
    EXPECT_FLOAT_EQ(loop.bpm, 98.5F);
    EXPECT_EQ(loop.num_beats, 9);
    EXPECT_EQ(loop.time_sig_num, 3);
    EXPECT_EQ(loop.time_sig_den, 4);
    EXPECT_EQ(loop.root_key, 33);
    EXPECT_STREQ(file.getString(SF_STR_TITLE), "Bassline");
}

TEST(AudioFiles, SamplerChunksLoopOverTheWholeSoundAndMarkersKeepTheirFramesAndNames) {
    const TemporaryFolder folder;
    for (const std::string extension : {"wav", "aiff"}) {
        SCOPED_TRACE(extension);
        const std::string path = folder.path("loop." + extension);
        writeSound(path, loopOfThreeBars());
        SndfileHandle file(path);
        SF_INSTRUMENT instrument{};
        ASSERT_EQ(file.command(SFC_GET_INSTRUMENT, &instrument, sizeof(instrument)), SF_TRUE);
        EXPECT_EQ(instrument.basenote, 33);
        ASSERT_EQ(instrument.loop_count, 1);
        EXPECT_EQ(instrument.loops[0].mode, SF_LOOP_FORWARD);
        EXPECT_EQ(instrument.loops[0].end, 10U);
        SF_CUES cues{};
        ASSERT_EQ(file.command(SFC_GET_CUE, &cues, sizeof(cues)), SF_TRUE);
        ASSERT_EQ(cues.cue_count, 2U) << "the two that bound the loop do not count";
        EXPECT_EQ(cues.cue_points[1].sample_offset, 7U);
        EXPECT_STREQ(cues.cue_points[1].name, "Bar III");
    }
}

TEST(AudioFiles, OneShotsSayThatTheyAreNoLoops) {
    const TemporaryFolder folder;
    Sound sound = ramp(1, 44100, 16);
    sound.rootNote = 62;
    writeWav(folder.path("one.wav"), sound);
    SndfileHandle file(folder.path("one.wav"));
    SF_LOOP_INFO loop{};
    ASSERT_EQ(file.command(SFC_GET_LOOP_INFO, &loop, sizeof(loop)), SF_TRUE);
    EXPECT_EQ(loop.loop_mode, SF_LOOP_NONE);
    EXPECT_EQ(loop.num_beats, 0);
    EXPECT_EQ(loop.root_key, 62);

    sound.rootNote.reset();
    EXPECT_THAT(wavBytes(sound), testing::Not(testing::HasSubstr("acid")));
    EXPECT_THAT(aiffBytes(sound), testing::Not(testing::HasSubstr("INST")));
}

}  // namespace
}  // namespace qvct::demo

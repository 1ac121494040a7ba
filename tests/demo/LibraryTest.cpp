#include "demo/Library.h"
#include "demo/Settings.h"
#include "support/Corpus.h"
#include "support/TemporaryFolder.h"

#include <algorithm>
#include <cmath>
#include <fstream>
#include <iterator>
#include <map>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sndfile.hh>

namespace qvct::demo {
namespace {

using test::TemporaryFolder;

/// Every file below a folder by its relative path.
std::map<std::string, std::string> contents(const TemporaryFolder& folder) {
    std::map<std::string, std::string> files;
    for (const std::string& path : test::filesBelow(folder.path())) {
        std::ifstream stream(path, std::ios::binary);
        files[path.substr(folder.path().size())] = {std::istreambuf_iterator<char>(stream), {}};
    }
    return files;
}

struct Written {
    TemporaryFolder folder;
    std::vector<std::string> items = writeLibrary(folder.path());
};

const Written& library() {
    static const Written written;
    return written;
}

TEST(DemoLibrary, IsTheSameByteForByteOnEveryRun) {
    const TemporaryFolder again;
    EXPECT_EQ(writeLibrary(again.path()), library().items);
    const auto first = contents(library().folder);
    EXPECT_TRUE(first == contents(again)) << "the files of two runs differ";
    EXPECT_THAT(library().items, testing::SizeIs(testing::Gt(45U)));
}

TEST(DemoLibrary, ItemsAreThereAndSmall) {
    std::uintmax_t total = 0;
    for (const auto& [path, bytes] : contents(library().folder)) total += bytes.size();
    EXPECT_LT(total, 9U << 20);
    for (const std::string& item : library().items) {
        EXPECT_TRUE(std::filesystem::exists(library().folder.path(item))) << item;
    }
}

TEST(DemoLibrary, WritesOverAnEarlierLibraryAndLeavesOtherFilesAlone) {
    const TemporaryFolder folder;
    folder.write("One Shots/Drums/Kick/Deep House Kick.wav", std::string(1 << 20, 'x'));
    folder.write("One Shots/mine.txt", "mine");
    writeLibrary(folder.path());
    auto files = contents(folder);
    EXPECT_EQ(files["/One Shots/mine.txt"], "mine");
    files.erase("/One Shots/mine.txt");
    EXPECT_TRUE(files == contents(library().folder));
}

TEST(DemoLibrary, NamesThePathThatItCannotWrite) {
    const TemporaryFolder folder;
    folder.write("Patches", "a file where a folder should be");
    try {
        writeLibrary(folder.path());
        FAIL() << "wrote below a file";
    } catch (const std::system_error& error) {
        EXPECT_THAT(error.what(), testing::HasSubstr(folder.path("Patches")));
    }
}

std::vector<double> samplesOf(SndfileHandle& file) {
    std::vector<double> samples(static_cast<std::size_t>(file.frames() * file.channels()));
    file.readf(samples.data(), file.frames());
    return samples;
}

TEST(DemoLibrary, EverySoundCanBeReadAndHeard) {
    for (const AudioItem& item : audioItems()) {
        SCOPED_TRACE(item.path);
        SndfileHandle file(library().folder.path(item.path));
        ASSERT_EQ(file.error(), SF_ERR_NO_ERROR) << file.strError();
        EXPECT_EQ(file.samplerate(), item.format.rate);
        EXPECT_EQ(file.channels(), item.format.channels);
        EXPECT_EQ(file.frames(), sound(item).frames());
        double peak = 0;
        double sum = 0;
        const std::vector<double> samples = samplesOf(file);
        for (const double sample : samples) {
            peak = std::max(peak, std::abs(sample));
            sum += sample;
        }
        EXPECT_NEAR(peak, 0.9, 0.01);
        EXPECT_NEAR(sum / static_cast<double>(samples.size()), 0, 0.02) << "offset from zero";
    }
}

/// The tempo that a file's name promises.
std::optional<double> namedTempo(std::string_view path) {
    const std::size_t unit = path.find("bpm");
    if (unit == std::string_view::npos) return std::nullopt;
    const std::size_t blank = path.rfind(' ', unit);
    return std::stod(std::string(path.substr(blank + 1, unit - blank - 1)));
}

TEST(DemoLibrary, LoopsLastTheBeatsOfTheTempoInTheirNames) {
    for (const AudioItem& item : audioItems()) {
        if (!item.path.starts_with("Loops/")) continue;
        SCOPED_TRACE(item.path);
        const std::optional<double> tempo = namedTempo(item.path);
        ASSERT_TRUE(tempo);
        const Sound loop = sound(item);
        ASSERT_TRUE(loop.loop);
        EXPECT_EQ(loop.loop->tempo, *tempo);
        EXPECT_EQ(loop.loop->beats % loop.loop->meterTop, 0) << "whole bars";
        EXPECT_NEAR(loop.frames(), loop.loop->beats * 60 / *tempo * loop.rate, 0.5);
    }
}

/// Seconds at which the level first passes half of its peak.
double firstBeat(const Sound& sound) {
    const auto loud = std::find_if(sound.samples.begin(), sound.samples.end(),
                                   [](float sample) { return std::abs(sample) > 0.45F; });
    return static_cast<double>(loud - sound.samples.begin()) / sound.channels / sound.rate;
}

TEST(DemoLibrary, DrumsFallOnTheStepsOfTheirGroove) {
    const Sound straight = render(DrumLoop{"Driving", Kit::house, 120, 1}, {});
    EXPECT_LT(firstBeat(straight), 0.02);
    const Sound oneDrop = render(DrumLoop{"One Drop", Kit::house, 60, 1}, {});
    EXPECT_NEAR(firstBeat(oneDrop), 2.0, 0.02) << "the drop is on the third beat";
}

/// The strength of a tone in a sound, by one bin of a Fourier transform.
double strength(const Sound& sound, double hertz) {
    double real = 0;
    double imaginary = 0;
    for (std::size_t i = 0; i < sound.samples.size(); ++i) {
        const double angle = 2 * M_PI * hertz * static_cast<double>(i) / sound.rate;
        real += sound.samples[i] * std::cos(angle);
        imaginary += sound.samples[i] * std::sin(angle);
    }
    return std::hypot(real, imaginary);
}

TEST(DemoLibrary, NotesSoundAtTheirPitch) {
    for (const Timbre timbre : {Timbre::subBass, Timbre::analogBass, Timbre::acidBass, Timbre::pluck,
                                Timbre::pad, Timbre::lead, Timbre::electricPiano, Timbre::clavinet,
                                Timbre::bell, Timbre::marimba, Timbre::koto, Timbre::voice}) {
        const Sound a = render(SynthNote{timbre, 57, 0.6}, {});
        for (const double neighbour : {207.65, 233.08}) {  // a semitone below and above
            EXPECT_GT(strength(a, 220), 3 * strength(a, neighbour)) << "timbre " << static_cast<int>(timbre);
        }
    }
}

TEST(DemoLibrary, SettingsHeadersSayTheSameInBothByteOrders) {
    const PluginIdentity identity{"MELC", "efx1", "tdly", 3};
    const std::string little = settingsBytes(identity, std::endian::little);
    const std::string big = settingsBytes(identity, std::endian::big);
    EXPECT_EQ(little.substr(12, 12), "CLEM1xfeyldt");
    EXPECT_EQ(big.substr(12, 12), "MELCefx1tdly");
    EXPECT_EQ(little.substr(6, 2), std::string("\1\3", 2));
    EXPECT_EQ(big.substr(6, 2), std::string("\0\3", 2));
    EXPECT_EQ(little.size(), big.size());
}

}  // namespace
}  // namespace qvct::demo

#include "media/midi/MidiSequence.h"
#include "support/Corpus.h"
#include "support/TemporaryFolder.h"

#include <random>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

using Bytes = std::vector<std::uint8_t>;

Bytes operator+(Bytes a, const Bytes& b) {
    a.insert(a.end(), b.begin(), b.end());
    return a;
}

Bytes bigEndian(std::size_t value, int bytes) {
    Bytes out;
    for (int shift = 8 * (bytes - 1); shift >= 0; shift -= 8)
        out.push_back(static_cast<std::uint8_t>(value >> shift));
    return out;
}

Bytes header(std::size_t format, std::size_t tracks, std::size_t division) {
    return Bytes{'M', 'T', 'h', 'd', 0, 0, 0, 6} + bigEndian(format, 2) + bigEndian(tracks, 2) +
           bigEndian(division, 2);
}

Bytes track(const Bytes& events) {
    return Bytes{'M', 'T', 'r', 'k'} + bigEndian(events.size(), 4) + events;
}

const Bytes kEnd = {0, 0xFF, 0x2F, 0};
const Bytes kTempo100 = {0, 0xFF, 0x51, 3, 0x09, 0x27, 0xC0};

/// A note as text: start, duration, channel, pitch, velocity.
std::string text(const MidiNote& note) {
    return testing::PrintToString(std::vector<double>{note.start, static_cast<double>(note.duration),
                                                      double(note.channel), double(note.pitch),
                                                      double(note.velocity)});
}

std::vector<std::string> notes(const Bytes& bytes, std::size_t number = 0) {
    const auto sequence = MidiSequence::parse(bytes);
    std::vector<std::string> all;
    if (!sequence || number >= sequence->tracks().size()) return {"no such track"};
    for (const MidiNote& note : sequence->tracks()[number].notes) all.push_back(text(note));
    return all;
}

std::string note(double start, float duration, int channel, int pitch, int velocity) {
    return text({start, duration, static_cast<std::uint8_t>(channel), static_cast<std::uint8_t>(pitch),
                 static_cast<std::uint8_t>(velocity), 0});
}

Bytes oneTrack(const Bytes& events) {
    return header(0, 1, 96) + track(events);
}

TEST(MidiSequence, PairsNotesFirstInFirstOut) {
    EXPECT_THAT(notes(oneTrack(Bytes{0,    0x90, 60, 10, 24,   60, 20, 24, 0x91, 60, 30, 24,
                                     0x90, 60,   0,  24, 0x80, 60, 64, 0,  0x80, 60, 1} +
                               kEnd)),
                testing::ElementsAre(note(0, 0.75F, 0, 60, 10), note(0.25, 0.75F, 0, 60, 20),
                                     note(0.5, 0.5F, 1, 60, 30)))
        << "the third note-off finds no open note, and the other channel's is closed by the track's end";
}

TEST(MidiSequence, ClosesOpenNotesAtTheTracksEnd) {
    const Bytes file = oneTrack(Bytes{0, 0x90, 60, 10, 96, 62, 20, 96, 0xFF, 0x2F, 0});
    EXPECT_THAT(notes(file), testing::ElementsAre(note(0, 2, 0, 60, 10), note(1, 1, 0, 62, 20)));
    EXPECT_EQ(MidiSequence::parse(file)->length(), 2);
    // The next track starts with nothing open.
    EXPECT_THAT(notes(header(2, 2, 96) + track(Bytes{0, 0x90, 60, 10} + kEnd) +
                          track(Bytes{0, 0x80, 60, 10, 0, 0x90, 60, 11} + kEnd),
                      1),
                testing::ElementsAre(note(0, 0, 0, 60, 11)));
}

TEST(MidiSequence, KeepsRunningStatusOverMetaAndSystemExclusiveEvents) {
    EXPECT_THAT(
        notes(oneTrack(Bytes{0,    0x90, 60, 9,  0, 0xFF, 1,    2, 'h',  'i', 48,   60, 0, 0,  0xF0, 2,
                             0x7E, 0xF7, 0,  62, 9, 0,    0xF7, 1, 0x40, 0,   0xF2, 1,  2, 48, 62,   0} +
                       kEnd)),
        testing::ElementsAre(note(0, 0.5F, 0, 60, 9), note(0.5, 0.5F, 0, 62, 9)));
}

TEST(MidiSequence, TellsTheTempoTrackFromTheFirstTrack) {
    const Bytes tempo = track(kTempo100 + Bytes{0x83, 0x00, 0xFF, 0x58, 4, 6, 3, 24, 8} + kEnd);
    const Bytes music = track(Bytes{0, 0x90, 60, 9, 96, 60, 0} + kEnd);
    const auto sequence = MidiSequence::parse(header(1, 2, 96) + tempo + music);
    ASSERT_EQ(sequence->tracks().size(), 1U);
    EXPECT_EQ(sequence->tracks()[0].notes.size(), 1U);
    EXPECT_NEAR(sequence->tempos().at(0).bpm, 100, 1e-9);
    EXPECT_EQ(sequence->meters().at(0).numerator, 6);
    EXPECT_EQ(sequence->meters().at(0).denominator, 8);
    EXPECT_EQ(sequence->meters().at(0).beat, 4);
    EXPECT_EQ(sequence->length(), 4);
    EXPECT_EQ(sequence->endOfNotes(), 1);
    EXPECT_TRUE(sequence->problems().empty());

    // A program change makes the first track music, and only format 1 has a tempo track.
    EXPECT_EQ(
        MidiSequence::parse(header(1, 2, 96) + track(Bytes{0, 0xC0, 5} + kEnd) + music)->tracks().size(), 2U);
    for (const std::size_t format : {0U, 2U}) {
        EXPECT_EQ(MidiSequence::parse(header(format, 2, 96) + tempo + music)->tracks().size(), 2U);
    }
    // A second track without events stays.
    EXPECT_EQ(MidiSequence::parse(header(1, 3, 96) + tempo + tempo + music)->tracks().size(), 2U);
}

TEST(MidiSequence, RoundsDurationsToSinglePrecision) {
    const auto sequence =
        MidiSequence::parse(header(0, 1, 30) + track(Bytes{0, 0x90, 60, 9, 1, 60, 0} + kEnd));
    const MidiNote& first = sequence->tracks()[0].notes[0];
    EXPECT_EQ(first.duration, 1.0F / 30);
    EXPECT_EQ(first.end(), static_cast<double>(1.0F / 30));
    EXPECT_NE(first.end(), 1.0 / 30);
}

TEST(MidiSequence, PutsSmpteTimeIntoBeatsByTheTempo) {
    // 25 frames of 40 ticks: 1000 ticks a second. 120 a minute for half a second, then 100.
    const auto file = header(0, 1, 0xE728) + track(Bytes{0x83, 0x74, 0xFF, 0x51, 3, 0x09, 0x27, 0xC0, 0x84,
                                                         0x58, 0x90, 60, 9, 0x84, 0x58, 60, 0} +
                                                   kEnd);
    EXPECT_THAT(notes(file), testing::ElementsAre(note(2, 1, 0, 60, 9)));
}

TEST(MidiSequence, ReadsWhatADamagedTrackStillHolds) {
    const Bytes whole = {0, 0x90, 60, 9, 96, 60, 0};
    struct {
        const char* name;
        Bytes rest;
    } const cases[] = {
        {"variable-length number without an end", {0x80, 0x80, 0x80, 0x80, 0x80, 0x80, 0x00}},
        {"event cut off", {0, 0x90, 60}},
        {"status byte as data", {0, 0x90, 60, 0x91}},
        {"meta event longer than the track", {0, 0xFF, 1, 0xFF, 0xFF, 0xFF, 0x7F}},
        {"no end event", {}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        const auto sequence = MidiSequence::parse(oneTrack(whole + c.rest));
        ASSERT_TRUE(sequence);
        EXPECT_GE(sequence->tracks().at(0).notes.size(), 1U);
        EXPECT_EQ(text(sequence->tracks()[0].notes[0]), note(0, 1, 0, 60, 9));
        EXPECT_EQ(sequence->problems().size(), 1U);
    }
    Bytes crowded = header(1, 1000, 96);
    for (int i = 0; i < 1000; ++i) crowded = std::move(crowded) + track({0, 60, 9});
    EXPECT_EQ(MidiSequence::parse(crowded)->problems().size(), 32U);
    const auto coarse = header(0, 1, 1) + track(Bytes{2, 0x90, 60, 9, 3, 60, 0} + kEnd);
    EXPECT_THAT(notes(coarse), testing::ElementsAre(note(2, 3, 0, 60, 9))) << "ticks as long as a quarter";
    const auto stray = MidiSequence::parse(oneTrack({0, 60, 9}));
    ASSERT_EQ(stray->problems().size(), 1U);
    EXPECT_THAT(stray->problems()[0].message(), testing::StartsWith("byte 24: a data byte without"));

    Bytes truncated = oneTrack(whole + kEnd);
    truncated.resize(truncated.size() - 5);
    EXPECT_THAT(notes(truncated), testing::ElementsAre(note(0, 1, 0, 60, 9)));
}

TEST(MidiSequence, RefusesHeadersThatGiveTimeNoUnit) {
    const Bytes music = track(Bytes{0, 0x90, 60, 9} + kEnd);
    struct {
        Bytes bytes;
        const char* reason;
    } const cases[] = {{{}, "header"},
                       {Bytes{'M', 'T', 'h', 'd'}, "header"},
                       {Bytes{'R', 'I', 'F', 'F'} + Bytes(20, 0), "no standard MIDI file header"},
                       {header(0, 1, 0) + music, "division of 0"},
                       {header(0, 1, 0xE700) + music, "division of 0"},
                       {header(3, 1, 96) + music, "format 3"}};
    for (const auto& c : cases) {
        Error error;
        EXPECT_FALSE(MidiSequence::parse(c.bytes, &error));
        EXPECT_THAT(error.message(), testing::HasSubstr(c.reason));
    }
    Error error;
    EXPECT_FALSE(MidiSequence::parse(Bytes(MidiSequence::kLargestFile + 1), &error));
    EXPECT_EQ(error.code, kErrorTooLarge);
    EXPECT_FALSE(MidiSequence::read("/no/such file.mid", &error));
    EXPECT_THAT(error.message(), testing::HasSubstr("/no/such file.mid"));
}

TEST(MidiSequence, SurvivesManyTracksAndFalseCounts) {
    const Bytes music = track(Bytes{0, 0x90, 60, 9} + kEnd);
    const auto announced = MidiSequence::parse(header(1, 65535, 96) + music);
    EXPECT_EQ(announced->tracks().size(), 1U);
    ASSERT_EQ(announced->problems().size(), 1U);
    EXPECT_EQ(announced->problems()[0].message(), "byte 10: 65535 tracks announced, 1 found");

    const auto foreign =
        MidiSequence::parse(header(0, 1, 96) + Bytes{'M', 'i', 'n', 'e', 0, 0, 0, 1, 0} + music);
    EXPECT_EQ(foreign->tracks().size(), 1U);
    EXPECT_THAT(foreign->problems(), testing::IsEmpty());

    Bytes many = header(1, 65535, 96);
    many.reserve(many.size() + 65536 * music.size());
    for (int i = 0; i < 65536; ++i) many.insert(many.end(), music.begin(), music.end());
    EXPECT_EQ(MidiSequence::parse(many)->tracks().size(), 65535U);
}

TEST(MidiSequence, SurvivesEveryCutAndManyFlippedBytes) {
    const Bytes file = header(1, 2, 0xE728) + track(kTempo100 + Bytes{0, 0xFF, 0x58, 4, 3, 2, 24, 8} + kEnd) +
                       track(Bytes{0, 0x90, 60, 9, 96, 60, 0, 0, 0xF0, 2, 1, 0xF7} + kEnd);
    for (std::size_t size = 0; size < file.size(); ++size) {
        MidiSequence::parse(Bytes(file.begin(), file.begin() + static_cast<std::ptrdiff_t>(size)));
    }
    std::mt19937 random(5);
    for (int round = 0; round < 20000; ++round) {
        Bytes broken = file;
        for (int i = 0; i < 3; ++i) broken[random() % broken.size()] = static_cast<std::uint8_t>(random());
        const auto sequence = MidiSequence::parse(broken);
        if (!sequence) continue;
        for (const MidiTrack& part : sequence->tracks()) {
            for (const MidiNote& each : part.notes) {
                ASSERT_TRUE(each.start >= 0 && each.duration >= 0 && each.start < 1e300) << round;
            }
        }
    }
}

TEST(MidiSequence, ReadsEveryFileOfTheCorpusOrSaysWhyNot) {
    const auto folder = test::corpus("midi");
    QVCT_SKIP_WITHOUT(folder);
    std::vector<std::string> refused, damaged;
    for (const std::string& path : test::filesBelow(folder)) {
        if (!path.ends_with(".mid")) continue;
        Error error;
        const auto sequence = MidiSequence::read(path, &error);
        const std::string name = std::filesystem::path(path).filename();
        if (!sequence) {
            refused.push_back(name);
            EXPECT_EQ(error.path, path);
        } else if (!sequence->problems().empty()) {
            damaged.push_back(name);
        }
    }
    EXPECT_THAT(refused, testing::UnorderedElementsAre("test-empty-file.mid", "test-not-a-midi-file.mid"));
    EXPECT_THAT(damaged, testing::Contains("test-corrupt-file-missing-byte.mid"));
    EXPECT_THAT(damaged, testing::Not(testing::Contains(testing::HasSubstr("drummer"))));

    const auto scale = MidiSequence::read((folder / "test-files/test-running-status-metaevent.mid").string());
    ASSERT_TRUE(scale);
    std::vector<int> pitches;
    for (const MidiNote& each : scale->tracks().at(0).notes) pitches.push_back(each.pitch);
    EXPECT_THAT(pitches, testing::ElementsAre(60, 62, 64, 65, 67, 69, 71, 72));
}

}  // namespace
}  // namespace qvct

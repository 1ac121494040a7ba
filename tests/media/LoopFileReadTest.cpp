#include "media/loopfile/LCFileParser.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/reading/RandomAccessReader.h"
#include "support/AudioFixtures.h"
#include "taxonomy/TaggingTypes.h"

#include <cstring>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

using test::Aiff;
using test::big;
using test::Caf;
using test::Wav;
using testing::ElementsAre;
using testing::HasSubstr;

std::shared_ptr<LCFileParser> parserOf(const std::string& bytes, unsigned types = kLCAllAudio,
                                       const std::string& name = "/s/file") {
    return LCFileParser::fileParserForBytes(
        {reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size()}, name, types);
}

TEST(LoopFileRead, TakesTheMusicOfWavFilesFromTheChunksOfOthersInBothByteOrders) {
    for (const char* magic : {"RIFF", "RIFX"}) {
        const Wav wav{magic};
        const std::string info =
            "INFO" + wav.chunk("IART", "abc") + wav.chunk("INAM", "Caf\xE9 Loop") + wav.chunk("ICMT", "x");
        const std::string file =
            wav.file(wav.format() + wav.chunk("inst", "\x30\x01\x02\x03\x04\x05\x06") + wav.data() +
                     wav.cues({700, 30, 700, 5000}) + wav.chunk("LIST", info) + wav.acid(2, 57, 3, 92.5F));
        const auto data = parserOf(file)->fileData();
        ASSERT_TRUE(data) << magic;
        EXPECT_EQ(data->tavioLoopType(), 0);
        EXPECT_TRUE(data->hasLoopTypeChunks());
        EXPECT_TRUE(data->hasAuthoredChunks());
        EXPECT_EQ(data->beatCount(), 3);
        EXPECT_EQ(data->midiRootNote(), 57);
        EXPECT_EQ(data->signatureTop(), 3);
        EXPECT_EQ(data->signatureBottom(), 4);
        EXPECT_EQ(data->bpm(), 92.5F);
        EXPECT_EQ(data->displayName(), "Caf\xC3\xA9 Loop");
        EXPECT_THAT(data->transientMarkers(), ElementsAre(30, 700)) << "5000 lies behind the audio";
        EXPECT_EQ(data->frameCount(), 1000U);
        EXPECT_EQ(data->channelCount(), 2U);
        EXPECT_EQ(data->sampleRate(), 44100);
    }
}

TEST(LoopFileRead, AOneShotIsNoLoopAndItsTempoMeansNothing) {
    const Wav wav;
    const auto data = parserOf(wav.file(wav.format() + wav.acid(3, 40, 9, 120) + wav.data()))->fileData();
    ASSERT_TRUE(data);
    EXPECT_EQ(data->tavioLoopType(), -1);
    EXPECT_FALSE(data->hasLoopTypeChunks());
    EXPECT_EQ(data->beatCount(), 0);
    EXPECT_EQ(data->bpm(), 0);
    EXPECT_EQ(data->midiRootNote(), 40);
}

TEST(LoopFileRead, AChunkThatIsAByteTooShortSaysNothing) {
    const Wav wav;
    const std::string acid = wav.acid(2, 50, 4, 120);
    const std::string cutOff = wav.chunk("acid", acid.substr(8, 23)) + wav.chunk("smpl", acid.substr(0, 15));
    const auto data = parserOf(wav.file(wav.format() + cutOff + wav.data()))->fileData();
    ASSERT_TRUE(data);
    EXPECT_FALSE(data->hasLoopTypeChunks());
    EXPECT_EQ(data->midiRootNote(), -1);
    const std::string sampler = wav.chunk("smpl", std::string(12, '\x01') + test::little(61, 4));
    EXPECT_EQ(parserOf(wav.file(wav.format() + sampler + wav.data()))->fileData()->midiRootNote(), 61);
}

TEST(LoopFileRead, TakesTheMusicOfAiffFilesAndLeavesLoopPointsOut) {
    const auto marker = [](unsigned number, unsigned frame, const std::string& name) {
        return big(number, 2) + big(frame, 4) + big(name.size(), 1) + name +
               std::string(1 - name.size() % 2, '\0');
    };
    const std::string markers = big(4, 2) + marker(1, 900, "end") + marker(2, 10, "") + marker(3, 5, "odd") +
                                marker(7, 400, "even") + marker(8, 20, "not counted");
    const std::string instrument = big(60, 1) + std::string(7, '\x01') + big(1, 2) + big(3, 2) + big(1, 2) +
                                   big(0, 2) + big(7, 2) + big(7, 2) + big(1, 2) + big(2, 2) +
                                   big(7, 2);  // and no third loop
    const std::string file =
        Aiff::file(Aiff::common() + Aiff::chunk("NAME", "Shaker") + Aiff::chunk("MARK", markers) +
                   Aiff::chunk("INST", instrument) + Aiff::chunk("MIDI", test::emptyMidi()) + Aiff::sound());
    const auto data = parserOf(file)->fileData();
    ASSERT_TRUE(data);
    EXPECT_EQ(data->displayName(), "Shaker");
    EXPECT_EQ(data->midiRootNote(), 60);
    EXPECT_THAT(data->transientMarkers(), ElementsAre(10, 400));
    EXPECT_EQ(data->tavioLoopType(), 1);
    EXPECT_EQ(data->midiData().size(), test::emptyMidi().size());
}

TEST(LoopFileRead, TakesNotesThatAreAByteLongerThanWhatIsReadAtOnce) {
    const std::string notes = test::emptyMidi() + std::string(4097 - test::emptyMidi().size(), '\0');
    const auto data =
        parserOf(Aiff::file(Aiff::common() + Aiff::chunk("MIDI", notes) + Aiff::sound()))->fileData();
    EXPECT_EQ(data->midiData().size(), notes.size());
}

TEST(LoopFileRead, TakesTheMusicOfCafFilesWhoseLoopsNobodyAuthored) {
    const auto marker = [](const std::string& kind, double frame) {
        return kind + big(std::bit_cast<std::uint64_t>(frame), 8) + std::string(16, '\x02');
    };
    const std::string plain(4, '\0');
    const std::string information = big(5, 4) + std::string(
                                                    "title\0Sea\0tempo\00090.5\0time signature\0"
                                                    "6/8\0key signature\0F#m\0last",
                                                    58);
    const std::string file = Caf::file(Caf::description(48000) + Caf::chunk("info", information) +
                                       Caf::chunk("midi", test::emptyMidi()) +
                                       Caf::chunk("mark", big(0, 4) + big(3, 4) + marker(plain, 9.6) +
                                                              marker("slbg", 3) + marker("rsyc", 2)) +
                                       Caf::data());
    const auto data = parserOf(file)->fileData();
    ASSERT_TRUE(data);
    EXPECT_EQ(data->displayName(), "Sea");
    EXPECT_EQ(data->bpm(), 90.5F);
    EXPECT_EQ(data->signatureTop(), 6);
    EXPECT_EQ(data->signatureBottom(), 8);
    EXPECT_EQ(data->keyType(), 1);
    EXPECT_THAT(data->transientMarkers(), ElementsAre(2, 10));
    EXPECT_TRUE(data->hasLoopTypeChunks());
    EXPECT_FALSE(data->hasAuthoredChunks());
    EXPECT_EQ(data->tavioLoopType(), 1);
}

TEST(LoopFileRead, TellsMinorFromMajorInKeySignatures) {
    struct {
        const char* text;
        int keyType;
    } const cases[] = {{"A minor", 1}, {"A Minor", 1}, {"F#m", 1},    {"Bb min", 1},       {"C", 2},
                       {"CM", 2},      {"D MAJOR", 2}, {"Eb-maj", 2}, {"G mixolydian", 0}, {"Hm", 0},
                       {"", 0}};
    for (const auto& c : cases) {
        const std::string information = big(1, 4) + "key signature" + '\0' + c.text + '\0';
        const auto data =
            parserOf(Caf::file(Caf::description() + Caf::chunk("info", information) + Caf::data()))
                ->fileData();
        ASSERT_TRUE(data);
        EXPECT_EQ(data->facts().keyType, c.keyType) << c.text;
    }
}

TEST(LoopFileRead, DerivesOnlyWhatThePlainDataDoesNotSay) {
    struct {
        unsigned beats;
        float tempo;
        float expectedTempo;
        int expectedBeats;
    } const cases[] = {
        {4, 0, 120, 4},                            // 2 seconds
        {0, 120, 120, 4},                          //
        {0, 120.2F, 120.2F, 4}, {0, 125, 125, 0},  // 4.17 beats are no loop's
        {5, 120, 120, 5},                          // what is said stands, also when it does not agree
    };
    const Wav wav;
    for (const auto& c : cases) {
        const auto parser =
            parserOf(wav.file(wav.format(1, 8000, 8) + wav.acid(0, 0, c.beats, c.tempo) + wav.data(16000)));
        const auto plain = parser->fileData();
        const auto enhanced = parser->enhancedFileData();
        ASSERT_TRUE(plain && enhanced);
        EXPECT_EQ(plain->lengthInSeconds(), 0);
        EXPECT_EQ(plain->beatCount(), static_cast<int>(c.beats));
        EXPECT_EQ(enhanced->lengthInSeconds(), 2);
        EXPECT_EQ(enhanced->bpm(), c.expectedTempo);
        EXPECT_EQ(enhanced->beatCount(), c.expectedBeats);
        EXPECT_TRUE(enhanced->record().empty()) << "derived values must never be stored";
    }
}

TEST(LoopFileRead, CountsBeatsInNotesOfTheLowerNumberAndTempoInQuarters) {
    struct {
        const char* signature;
        int beats;
    } const cases[] = {{"4/4", 4}, {"6/8", 8}, {"2/2", 2}};
    for (const auto& c : cases) {
        const std::string facts =
            big(2, 4) + std::string("tempo\000120\0time signature\0", 25) + c.signature + '\0';
        const std::string file =
            Caf::file(Caf::description(1000) + Caf::chunk("info", facts) + Caf::data(8000));
        const auto data = parserOf(file)->enhancedFileData();
        ASSERT_TRUE(data);
        EXPECT_EQ(data->beatCount(), c.beats) << c.signature << ", two seconds";
    }
}

TEST(LoopFileRead, AdmitsTheKindsThatAreAskedFor) {
    const Wav wav;
    const std::string plain = wav.file(wav.format() + wav.data());
    const std::string loop = wav.file(wav.format() + wav.data() + wav.acid(0, 0, 4, 120));
    struct {
        const std::string& bytes;
        unsigned types;
        bool admitted;
    } const cases[] = {
        {plain, 7, true}, {plain, 4, true}, {plain, 3, false}, {plain, 1, false}, {loop, 7, true},
        {loop, 3, true},  {loop, 2, true},  {loop, 1, false},  {loop, 4, false},
    };
    for (const auto& c : cases) {
        Error error;
        EXPECT_EQ(parserOf(c.bytes, c.types)->fileData(&error) != nullptr, c.admitted) << c.types;
        EXPECT_NE(error.isSet(), c.admitted);
    }
}

/// Every file is named after its fault. A reason means that the file is refused with it; those without one
/// are read, with that many frames.
TEST(LoopFileRead, HostileAndDamagedFiles) {
    const Wav wav;
    const std::string format = wav.format();
    const std::string data = wav.data();
    const std::string start = Aiff::common();
    const std::string rateOfInfinity = big(0x7FFF, 2) + big(0x8000000000000000, 8);
    const std::string rateBelowZero = big(0xC00E, 2) + big(0xAC44000000000000, 8);
    struct {
        const char* fault;
        std::string bytes;
        const char* reason;
        std::uint64_t frames;
    } const cases[] = {
        {"empty", "", "byte 0: is no WAV", 0},
        {"wav-header-only", wav.file(""), "no chunk 'fmt '", 0},
        {"wav-only-a-tag", wav.file(wav.chunk("qvct", "bplist00")), "no chunk 'fmt '", 0},
        {"wav-without-audio", wav.file(format), "no chunk 'data'", 0},
        {"wav-size-0", wav.file(format + "data" + big(0, 4)), nullptr, 0},
        {"wav-claims-a-gigabyte-in-24-bytes",
         "RIFF" + test::little(1U << 30U, 4) + "WAVEfmt " + test::little(1U << 30U, 4) + std::string(4, '\1'),
         "no chunk 'data'", 0},
        {"wav-chunk-size-FFFFFFF8", wav.file(format + "junk" + test::little(0xFFFFFFF8, 4) + data),
         "no chunk 'data'", 0},
        {"wav-format-too-short", wav.file(wav.chunk("fmt ", "\1") + data), "'fmt ', byte 12: is too short",
         0},
        {"wav-rate-0", wav.file(wav.format(2, 0) + data), "'fmt ', byte 12: a sample rate of 0", 0},
        {"wav-no-channels", wav.file(wav.format(0) + data), "0 channels are out of range", 0},
        {"wav-samples-wider-than-frames",
         wav.file(wav.chunk("fmt ", test::little(0x00020001, 4) + test::little(44100, 4) +
                                        test::little(88200, 4) + test::little(0x00100002, 4)) +
                  data),
         "2 channels of 16 bits do not fit into frames of 2 bytes", 0},
        {"wav-data-cut-off", wav.file(format + data).substr(0, 1044), nullptr, 250},
        {"wav-of-a-recorder-that-crashed",
         "RIFF" + big(0, 4) + "WAVE" + format + "data" + big(0, 4) + test::noise(400), nullptr, 100},
        {"wav-pad-missing", wav.file(format + wav.chunk("odd ", "abc").substr(0, 11) + data), nullptr, 1000},
        {"wav-pad-not-zero", wav.file(format + wav.chunk("odd ", "abc").substr(0, 11) + "\xFF" + data),
         nullptr, 1000},
        {"wav-invalid-id-before-audio", wav.file(format + wav.chunk("\x86\x01te", "abcd") + data), nullptr,
         1000},
        {"wav-two-formats", wav.file(format + wav.format(1, 8000, 8) + data), nullptr, 1000},
        {"rf64-without-sizes", Wav{"RF64"}.file(format + data), nullptr, 1000},
        {"rf64-called-wav", Wav{"RF64"}.longFile(format, 400), nullptr, 100},
        {"rf64-other-long-chunks",
         Wav{"RF64"}.longFile(format + "huge" + test::little(0xFFFFFFFF, 4) + "abcd", 400, "",
                              "none" + test::little(2, 8) + "huge" + test::little(4, 8)),
         nullptr, 100},
        {"ds64-in-a-plain-wav", wav.file(wav.chunk("ds64", std::string(28, '\xFF')) + format + data), nullptr,
         1000},
        {"aiff-without-format", Aiff::file(Aiff::sound()), "no chunk 'COMM'", 0},
        {"aiff-format-of-size-0", Aiff::file("COMM" + big(0, 4) + Aiff::sound()),
         "'COMM', byte 12: is too short", 0},
        {"aiff-rate-infinite", Aiff::file(Aiff::common(2, 1000, 16, rateOfInfinity) + Aiff::sound()),
         "'COMM', byte 12: a sample rate of 0", 0},
        {"aiff-rate-negative", Aiff::file(Aiff::common(2, 1000, 16, rateBelowZero) + Aiff::sound()),
         "out of range", 0},
        {"aiff-claims-more-frames-than-there-are", Aiff::file(Aiff::common(2, 0xFFFFFFFF) + Aiff::sound()),
         nullptr, 1000},
        {"aiff-sound-size-FFFFFFF8", Aiff::file(start + "SSND" + big(0xFFFFFFF8, 4) + test::noise(808)),
         nullptr, 200},
        {"aiff-markers-without-end", Aiff::file(start + Aiff::chunk("MARK", big(0xFFFF, 2)) + Aiff::sound()),
         nullptr, 1000},
        {"caf-without-description", Caf::file(Caf::data()), "byte 8: the first chunk is not 'desc'", 0},
        {"caf-rate-nan", Caf::file(Caf::description(std::nan("")) + Caf::data()), "a sample rate of nan", 0},
        {"caf-channels-out-of-range", Caf::file(Caf::description(44100, 1U << 31U) + Caf::data()),
         "'desc', byte 8: 2147483648 channels", 0},
        {"caf-chunk-size-minus-8", Caf::file(Caf::description() + Caf::chunk("free", "", -8) + Caf::data()),
         "no chunk 'data'", 0},
        {"caf-open-end", Caf::file(Caf::description() + Caf::openData()), nullptr, 1000},
        {"caf-chunks-behind-open-end",
         Caf::file(Caf::description() + Caf::openData() + Caf::chunk("free", "")), nullptr, 1003},
        {"caf-data-of-64-bit-size",
         Caf::file(Caf::description() + Caf::chunk("data", big(0, 4) + test::noise(400), INT64_MAX)), nullptr,
         100},
    };
    for (const auto& c : cases) {
        Error error;
        const auto read = parserOf(c.bytes, kLCAllAudio, "/s/" + std::string(c.fault))->fileData(&error);
        EXPECT_EQ(read != nullptr, c.reason == nullptr) << c.fault << ": " << error.message();
        if (read) {
            EXPECT_EQ(read->frameCount(), c.frames) << c.fault;
        } else {
            EXPECT_EQ(error.path, std::string("/s/") + c.fault);
            EXPECT_TRUE(error.offset) << "every reason has its place";
            EXPECT_THAT(error.message(), HasSubstr(c.reason == nullptr ? "" : c.reason));
        }
    }
}

TEST(LoopFileRead, CountsTheFramesOfPackedAiffAudio) {
    struct {
        const char* coding;
        unsigned channels;
        std::uint32_t inHeader;
        std::size_t bytes;
        std::uint64_t frames;
    } const cases[] = {
        {"ima4", 1, 690, 690 * 34, 690ULL * 64},   // packets
        {"ima4", 2, 345, 1380 * 34, 690ULL * 64},  // half of them
        {"ima4", 1, 690, 100 * 34 + 5, 6400},      // cut off
        {"GSM ", 1, 44100, 276 * 33, 44100},       // the last packet is not full
        {"GSM ", 1, 44100, 10 * 33, 1600},         //
        {"DWVW", 1, 44100, 70000, 44100},          // packets of any size
        {"42ni", 2, 44100, 6000, 1000},            //
        {"MAC6", 1, 7350, 7350, 0},                // unknown, not wrong
    };
    for (const auto& c : cases) {
        const std::string common = Aiff::common(c.channels, c.inHeader, 16, Aiff::rate(44100), c.coding) +
                                   Aiff::chunk("MARK", big(1, 2) + big(1, 2) + big(900, 4) + big(0, 2));
        const auto data = parserOf(Aiff::file(common + Aiff::sound(c.bytes), "AIFC"))->enhancedFileData();
        ASSERT_TRUE(data) << c.coding;
        EXPECT_EQ(data->frameCount(), c.frames) << c.coding << " of " << c.bytes << " bytes";
        EXPECT_FLOAT_EQ(data->lengthInSeconds(), static_cast<float>(c.frames) / 44100);
        EXPECT_THAT(data->transientMarkers(), ElementsAre(900)) << c.coding;
    }
}

TEST(LoopFileRead, CountsTheFramesOfCodedWavAudio) {
    constexpr int kALaw = 6;
    constexpr int kMuLaw = 7;
    constexpr int kMsAdpcm = 2;
    constexpr int kImaAdpcm = 0x11;
    constexpr int kGsm = 0x31;
    constexpr int kUnknown = 0x55;
    struct {
        int coding;
        unsigned channels, bytesOfBlock;
        std::uint32_t fact;
        std::size_t bytes;
        std::uint64_t frames;
    } const cases[] = {
        {kALaw, 1, 2, 2000, 1000, 1000},  // the header speaks of 16 bits
        {kMuLaw, 2, 2, 0, 1000, 500},
        {kMsAdpcm, 1, 256, 0, 2560, 5000},
        {kMsAdpcm, 2, 512, 0, 5120, 5000},
        {kMsAdpcm, 1, 256, 4990, 2560, 4990},          // the last block is filled up
        {kMsAdpcm, 1, 256, 0xFFFFFFFF, 2560, 5000},    // more than there can be
        {kImaAdpcm, 1, 256, 0, 2660, 5050 + 1 + 192},  // cut off within a block
        {kImaAdpcm, 2, 256, 9000, 2560, 2490},
        {kImaAdpcm, 2, 256, 1245, 2560, 2490},   // half of them, as some encoders write
        {kImaAdpcm, 2, 2048, 3061, 6144, 6123},  // of few blocks, too
        {kMsAdpcm, 2, 512, 250, 512, 250},
        {kMsAdpcm, 1, 256, 1, 256, 1},
        {kImaAdpcm, 1, 0, 0, 2, 0},
        {kGsm, 1, 65, 3100, 650, 3100},
        {kGsm, 1, 65, 0, 650, 3200},
        {kUnknown, 1, 1, 5000, 650, 5000},
        {kUnknown, 1, 1, 1, 650, 1},
        {kUnknown, 1, 1, 0xFFFFFFFF, 22050, 44100},  // as the data rate makes likely
    };
    const Wav wav;
    for (const auto& c : cases) {
        const std::string format =
            wav.chunk("fmt ", test::little(static_cast<unsigned>(c.coding), 2) + test::little(c.channels, 2) +
                                  test::little(44100, 4) + test::little(22050, 4) +
                                  test::little(c.bytesOfBlock, 2) + test::little(4, 2));
        const std::string fact = c.fact == 0 ? "" : wav.chunk("fact", test::little(c.fact, 4));
        const auto data = parserOf(wav.file(format + fact + wav.data(c.bytes)))->fileData();
        ASSERT_TRUE(data);
        EXPECT_EQ(data->frameCount(), c.frames) << c.coding << ", " << c.bytes << " bytes";
    }
    std::string caf = Caf::file(Caf::description(44100, 1) + Caf::data(1000));
    caf.replace(caf.find("lpcm"), 4, "alaw");
    EXPECT_EQ(parserOf(caf)->fileData()->frameCount(), 1000U);
}

TEST(LoopFileRead, ListsEveryChunkWithItsPlaceAndWhatIsWrongWithIt) {
    const Wav wav;
    const std::string file = wav.file(wav.format() + wav.chunk("\x86\x01te", "abcd") + wav.data(401) +
                                      wav.chunk("LIST", "INFO" + wav.chunk("INAM", "Sea")));
    const auto forms = parserOf(file)->chunks();
    ASSERT_EQ(forms.size(), 1U);
    EXPECT_EQ(forms[0].id, "RIFF");
    const auto& chunks = forms[0].children;
    ASSERT_EQ(chunks.size(), 4U);
    EXPECT_EQ(chunks[0].meaning, "format of the audio: 44100 Hz, 2 channels, 16 bits, 100 frames");
    EXPECT_EQ(chunks[1].fault, "its id is invalid");
    EXPECT_EQ(chunks[2].offset, 48U);
    EXPECT_EQ(chunks[2].size, 401U);
    ASSERT_EQ(chunks[3].children.size(), 1U);
    EXPECT_EQ(chunks[3].offset, 458U);
    EXPECT_EQ(chunks[3].children[0].offset, 470U);
    EXPECT_EQ(chunks[3].children[0].meaning, "title \"Sea\"");
}

TEST(LoopFileRead, ListsOurRecordWithTheSizeThatStandsInTheFile) {
    const Wav wav;
    const std::string record = "bplist00 or not";
    const std::string uuid = "\x5C\xE5\x4F\x6C\x9A\x0B\x4D\x5F\x8D\x3E\x71\x63\x76\x74\x2E\x31";
    struct {
        std::string file;
        std::size_t size;
    } const cases[] = {
        {wav.file(wav.format() + wav.data() + wav.chunk("qvct", record)), 15},
        {Aiff::file(Aiff::common() + Aiff::sound() + Aiff::chunk("APPL", "qvct" + record)), 19},
        {Caf::file(Caf::description() + Caf::data() + Caf::chunk("uuid", uuid + record)), 31},
    };
    for (const auto& c : cases) {
        const auto chunks = parserOf(c.file)->chunks()[0].children;
        ASSERT_EQ(chunks.size(), 3U);
        EXPECT_EQ(chunks[2].meaning, "our record, unreadable");
        EXPECT_EQ(chunks[2].size, c.size) << chunks[2].id;
    }
}

/// A file of zeros but for its head and tail, which counts what is read; it may break off.
class SparseReader : public RandomAccessReader {
  public:
    SparseReader(std::string head, std::uint64_t gap, std::string tail)
        : head_(std::move(head)), tail_(std::move(tail)), size_(head_.size() + gap + tail_.size()) {}

    std::uint64_t size() const override { return size_; }
    bool read(std::uint64_t offset, std::span<std::uint8_t> into) const override {
        ++calls;
        bytes += into.size();
        if (offset + into.size() > readable) return false;
        for (std::size_t i = 0; i < into.size(); ++i) into[i] = static_cast<std::uint8_t>(at(offset + i));
        return true;
    }

    mutable std::size_t calls = 0;
    mutable std::size_t bytes = 0;
    std::uint64_t readable = UINT64_MAX;

  private:
    char at(std::uint64_t offset) const {
        const std::uint64_t tail = size_ - tail_.size();
        return offset < head_.size() ? head_[offset] : offset >= tail ? tail_[offset - tail] : '\0';
    }

    std::string head_;
    std::string tail_;
    std::uint64_t size_;
};

TEST(LoopFileRead, AFileOfTwoGigabytesCostsTwoSmallReads) {
    const Wav wav;
    constexpr std::uint32_t kSize = 2'000'000'000;
    const std::string tail = wav.acid(0, 0, 16, 120);
    const std::string start = wav.format() + "data" + test::little(kSize, 4);
    const auto reader = std::make_shared<SparseReader>(
        "RIFF" + test::little(4 + start.size() + kSize + tail.size(), 4) + "WAVE" + start, kSize, tail);
    const auto data = LCFileParser::fileParserForReader(reader, "/s/big.wav")->fileData();
    ASSERT_TRUE(data);
    EXPECT_EQ(data->beatCount(), 16);
    EXPECT_EQ(data->frameCount(), kSize / 4);
    EXPECT_EQ(reader->calls, 2U);
    EXPECT_LE(reader->bytes, 2U * 4096U);
}

TEST(LoopFileRead, LeavesOutNotesThatTakeMoreThanSixteenMegabytes) {
    constexpr std::uint32_t kLargest = 16U << 20U;
    for (const std::uint32_t size : {kLargest, kLargest + 1}) {
        const std::string chunks = Aiff::common() + Aiff::sound() + "MIDI" + big(size, 4) + test::emptyMidi();
        const std::size_t gap = size - test::emptyMidi().size();
        const auto reader = std::make_shared<SparseReader>(
            "FORM" + big(4 + chunks.size() + gap + size % 2, 4) + "AIFF" + chunks, gap + size % 2, "");
        const auto data = LCFileParser::fileParserForReader(reader, "/s/notes.aif")->fileData();
        ASSERT_TRUE(data);
        EXPECT_EQ(data->midiData().size(), size == kLargest ? size : 0);
    }
}

TEST(LoopFileRead, AFileThatShrinksWhileItIsReadIsRefusedOrReadAsFarAsItGoes) {
    const Wav wav;
    const std::string head = wav.file(wav.format() + "data" + test::little(9000, 4));
    const auto reader = std::make_shared<SparseReader>(head, 9000, wav.acid(0, 0, 16, 120));
    for (const std::uint64_t readable : {0ULL, 20ULL, 5000ULL, 9050ULL}) {
        reader->readable = readable;
        Error error;
        const auto data = LCFileParser::fileParserForReader(reader, "/s/shrinks.wav")->fileData(&error);
        EXPECT_TRUE(data == nullptr || data->beatCount() == 0);
        EXPECT_EQ(data == nullptr, error.isSet());
    }
}

TEST(LoopFileRead, ValuesOfAWrongTypeInARecordCountAsAbsent) {
    LCAudioFacts facts;
    facts.beatCount = 8;
    facts.bpm = 99;
    facts.displayName = "from the file";
    using Array = PropertyList::Array;
    const LCFileData data(facts, PropertyList::Dictionary{{"BeatCount", "many"},
                                                          {"Tempo", "fast"},
                                                          {"DisplayName", 7},
                                                          {"Tagging", Array{}},
                                                          {"ContentInfo", "x"},
                                                          {"Descriptors", Array{1, "Dark"}},
                                                          {"TransientMarkers", Array{9, -1, "x", 3}},
                                                          {"MidiData", 1}});
    EXPECT_EQ(data.beatCount(), 8);
    EXPECT_EQ(data.bpm(), 99);
    EXPECT_EQ(data.displayName(), "from the file");
    EXPECT_TRUE(data.taggingDictionary().empty());
    EXPECT_EQ(data.contentInfoDictionary(), nullptr);
    EXPECT_THAT(data.descriptors(), ElementsAre("Dark"));
    EXPECT_THAT(data.transientMarkers(), ElementsAre(3, 9));
    EXPECT_TRUE(data.midiData().empty());
}

TEST(LoopFileRead, NumbersOutOfRangeInARecordCountAsAbsent) {
    LCAudioFacts facts;
    facts.frameCount = 1000;
    facts.isLoop = true;
    facts.beatCount = 8;
    facts.bpm = 99;
    facts.midiRootNote = 48;
    facts.keyType = 2;
    facts.signatureTop = 3;
    facts.signatureBottom = 8;
    const auto values = [&facts](const char* key, const PropertyList& value) {
        const LCFileData data(facts, PropertyList::Dictionary{{key, value}});
        return std::vector<double>{
            double(data.tavioLoopType()),   double(data.beatCount()),      double(data.bpm()),
            double(data.midiRootNote()),    double(data.keyType()),        double(data.signatureTop()),
            double(data.signatureBottom()), double(data.lengthInSeconds())};
    };
    constexpr std::int64_t huge = std::int64_t{1} << 40;
    const std::vector<double> untouched = {0, 8, 99, 48, 2, 3, 8, 0};
    struct {
        const char* key;
        std::size_t place;
        std::vector<PropertyList> absent;
        std::vector<double> present;
    } const cases[] = {
        {"TavioLoopType", 0, {-2, huge}, {-1, 0, 7}},
        {"BeatCount", 1, {-1, 1'000'001, huge}, {0, 1'000'000}},
        {"Tempo", 2, {-1, 1000.5, 1e300}, {0, 1000}},
        {"MidiRootNote", 3, {-2, 128, huge}, {-1, 0, 127}},
        {"KeyType", 4, {-1, 5, huge}, {0, 4}},
        {"SignatureTop", 5, {-1, 65, 1e300}, {0, 64}},
        {"SignatureBottom", 6, {-4, 3, 128}, {0, 1, 64}},
        {"LengthInSeconds", 7, {-1, 1e300}, {0, 1e9}},
    };
    for (const auto& c : cases) {
        std::vector<PropertyList> absent = c.absent;
        absent.insert(absent.end(), {std::nan(""), -INFINITY, INFINITY, UINT64_MAX});
        for (const PropertyList& value : absent)
            EXPECT_EQ(values(c.key, value), untouched) << c.key << " " << value.doubleValue().value();
        for (const double value : c.present) EXPECT_EQ(values(c.key, value)[c.place], value) << c.key;
    }
    const LCFileData marked(
        facts, PropertyList::Dictionary{{"TransientMarkers", PropertyList::Array{1000, 1001, 0, huge, -1}}});
    EXPECT_THAT(marked.transientMarkers(), ElementsAre(0, 1000));
}

TEST(LoopFileRead, TheLengthOfTheAudioCountsBeforeTheRecords) {
    const Wav wav;
    const std::string record = serializePropertyList(PropertyList::Dictionary{{"LengthInSeconds", 99.0}},
                                                     PropertyListFormat::binary);
    struct {
        std::size_t bytes;
        float expected;
    } const cases[] = {{32000, 4}, {0, 99}};
    for (const auto& c : cases) {
        const std::string file = wav.file(wav.format(1, 8000, 8) + wav.acid(0, 0, 4, 0) + wav.data(c.bytes) +
                                          wav.chunk("qvct", record));
        const auto data = parserOf(file)->enhancedFileData();
        ASSERT_TRUE(data);
        EXPECT_EQ(data->lengthInSeconds(), c.expected);
        EXPECT_FLOAT_EQ(data->bpm(), 240 / c.expected);
    }
}

}  // namespace
}  // namespace qvct

#include "listening/onsets/OnsetDetector.h"
#include "media/audio/AudioDecoder.h"
#include "platform/files/FileAccess.h"
#include "platform/files/reading/RandomAccessReader.h"
#include "support/AudioFixtures.h"
#include "support/Corpus.h"
#include "support/TemporaryFolder.h"

#include <cmath>
#include <cstring>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

// A WAV file; format 1 is integers, 3 floats.
std::string wav(unsigned format, unsigned channels, std::uint32_t rate, unsigned bits,
                const std::string& data) {
    const test::Wav wav;
    std::string description = wav.format(channels, rate, bits);
    description[8] = static_cast<char>(format);
    return wav.file(description + wav.chunk("data", data));
}

std::string floats(const std::vector<float>& samples) {
    std::string bytes(samples.size() * sizeof(float), '\0');
    std::memcpy(bytes.data(), samples.data(), bytes.size());
    return bytes;
}

std::unique_ptr<AudioDecoder> decoderOf(const std::string& file) {
    const std::span bytes(reinterpret_cast<const std::uint8_t*>(file.data()), file.size());
    return AudioDecoder::open(std::make_shared<MemoryReader>(bytes), "a file in memory");
}

std::vector<float> decoded(AudioDecoder& decoder, std::size_t blockFrames = 100) {
    std::vector<float> all;
    std::vector<float> block(blockFrames * static_cast<std::size_t>(decoder.channels()));
    while (const std::size_t frames = decoder.read(block)) {
        all.insert(all.end(), block.begin(),
                   block.begin() +
                       static_cast<std::ptrdiff_t>(frames * static_cast<std::size_t>(decoder.channels())));
    }
    return all;
}

TEST(AudioDecoder, GivesTheSamplesOfEveryDepth) {
    const std::string sixteen = wav(1, 2, 48000, 16, std::string("\x00\x40\x00\x80\xff\x7f\x01\x00", 8));
    const auto decoder = decoderOf(sixteen);
    ASSERT_TRUE(decoder);
    EXPECT_EQ(decoder->sampleRate(), 48000);
    EXPECT_EQ(decoder->channels(), 2);
    EXPECT_EQ(decoder->frames(), 2);
    EXPECT_THAT(decoded(*decoder, 1), testing::ElementsAre(0.5F, -1.0F, 32767.0F / 32768, 1.0F / 32768));

    const std::string eight = wav(1, 1, 8000, 8, std::string("\x80\xc0\x00", 3));
    EXPECT_THAT(decoded(*decoderOf(eight)), testing::ElementsAre(0.0F, 0.5F, -1.0F));
    const std::string wide = wav(1, 1, 96000, 24, std::string("\x00\x00\x40\x00\x00\x80", 6));
    EXPECT_THAT(decoded(*decoderOf(wide)), testing::ElementsAre(0.5F, -1.0F));
    const std::string real = wav(3, 1, 44100, 32, floats({0.25F, -4.0F}));
    EXPECT_THAT(decoded(*decoderOf(real)), testing::ElementsAre(0.25F, -4.0F));
}

TEST(AudioDecoder, ReadsFromAPathWhatItReadsFromMemory) {
    const test::TemporaryFolder folder;
    std::string data;
    for (std::uint32_t i = 0; i < 5000; ++i) data += test::little(i * 2654435761U, 2);
    const std::string file = wav(1, 1, 44100, 16, data);
    const auto memory = decoderOf(file);
    const auto path = AudioDecoder::open(folder.write("a.wav", file));
    ASSERT_TRUE(memory && path);
    EXPECT_EQ(decoded(*memory), decoded(*path, 4096));
}

TEST(AudioDecoder, RefusesWhatIsNoAudioAndNamesIt) {
    const test::TemporaryFolder folder;
    for (const std::string& bytes : {std::string(), std::string("RIFF"), std::string(1000, 'x')}) {
        Error error;
        const std::string path = folder.write("no.wav", bytes);
        EXPECT_FALSE(AudioDecoder::open(path, &error));
        EXPECT_EQ(error.path, path);
        EXPECT_FALSE(decoderOf(bytes));
    }
    EXPECT_FALSE(AudioDecoder::open(folder.path("absent.wav")));
    EXPECT_FALSE(decoderOf(wav(1, 0, 44100, 16, "abcd"))) << "no channels";
}

TEST(AudioDecoder, StopsAtTheEndOfATruncatedFile) {
    std::string file = wav(1, 1, 44100, 16, std::string(2000, '\x11'));
    file.resize(file.size() - 1001);
    const auto decoder = decoderOf(file);
    ASSERT_TRUE(decoder);
    EXPECT_LE(decoded(*decoder).size(), 500U);
}

TEST(AudioDecoder, AnOddSoundWithoutItsPadByteIsHeardToItsEnd) {
    const auto decoder = decoderOf(wav(1, 1, 8000, 8, std::string(333, '\x80')));
    ASSERT_TRUE(decoder);
    EXPECT_EQ(decoder->frames(), 333);
    EXPECT_EQ(decoded(*decoder).size(), 333U);
}

TEST(AudioDecoder, FloatFilesWithoutNumbersHaveNoOnsetsOfTheirOwn) {
    std::vector<float> samples(30000, 0.0F);
    for (std::size_t i = 0; i < samples.size(); i += 3) samples[i] = i % 2 ? std::nanf("") : HUGE_VALF;
    const std::string file = wav(3, 1, 44100, 32, floats(samples));
    const auto decoder = decoderOf(file);
    ASSERT_TRUE(decoder);
    EXPECT_THAT(OnsetDetector::detect(*decoder), testing::IsEmpty());
    const std::string none = wav(1, 1, 44100, 16, "");
    const auto empty = decoderOf(none);
    ASSERT_TRUE(empty);
    EXPECT_THAT(OnsetDetector::detect(*empty), testing::IsEmpty());
}

TEST(AudioDecoder, ReadsTheSameNoteFromEveryCoding) {
    const auto folder = test::corpus("audio/pluck");
    QVCT_SKIP_WITHOUT(folder);
    const auto reference = AudioDecoder::open((folder / "pluck-pcm24.wav").string());
    ASSERT_TRUE(reference);
    const std::vector<float> expected = decoded(*reference);
    for (const std::string& path : test::filesBelow(folder)) {
        const auto decoder = AudioDecoder::open(path);
        ASSERT_TRUE(decoder) << path;
        const std::vector<float> samples = decoded(*decoder);
        ASSERT_EQ(samples.size(), expected.size()) << path;
        double error = 0;
        for (std::size_t i = 0; i < samples.size(); ++i)
            error = std::max(error, std::abs(double(samples[i] - expected[i])));
        EXPECT_LT(error, 0.05) << path;
    }
}

TEST(AudioDecoder, SurvivesMalformedFiles) {
    const auto folder = test::corpus("malformed");
    QVCT_SKIP_WITHOUT(folder);
    for (const std::string& path : test::filesBelow(folder)) {
        Error error;
        const auto decoder = AudioDecoder::open(path, &error);
        if (!decoder) {
            EXPECT_THAT(error.message(), testing::HasSubstr(path));
        } else {
            OnsetDetector::detect(*decoder);
        }
    }
}

}  // namespace
}  // namespace qvct

#include "FormatsSupport.h"
#include "formats/audiofile/TGRTAudioFileTypeValidator.h"
#include "media/loopfile/LCFileParser.h"
#include "media/loopfile/LCFileWriter.h"
#include "media/loopfile/LCFingerprint.h"
#include "support/AudioFixtures.h"

#include <functional>
#include <map>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using test::Caf;
using test::Dictionary;
using test::read;
using test::TemporaryFolder;
using test::textsOf;
using test::urlOf;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;
using testing::UnorderedElementsAre;

std::string plain() {
    return Caf::file(Caf::description() + Caf::data());
}

/// A loop of ours with a tag of today and keywords of old.
std::string writeOldLoop(const TemporaryFolder& folder) {
    std::string path = folder.write("old.caf", plain());
    const auto data = LCFileParser::fileParserForURL(urlOf(path))->fileData();
    data->setTavioLoopType(0);
    data->setBeatCount(8);
    data->setDescriptors({"Cheerful", "Unheard of"});
    data->setInstrumentTypeTag("Dark");
    data->setTaggingDictionary(test::taggingDictionary("Genres", "House"));
    data->setContentInfoDictionary({{"Dependencies", PropertyList::Array{"/a"}}});
    data->setDisplayName("Old");
    EXPECT_TRUE(LCFileWriter::fileWriterForURL(urlOf(path))->writeFileData(data));
    return path;
}

std::map<std::string, double> valuesOf(const TGRTMetaData& record) {
    std::map<std::string, double> values;
    for (const auto& item : record.keyValues()) values[item->key()] = *item->value()->doubleValue();
    return values;
}

TEST(LoopReader, AddsOldKeywordsOnDemand) {
    const TemporaryFolder folder;
    const std::string path = writeOldLoop(folder);
    // Without a level: not "=0.00".
    const std::set<std::string> legacy = {"LoopDescriptors/Cheerful", "LoopDescriptors/Dark"};
    const std::set<std::string> mapped = {"Positive Emotions/Happy", "Sound Descriptors/Bright / Dark=0.80"};
    for (std::uint64_t options = 0; options < 4; ++options) {
        std::set<std::string> expected = {"Genres/House"};
        if ((options & 1U) != 0) expected.insert(legacy.begin(), legacy.end());
        if ((options & 2U) != 0) expected.insert(mapped.begin(), mapped.end());
        EXPECT_EQ(textsOf(read(path, options)->taggings()), expected) << options;
    }
}

TEST(LoopReader, ReadsLoopsAndOtherAudio) {
    const TemporaryFolder folder;
    const auto loop = read(writeOldLoop(folder));
    EXPECT_EQ(loop->fileType(), 2);
    EXPECT_EQ(loop->subFileType(), 0);
    EXPECT_EQ(loop->displayName(), "Old");
    EXPECT_EQ(loop->contentInfo()->assetDependencyPaths().count("/a"), 1U);
    EXPECT_THAT(
        valuesOf(*loop),
        UnorderedElementsAre(Pair("LengthInSeconds", testing::DoubleNear(0.0227, 0.001)),
                             Pair("BeatCount", 8), Pair("TavioLoopType", 0), Pair("MidiRootNote", -1),
                             Pair("KeyType", 0), Pair("SignatureTop", 0), Pair("SignatureBottom", 0)));
    EXPECT_EQ(loop->keyValues().ordered()[1]->key(), "BeatCount");

    // Another maker's notes make a loop of it for the parser, but nobody has authored it.
    const std::string midi = Caf::chunk("midi", test::emptyMidi());
    const std::string path = folder.write("midi.caf", Caf::file(Caf::description() + midi + Caf::data()));
    const auto notes = read(path, 3);
    EXPECT_EQ(notes->fileType(), 7);
    EXPECT_EQ(notes->subFileType(), -1);
    EXPECT_THAT(valuesOf(*notes), ElementsAre(Pair("LengthInSeconds", testing::Gt(0.0))));
    EXPECT_TRUE(TGRTTavioLoopTypeValidator().isValidContentTypeAtFileURL(urlOf(path)));

    EXPECT_EQ(read(folder.write("a.cst.caf", plain())), nullptr) << "previews have no record";
    EXPECT_EQ(read(folder.write("broken.wav", "RIFF")), nullptr);
}

TEST(LoopReader, AddsNoOldKeywordsToWhatIsNoLoop) {
    const TemporaryFolder folder;
    const URL url = urlOf(folder.write("shot.caf", plain()));
    const auto data = LCFileParser::fileParserForURL(url)->fileData();
    data->setDescriptors({"Cheerful"});
    ASSERT_TRUE(LCFileWriter::fileWriterForURL(url)->writeFileData(data));
    const auto reader = TGRTTavioLoopMetaDataReader::initWithTaxonomy(TGRTTaxonomy::defaultTaxonomy());
    EXPECT_THAT(textsOf(reader->readMetaDataFromURL(url, 3)->taggings()), IsEmpty());
}

TEST(AudioWriters, KeepOrClearTheLoopType) {
    const TemporaryFolder folder;
    const auto taggings = test::taggingsOf({{"Genres", "Techno"}}, 0.5);
    struct {
        const char* what;
        bool keeps;
        std::function<bool(const URL&)> write;
    } const cases[] = {
        {"loop taggings", true,
         [&](const URL& u) { return TGRTTavioLoopTaggingWriter().writeTaggings(taggings, u); }},
        {"audio taggings", false,
         [&](const URL& u) { return TGRTAudioFileTaggingWriter().writeTaggings(taggings, u); }},
        {"loop content info", true,
         [&](const URL& u) { return TGRTTavioLoopContentInfoWriter().writeContentInfo(nullptr, u); }},
        {"audio content info", false,
         [&](const URL& u) { return TGRTAudioFileContentInfoWriter().writeContentInfo(nullptr, u); }},
        {"loop record", true,
         [&](const URL& u) { return TGRTTavioLoopMetaDataWriter().writeMetaData(TGRTMetaData::init(), u); }},
        {"audio record", false,
         [&](const URL& u) { return TGRTAudioFileMetaDataWriter().writeMetaData(TGRTMetaData::init(), u); }},
    };
    for (const auto& c : cases) {
        const URL url = urlOf(writeOldLoop(folder));
        ASSERT_TRUE(c.write(url)) << c.what;
        const auto data = LCFileParser::fileParserForURL(url)->fileData();
        EXPECT_EQ(data->tavioLoopType(), c.keeps ? 0 : -1) << c.what;
        EXPECT_EQ(data->beatCount(), 8) << c.what;
        EXPECT_EQ(data->descriptors().size(), 2U) << c.what;
    }
}

TEST(AudioWriters, WriteTheirPartOnly) {
    const TemporaryFolder folder;
    const std::string path = writeOldLoop(folder);
    const auto before = fingerprintOfFile(urlOf(path));
    auto record = read(path);
    record->setTaggings(test::taggingsOf({{"Genres", "Techno"}}, 0.5));
    record->setDisplayName("New");
    record->setFileType(7);
    record->setKeyValues({TGRTKeyValue::initWithKeyNumberValue("BeatCount", 99)});
    ASSERT_TRUE(
        TGRTTavioLoopMetaDataWriter().writeMetaData(record, urlOf(path), nullptr, {.verifies = true}));
    const auto after = read(path);
    EXPECT_EQ(after->displayName(), "New");
    EXPECT_THAT(textsOf(after->taggings()), ElementsAre("Genres/Techno=0.50"));
    EXPECT_EQ(after->contentInfo()->assetDependencyPaths().count("/a"), 1U);
    EXPECT_EQ(after->fileType(), 2);
    EXPECT_EQ(valuesOf(*after)["BeatCount"], 8) << "the music stays as the file says it";
    EXPECT_THAT(before->differences(*fingerprintOfFile(urlOf(path))), IsEmpty());
}

}  // namespace
}  // namespace qvct

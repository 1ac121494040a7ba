#include "autotagging/services/QVCTContentTypeTaggingService.h"
#include "autotagging/services/QVCTTranslateTagsTaggingService.h"
#include "autotagging/services/QVCTUserGeneratedTaggingService.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "media/loopfile/LCFileData.h"
#include "metadata/TGRTMetaData.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::vector<std::string> labels(const TagDictionarySet& tags) {
    std::vector<std::string> result;
    for (const auto& tag : tags) result.push_back(*tag.value("label")->string());
    return result;
}

std::shared_ptr<TGRTMetaData> record(std::int64_t type, std::int64_t subType) {
    auto metaData = TGRTMetaData::init();
    metaData->setFileType(type);
    metaData->setSubFileType(subType);
    return metaData;
}

std::shared_ptr<LCFileData> audio(float seconds, bool isLoop = false, int beats = 0) {
    LCAudioFacts facts;
    facts.lengthInSeconds = seconds;
    facts.isLoop = isLoop;
    facts.beatCount = beats;
    return std::make_shared<LCFileData>(facts, std::nullopt);
}

TEST(ContentType, IsWhatRecordChunksAndNameSayInThisOrder) {
    const auto aux = QVCTXMLDocument::initWithXMLData(
        "<Patch><Channels><Channel type='Aux'/><Channel type='Instrument'/></Channels></Patch>", "test");
    struct {
        const char* path;
        std::shared_ptr<QVCTXMLDocument> xml;
        std::shared_ptr<TGRTMetaData> record;
        std::shared_ptr<LCFileData> file;
        std::vector<std::string> expected;
    } const cases[] = {
        {"/a.patch", nullptr, nullptr, nullptr, {"Patch"}},
        {"/a.patch", aux, nullptr, nullptr, {"Patch", "Aux Patch"}},
        {"/a.patch", aux, record(1, 2), nullptr, {"Patch", "Audio Patch"}},
        {"/a.ostrax", nullptr, record(8, 3), nullptr, {"Project", "Remix Session"}},
        {"/a.ostrax", nullptr, record(8, 9), nullptr, {"Project"}},
        {"/a.wav", nullptr, record(7, -1), audio(2), {"One Shot"}},
        {"/a.wav", nullptr, nullptr, audio(10.5F), {"Sample"}},
        {"/a.wav", nullptr, record(7, -1), audio(2, true), {"Tavio Loop", "Audio Loop"}},
        {"/a.caf", nullptr, record(7, -1), audio(2, false, 4), {"Tavio Loop", "Audio Loop"}},
        {"/Beat 122bpm.aif", nullptr, nullptr, audio(2), {}},
        {"/Beat 122bpmx.aif", nullptr, nullptr, audio(2), {"One Shot"}},
        {"/a.CST", nullptr, nullptr, nullptr, {"CST"}},
        {"/a.aaz", nullptr, nullptr, nullptr, {"PST"}},
        {"/a.vcp", nullptr, nullptr, nullptr, {"Vorthal Setting"}},
        {"/a.txt", nullptr, nullptr, nullptr, {}},
    };
    QVCTContentTypeTaggingService service;
    for (const auto& c : cases) {
        const URL url = URL::fileURLWithPath(c.path);
        EXPECT_EQ(labels(service.tagsWithContentsOfURL(url, c.xml, c.record, c.file, 0x8)), c.expected)
            << c.path;
        EXPECT_THAT(service.tagsWithContentsOfURL(url, c.xml, c.record, c.file, ~std::uint64_t{0x8}),
                    IsEmpty());
    }
}

TEST(UserGenerated, IsWhatLiesInNoPack) {
    QVCTUserGeneratedTaggingService service;
    const auto tags = [&service](const char* path, const std::shared_ptr<TGRTMetaData>& metaData) {
        return labels(
            service.tagsWithContentsOfURL(URL::fileURLWithPath(path), nullptr, metaData, nullptr, 0x100));
    };
    const auto inPack = record(2, 0);
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    inPack->setTaggings(
        {TGRTTagging::initWithTag(taxonomy->findOrCreateTagWithLabel("9999_own", "Soundpack"), nullptr)});
    EXPECT_THAT(tags("/Me/Kick.wav", nullptr), ElementsAre("User generated"));
    EXPECT_THAT(tags("/Me/Kick.wav", record(7, 0)), ElementsAre("User generated"));
    EXPECT_THAT(tags("/Me/Kick.wav", inPack), IsEmpty());
    EXPECT_THAT(tags("/Packs/0022_Ultimate808s/Kick.wav", nullptr), IsEmpty());
    EXPECT_THAT(tags("/Packs/Ultimate 808s/Kick.wav", nullptr), IsEmpty());
    EXPECT_THAT(tags("/Packs/Not Ultimate 808s/Kick.wav", nullptr), ElementsAre("User generated"));
}

TEST(TranslateTags, TurnsOldWordsOfLoopsAndPresetsIntoTodays) {
    QVCTTranslateTagsTaggingService service;
    LCAudioFacts facts;
    facts.isAuthored = true;
    facts.descriptors = {"Cheerful", "Dark", "no such word"};
    const auto loop = std::make_shared<LCFileData>(facts, std::nullopt);
    const URL caf = URL::fileURLWithPath("/a.caf");
    const auto tags = service.tagsWithContentsOfURL(caf, nullptr, nullptr, loop, 0x200);
    EXPECT_THAT(labels(tags), testing::UnorderedElementsAre("Happy", "Bright / Dark"));
    EXPECT_THAT(service.tagsWithContentsOfURL(caf, nullptr, nullptr, loop, 0x100), IsEmpty());

    const test::TemporaryFolder folder;
    const URL preset = URL::fileURLWithPath(folder.write("a.vcp", "Attribs = 8015\n"));
    EXPECT_THAT(labels(service.tagsWithContentsOfURL(preset, nullptr, nullptr, nullptr, 0x200)),
                testing::UnorderedElementsAre("Synth", "Additive"));
}

}  // namespace
}  // namespace qvct

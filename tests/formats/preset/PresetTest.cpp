#include "../FormatsSupport.h"
#include "formats/preset/PresetText.h"
#include "formats/preset/TGRTVorthalPresetMetaDataWriter.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"

#include <gmock/gmock.h>

namespace qvct {
namespace {

using test::read;
using test::TemporaryFolder;
using test::textsOf;
using test::urlOf;
using testing::ElementsAre;
using testing::HasSubstr;

constexpr std::string_view kPreset =
    "\xef\xbb\xbf// by hand\n"
    "<metadata>\nUUID = u\nDisplayName = Old\nVersion = 1\nSubType = 4\n</metadata>\n"
    "<unknown>\n  Category = kept\n</unknown>\n\n"
    "<tagging>\nAttribs = 4001,6004\nCategory = Genres\nName = House\nColour = red\nWeight = 0.5\n"
    "AutoTagging = true\nName = Techno\n</tagging>\n"
    "<applicationinfo>\nAppIdentifier = org.a\nMinimumVersion = 1.0\nAppIdentifier = org.b\nLegacy = true\n"
    "</applicationinfo>\n"
    "<assetdependencies>\nPath = /b\nPath = /a\n</assetdependencies>\nCutoff 0.5";

TEST(Presets, ReadEverySection) {
    const TemporaryFolder folder;
    const std::string path = folder.write("a.vcp", kPreset);
    const auto record = read(path);
    ASSERT_TRUE(record);
    EXPECT_EQ(record->fileType(), 3);
    EXPECT_EQ(record->subFileType(), 4);
    EXPECT_EQ(record->displayName(), "Old");
    EXPECT_THAT(textsOf(record->taggings()), ElementsAre("Genres/House=0.50", "Genres/Techno"));
    EXPECT_TRUE(record->taggings().ordered()[0]->isAutoTagging());
    EXPECT_EQ(record->contentInfo()->applicationInfos().size(), 2U);
    EXPECT_TRUE(record->contentInfo()->applicationInfos().ordered()[1]->legacy());
    EXPECT_THAT(record->contentInfo()->assetDependencyPaths(), ElementsAre("/a", "/b"));
    const auto labels = [&](std::uint64_t options) {
        std::set<std::string> result;
        const auto taggings = read(path, options)->taggings();
        for (const auto& tagging : taggings) result.insert(tagging->label());
        return result;
    };
    EXPECT_THAT(labels(1), ElementsAre("Bass", "Bright", "House", "Techno"));
    EXPECT_THAT(labels(2), testing::IsSupersetOf({"House", "Techno", "Bright / Dark"}));
    EXPECT_THAT(labels(2), testing::Not(testing::Contains("Bright")));
}

TEST(Presets, ChangeTheirOwnLinesOnly) {
    const TemporaryFolder folder;
    const std::string path = folder.write("a.vcp", kPreset);
    const auto taggings = test::taggingsOf({{"Genres", "Ambient"}}, 0.25);
    ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeTaggings(taggings, urlOf(path)));
    std::string expected = replaceAll(kPreset, "UUID = u\n", "");
    expected = replaceAll(expected,
                          "Category = Genres\nName = House\nColour = red\nWeight = 0.5\nAutoTagging = true\n"
                          "Name = Techno\n",
                          "Category = Genres\nName = Ambient\nWeight = 0.25\nColour = red\n");
    EXPECT_EQ(readTextFile(path), expected);

    auto record = TGRTMetaData::init();
    record->setTaggings(taggings);
    ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeMetaData(record, urlOf(path)));
    EXPECT_EQ(record->fileType(), 3);
    EXPECT_EQ(readTextFile(path), replaceAll(expected, "DisplayName = Old\n", ""))
        << "sub type and content info stay";
    ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeContentInfo(nullptr, urlOf(path)));
    EXPECT_THAT(*readTextFile(path),
                HasSubstr("<applicationinfo>\n</applicationinfo>\n<assetdependencies>\n</"));
}

TEST(Presets, KeepLinesThatMakeNoSenseWhereTheyStand) {
    const TemporaryFolder folder;
    struct {
        std::string before;
        std::string after;
    } const cases[] = {
        {"<tagging>\nName = Orphan\nCategory = A\nName = B\nWeight = abc\nAutoTagging = yes\n</tagging>\n",
         "<tagging>\nName = Orphan\nWeight = abc\nAutoTagging = yes\nCategory = A\nName = B\n</tagging>\n"},
        {"<tagging>\nCategory = Genres\nName = House\nCategory = Source\nWeight = 0.5\n</tagging>\n",
         "<tagging>\nWeight = 0.5\nCategory = Genres\nName = House\n</tagging>\n"},
        {"<tagging>\nCategory = A\nName = B\nCategory = C\nName = D\nCategory = A\nName = E\n</tagging>\n",
         "<tagging>\nCategory = A\nName = B\nName = E\nCategory = C\nName = D\n</tagging>\n"},
        {"<metadata>\nText = orphan\nKey = Tempo\nNumber = 120,5\nText = fast\nKey = Empty\nKey = Key\n"
         "Number = 1e999\nKey = Beats\nNumber = 8\n</metadata>\n",
         "<metadata>\nText = orphan\nKey = Tempo\nNumber = 120,5\nKey = Empty\nKey = Key\n"
         "Number = 1e999\nKey = Tempo\nText = fast\nKey = Beats\nNumber = 8\n</metadata>\n"},
        {"<applicationinfo>\nMinimumVersion = 3\nAppIdentifier = org.a\nLegacy = 1\n</applicationinfo>\n",
         "<applicationinfo>\nMinimumVersion = 3\nLegacy = 1\nAppIdentifier = org.a\n</applicationinfo>\n"},
    };
    for (const auto& c : cases) {
        const std::string path = folder.write("a.vcp", c.before);
        const auto record = read(path);
        ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeMetaData(record, urlOf(path)));
        EXPECT_EQ(readTextFile(path), c.after);
        const auto again = read(path);
        EXPECT_EQ(again->taggings(), record->taggings());
        EXPECT_EQ(again->keyValues(), record->keyValues());
        ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeMetaData(again, urlOf(path)));
        EXPECT_EQ(readTextFile(path), c.after) << "a second write changes nothing";
    }
}

TEST(Presets, SayWhatIsRejectedBehindTheirTags) {
    const TemporaryFolder folder;
    const std::string path = folder.write("a.vcp", kPreset);
    const auto record = read(path);
    record->setRejectedLabels({"A = B", "Kick"});
    ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeMetaData(record, urlOf(path)));
    EXPECT_THAT(*readTextFile(path), HasSubstr("\nRejected = A \\= B\nRejected = Kick\n</tagging>\n"));
    ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeMetaData(TGRTMetaData::init(), urlOf(path)));
    const auto again = read(path);
    EXPECT_EQ(again->rejectedLabels(), record->rejectedLabels());
    again->setRejectedLabels({});
    again->setTaggings(record->taggings());
    ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeMetaData(again, urlOf(path)));
    EXPECT_THAT(*readTextFile(path), testing::Not(HasSubstr("Rejected")));
}

TEST(Presets, KeepEveryTextThatARecordHolds) {
    const TemporaryFolder folder;
    const std::string awkward = "a = b\\n \\= \r\n</tagging>\nAttribs = 4001 \xe2\x99\xab ";
    for (const std::string start : {"", "no line end", "<tagging>\r\n</tagging>\r\n", "Cutoff\r\n"}) {
        const std::string path = folder.write("a.vcp", start);
        auto record = TGRTMetaData::init();
        record->setDisplayName(awkward);
        record->setSubFileType(9);
        record->setTaggings(test::taggingsOf({{"A/B = C", "Bright / Dark"}, {"Genres", "x = y"}}, 0.1));
        record->setKeyValues({TGRTKeyValue::initWithKeyStringValue(awkward, awkward),
                              TGRTKeyValue::initWithKeyNumberValue("Tempo", 120.5),
                              TGRTKeyValue::initWithKeyNumberValue("Big", ~std::uint64_t{0}),
                              TGRTKeyValue::initWithKeyNumberValue("Flag", true)});
        auto info = TGRTContentInfo::init();
        info->updateDependencyPaths({awkward, "/a"});
        record->setContentInfo(info);
        Error error;
        ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeMetaData(record, urlOf(path), &error))
            << error.message();
        const auto again = read(path, 1);
        EXPECT_EQ(again->displayName(), awkward);
        EXPECT_EQ(again->subFileType(), 9);
        EXPECT_EQ(again->taggings(), record->taggings()) << "no text is taken for old codes";
        EXPECT_EQ(again->keyValues(), record->keyValues());
        EXPECT_EQ(again->contentInfo()->assetDependencyPaths(), info->assetDependencyPaths());
        const std::string written = *readTextFile(path);
        EXPECT_TRUE(written.starts_with(start.substr(0, 9)));
        EXPECT_EQ(start.find('\r') == std::string::npos,
                  replaceAll(written, "\r\n", "").find('\n') != std::string::npos)
            << "line ends follow the file's";
        ASSERT_TRUE(TGRTVorthalPresetMetaDataWriter().writeMetaData(record, urlOf(path)));
        EXPECT_EQ(readTextFile(path), written) << "a second write changes nothing";
    }
}

TEST(Presets, RefuseWhatTheyCannotRewriteWithCertainty) {
    const TemporaryFolder folder;
    struct {
        std::string text;
        const char* reason;
    } const cases[] = {
        {"<metadata>\n<tagging>\n</tagging>\n", "a.vcp: line 1: the section does not end"},
        {"x\n<tagging>\nName = a", "a.vcp: line 2: the section does not end"},
        {"fine\n\xff\n", "a.vcp: line 2: not UTF-8"},
    };
    const TGRTVorthalPresetMetaDataWriter writer;
    for (const auto& c : cases) {
        const std::string path = folder.write("a.vcp", c.text);
        Error error;
        EXPECT_FALSE(writer.writeTaggings(test::taggingsOf({{"Genres", "House"}}), urlOf(path), &error));
        EXPECT_THAT(error.message(), testing::EndsWith(c.reason));
        EXPECT_EQ(readFile(path)->size(), c.text.size());
    }
    Error error;
    EXPECT_FALSE(writer.writeTaggings({}, urlOf(folder.path("absent.vcp")), &error));
    EXPECT_EQ(read(folder.write("a.vcp", "\xff"), 0, &error), nullptr);
    EXPECT_THAT(error.message(), testing::EndsWith("a.vcp: line 1: not UTF-8"));
}

}  // namespace
}  // namespace qvct

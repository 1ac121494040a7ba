// Records that lie in property lists: of bundles, of settings files, and embedded in data files.

#include "FormatsSupport.h"
#include "formats/TGRTFileNode.h"
#include "formats/bundle/TGRTBundleTypeValidators.h"
#include "formats/settings/TGRTBinaryFileMetaDataReader.h"
#include "formats/settings/TGRTCstSxvPstTypeValidator.h"
#include "platform/files/FileAccess.h"
#include "support/CapturedLog.h"

#include <filesystem>

#include <gmock/gmock.h>
#include <sys/stat.h>

namespace qvct {
namespace {

using test::Dictionary;
using test::read;
using test::TemporaryFolder;
using test::textsOf;
using test::urlOf;
using testing::ElementsAre;
using testing::HasSubstr;

const Dictionary kHouse = test::taggingDictionary("Genres", "House");

PropertyList::Dictionary stored(const std::string& path) {
    Error error;
    auto dictionary = readDictionaryFile(path, &error);
    EXPECT_TRUE(dictionary) << error.message();
    return dictionary.value_or(Dictionary{});
}

TEST(StoredRecords, FileTypesOfEachKind) {
    struct {
        const char* item;
        const char* list;
        int stored;
        int read;
    } const cases[] = {
        {"a.patch", "a.patch/tags.plist", 3, 1},
        {"b.patch", "b.patch/tags.plist", 0, 1},
        {"a.ostrax", "a.ostrax/Resources/tags.plist", 3, 3},
        {"b.ostrax", "b.ostrax/Resources/tags.plist", 0, 8},
        {"a.cst", "a.cst.plist", 0, 6},
        {"b.cst", "b.cst.plist", 3, 3},
        {"a.sxv", "a.sxv.plist", 0, 4},
        {"a.PST", "a.PST.plist", 0, 5},
        {"a.aaz", "a.aaz.plist", 0, 5},
    };
    const TemporaryFolder folder;
    for (const auto& c : cases) {
        test::writeList(folder, c.list, {{"Type", c.stored}, {"Tagging", kHouse}});
        const auto record = read(folder.path(c.item));
        ASSERT_TRUE(record) << c.item;
        EXPECT_EQ(record->fileType(), c.read) << c.item << " stores " << c.stored;
        EXPECT_THAT(textsOf(record->taggings()), ElementsAre("Genres/House")) << c.item;
    }
}

TEST(StoredRecords, NothingStoredIsNotBroken) {
    const TemporaryFolder folder;
    folder.write("broken.patch/tags.plist", "<plist><dict>");
    folder.write("empty.patch/x", "");
    Error error;
    for (const char* name : {"empty.patch", "absent.cst", "absent.ostrax"})
        EXPECT_EQ(read(folder.path(name), 0, &error), nullptr) << name;
    EXPECT_EQ(error.message(), "");
    const auto untagged = read(folder.path("empty.patch"), kReadUntaggedPatch);
    ASSERT_TRUE(untagged);
    EXPECT_EQ(untagged->fileType(), 1);
    EXPECT_EQ(read(folder.path("broken.patch"), 0, &error), nullptr);
    EXPECT_THAT(error.message(), HasSubstr(folder.path("broken.patch/tags.plist")));
}

TEST(StoredRecords, SubTypesFollowTheFirstTagInTheTable) {
    struct {
        std::vector<std::string_view> labels;
        int ofBundle;
        int ofPatch;
    } const cases[] = {
        {{QVTagAudioPatch}, 2, 2},
        {{QVTagAuxPatch}, 3, 3},
        {{QVTagOutputPatch}, 4, 4},
        {{QVTagInstrumentPatch}, 1, 1},
        {{QVTagDemoSong}, 1, 0},
        {{QVTagLiveLoopGrid}, 2, 0},
        {{QVTagRemixSession}, 3, 0},
        {{QVTagInstrumentPatch, QVTagOutputPatch}, 4, 4},
        {{QVTagRemixSession, QVTagDemoSong}, 1, 0},
        {{QVTagDemoSong, QVTagInstrumentPatch, QVTagAudioPatch}, 2, 2},
        {{QVTagPatch}, 0, 0},
    };
    for (const auto& c : cases) {
        ObjectSet<TGRTTagging> taggings;
        for (const auto label : c.labels)
            taggings.insertAll(test::taggingsOf({{QVCategoryContentTypeIdentifier, label}}));
        EXPECT_EQ(TGRTBundleMetaDataReader::subTypeFromTaggings(taggings), c.ofBundle) << c.labels[0];
        EXPECT_EQ(TGRTPatchMetaDataReader::patchSubTypeFromTaggings(taggings), c.ofPatch) << c.labels[0];
        EXPECT_EQ(TGRTPatchTaggingWriter().subTypeFromTaggings(taggings), c.ofBundle) << c.labels[0];
    }
}

TEST(TaggingWriters, ReplaceTaggingsAndKeepWhatIsNotTheirs) {
    const auto demo = test::taggingsOf({{QVCategoryContentTypeIdentifier, QVTagDemoSong}});
    struct {
        const char* what;
        std::shared_ptr<TGRTTaggingsWriter> writer;
        const char* item;
        const char* list;
        int type;
        PropertyList subType;  // false for none
    } const cases[] = {
        {"bare bundle", std::make_shared<TGRTBundleTaggingWriter>(), "a", "a/tags.plist", 0, 1},
        {"patch", std::make_shared<TGRTPatchTaggingWriter>(), "a.patch", "a.patch/tags.plist", 1, 1},
        {"project", std::make_shared<TGRTOstraProjectTaggingWriter>(), "a.ostrax",
         "a.ostrax/Resources/tags.plist", 8, 1},
        {"settings", std::make_shared<TGRTCstSxvPstTaggingWriter>(), "a.cst", "a.cst.plist", 6, false},
    };
    for (const auto& c : cases) {
        const TemporaryFolder folder;
        Error error;
        const URL item = urlOf(folder.path(c.item));
        ASSERT_TRUE(c.writer->writeTaggings(demo, item, &error)) << c.what << ": " << error.message();
        Dictionary expected = {{"Tagging", test::taggingDictionary("Content Type", "Demo Song")},
                               {"Type", c.type}};
        if (c.subType != PropertyList(false)) expected.set("SubType", c.subType);
        EXPECT_EQ(stored(folder.path(c.list)), expected) << c.what;

        test::writeList(
            folder, c.list,
            {{"UUID", "u"}, {"Mine", 7}, {"Type", 3}, {"SubType", 4}, {"ContentInfo", Dictionary{}}},
            PropertyListFormat::binary);
        ASSERT_TRUE(c.writer->writeTaggings({}, item, &error)) << c.what << ": " << error.message();
        Dictionary cleared = {
            {"Mine", 7}, {"Type", c.type}, {"ContentInfo", Dictionary{}}, {"Tagging", Dictionary{}}};
        if (c.subType == PropertyList(false)) cleared.set("SubType", 4);  // what bundles drop, settings keep
        EXPECT_EQ(stored(folder.path(c.list)), cleared) << c.what;
        EXPECT_TRUE(readFile(folder.path(c.list))->front() == 'b') << c.what << " keeps its encoding";
    }
}

TEST(MetaDataWriters, BundlesAreWrittenOverAndSideCarsAreKept) {
    const Dictionary before = {
        {"Mine", 7}, {"UUID", "u"}, {"SubType", 4}, {"KeyValueData", Dictionary{{"a", 1}}}};
    struct {
        const char* what;
        std::shared_ptr<TGRTMetaDataWriter> writer;
        const char* item;
        const char* list;
        int type;
        bool keeps;
    } const cases[] = {
        {"bare bundle", std::make_shared<TGRTBundleMetaDataWriter>(), "a", "a/tags.plist", 0, false},
        {"patch", std::make_shared<TGRTPatchMetaDataWriter>(), "a.patch", "a.patch/tags.plist", 1, false},
        {"project", std::make_shared<TGRTOstraProjectMetaDataWriter>(), "a.ostrax",
         "a.ostrax/Resources/tags.plist", 8, false},
        {"settings", std::make_shared<TGRTCstSxvPstMetaDataWriter>(), "a.pst", "a.pst.plist", 5, true},
    };
    for (const auto& c : cases) {
        const TemporaryFolder folder;
        test::writeList(folder, c.list, before);
        auto record = TGRTMetaData::init();
        record->setDisplayName("New");
        Error error;
        ASSERT_TRUE(c.writer->writeMetaData(record, urlOf(folder.path(c.item)), &error)) << error.message();
        EXPECT_EQ(record->fileType(), c.type) << c.what << ": the caller's record is given its type";
        Dictionary expected = {{"Tagging", Dictionary{}},
                               {"KeyValueData", Dictionary{}},
                               {"Type", c.type},
                               {"DisplayName", "New"}};
        if (c.keeps) {
            expected.set("Mine", 7);
            expected.set("SubType", 4);
        }
        EXPECT_EQ(stored(folder.path(c.list)), expected) << c.what;
        record->setFileType(2);
        ASSERT_TRUE(c.writer->writeMetaData(record, urlOf(folder.path(c.item))));
        EXPECT_EQ(*stored(folder.path(c.list)).value("Type"), PropertyList(2)) << c.what;
        EXPECT_FALSE(c.writer->writeMetaData(nullptr, urlOf(folder.path(c.item)), &error));
    }
}

TEST(ContentInfoWriters, SetTheirEntryAlone) {
    const auto info = TGRTContentInfo::init();
    info->updateDependencyPaths({"/b", "/a"});
    const Dictionary expected = {
        {"Mine", 7},
        {"UUID", "u"},
        {"ContentInfo", Dictionary{{"Dependencies", PropertyList::Array{"/a", "/b"}}}}};
    struct {
        std::shared_ptr<TGRTContentInfoWriter> writer;
        const char* item;
        const char* list;
    } const cases[] = {
        {std::make_shared<TGRTPatchContentInfoWriter>(), "a.patch", "a.patch/tags.plist"},
        {std::make_shared<TGRTOstraProjectContentInfoWriter>(), "a.ostrax", "a.ostrax/Resources/tags.plist"},
        {std::make_shared<TGRTCstSxvPstContentInfoWriter>(), "a.pst", "a.pst.plist"},
    };
    for (const auto& c : cases) {
        const TemporaryFolder folder;
        test::writeList(folder, c.list, {{"Mine", 7}, {"UUID", "u"}});
        ASSERT_TRUE(c.writer->writeContentInfo(info, urlOf(folder.path(c.item)))) << c.item;
        EXPECT_EQ(stored(folder.path(c.list)), expected) << c.item;
    }
}

TEST(Writers, LeaveWhatTheyCannotReadOrReach) {
    const TemporaryFolder folder;
    const auto taggings = test::taggingsOf({{"Genres", "House"}});
    for (const std::string bytes :
         {"<plist><dict>", "bplist00 cut", "<plist version=\"1.0\"><array/></plist>"}) {
        const std::string list = folder.write("a.cst.plist", bytes);
        Error error;
        EXPECT_FALSE(
            TGRTCstSxvPstTaggingWriter().writeTaggings(taggings, urlOf(folder.path("a.cst")), &error));
        EXPECT_EQ(error.path, list);
        EXPECT_THAT(error.reason, testing::StartsWith("not overwritten"));
        EXPECT_EQ(readTextFile(list), bytes);
    }
    Error error;
    const URL nowhere = urlOf(folder.path("absent/a.cst"));
    EXPECT_FALSE(TGRTCstSxvPstTaggingWriter().writeTaggings(taggings, nowhere, &error));
    EXPECT_THAT(error.message(), HasSubstr(nowhere.path() + ".plist"));
    EXPECT_FALSE(std::filesystem::exists(folder.path("absent"))) << "settings writers make no folder";
    folder.write("file.patch", "");
    EXPECT_FALSE(TGRTPatchTaggingWriter().writeTaggings(taggings, urlOf(folder.path("file.patch")), &error));
    EXPECT_THAT(error.message(), HasSubstr("file.patch/tags.plist"));
}

TEST(Writers, DoNotTouchAFileThatSaysItAlready) {
    const TemporaryFolder folder;
    const URL item = urlOf(folder.path("a.patch"));
    const auto taggings = test::taggingsOf({{"Genres", "House"}}, 0.5);
    ASSERT_TRUE(TGRTPatchTaggingWriter().writeTaggings(taggings, item));
    struct stat before {};
    struct stat after {};
    ::stat(folder.path("a.patch/tags.plist").c_str(), &before);
    ASSERT_TRUE(TGRTPatchTaggingWriter().writeTaggings(taggings, item));
    ::stat(folder.path("a.patch/tags.plist").c_str(), &after);
    EXPECT_EQ(before.st_ino, after.st_ino);
}

TEST(PluginTaggings, NameThePlugInsThatAreNotBypassed) {
    const TemporaryFolder folder;
    folder.write("a.patch/org.qvcontenttagging.intermediate.cache.xml",
                 "<Patch><Channels><Channel><Plugins><Plugin bypassed='0' name='Tube Amp'/>"
                 "<Plugin bypassed='1' name='Echo'/><Plugin bypassed='0' name=''/><Plugin bypassed='0'/>"
                 "<Plugin bypassed='10' name='Odd &amp; Even'/></Plugins></Channel></Channels>"
                 "<Plugin bypassed='0' name='Elsewhere'/>");  // cut off
    const test::CapturedLog log;
    const auto taggings = TGRTPatchMetaDataReader::pluginTaggingsForURL(urlOf(folder.path("a.patch")));
    EXPECT_TRUE(TGRTPatchMetaDataReader::pluginTaggingsForURL(urlOf(folder.path("b.patch"))).empty());
    // Without a level: not "=0.00".
    EXPECT_THAT(textsOf(taggings), ElementsAre("Plugins/Odd & Even", "Plugins/Tube Amp"));
    EXPECT_THAT(log.messages(), ElementsAre("pluginName Tube Amp", "pluginName Odd & Even"));
}

TEST(DataFiles, FindTheirListBetweenOtherBytes) {
    const TemporaryFolder folder;
    const std::string list = serializePropertyList(
        Dictionary{{"Tagging", kHouse},
                   {"Type", 4},
                   {"DisplayName", "Deep"},
                   {"ContentInfo", Dictionary{{"Dependencies", PropertyList::Array{"/a"}}}},
                   {"KeyValueData", Dictionary{{"a", 1}}}},
        PropertyListFormat::binary);
    const auto record = read(folder.write(
        "a.data", std::string("before\0bplist0", 14) + list + std::string(40, '\0') + "bplist00"));
    EXPECT_EQ(record->fileType(), 4);
    EXPECT_EQ(record->displayName(), "Deep");
    EXPECT_EQ(record->contentInfo()->assetDependencyPaths().count("/a"), 1U);
    EXPECT_THAT(textsOf(record->taggings()), ElementsAre("Genres/House"));
    EXPECT_TRUE(record->keyValues().empty());
}

TEST(DataFiles, LogOneLineWhenThereIsNone) {
    const TemporaryFolder folder;
    const std::string array = serializePropertyList(PropertyList::Array{1}, PropertyListFormat::binary);
    std::string damaged = "xx" + array;
    damaged[10] = '\xF0';
    struct {
        std::string bytes;
        const char* reason;
    } const cases[] = {
        {damaged, "embedded binary property list, byte 10: unknown marker 0xf"},
        {"no list at all", "no embedded property list"},
        {"xxbplist00" + std::string(60, 'x'), "embedded property list, byte 2: has no end"},
        {array, "embedded property list, byte 0: is no dictionary"},
    };
    for (const auto& c : cases) {
        const std::string path = folder.write("a.data", c.bytes);
        const test::CapturedLog log;
        Error error;
        const auto record = read(path, 0, &error);
        ASSERT_TRUE(record);
        EXPECT_EQ(record->fileType(), 0);
        EXPECT_THAT(log.messages(), ElementsAre("Indexing " + path + ": " + c.reason));
        EXPECT_EQ(error.code, 2);
        EXPECT_EQ(error.message(), path + ": " + c.reason);
    }
}

}  // namespace
}  // namespace qvct

#include "demo/files/AudioFiles.h"
#include "formats/FormatsSupport.h"
#include "formats/TGRTMetaDataReader.h"
#include "indexing/TGRTIndexableContentObject.h"
#include "media/loopfile/LCFileParser.h"
#include "media/loopfile/LCFileWriter.h"

#include <functional>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using test::Dictionary;
using test::TemporaryFolder;
using test::textsOf;
using test::urlOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::IsSupersetOf;
using testing::Not;
using Array = PropertyList::Array;
using Object = TGRTIndexableContentObject;

std::shared_ptr<Object> objectAt(const std::string& path, std::uint64_t options = 0, Error* error = nullptr) {
    return Object::indexableContentObjectForURL(urlOf(path), options, error);
}

std::string writeTone(const TemporaryFolder& folder, std::string_view name) {
    std::string path = folder.path(name);
    demo::writeSound(path, {.samples = std::vector<float>(4410, 0.25F)});
    return path;
}

/// Audio that our own record makes a loop of.
std::string writeLoop(const TemporaryFolder& folder, const std::function<void(LCFileData&)>& edit) {
    std::string path = writeTone(folder, "A Loop.caf");
    const auto data = LCFileParser::fileParserForURL(urlOf(path))->fileData();
    data->setTavioLoopType(0);
    edit(*data);
    EXPECT_TRUE(LCFileWriter::fileWriterForURL(urlOf(path))->writeFileData(data));
    return path;
}

/// A channel strip, whose record lies beside it.
std::string writeStrip(const TemporaryFolder& folder, const Dictionary& record) {
    test::writeList(folder, "Lead Vox.cst.plist", record);
    return folder.write("Lead Vox.cst", "settings");
}

Dictionary tag(const char* label) {
    return {{"Name", label}};
}

TEST(IndexableObject, HoldsWhatTheRecordSays) {
    const TemporaryFolder folder;
    const std::string path = writeStrip(
        folder, {{"DisplayName", "Vocal"},
                 {"SubType", 3},
                 {"Tagging", Dictionary{{"Soundpack", Array{tag("0010_toybox"), tag("0022_ultimate808s")}},
                                        {"Source", Array{tag("Kick")}}}},
                 {"KeyValueData", Dictionary{{"Tempo", 120}}},
                 {"ContentInfo", Dictionary{{"Dependencies", Array{"/b.wav", "/a.wav"}}}}});
    const auto object = objectAt(path);
    ASSERT_NE(object, nullptr);
    EXPECT_EQ(object->displayName(), "Vocal");
    EXPECT_EQ(object->fileType(), 6);
    EXPECT_EQ(object->subFileType(), 3);
    EXPECT_FALSE(object->previewAvailable());
    EXPECT_THAT(object->packageIdentifiers(), ElementsAre("0010_toybox", "0022_ultimate808s"));
    EXPECT_EQ(object->dependencyItems().size(), 2U);
    EXPECT_EQ(object->valueDatas().ordered()[0]->key(), "Tempo");
    // "Drums", above "Kick", is for the host to know.
    EXPECT_THAT(textsOf(object->taggingDatas()), ElementsAre("Content Type/CST", "Soundpack/0010_toybox",
                                                             "Soundpack/0022_ultimate808s", "Source/Kick"));

    folder.write("Lead Vox.cst.caf", "sound");
    EXPECT_TRUE(objectAt(path)->previewAvailable());
}

TEST(IndexableObject, IsMissingOrNotAsTheOptionsSay) {
    const TemporaryFolder folder;
    const std::string audio = writeTone(folder, "tone.wav");
    const std::string bare = folder.write("Bare Strip.cst", "settings");
    const std::string patch = folder.path("Bare Patch.patch");
    folder.write("Bare Patch.patch/prelisten.caf", "sound");
    const std::string broken = folder.write("broken.wav", "RIFF");
    const std::string text = folder.write("notes.v2.txt", "");
    struct {
        const char* what;
        std::string path;
        std::int64_t fileType;  // -1: no object unless asked for all
        std::int64_t fileTypeOfAll;
        const char* name;
        bool previewAvailable;
        const char* error;
    } const cases[] = {{"plain audio", audio, 7, 7, "tone", true, ""},
                       {"settings without record", bare, -1, 0, "Bare Strip", false, ""},
                       {"patch without record", patch, -1, 1, "Bare Patch", true, ""},
                       {"audio that is none", broken, -1, 0, "broken", true, "broken.wav"},
                       {"no content", text, -1, 0, "notes.v2", false, "notes.v2.txt: no kind of content"}};
    for (const auto& c : cases) {
        SCOPED_TRACE(c.what);
        Error error;
        const auto object = objectAt(c.path, 0, &error);
        EXPECT_THAT(error.message(), *c.error == '\0' ? testing::Matcher<std::string>(IsEmpty())
                                                      : testing::Matcher<std::string>(HasSubstr(c.error)));
        EXPECT_EQ(object ? object->fileType() : -1, c.fileType);
        const auto all = objectAt(c.path, kIndexWithoutRecord);
        ASSERT_NE(all, nullptr);
        EXPECT_EQ(all->fileType(), c.fileTypeOfAll);
        EXPECT_EQ(all->displayName(), c.name);
        EXPECT_EQ(all->previewAvailable(), c.previewAvailable);
    }
    EXPECT_THAT(textsOf(objectAt(audio)->taggingDatas()), IsEmpty()) << "audio files have no content type";
    EXPECT_THAT(textsOf(objectAt(patch, kIndexWithoutRecord)->taggingDatas()),
                ElementsAre("Content Type/Patch"));
}

TEST(IndexableObject, IsMadeOfFilesOnly) {
    for (const std::uint64_t options : {0x0U, 0x4U, 0x100U, 0x104U}) {
        Error error;
        const URL url = URL::URLWithString("https://example.org/a.wav");
        EXPECT_EQ(Object::indexableContentObjectForURL(url, options, &error), nullptr) << options;
        EXPECT_THAT(error.message(), HasSubstr("example.org/a.wav: not a file URL"));
    }
}

TEST(IndexableObject, TakesTheFileNameForAnEmptyOne) {
    const TemporaryFolder folder;
    for (const Dictionary& record : {Dictionary{{"Type", 6}}, Dictionary{{"DisplayName", ""}}}) {
        const auto object = objectAt(writeStrip(folder, record));
        ASSERT_NE(object, nullptr);
        EXPECT_EQ(object->displayName(), "Lead Vox");
    }
}

TEST(IndexableObject, LearnsUnknownTagsOnlyInTheWritableTaxonomy) {
    const TemporaryFolder folder;
    const std::string path =
        writeStrip(folder, {{"Tagging", Dictionary{{"Custom", Array{tag("Tape Hiss of Ours")}}}}});
    EXPECT_THAT(textsOf(objectAt(path)->taggingDatas()), ElementsAre("Content Type/CST"));
    EXPECT_THAT(textsOf(objectAt(path, kIndexInMutableTaxonomy)->taggingDatas()),
                ElementsAre("Content Type/CST", "Custom/Tape Hiss of Ours"));
}

TEST(LoopTaggings, FollowFromTheValues) {
    struct {
        int top, bottom, keyType, root;
        std::set<std::string> labels;
    } const cases[] = {
        {6, 8, 2, 57, {"6/8", "Major KeyType", "A"}},   {4, 4, 1, 48, {"4/4", "Minor KeyType", "C"}},
        {3, 4, 3, 59, {"3/4", "Neither KeyType", "B"}}, {4, 4, 4, 60, {"4/4", "Both KeyType"}},
        {4, 4, 0, 47, {"4/4", "Any KeyType"}},          {0, 4, 2, 49, {"Major KeyType", "CSharp"}},
        {4, 0, 9, 58, {"Any KeyType", "ASharp"}},       {7, 8, 2, -1, {"Major KeyType"}}};
    for (const auto& c : cases) {
        const TemporaryFolder folder;
        const std::string path = writeLoop(folder, [&c](LCFileData& data) {
            data.setSignatureTop(c.top);
            data.setSignatureBottom(c.bottom);
            data.setKeyType(c.keyType);
            data.setMidiRootNote(c.root);
        });
        std::set<std::string> expected = {"Content Type/Tavio Loop"};
        for (const std::string& label : c.labels) expected.insert("Loop Specifics/" + label);
        EXPECT_EQ(textsOf(objectAt(path)->taggingDatas()), expected) << c.top << "/" << c.bottom;
    }
}

TEST(LoopTaggings, AreOfLoopsOnly) {
    const auto record = TGRTMetaData::init();
    const Dictionary values{{"SignatureTop", 4}, {"SignatureBottom", 4}, {"MidiRootNote", 57}};
    const PropertyList list(values);
    record->setKeyValues(TGRTKeyValue::keyValuesWithDictionary(&list));
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    for (const std::int64_t fileType : {0, 1, 2, 7, 8}) {
        record->setFileType(fileType);
        EXPECT_EQ(Object::virtualLoopTaggingsForMetaData(*record, *taxonomy).size(), fileType == 2 ? 3U : 0U);
        EXPECT_THAT(textsOf(Object::virtualLoopTaggingsForMetaData(*record, *TGRTTaxonomy::init())),
                    IsEmpty());
    }
}

TEST(LoopTaggings, ComeFromTheChunksOfOtherMakers) {
    const TemporaryFolder folder;
    const std::string path = folder.path("theirs.wav");
    demo::writeWav(path,
                   {.samples = std::vector<float>(88200, 0.25F),
                    .rootNote = 57,
                    .loop = demo::LoopFacts{.tempo = 120, .beats = 4, .meterTop = 3, .meterBottom = 4}});
    EXPECT_THAT(textsOf(objectAt(path)->taggingDatas()),
                ElementsAre("Content Type/Tavio Loop", "Loop Specifics/3/4", "Loop Specifics/A",
                            "Loop Specifics/Any KeyType"));
}

TEST(ContentType, FollowsFromTheFileType) {
    const std::pair<std::int64_t, const char*> labels[] = {
        {1, "Patch"},   {2, "Tavio Loop"}, {3, "Vorthal Setting"}, {4, "SXV"},    {5, "PST"},  {6, "CST"},
        {8, "Project"}, {7, nullptr},      {0, nullptr},           {-1, nullptr}, {9, nullptr}};
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    for (const auto& [fileType, label] : labels) {
        const auto tagging = Object::taggingForTagLabel(Object::tagLabelForFileType(fileType), std::nullopt,
                                                        QVCategoryContentTypeIdentifier, *taxonomy);
        ASSERT_EQ(tagging != nullptr, label != nullptr) << fileType;
        if (label == nullptr) continue;
        EXPECT_EQ(tagging->label(), std::string_view(label));
    }
    EXPECT_EQ(Object::taggingForTagLabel("A", "Key Type", "Loop Specifics", *taxonomy), nullptr);
}

TEST(VirtualTaggings, AreTheAncestorsThatAreNotThere) {
    const auto taggings = test::taggingsOf({{"Genres", "Deep House"},
                                            {"Source", "Kick"},
                                            {"Source", "Drums"},
                                            {"Source", "Cello"},
                                            {"Content Type", "Audio Loop"},
                                            {"Effects", "Chorus"}},
                                           1.0);
    Object::CategoryTaggings byCategory;
    for (const auto& tagging : taggings) byCategory[tagging->category()].insert(tagging);
    EXPECT_THAT(textsOf(Object::virtualTaggings(taggings, byCategory)),
                ElementsAre("Content Type/Tavio Loop", "Genres/Electronic Music=0.50", "Genres/House=0.50",
                            "Source/Strings"));
    EXPECT_THAT(textsOf(Object::virtualTaggings(taggings, {})), IsEmpty());
    EXPECT_EQ(
        Object::taggingsByAddingVirtualTagsToTaggings(taggings, nullptr, *TGRTTaxonomy::defaultTaxonomy()),
        taggings);
}

TEST(AdjustedTaggings, SayOldKeywordsInTagsOfToday) {
    const TemporaryFolder folder;
    const std::string path = writeLoop(folder, [](LCFileData& data) {
        data.setDescriptors({"Cheerful", "Distorted", "Dark"});
        data.setTaggingDictionary(
            {{"Sound Descriptors", Array{Dictionary{{"Name", "Bright / Dark"}, {"Weight", 0.25}}}}});
    });
    const auto texts = textsOf(objectAt(path, kReadLegacyTaggings)->taggingDatas());
    EXPECT_THAT(texts, IsSupersetOf({"Positive Emotions/Happy", "Effects/Distortion", "LoopDescriptors/Dark",
                                     "Sound Descriptors/Bright / Dark=0.25"}));
    EXPECT_THAT(texts, Not(testing::Contains("Sound Descriptors/Bright / Dark=0.80")))
        << "the loop's own level stands";
    EXPECT_THAT(textsOf(objectAt(path)->taggingDatas()), Not(testing::Contains("Effects/Distortion")))
        << "nobody asked for old keywords";
}

}  // namespace
}  // namespace qvct

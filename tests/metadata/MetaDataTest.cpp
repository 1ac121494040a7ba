#include "metadata/TGRTMetaData.h"
#include "platform/data/PropertyListFile.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <limits>
#include <optional>
#include <set>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using Array = PropertyList::Array;
using Dictionary = PropertyList::Dictionary;

std::shared_ptr<TGRTMetaData> recordOf(const Dictionary& dictionary) {
    return TGRTMetaData::metaDataFromDictionary(&dictionary, *TGRTTaxonomy::defaultTaxonomy());
}

std::vector<std::string> keys(const Dictionary& dictionary) {
    std::vector<std::string> result;
    for (const auto& entry : dictionary) result.push_back(entry.key);
    return result;
}

Dictionary fullRecord() {
    return {{"Tagging", Dictionary{{"Genres", Array{Dictionary{{"Name", "Deep House"}, {"Weight", 0.5}}}},
                                   {"Source", Array{Dictionary{{"Name", "Bass"}, {"AutoTagging", true}},
                                                    Dictionary{{"Name", "Drums"}}}}}},
            {"ContentInfo", Dictionary{{"Dependencies", Array{"/a.wav"}}}},
            {"KeyValueData", Dictionary{{"BeatCount", 8}, {"Comment", "x"}, {"Tempo", 120.5}}},
            {"Type", 2},
            {"SubType", 4},
            {"DisplayName", "Deep"}};
}

TEST(MetaData, SurvivesBeingStoredAndReadBack) {
    const test::TemporaryFolder folder;
    const URL url = URL::fileURLWithPath(folder.path("tags.plist"));
    const auto record = recordOf(fullRecord());
    for (const auto format : {PropertyListFormat::xml, PropertyListFormat::binary}) {
        ASSERT_TRUE(writePropertyListFile(record->prepareDictionaryForURL(url), url.path(), format));
        EXPECT_EQ(PropertyList(*readDictionaryFile(url.path())), PropertyList(fullRecord()));
    }
    EXPECT_EQ(record->valueForKey("Tempo"), PropertyList(120.5));
    EXPECT_EQ(record->valueForKey("tempo"), std::nullopt);
    EXPECT_EQ(record->taggings().size(), 3U);
}

TEST(MetaData, WritingKeepsWhatItDoesNotProduce) {
    const test::TemporaryFolder folder;
    const Dictionary stored{{"zebra", PropertyList::Date{1e8}},
                            {"UUID", "old"},
                            {"SubType", 5},
                            {"Tagging", Dictionary{{"Genres", Array{Dictionary{{"Name", "House"}}}}}},
                            {"number", std::numeric_limits<std::uint64_t>::max()},
                            {"DisplayName", "Old"},
                            {"ContentInfo", Dictionary{{"Dependencies", Array{"/a"}}}},
                            {"archive", PropertyList::Uid{9}},
                            {"bytes", PropertyList::Data{0, 1}}};
    const auto record = TGRTMetaData::init();
    record->setFileType(3);
    const Dictionary expected{{"zebra", PropertyList::Date{1e8}},
                              {"SubType", 5},
                              {"Tagging", Dictionary{}},
                              {"number", std::numeric_limits<std::uint64_t>::max()},
                              {"ContentInfo", Dictionary{{"Dependencies", Array{"/a"}}}},
                              {"archive", PropertyList::Uid{9}},
                              {"bytes", PropertyList::Data{0, 1}},
                              {"KeyValueData", Dictionary{}},
                              {"Type", 3}};
    for (const auto format : {PropertyListFormat::xml, PropertyListFormat::binary}) {
        const URL url = URL::fileURLWithPath(folder.path("tags.plist"));
        ASSERT_TRUE(writePropertyListFile(stored, url.path(), format));
        ASSERT_TRUE(writePropertyListFile(record->prepareDictionaryForURL(url), url.path(), format));
        const auto read = readDictionaryFile(url.path());
        EXPECT_EQ(PropertyList(*read), PropertyList(expected));
        EXPECT_EQ(keys(*read), keys(expected));
    }
}

TEST(MetaData, SaysWhenWhatIsStoredCannotBeRead) {
    const test::TemporaryFolder folder;
    const auto record = TGRTMetaData::init();
    Error error;
    EXPECT_EQ(record->prepareDictionaryForURL(URL::fileURLWithPath(folder.path("none")), &error).size(), 3U);
    EXPECT_EQ(error.message(), "");
    for (const char* broken : {"<plist><dict>", "<plist><dict/></plist>behind"}) {
        const URL url = URL::fileURLWithPath(folder.write("broken", broken));
        EXPECT_EQ(record->prepareDictionaryForURL(url, &error).size(), 3U);
        EXPECT_THAT(error.message(), testing::HasSubstr(url.path())) << broken;
        error = {};
    }
}

TEST(MetaData, CountsWrongTypesAsAbsent) {
    const auto record = recordOf({{"Tagging", Array{"x"}},
                                  {"ContentInfo", 1},
                                  {"KeyValueData", Array{Dictionary{}}},
                                  {"Type", Array{2}},
                                  {"SubType", "7 of 9"},
                                  {"DisplayName", PropertyList::Data{65}}});
    EXPECT_TRUE(record->taggings().empty());
    ASSERT_NE(record->contentInfo(), nullptr);
    EXPECT_TRUE(record->keyValues().empty());
    EXPECT_EQ(record->fileType(), 0);
    EXPECT_EQ(record->subFileType(), 7);
    EXPECT_EQ(record->displayName(), std::nullopt);
    EXPECT_EQ(TGRTMetaData::metaDataFromDictionary(nullptr, *TGRTTaxonomy::defaultTaxonomy()), nullptr);
}

TEST(MetaData, StoresRejectedLabelsOnlyWhereThereAreSome) {
    const Dictionary none;
    const struct {
        const char* what;
        Dictionary stored;
        std::optional<std::set<std::string>> labels;
        Dictionary after;  // without what every record stores
    } cases[] = {
        {"none where none are", none, std::set<std::string>{}, none},
        {"a new one", none, std::set<std::string>{"Snare", "Kick"}, {{"Rejected", Array{"Kick", "Snare"}}}},
        {"what is no label stands behind the others",
         {{"Rejected", Array{5, "Kick"}}},
         std::set<std::string>{"Snare"},
         {{"Rejected", Array{"Snare", 5}}}},
        {"the same in another order stays",
         {{"Rejected", Array{"Snare", 5, "Kick"}}},
         std::set<std::string>{"Kick", "Snare"},
         {{"Rejected", Array{"Snare", 5, "Kick"}}}},
        {"the last is taken back", {{"Rejected", Array{"Kick"}}}, std::set<std::string>{}, none},
        {"another type stays", {{"Rejected", "Kick"}}, std::set<std::string>{}, {{"Rejected", "Kick"}}},
        {"and makes room", {{"Rejected", 5}}, std::set<std::string>{"Kick"}, {{"Rejected", Array{"Kick"}}}},
        {"a record that does not know them leaves them",
         {{"Rejected", Array{"Kick"}}},
         std::nullopt,
         {{"Rejected", Array{"Kick"}}}},
    };
    for (const auto& c : cases) {
        const auto record = TGRTMetaData::init();
        if (c.labels) record->setRejectedLabels(*c.labels);
        for (const auto& store : {&TGRTMetaData::storeInto, &TGRTMetaData::storeOver}) {
            Dictionary stored = c.stored;
            ((*record).*store)(stored);
            if (c.labels) {
                EXPECT_EQ(recordOf(stored)->rejectedLabels(), *c.labels) << c.what;
            }
            for (const char* key : {"Tagging", "KeyValueData", "Type"}) stored.remove(key);
            EXPECT_EQ(PropertyList(stored), PropertyList(c.after)) << c.what;
        }
    }
}

TEST(MetaData, KeepsACopyOfItsContentInfo) {
    const auto info = TGRTContentInfo::init();
    const auto record = TGRTMetaData::init();
    record->setContentInfo(info);
    info->updateDependencyPaths({"/a"});
    EXPECT_THAT(record->contentInfo()->assetDependencyPaths(), IsEmpty());
}

TEST(KeyValue, IsKnownByKeyKindAndValueAtCreation) {
    const auto number = [](PropertyList value) { return TGRTKeyValue::initWithKeyNumberValue("k", value); };
    const auto text = TGRTKeyValue::initWithKeyStringValue("k", "120");
    struct {
        const char* what;
        std::shared_ptr<TGRTKeyValue> a, b;
        bool equal;
    } const cases[] = {
        {"integer and real", number(120), number(120.0), true},
        {"string and number", text, number(120), false},
        {"values", number(120), number(120.5), false},
        {"close reals", number(0.1), number(0.1000000000000001), false},
        {"the largest", number(std::numeric_limits<std::uint64_t>::max()), number(-1), false},
        {"keys", text, TGRTKeyValue::initWithKeyStringValue("l", "120"), false},
    };
    for (const auto& c : cases) EXPECT_EQ(c.a->isEqual(*c.b), c.equal) << c.what;
    EXPECT_EQ(number("text"), nullptr);
    const auto changed = TGRTKeyValue::initWithKeyStringValue("k", "120");
    changed->setStringValue(std::nullopt);
    EXPECT_EQ(changed->value(), std::nullopt);
    changed->setNumberValue(PropertyList(3));
    EXPECT_EQ(changed->value(), PropertyList(3));
    EXPECT_TRUE(changed->isEqual(*text));
}

TEST(KeyValue, PassesOverWhatIsNeitherStringNorNumber) {
    const PropertyList list = Dictionary{{"array", Array{1}},
                                         {"date", PropertyList::Date{0}},
                                         {"flag", true},
                                         {"dictionary", Dictionary{}},
                                         {"Tempo", 120},
                                         {"data", PropertyList::Data{1}},
                                         {"uid", PropertyList::Uid{1}},
                                         {"text", ""}};
    const auto items = TGRTKeyValue::keyValuesWithDictionary(&list);
    EXPECT_THAT(keys(TGRTKeyValue::keyValueDictionaryForKeyValues(items)),
                ElementsAre("flag", "Tempo", "text"));
    EXPECT_TRUE(TGRTKeyValue::keyValuesWithDictionary(nullptr).empty());
    const ObjectSet<TGRTKeyValue> twoOfOneKey = {TGRTKeyValue::initWithKeyStringValue("k", "first"),
                                                 TGRTKeyValue::initWithKeyStringValue("other", "x"),
                                                 TGRTKeyValue::initWithKeyNumberValue("k", 2)};
    EXPECT_EQ(PropertyList(TGRTKeyValue::keyValueDictionaryForKeyValues(twoOfOneKey)),
              PropertyList(Dictionary{{"k", 2}, {"other", "x"}}));
}

TEST(MetaData, DescribesItselfAndItsKeyValues) {
    EXPECT_THAT(TGRTKeyValue::initWithKeyNumberValue("Tempo", 120.5)->description(),
                testing::MatchesRegex("<TGRTKeyValue 0x[0-9a-f]+> Key: Tempo Value: 120.5"));
    const auto record =
        recordOf({{"DisplayName", "Deep"}, {"Type", 2}, {"KeyValueData", Dictionary{{"a", "b"}}}});
    EXPECT_THAT(
        record->description(),
        testing::MatchesRegex("<TGRTMetaData 0x[0-9a-f]+> displayName: Deep fileType: 2 subFileType: 0 "
                              "taggings: \\{\\} keyValues: \\{<TGRTKeyValue .*> Key: a Value: b\\} "
                              "contentInfo: <TGRTContentInfo .*> .*"));
}

}  // namespace
}  // namespace qvct

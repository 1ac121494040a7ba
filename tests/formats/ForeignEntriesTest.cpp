// What other programs put into a record survives whatever is written into it.

#include "FormatsSupport.h"
#include "formats/TGRTFileNode.h"
#include "media/loopfile/LCFileParser.h"
#include "media/loopfile/LCFileWriter.h"
#include "metadata/StoredParts.h"
#include "support/AudioFixtures.h"

#include <map>
#include <random>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using test::Dictionary;
using test::TemporaryFolder;
using test::urlOf;
using Array = PropertyList::Array;

constexpr std::string_view kMark = "foreign";

/// Records with things that no record of ours has, each under a mark of its own.
class RecordGenerator {
  public:
    explicit RecordGenerator(unsigned seed) : random_(seed) {}

    bool flip() { return random_() % 2 == 0; }
    std::size_t below(std::size_t count) { return random_() % count; }

    PropertyList foreign() {
        Dictionary value{{std::string(kMark), ++marks_}, {"date", PropertyList::Date{1e8}}};
        if (flip()) value.set("deep", Array{PropertyList::Data{1, 2}, Array{PropertyList::Date{0}, "x"}});
        return value;
    }

    Dictionary record(int fileType) {
        Dictionary record{{"Type", fileType}};
        addSome(record, "top");
        record.set("Tagging", taggings());
        record.set("KeyValueData", keyValues());
        record.set("ContentInfo", contentInfo());
        if (flip()) record.set("DisplayName", "Old");
        addSome(record, "bottom");
        return record;
    }

  private:
    void addSome(Dictionary& dictionary, const char* key) {
        if (flip()) dictionary.set(key, foreign());
    }
    void addSome(Array& array) {
        if (flip())
            array.insert(array.begin() + static_cast<std::ptrdiff_t>(below(array.size() + 1)), foreign());
    }

    Dictionary taggings() {
        Dictionary categories;
        addSome(categories, "no array");
        for (const char* category : {"Source", "Genres", "Mine"}) {
            Array entries;
            for (const char* label : {"Zither", "House", "Bass", "Deep"}) {
                if (flip()) continue;
                Dictionary entry{{"Name", label}};
                addSome(entry, "colour");
                if (flip()) entry.set("Weight", flip() ? PropertyList(0.5) : PropertyList(1));
                if (flip()) entry.set("AutoTagging", true);
                addSome(entry, "by");
                entries.emplace_back(entry);
                if (below(4) == 0)
                    entries.emplace_back(
                        Dictionary{{"Name", label}, {"Weight", 0.125}, {"twice", foreign()}});
            }
            addSome(entries);
            categories.set(category, entries);
        }
        return categories;
    }

    Dictionary keyValues() {
        Dictionary values;
        for (const char* key : {"a", "b", "c", "d"}) {
            if (flip()) values.set(key, flip() ? PropertyList("text") : PropertyList(7.5));
            addSome(values, (std::string(key) + " foreign").c_str());
        }
        return values;
    }

    Dictionary contentInfo() {
        Dictionary info;
        addSome(info, "licence");
        Array paths{"/z", "/a"};
        addSome(paths);
        info.set("Dependencies", paths);
        Array applications{Dictionary{{"AppIdentifier", "org.a"}, {"MinimumVersion", "1"}}};
        if (flip()) applications.emplace_back(Dictionary{{"MinimumVersion", "2"}, {"nameless", foreign()}});
        Dictionary other{{"AppIdentifier", "org.b"}};
        addSome(other, "vendor");
        applications.emplace_back(other);
        info.set("ApplicationInfos", applications);
        return info;
    }

    std::mt19937 random_;
    int marks_ = 0;
};

/// What stands below each mark.
std::map<std::int64_t, PropertyList> marked(const PropertyList& value) {
    std::map<std::int64_t, PropertyList> found;
    if (const Dictionary* dictionary = value.dictionary()) {
        if (const PropertyList* mark = dictionary->value(kMark)) return {{*mark->signedInteger(), value}};
        for (const auto& entry : *dictionary) found.merge(marked(entry.value));
    }
    if (const Array* array = value.array()) {
        for (const PropertyList& item : *array) found.merge(marked(item));
    }
    return found;
}

/// An item of one kind, and its record as it is stored.
struct Item {
    const char* name;
    int fileType;
    std::string list = {};  // where the record lies; empty in audio
    std::string sound = {};

    void store(const TemporaryFolder& folder, const Dictionary& record) const {
        if (list.empty()) {
            const URL url = urlOf(folder.write(name, sound));
            const auto data = std::make_shared<LCFileData>(LCAudioFacts{}, record);
            ASSERT_TRUE(LCFileWriter::fileWriterForURL(url)->writeFileData(data));
            return;
        }
        test::writeList(folder, list, record);
        if (list.starts_with(std::string(name) + ".")) folder.write(name, "settings");
    }
    Dictionary stored(const TemporaryFolder& folder) const {
        if (!list.empty()) return readDictionaryFile(folder.path(list)).value_or(Dictionary{});
        return LCFileParser::fileParserForURL(urlOf(folder.path(name)))->fileData()->record();
    }
};

std::vector<Item> items() {
    using test::Aiff;
    using test::Caf;
    const test::Wav wav;
    return {{"a.wav", 7, "", wav.file(wav.format() + wav.data(40))},
            {"a.aif", 7, "", Aiff::file(Aiff::common(1, 20, 16) + Aiff::sound(40))},
            {"a.caf", 7, "", Caf::file(Caf::description() + Caf::data(40))},
            {"a.patch", 1, "a.patch/tags.plist"},
            {"a.ostrax", 8, "a.ostrax/Resources/tags.plist"},
            {"a.cst", 6, "a.cst.plist"}};
}

using Record = std::shared_ptr<TGRTMetaData>;

bool writeTaggings(const URL& url, const Record& record) {
    return TGRTFileNode::nodeWithFileURL(url)->taggingWriterForFileURL(url)->writeTaggings(record->taggings(),
                                                                                           url);
}
bool writeContentInfo(const URL& url, const Record& record) {
    return TGRTFileNode::nodeWithFileURL(url)->contentInfoWriterForFileURL(url)->writeContentInfo(
        record->contentInfo(), url);
}
bool writeMetaData(const URL& url, const Record& record) {
    return TGRTFileNode::nodeWithFileURL(url)->metaDataWriterForFileURL(url)->writeMetaData(record, url);
}

Record read(const URL& url) {
    return TGRTFileNode::nodeWithFileURL(url)->readMetaDataWithOptions(0);
}

/// Without the tags of that label.
void removeTags(Dictionary& record, std::string_view label) {
    PropertyList& categories = *record.value("Tagging");
    Dictionary left;
    for (const auto& [category, entries] : *categories.dictionary()) {
        if (entries.array() == nullptr) {
            left.append(category, entries);
            continue;
        }
        Array kept;
        for (const PropertyList& entry : *entries.array()) {
            const PropertyList* name = entry.dictionary()->value("Name");
            if (name == nullptr || *name != PropertyList(label)) kept.push_back(entry);
        }
        if (!kept.empty() || entries.array()->empty()) left.append(category, kept);
    }
    categories = left;
}

TEST(ForeignEntries, SurviveEveryKindOfWrite) {
    for (unsigned seed = 0; seed < 8; ++seed) {
        for (const Item& item : items()) {
            const std::string what = std::string(item.name) + ", seed " + std::to_string(seed);
            RecordGenerator generator(seed);
            const Dictionary original = generator.record(item.fileType);
            const TemporaryFolder folder;
            item.store(folder, original);
            const URL url = urlOf(folder.path(item.name));

            for (const auto& write : {&writeTaggings, &writeContentInfo, &writeMetaData}) {
                ASSERT_TRUE(write(url, read(url))) << what;
                ASSERT_EQ(item.stored(folder), original) << what << ": nothing was changed";
            }

            auto record = read(url);
            record->setRejectedLabels({"Snare", "Kick"});
            ASSERT_TRUE(writeMetaData(url, record)) << what;
            Dictionary rejecting = original;
            rejecting.set("Rejected", Array{"Kick", "Snare"});
            ASSERT_EQ(item.stored(folder), rejecting) << what;
            ASSERT_TRUE(writeTaggings(url, TGRTMetaData::init())) << what;
            ASSERT_TRUE(writeTaggings(url, record)) << what;
            EXPECT_EQ(read(url)->rejectedLabels(), record->rejectedLabels()) << what;
            item.store(folder, rejecting);
            record = read(url);
            record->setRejectedLabels({});
            ASSERT_TRUE(writeMetaData(url, record)) << what;
            ASSERT_EQ(item.stored(folder), original) << what;

            record = read(url);
            record->setDisplayName("New");
            ASSERT_TRUE(writeMetaData(url, record)) << what;
            Dictionary expected = original;
            expected.set("DisplayName", "New");
            ASSERT_EQ(item.stored(folder), expected) << what;

            record = read(url);
            auto taggings = record->taggings();
            for (const auto& house : record->taggings()) {
                if (house->label() == "House") taggings.erase(*house);
            }
            taggings.insertAll(test::taggingsOf({{"Genres", "Ambient"}, {"New", "Tag"}}, 0.25));
            record->setTaggings(taggings);
            ASSERT_TRUE((seed % 2 == 0 ? writeTaggings : writeMetaData)(url, record)) << what;
            removeTags(expected, "House");
            EXPECT_EQ(marked(item.stored(folder)), marked(expected)) << what;
            EXPECT_EQ(read(url)->taggings(), taggings) << what;

            auto louder = ObjectSet<TGRTTagging>{};
            for (const auto& tagging : taggings)
                louder.insertAll(test::taggingsOf({{tagging->category(), tagging->label()}}, 0.75));
            ASSERT_TRUE((record->setTaggings(louder), writeTaggings(url, record))) << what;
            EXPECT_EQ(read(url)->taggings(), louder) << what;

            const auto before = marked(item.stored(folder));
            record->contentInfo()->updateDependencyPaths({"/m"});
            const auto application = TGRTApplicationInfo::init();
            application->setAppIdentifier("org.c");
            auto applications = record->contentInfo()->applicationInfos();
            applications.insert(application);
            record->contentInfo()->setApplicationInfos(applications);
            ASSERT_TRUE((seed % 2 == 0 ? writeContentInfo : writeMetaData)(url, record)) << what;
            EXPECT_EQ(marked(item.stored(folder)), before) << what;
            EXPECT_EQ(PropertyList(read(url)->contentInfo()->dictionary()),
                      PropertyList(record->contentInfo()->dictionary()))
                << what;
            if (item.list.empty()) continue;  // audio stores no key values

            record->setKeyValues({TGRTKeyValue::initWithKeyStringValue("new", "x")});
            ASSERT_TRUE(writeMetaData(url, record)) << what;
            EXPECT_EQ(marked(item.stored(folder)), before) << what;
            EXPECT_EQ(read(url)->keyValues(), record->keyValues()) << what;
        }
    }
}

TEST(ForeignEntries, KeepTheFormsOfWhatIsWritten) {
    const Dictionary stored{
        {"Source", Array{Dictionary{{"Name", "Zither"}, {"Weight", 0.5}, {"by", "me"}}, 7,
                         Dictionary{{"Name", "House"}, {"Weight", 1.7}, {"AutoTagging", "YES"}},
                         Dictionary{{"Weight", 1}}}},
        {"Gone", Array{Dictionary{{"Name", "x"}}}},
        {"Empty", Array{}},
        {"Odd", "text"}};
    const PropertyList list(stored);
    const auto held = TGRTTagging::taggingsWithTaggingDictionary(&list, *TGRTTaxonomy::init());
    EXPECT_EQ(storedTaggings(&list, held), list);

    const Dictionary expected{
        {"Source",
         Array{Dictionary{{"Name", "Bass"}, {"Weight", 0.25}}, Dictionary{{"Name", "House"}, {"Weight", 1.7}},
               Dictionary{{"Name", "Zither"}, {"Weight", 0.25}, {"by", "me"}}, 7, Dictionary{{"Weight", 1}}}},
        {"Empty", Array{}},
        {"Odd", "text"},
        {"Aardvark", Array{Dictionary{{"Name", "y"}, {"Weight", 0.25}}}}};
    auto taggings = test::taggingsOf({{"Source", "Zither"}, {"Source", "Bass"}, {"Aardvark", "y"}}, 0.25);
    taggings.insertAll(test::taggingsOf({{"Source", "House"}}, 1));
    EXPECT_EQ(storedTaggings(&list, taggings), PropertyList(expected));

    const PropertyList text("text");
    EXPECT_EQ(storedTaggings(&text, {}), text) << "nothing is to be stored in its place";
    EXPECT_EQ(storedKeyValues(&text, {}), text);
    EXPECT_EQ(storedContentInfo(&text, *TGRTContentInfo::init()), text);
    EXPECT_EQ(storedTaggings(nullptr, {}), PropertyList(Dictionary{}));
    EXPECT_EQ(*storedTaggings(&text, taggings).dictionary()->value("Aardvark"), *expected.value("Aardvark"));
}

}  // namespace
}  // namespace qvct

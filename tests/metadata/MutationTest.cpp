// Ten thousand damaged dictionaries: whatever stands where, reading passes over it and keeps the rest.

#include "metadata/TGRTMetaData.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/Text.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <cmath>
#include <limits>
#include <random>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using Array = PropertyList::Array;
using Dictionary = PropertyList::Dictionary;

PropertyList validRecord() {
    return Dictionary{
        {"Tagging",
         Dictionary{{"Genres", Array{Dictionary{{"Name", "Deep House"}, {"Weight", 0.5}}}},
                    {"Sound Descriptors",
                     Array{Dictionary{{"Name", "Bright / Dark"}, {"Weight", 0.25}, {"AutoTagging", true}},
                           Dictionary{{"Name", "Cold / Warm"}, {"Weight", 1.0}}}}}},
        {"ContentInfo",
         Dictionary{{"Dependencies", Array{"/a.wav", "/b.wav"}},
                    {"ApplicationInfos", Array{Dictionary{{"AppIdentifier", "com.example.host"},
                                                          {"MinimumVersion", "10.7"},
                                                          {"Legacy", true}}}}}},
        {"KeyValueData", Dictionary{{"BeatCount", 8}, {"Comment", "x"}, {"Tempo", 120.5}}},
        {"Type", 2},
        {"SubType", 4},
        {"DisplayName", "Deep"},
        {"Rejected", Array{"Kick", 5}}};
}

class Mutator {
  public:
    explicit Mutator(unsigned seed) : random_(seed) {}

    /// Puts something else in place of some value, key or level of the tree.
    void mutate(PropertyList& value) {
        if (pick(6) == 0) {
            value = anything();
        } else if (Array* items = value.array(); items != nullptr && !items->empty()) {
            mutateItem(*items);
        } else if (Dictionary* entries = value.dictionary(); entries != nullptr && !entries->empty()) {
            mutateEntry(*entries);
        } else {
            value = anything();
        }
    }

  private:
    std::size_t pick(std::size_t count) {
        return std::uniform_int_distribution<std::size_t>(0, count - 1)(random_);
    }

    void mutateItem(Array& items) {
        PropertyList& item = items[pick(items.size())];
        switch (pick(6)) {
            case 0:
                return items.push_back(anything());
            case 1:
                return items.push_back(PropertyList(item));
            default:
                return mutate(item);
        }
    }

    void mutateEntry(Dictionary& entries) {
        const std::string key = (entries.begin() + pick(entries.size()))->key;
        switch (pick(6)) {
            case 0:
                entries.remove(key);
                return;
            case 1:
                return entries.set(text(), anything());
            case 2: {
                PropertyList moved = *entries.value(key);
                entries.remove(key);
                return entries.set(text(), std::move(moved));
            }
            default:
                return mutate(*entries.value(key));
        }
    }

    std::string text() {
        const std::vector<std::string> texts = split(
            "|Name|Weight|Genres|(null)|%|x-+|[,]|}{|1^$9|/../"
            "..|\xe2\x80\xa8|House$99999999999999999999|Tagging",
            "|");
        if (pick(texts.size()) == 0) return std::string(3000, '%');
        return texts[pick(texts.size())];
    }

    PropertyList anything() {
        const PropertyList values[] = {pick(2) == 0,
                                       std::numeric_limits<std::int64_t>::min(),
                                       std::numeric_limits<std::uint64_t>::max(),
                                       std::nan(""),
                                       -std::numeric_limits<double>::infinity(),
                                       1e308,
                                       PropertyList::Data{0, 255},
                                       PropertyList::Date{1e9},
                                       PropertyList::Uid{1},
                                       Array{text(), 1},
                                       Dictionary{{text(), text()}},
                                       text()};
        return values[pick(std::size(values))];
    }

    std::mt19937 random_;
};

bool isText(const PropertyList* value) {
    return value != nullptr && value->string() != nullptr && !value->string()->empty();
}

/// The labels of a tagging dictionary's well-formed entries that the taxonomy knows.
std::size_t knownEntries(const PropertyList* tagging, const TGRTTaxonomy& taxonomy) {
    std::size_t count = 0;
    if (tagging == nullptr || tagging->dictionary() == nullptr) return 0;
    for (const auto& [category, entries] : *tagging->dictionary()) {
        if (entries.array() == nullptr) continue;
        for (const PropertyList& entry : *entries.array()) {
            const auto* fields = entry.dictionary();
            if (fields == nullptr || !isText(fields->value("Name"))) continue;
            if (taxonomy.findTagForLabel(*fields->value("Name")->string(), category)) ++count;
        }
    }
    return count;
}

TEST(DamagedRecords, AreReadAsFarAsTheyGo) {
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    std::size_t damagedTaggings = 0;
    for (unsigned seed = 0; seed < 10000; ++seed) {
        Mutator mutator(seed);
        PropertyList list = validRecord();
        for (unsigned i = 0; i <= seed % 4; ++i) mutator.mutate(list);
        if (list.dictionary() == nullptr) continue;
        const Dictionary& dictionary = *list.dictionary();
        const auto record = TGRTMetaData::metaDataFromDictionary(&dictionary, *taxonomy);

        const std::size_t expected = knownEntries(dictionary.value("Tagging"), *taxonomy);
        if (expected != 3) ++damagedTaggings;
        ASSERT_LE(record->taggings().size(), expected) << seed;
        ASSERT_EQ(record->taggings().empty(), expected == 0) << seed;
        for (const auto& tagging : record->taggings()) {
            ASSERT_TRUE(tagging->weight() >= 0 && tagging->weight() <= 1) << seed;
            ASSERT_TRUE(tagging->weightLevel() >= 0 && tagging->weightLevel() <= 10) << seed;
            ASSERT_FALSE(tagging->displayString().empty()) << seed;
        }
        ASSERT_EQ(record->displayName().has_value(), dictionary.value("DisplayName") != nullptr &&
                                                         dictionary.value("DisplayName")->string() != nullptr)
            << seed;

        // What was understood is understood again after it was written.
        const Dictionary written = record->prepareDictionaryForURL(URL::fileURLWithPath("/no/such/file"));
        const auto again = TGRTMetaData::metaDataFromDictionary(&written, *taxonomy);
        // Weights out of range are clamped by then, so that some taggings may have become equal.
        ASSERT_LE(again->taggings().size(), record->taggings().size()) << seed;
        ASSERT_EQ(again->taggings().empty(), record->taggings().empty()) << seed;
        ASSERT_EQ(again->keyValues(), record->keyValues()) << seed;
        ASSERT_EQ(again->rejectedLabels(), record->rejectedLabels()) << seed;
        ASSERT_EQ(again->contentInfo()->assetDependencyPaths(), record->contentInfo()->assetDependencyPaths())
            << seed;
        ASSERT_FALSE(record->description().empty());
    }
    EXPECT_GT(damagedTaggings, 2000U) << "the mutations miss the taggings";
}

TEST(DamagedRecords, MayAddWhateverLabelsToAWritableTaxonomy) {
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    for (unsigned seed = 0; seed < 1000; ++seed) {
        Mutator mutator(seed);
        PropertyList list = validRecord();
        for (unsigned i = 0; i < 4; ++i) mutator.mutate(list);
        if (list.dictionary() == nullptr) continue;
        for (const auto& tagging : TGRTMetaData::taggingsFromDictionary(*list.dictionary(), *taxonomy)) {
            ASSERT_FALSE(tagging->label().empty());
            ASSERT_NE(taxonomy->findCategoryWithIdentifier(tagging->category()), nullptr);
        }
    }
}

}  // namespace
}  // namespace qvct

#include "platform/data/PropertyListFile.h"
#include "platform/data/UserDefaults.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TGRTTaxonomySearching.h"
#include "taxonomy/TaggingTypes.h"

#include <cmath>
#include <functional>
#include <random>

#include <gmock/gmock.h>
#include <pthread.h>

namespace qvct {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;
using Dictionary = PropertyList::Dictionary;
using Localization = TGRTTaxonomy::Localization;
using TagPointer = std::shared_ptr<TGRTTag>;

std::shared_ptr<TGRTTaxonomy> taxonomyOf(Dictionary categories) {
    return TGRTTaxonomy::taxonomyWithDictionary(Dictionary{{"categories", std::move(categories)}});
}

std::vector<std::string> labels(const auto& tags) {
    std::vector<std::string> result;
    for (const auto& tag : tags) result.push_back(tag->label());
    return result;
}

/// Whether a host may write this: a label or category that is a null pointer would crash.
template <typename... Arguments>
concept CanFindTag = requires(TGRTTaxonomy& taxonomy, Arguments... arguments) {
    taxonomy.findTagForLabel(arguments...);
};
template <typename... Arguments>
concept CanMakeTag = requires(TGRTTaxonomy& taxonomy, Arguments... arguments) {
    taxonomy.findOrCreateTagWithLabel(arguments...);
};
using Text = const char*;
using Null = std::nullptr_t;
static_assert(CanFindTag<Text, Null, Text> && CanMakeTag<Text, Null, Text>, "no parent");
static_assert(!CanFindTag<Null> && !CanFindTag<Null, Text> && !CanFindTag<Text, Null> &&
              !CanFindTag<Text, Null, Null>);
static_assert(!CanMakeTag<Null, Text> && !CanMakeTag<Text, Null> && !CanMakeTag<Text, Text, Null>);

TEST(Tag, BelongsToParentAndCategoryAndIsKnownByTheThreeLabels) {
    const auto category = TGRTCategory::initWithIdentifier("Genres");
    const auto house = TGRTTag::initWithLabel("House", nullptr, category);
    const auto deep = TGRTTag::initWithLabel("Deep!", house, category);
    const auto other =
        TGRTTag::initWithLabel("Deep", TGRTTag::initWithLabel("Techno", nullptr, category), category);
    EXPECT_THAT(labels(category->orderedTags()), ElementsAre("House", "Deep", "Techno", "Deep"));
    EXPECT_FALSE(deep->isEqual(*other));
    const auto elsewhere = TGRTCategory::initWithIdentifier("Genres");
    EXPECT_TRUE(category->isEqual(*elsewhere));
    EXPECT_FALSE(category->isEqual(*TGRTCategory::initWithIdentifier("Rhythm")));
    EXPECT_TRUE(deep->isEqual(
        *TGRTTag::initWithLabel("Deep", TGRTTag::initWithLabel("House", nullptr, elsewhere), elsewhere)));
    deep->setLabel("Changed");
    EXPECT_FALSE(deep->isEqual(*TGRTTag::initWithLabel("Changed", house, elsewhere)));
    EXPECT_EQ(category->compareTag(*house, *house), -1);
    EXPECT_EQ(category->compareTag(*deep, *house), 1);
    EXPECT_EQ(category->compareTag(*TGRTTag::initWithLabel("not here", nullptr, nullptr), *deep), 1);
}

TEST(Tag, WritesItsMarkersSoThatTheyParseToTheSameTag) {
    struct {
        const char *raw, *serialized;
        double defaultWeight;  // -1: none
        int type;
    } const cases[] = {
        {"Bright / Dark-+", "Bright / Dark{Bright,Dark}", 0.0, 1},
        {"Distortion[Light Distortion,Heavy Distortion]", "Distortion[Light Distortion,Heavy Distortion]",
         1.0, 0},
        {"Tempo$5", "Tempo$5", 1.0, 0},
        {"Loudness%", "Loudness%", 1.0, 0},
        {"Featured!", "Featured!", 1.0, 2},
        {"Bass", "Bass", -1, 0},
    };
    for (const auto& c : cases) {
        const auto tag = TGRTTag::initWithLabel(c.raw, nullptr, TGRTCategory::initWithIdentifier("Effects"));
        EXPECT_EQ(tag->serializedLabel(), c.serialized);
        const auto again = TGRTTag::initWithLabel(tag->serializedLabel(), nullptr, nullptr);
        EXPECT_EQ(again->label(), tag->label());
        EXPECT_EQ(again->valueType(), tag->valueType());
        EXPECT_EQ(again->valueStepLabels(), tag->valueStepLabels());
        EXPECT_EQ(tag->defaultLevel() ? tag->defaultLevel()->weight() : -1, c.defaultWeight) << c.raw;
        EXPECT_EQ(tag->type(), c.type) << c.raw;
    }
}

TEST(Tag, MakesPackageIdentifiersOfContentPacksOnly) {
    const auto packs = TGRTCategory::initWithIdentifier(std::string(QVCategorySoundpackIdentifier));
    const auto identifier = [&packs](const char* label) {
        return TGRTTag::initWithLabel(label, nullptr, packs)->packageIdentifier();
    };
    EXPECT_EQ(identifier(" Essential Hip  Hop? "), "essential_hip_hop_");
    EXPECT_EQ(identifier("\xc3\x84rger & 808s"), "\xc3\xa4rger_808s");
    // Spacing and enclosing marks, and numbers that are no digits, belong to words, too.
    EXPECT_EQ(identifier("\u0939\u093f\u0928\u094d\u0926\u0940 E\u0301 \u2167\u00bd 1\u20dd"),
              "\u0939\u093f\u0928\u094d\u0926\u0940_e\u0301_\u2177\u00bd_1\u20dd");
    EXPECT_EQ(TGRTTag::initWithLabel("x", nullptr, nullptr)->packageIdentifier(), std::nullopt);
}

TEST(Level, ClampsTheWeightButNotItsIdentity) {
    EXPECT_EQ(TGRTLevel::levelWithWeight(1.5)->weight(), 1.0);
    EXPECT_EQ(TGRTLevel::levelWithWeight(-0.5)->weight(), 0.0);
    EXPECT_FALSE(TGRTLevel::levelWithWeight(1.5)->isEqual(*TGRTLevel::levelWithWeight(1.0)));
    EXPECT_TRUE(TGRTLevel::levelWithWeight(0.5)->isEqual(*TGRTLevel::levelWithWeight(0.5000001)));
    EXPECT_EQ(TGRTLevel::levelWithWeight(std::nan(""))->weight(), 0.0);
}

TEST(Taxonomy, BuildsSubtreesInOrderWithSiblingsSorted) {
    const auto taxonomy = taxonomyOf(Dictionary{{"Z", Dictionary{{"b", PropertyList::Array{"y", "X", 7}},
                                                                 {"A", Dictionary{{"c", Dictionary{}}}},
                                                                 {"d", "text"}}},
                                                {"Empty", 3}});
    const auto category = taxonomy->findCategoryWithIdentifier("Z");
    EXPECT_THAT(labels(category->orderedTags()), ElementsAre("A", "c", "b", "X", "y", "d"));
    EXPECT_THAT(labels(category->rootTags()), ElementsAre("A", "b", "d"));
    EXPECT_TRUE(taxonomy->findCategoryWithIdentifier("Empty")->tags().empty());
}

TEST(Taxonomy, SurvivesBeingWrittenAndReadBack) {
    const test::TemporaryFolder folder;
    const URL url = URL::fileURLWithPath(folder.path("taxonomy.plist"));
    const auto original = TGRTTaxonomy::defaultTaxonomy();
    Error error;
    ASSERT_TRUE(original->writeToURL(url, &error)) << error.message();
    const auto read = TGRTTaxonomy::taxonomyWithContentsOfURL(url, &error);
    EXPECT_EQ(read->categories(), original->categories());
    const auto originalTags = original->allTags();
    const auto readTags = read->allTags();
    ASSERT_EQ(readTags.size(), originalTags.size());
    for (std::size_t i = 0; i < readTags.size(); ++i) EXPECT_TRUE(readTags[i]->isEqual(*originalTags[i]));
    const auto fromData = TGRTTaxonomy::taxonomyWithData(original->serializedTaxonomyData());
    EXPECT_EQ(fromData->allTags().size(), originalTags.size());
}

/// A taxonomy with one tag on each level.
std::shared_ptr<TGRTTaxonomy> deepTaxonomy(int levels) {
    const auto taxonomy = TGRTTaxonomy::init();
    const auto category = taxonomy->findOrCreateCategoryWithIdentifier("Deep");
    TagPointer tag;
    for (int level = 0; level < levels; ++level)
        tag = TGRTTag::initWithLabel(std::to_string(level), tag, category);
    return taxonomy;
}

/// Runs it on a thread with a stack of that many bytes.
void runWithStack(std::size_t bytes, const std::function<void()>& work) {
    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    ASSERT_EQ(pthread_attr_setstacksize(&attributes, bytes), 0);
    pthread_t thread{};
    const auto run = [](void* argument) -> void* {
        (*static_cast<const std::function<void()>*>(argument))();
        return nullptr;
    };
    ASSERT_EQ(pthread_create(&thread, &attributes, run, const_cast<std::function<void()>*>(&work)), 0);
    pthread_join(thread, nullptr);
    pthread_attr_destroy(&attributes);
}

TEST(Taxonomy, OfAThousandLevelsIsWrittenAndReadWithASmallStack) {
    const test::TemporaryFolder folder;
    const URL url = URL::fileURLWithPath(folder.path("deep.plist"));
#ifdef NDEBUG
    constexpr std::size_t stack = 512U << 10U;  // as some systems give to each further thread
#else
    constexpr std::size_t stack = 8U << 20U;  // frames of code that is not optimised are several times larger
#endif
    runWithStack(stack, [&url] {
        // The property list has three dictionaries more: its own, of the categories, of the category.
        constexpr int levels = kDeepestPropertyList - 3;
        Error error;
        EXPECT_TRUE(deepTaxonomy(levels)->writeToURL(url, &error)) << error.message();
        const auto read = TGRTTaxonomy::taxonomyWithContentsOfURL(url, &error);
        const auto lowest = read->findTagForLabel(std::to_string(levels - 1));
        ASSERT_NE(lowest, nullptr) << error.message();
        EXPECT_EQ(lowest->ancestors().size(), std::size_t{levels} - 1);
        EXPECT_FALSE(deepTaxonomy(levels + 1)->writeToURL(url, &error));
        EXPECT_THAT(error.message(),
                    testing::HasSubstr("deep.plist: no property list can hold more than 1024 levels"));
        EXPECT_EQ(TGRTTaxonomy::taxonomyWithContentsOfURL(url)->allTags().size(), std::size_t{levels});
    });
}

TEST(Taxonomy, SaysWhatCouldNotBeRead) {
    Error error;
    const auto empty =
        TGRTTaxonomy::taxonomyWithContentsOfURL(URL::fileURLWithPath("/no/such.plist"), &error);
    EXPECT_TRUE(empty->categories().empty());
    EXPECT_THAT(error.message(), testing::HasSubstr("/no/such.plist"));
    const std::string noList = "<plist><string>x</string></plist>";
    Error none;
    EXPECT_EQ(TGRTTaxonomy::taxonomyWithData(noList, &none), nullptr);
    EXPECT_EQ(none.message(), "");
}

TEST(Taxonomy, SharesCachedInstancesUntilTheyAreEvicted) {
    const auto first = TGRTTaxonomy::defaultTaxonomy();
    EXPECT_EQ(TGRTTaxonomy::defaultTaxonomy(), first);
    EXPECT_NE(TGRTTaxonomy::mutableDefaultTaxonomy(), first);
    EXPECT_NE(TGRTTaxonomy::testingTaxonomy(), TGRTTaxonomy::testingTaxonomy());
    TGRTTaxonomy::evictCache();
    EXPECT_NE(TGRTTaxonomy::defaultTaxonomy(), first);
    EXPECT_TRUE(TGRTTaxonomy::newTaxonomyOfType(7, false, false)->categories().empty());
}

TEST(Taxonomy, ReadOnlyRefusesButForContentPacks) {
    const auto taxonomy = TGRTTaxonomy::newTaxonomyOfType(kDefaultTaxonomy, true, false);
    EXPECT_EQ(taxonomy->findOrCreateTagWithLabel("New", "House", "Genres"), nullptr);
    EXPECT_EQ(taxonomy->findOrCreateCategoryWithIdentifier("New"), nullptr);
    const auto writable = TGRTTaxonomy::newTaxonomyOfType(kDefaultTaxonomy, false, false);
    taxonomy->addCategory(writable->findOrCreateCategoryWithIdentifier("New"));
    EXPECT_EQ(taxonomy->findCategoryWithIdentifier("New"), nullptr);
    EXPECT_EQ(taxonomy->findOrCreateSoundPackTagWithIdentifier(""), nullptr);
    const auto pack = taxonomy->findOrCreateSoundPackTagWithIdentifier("9999_new");
    ASSERT_NE(pack, nullptr);
    EXPECT_EQ(taxonomy->findTagForLabel("9999_new"), pack);
    EXPECT_TRUE(taxonomy->doesContainTag(pack));
    const auto namesake = TGRTCategory::initWithIdentifier(pack->categoryIdentifier());
    EXPECT_FALSE(taxonomy->doesContainTag(TGRTTag::initWithLabel("elsewhere", nullptr, namesake)));
}

TEST(Tag, TakesOverAChildNamedByAReferenceIntoTheOldList) {
    const auto category = TGRTCategory::initWithIdentifier("Genres");
    const auto parent = TGRTTag::initWithLabel("House", nullptr, category);
    for (const char* label : {"a", "b", "c"}) TGRTTag::initWithLabel(label, parent, category);
    parent->addChild(parent->children().ordered()[0]);
    EXPECT_THAT(labels(parent->children()), ElementsAre("b", "c", "a"));
}

TEST(Tag, RefusesToLieBelowItself) {
    const auto top = TGRTTag::initWithLabel("top", nullptr, nullptr);
    const auto middle = TGRTTag::initWithLabel("middle", top, nullptr);
    const auto low = TGRTTag::initWithLabel("low", middle, nullptr);
    for (const auto& tag : {top, middle, low}) low->addChild(tag);
    top->addChild(top);
    EXPECT_THAT(labels(top->descendants()), ElementsAre("middle", "low"));
    EXPECT_THAT(low->children(), IsEmpty());
}

/// What a walk over the tree finds, without the library's search and index.
TagPointer walked(const std::string& label, TGRTTaxonomy::OptionalLabel parent, const auto& tags) {
    for (const TagPointer& tag : tags) {
        if (tag->label() != label) {
            if (const auto below = walked(label, parent, tag->children())) return below;
        } else if (!parent || (tag->parent() && tag->parent()->label() == *parent)) {
            return tag;
        }
    }
    return nullptr;
}

/// One change of two categories and their tags: mostly new tags, below any parent.
void changeAtRandom(TGRTTaxonomy& taxonomy, std::vector<TagPointer>& tags, bool onlyCreates,
                    const std::vector<std::string>& names, const auto& pick) {
    const auto category = taxonomy.findOrCreateCategoryWithIdentifier(pick(4) == 0 ? "Y" : "X");
    const auto any = [&] { return tags[pick(tags.size())]; };
    const std::size_t what = onlyCreates ? 0 : pick(12);
    if (what <= 5 || tags.empty()) {
        const auto parent = tags.empty() || pick(3) == 0 ? nullptr : any();
        const bool hasCategory = onlyCreates || pick(8) != 0;
        tags.push_back(
            TGRTTag::initWithLabel(names[pick(names.size())], parent, hasCategory ? category : nullptr));
    } else if (what == 6) {
        any()->setLabel(names[pick(names.size())]);
    } else if (what == 7) {
        category->removeTag(any());
    } else if (what == 8) {
        any()->removeChild(any());
    } else if (what == 9) {
        any()->addChild(any());
    } else {
        category->addTag(any());
    }
}

TEST(Taxonomy, TheIndexAnswersAsAWalkOverTheTreeAfterAnyChange) {
    std::mt19937 random(7);
    const auto pick = [&random](std::size_t count) {
        return std::uniform_int_distribution<std::size_t>(0, count - 1)(random);
    };
    const std::vector<std::string> names = {"a", "b", "c", "d", "e"};
    int lookups = 0;
    int differences = 0;
    for (int round = 0; lookups < 256000; ++round) {
        const auto taxonomy = TGRTTaxonomy::init();
        std::vector<TagPointer> tags;
        for (int step = 0; step < 14; ++step) {
            changeAtRandom(*taxonomy, tags, round % 2 == 0, names, pick);
            for (const auto& category : taxonomy->categories()) {
                for (const std::string& label : names) {
                    std::vector<TGRTTaxonomy::OptionalLabel> parents(names.begin(), names.end());
                    parents.emplace_back();
                    for (const auto& parent : parents) {
                        const auto found = taxonomy->findTagForLabel(label, parent, category->identifier());
                        differences += found == walked(label, parent, category->tags()) ? 0 : 1;
                        ++lookups;
                    }
                }
            }
        }
    }
    EXPECT_EQ(differences, 0) << "of " << lookups;
}

/// The pairs of a strings table, escapes resolved.
Localization stringsIn(const std::string& table) {
    std::vector<std::string> texts;
    bool isOpen = false;
    for (std::size_t i = 0; i < table.size(); ++i) {
        if (table[i] == '"') {
            isOpen = !isOpen;
            if (isOpen) texts.emplace_back();
        } else if (isOpen && table[i] == '\\') {
            const char c = table[++i];
            texts.back() += c == 'n' ? '\n' : c == 'r' ? '\r' : c;
        } else if (isOpen && table[i] != '\n' && table[i] != '\r') {
            texts.back() += table[i];
        }
    }
    Localization strings;
    for (std::size_t i = 0; i + 1 < texts.size(); i += 2) strings[texts[i]] = texts[i + 1];
    return strings;
}

TEST(Taxonomy, StringsTablesHoldAnyLabel) {
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    for (const char* label : {"12\" Mix", "Back\\slash\\", "Two\r\nLines", "a\" = \"b\\n"}) {
        taxonomy->findOrCreateTagWithLabel(label, "Custom");
    }
    EXPECT_EQ(stringsIn(taxonomy->localizedStrings()), taxonomy->localizationDictionary());
}

TEST(Taxonomy, LocalizesPacksKeysAndPoles) {
    const auto strings = TGRTTaxonomy::defaultTaxonomy()->localizationDictionary();
    const std::pair<const char*, const char*> expected[] = {
        {"Bass", "Bass"},
        {"0022_ultimate808s", "Ultimate 808s"},
        {"arx0006_demosong_1", "Demosong 1"},
        {"CSharp", "Key: C#"},
        {"Generative Instrument Loop", "Drummer Loop"},
        {"Non-rhythmic", "Non-Rhythmic"},
        {"Minor KeyType", "Minor"},
        {"Genres", "Genres"},
        {"Distortion_1", "Heavy Distortion"},
        {"Bright / Dark_lowerPole", "Bright"},
        {"Bright / Dark_upperPole", "Dark"},
    };
    for (const auto& [key, value] : expected) EXPECT_EQ(strings.at(key), value) << key;
    UserDefaults::setBool(true, "fakeLocalization");
    const auto reversed = TGRTTaxonomy::defaultTaxonomy()->localizationDictionary();
    UserDefaults::setBool(false, "fakeLocalization");
    EXPECT_EQ(reversed.at("Bass"), "ssaB");
    EXPECT_EQ(reversed.at("Bright / Dark_upperPole"), "Dark");
    EXPECT_EQ(reversed.at("Distortion_1"), "noitrotsiD yvaeH");
}

TEST(Taxonomy, ExportsRowsForAMapping) {
    const auto rows = TGRTTaxonomy::legacyLoopTaxonomy()->mappingExport();
    EXPECT_EQ(rows.size(), 139U);
    EXPECT_THAT(rows[0],
                testing::StartsWith("Type;Legacy Keyword;Legacy Keyword Sub;New Taxonomy Keyword 1;"));
    EXPECT_THAT(rows, Contains("LoopDescriptors;Cheerful;;;;;;"));
    EXPECT_THAT(rows, Contains("LoopInstrumentTypes;Bass;Electric Bass;;;;;"));
}

TEST(TaxonomySearching, FindsPartsWithoutRegardToCaseAndDiacritics) {
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    taxonomy->findOrCreateTagWithLabel("F\xc3\xaate d'\xc3\x89t\xc3\xa9", "Custom");
    const auto searching = TGRTTaxonomySearching::initWithTaxonomy(taxonomy);
    EXPECT_THAT(searching->findTagLabelsForString("house", false), Contains("Slap House"));
    EXPECT_THAT(searching->findTagLabelsForString("house", true), IsEmpty());
    EXPECT_THAT(searching->findTagLabelsForString("House", true), ElementsAre("House"));
    EXPECT_THAT(searching->findTagLabelsForString("FETE D'ETE", false),
                ElementsAre("F\xc3\xaate d'\xc3\x89t\xc3\xa9"));
    EXPECT_THAT(searching->findTagLabelsForString("", false), IsEmpty());
    EXPECT_THAT(labels(searching->findTagsForString("reggae")),
                ElementsAre("Reggaeton", "Reggae & Ska", "Roots Reggae"));
}

TEST(TaxonomySearching, SearchesTheTableThatItIsGiven) {
    const auto taxonomy =
        taxonomyOf(Dictionary{{"A", Dictionary{{"Pop", Dictionary{}}, {"Rock", Dictionary{}}}},
                              {"B", Dictionary{{"Pop", Dictionary{}}}}});
    const auto searching = TGRTTaxonomySearching::initWithTaxonomy(taxonomy);
    const TagPointer rock = taxonomy->findTagForLabel("Rock");
    const TagPointer firstPop = taxonomy->findTagForLabel("Pop", "A");
    const TagPointer lastPop = taxonomy->findTagForLabel("Pop", "B");
    EXPECT_THAT(searching->tagsTable(), ElementsAre(Pair("Pop", lastPop), Pair("Rock", rock)));
    searching->setTagsTable({{"x", rock}, {"Pop", lastPop}, {"x", firstPop}});
    EXPECT_THAT(searching->tagsTable(), ElementsAre(Pair("x", firstPop), Pair("Pop", lastPop)));
    EXPECT_EQ(searching->tagForLabel("x"), firstPop);
    EXPECT_EQ(searching->tagForLabel("Rock"), nullptr);
    EXPECT_THAT(searching->findTagLabelsForString("X", false), ElementsAre("x"));
    searching->_updateSearchTable();
    EXPECT_THAT(searching->findTagLabelsForString("o", false), ElementsAre("Pop", "Rock"));
}

TEST(ObjectSet, ForgetsTheRightOneOfTwoWithTheSameHash) {
    ObjectSet<TGRTTag> set;
    const auto a = TGRTTag::initWithLabel("a", nullptr, nullptr);
    set.insert(a);
    EXPECT_FALSE(set.insert(TGRTTag::initWithLabel("a", nullptr, nullptr)));
    EXPECT_TRUE(set.erase(*TGRTTag::initWithLabel("a", nullptr, nullptr)));
    EXPECT_FALSE(set.contains(*a));
    EXPECT_TRUE(set.empty());
}

}  // namespace
}  // namespace qvct

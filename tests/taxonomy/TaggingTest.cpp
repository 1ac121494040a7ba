#include "platform/text/DecimalFormatter.h"
#include "taxonomy/TGRTTaggingCollection.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingSetAdditions.h"
#include "taxonomy/TaggingTypes.h"

#include <cstdio>
#include <cstdlib>
#include <ctime>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::ElementsAre;
using Array = PropertyList::Array;
using Dictionary = PropertyList::Dictionary;
using Taggings = ObjectSet<TGRTTagging>;

std::shared_ptr<TGRTTagging> taggingOf(std::string_view label, std::optional<double> weight = std::nullopt) {
    return TGRTTagging::initWithTag(TGRTTaxonomy::defaultTaxonomy()->findTagForLabel(label),
                                    weight ? TGRTLevel::levelWithWeight(*weight) : nullptr);
}

TEST(Tagging, IsKnownByLabelWeightAndCategory) {
    const auto automatic = taggingOf("House", 0.5);
    automatic->setIsAutoTagging(true);
    EXPECT_TRUE(automatic->isEqual(*taggingOf("House", 0.5)));
    EXPECT_FALSE(automatic->isEqual(*taggingOf("House", 0.25)));
    EXPECT_FALSE(automatic->isEqual(*taggingOf("House")));
    // The parent takes no part.
    const auto category = TGRTCategory::initWithIdentifier("Genres");
    const auto elsewhere =
        TGRTTag::initWithLabel("House", TGRTTag::initWithLabel("Other", nullptr, category), category);
    EXPECT_TRUE(automatic->isEqual(*TGRTTagging::initWithTag(elsewhere, TGRTLevel::levelWithWeight(0.5))));
    EXPECT_EQ(TGRTTagging::initWithTag(TGRTTag::initWithDictionary({}), nullptr), nullptr);
    EXPECT_EQ(TGRTTagging::initWithTag(nullptr, nullptr), nullptr);
}

TEST(Tagging, WeighsAsItsLevelOrItsTagSays) {
    const auto untyped = TGRTCategory::initWithIdentifier("Custom");
    const auto bare = [&](const char* raw) {
        return TGRTTagging::initWithTag(TGRTTag::initWithLabel(raw, nullptr, untyped), nullptr);
    };
    EXPECT_EQ(bare("Loudness%")->weight(), 1.0F);
    EXPECT_EQ(bare("Bright / Dark-+")->weight(), 0.0F);
    EXPECT_EQ(bare("Bass")->weight(), 1.0F);
    EXPECT_EQ(bare("Bright / Dark-+")->displayString(), "Bright / Dark");
    EXPECT_EQ(taggingOf("House", 0.25)->weightLevel(), 3);
    EXPECT_EQ(taggingOf("House", 0.04)->weightLevel(), 0);
    EXPECT_EQ(taggingOf("House", 7)->weightLevel(), 10);
}

/// What the levels look like in a process whose user has that locale.
void printLevels(const char* locale) {
    ::setenv("LC_ALL", locale, 1);
    for (const double weight : {0.25, 1.0, 0.3, 0.0}) {
        std::fprintf(stderr, "%s|", taggingOf("House", weight)->displayString().c_str());
    }
    std::fprintf(stderr, "%s", TGRTTagging::doubleFormatter().stringFromNumber(1234.56).c_str());
    std::exit(0);
}

TEST(TaggingDeathTest, ShowsLevelsAsTheUsersLocaleWritesNumbers) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");  // a process of its own, which reads the locale anew
    const auto exits = testing::ExitedWithCode(0);
    EXPECT_EXIT(printLevels("C"), exits,
                "^House \\(1\\)\\|House \\(4\\)\\|House \\(1\\.2\\)\\|House \\(0\\.0\\)\\|1234\\.6$");
    EXPECT_EXIT(printLevels("de_DE.UTF-8"), exits,
                "^House \\(1\\)\\|House \\(4\\)\\|House \\(1,2\\)\\|House \\(0,0\\)\\|1234,6$");
    EXPECT_EXIT(printLevels("ar_EG.UTF-8"), exits, "^House \\(\xd9\xa1\\)\\|House \\(\xd9\xa4\\)\\|");
}

TEST(TaggingDictionary, SurvivesBeingWrittenAndReadBack) {
    const auto automatic = taggingOf("Bright / Dark", 0.2);
    automatic->setIsAutoTagging(true);
    const Taggings taggings = {taggingOf("House", 0.5), automatic, taggingOf("Deep House"),
                               taggingOf("Bass", 1.0)};
    const PropertyList written = TGRTTagging::taggingDictionaryForTaggings(taggings);
    const PropertyList expected = Dictionary{
        {"Genres", Array{Dictionary{{"Name", "Deep House"}}, Dictionary{{"Name", "House"}, {"Weight", 0.5}}}},
        {"Sound Descriptors",
         Array{Dictionary{{"Name", "Bright / Dark"}, {"Weight", 0.2}, {"AutoTagging", true}}}},
        {"Source", Array{Dictionary{{"Name", "Bass"}, {"Weight", 1.0}}}}};
    EXPECT_EQ(written, expected);
    const auto read = TGRTTagging::taggingsWithTaggingDictionary(&written, *TGRTTaxonomy::defaultTaxonomy());
    ASSERT_EQ(read, taggings);
    EXPECT_TRUE(read.find(*automatic)->isAutoTagging());
}

TEST(TaggingDictionary, OfAnArrayHasAnEntryForEachOfEqualTaggings) {
    const std::vector<std::shared_ptr<TGRTTagging>> taggings = {taggingOf("House"), nullptr,
                                                                taggingOf("Bass", 1.0), taggingOf("House")};
    const PropertyList expected =
        Dictionary{{"Genres", Array{Dictionary{{"Name", "House"}}, Dictionary{{"Name", "House"}}}},
                   {"Source", Array{Dictionary{{"Name", "Bass"}, {"Weight", 1.0}}}}};
    EXPECT_EQ(PropertyList(TGRTTagging::taggingDictionaryForTaggings(taggings)), expected);
}

TEST(TaggingDictionary, SkipsWhatIsNotAsItShouldBe) {
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    const PropertyList list =
        Dictionary{{"Genres", Array{"House", Dictionary{{"Name", ""}}, Dictionary{{"Name", 5}}, Dictionary{},
                                    Dictionary{{"Name", "House"}, {"Weight", Array{}}, {"AutoTagging", 1}},
                                    Dictionary{{"Name", "Techno"}, {"Weight", "0.5"}}}},
                   {"Source", Dictionary{{"Name", "Bass"}}},
                   {"New", Array{Dictionary{{"Name", "Invented"}}, Dictionary{{"Name", "%"}}}}};
    const auto taggings = TGRTTagging::taggingsWithTaggingDictionary(&list, *taxonomy);
    ASSERT_EQ(taggings.size(), 3U);
    EXPECT_EQ(taggings.ordered()[0]->level(), nullptr);
    EXPECT_TRUE(taggings.ordered()[0]->isAutoTagging());
    EXPECT_EQ(taggings.ordered()[1]->level()->weight(), 0.5);
    EXPECT_EQ(taggings.ordered()[2]->label(), "Invented");
    EXPECT_NE(taxonomy->findTagForLabel("Invented", "New"), nullptr);
    EXPECT_EQ(TGRTTagging::taggingsWithTaggingDictionary(&list, *TGRTTaxonomy::defaultTaxonomy()).size(), 2U);
    const PropertyList noDictionary = Array{};
    EXPECT_TRUE(TGRTTagging::taggingsWithTaggingDictionary(&noDictionary, *taxonomy).empty());
    EXPECT_TRUE(TGRTTagging::taggingsWithTaggingDictionary(nullptr, *taxonomy).empty());
}

TEST(TaggingDictionary, ManyUnknownCategoriesTakeNoMoreThanTheirShare) {
    constexpr int count = 40000;
    Dictionary list;
    for (int i = 0; i < count; ++i) list.append(std::to_string(i), Array{Dictionary{{"Name", "x%"}}});
    const PropertyList hostile = std::move(list);
    const std::clock_t start = std::clock();
    const auto taggings = TGRTTagging::taggingsWithTaggingDictionary(&hostile, *TGRTTaxonomy::init());
    EXPECT_EQ(TGRTTagging::taggingDictionaryForTaggings(taggings).size(), count);
    // About 2 s without optimisation; 20 when each category is compared with all others.
    EXPECT_LT(static_cast<double>(std::clock() - start) / CLOCKS_PER_SEC, 8.0);
}

TEST(Tagging, DescribesItself) {
    EXPECT_THAT(taggingOf("House", 0.5)->description(),
                testing::MatchesRegex("<TGRTTagging 0x[0-9a-f]+> Name: House Level: <TGRTLevel 0x[0-9a-f]+> "
                                      "weight:0\\.500000 Category: Genres"));
    EXPECT_THAT(taggingOf("House")->description(), testing::HasSubstr(" Level: (null) Category: Genres"));
    EXPECT_THAT(
        taggingOf("Deep House")->tag()->description(),
        testing::MatchesRegex("<TGRTTag 0x[0-9a-f]+> label: Deep House parentTag: House category: Genres"));
    const auto taxonomy = TGRTTaxonomy::taxonomyWithDictionary(
        Dictionary{{"categories", Dictionary{{"G", Dictionary{{"a", Array{"b"}}}}}}});
    EXPECT_THAT(taxonomy->description(),
                testing::MatchesRegex("<TGRTTaxonomy 0x[0-9a-f]+> categories: \n"
                                      "<TGRTCategory 0x[0-9a-f]+> identifier: G tags:\n"
                                      "<TGRTTag .*> label: a parentTag: None category: G\n"
                                      "<TGRTTag .*> label: b parentTag: a category: G\n\n"));
}

class Node : public FileURLNode {
  public:
    explicit Node(const char* path) : url_(URL::fileURLWithPath(path)) {}
    URL fileURL() const override { return url_; }

  private:
    URL url_;
};

TEST(TaggingCollection, TellsOnHowManyNodesATaggingIs) {
    using NodePointer = std::shared_ptr<FileURLNode>;
    const NodePointer a = std::make_shared<Node>("/a");
    const NodePointer b = std::make_shared<Node>("/b");
    const NodePointer sameAsA = std::make_shared<Node>("/x/../a");
    const NodePointer never = std::make_shared<Node>("/never");
    const auto house = taggingOf("House");
    const auto bass = taggingOf("Bass");
    TGRTTaggingCollection collection;
    EXPECT_EQ(collection.taggingStateForTagging(*house, {a, nullptr}), kTaggingStateNone);

    collection.setTaggings({house}, a);
    collection.setTaggings({}, b);
    EXPECT_EQ(collection.taggingStateForTagging(*house, {sameAsA, never, nullptr}), kTaggingStateAll);
    EXPECT_EQ(collection.taggingStateForTagging(*house, {a, b}), kTaggingStateSome);
    EXPECT_EQ(collection.taggingStateForTagging(*house, {b, a}), kTaggingStateSome);
    EXPECT_EQ(collection.taggingStateForTagging(*house, {b, never}), kTaggingStateNone);

    collection.addTaggings({house, bass}, {a, b, nullptr});
    EXPECT_EQ(collection.taggingStateForTagging(*bass, {a, b}), kTaggingStateAll);
    EXPECT_EQ(collection.taggings(), (Taggings{bass, house}));
    collection.removeTaggings({taggingOf("House")}, {sameAsA, b});
    EXPECT_EQ(collection.taggings(), Taggings{bass});
    collection.setTaggings({house}, {a, b});
    EXPECT_EQ(collection.taggings(), Taggings{house});
}

TEST(TaggingSet, FindsByLabel) {
    const auto strong = taggingOf("House", 1.0);
    const Taggings taggings = {taggingOf("Bass"), strong, taggingOf("House", 0.5)};
    EXPECT_EQ(anyTaggingForLabel(taggings, "House"), strong);
    EXPECT_TRUE(containsTagWithLabel(taggings, "Bass"));
    EXPECT_FALSE(containsTagWithLabel(taggings, "bass"));
}

TEST(TaggingSet, RenamesWithinParentAndCategory) {
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    const auto old =
        TGRTTagging::initWithTag(taxonomy->findTagForLabel("Deep House"), TGRTLevel::levelWithWeight(0.5));
    old->setIsAutoTagging(true);
    Taggings taggings = {old};
    for (const auto& [from, to] :
         {std::pair("", "x"), {"Deep House", ""}, {"none", "x"}, {"Deep House", "%"}}) {
        EXPECT_FALSE(renameTagWithLabel(taggings, from, to)) << from << to;
    }
    EXPECT_EQ(taggings, Taggings{old});
    EXPECT_TRUE(renameTagWithLabel(taggings, "Deep House", "Deeper House"));
    ASSERT_EQ(taggings.size(), 1U);
    const auto& renamed = taggings.ordered()[0];
    EXPECT_EQ(renamed->label(), "Deeper House");
    EXPECT_EQ(renamed->parentLabel(), "House");
    EXPECT_EQ(renamed->level(), old->level());
    EXPECT_FALSE(renamed->isAutoTagging());
    EXPECT_EQ(taxonomy->findTagForLabel("Deeper House", "House", "Genres"), renamed->tag());
    EXPECT_TRUE(renameTagWithLabel(taggings, "Deeper House", "Deeper House"));
    EXPECT_TRUE(containsTagWithLabel(taggings, "Deeper House"));
}

TEST(TaggingSet, RenamedOntoATagWithChildrenTheTagTakesItsPlaceWithoutThem) {
    const auto taxonomy = TGRTTaxonomy::taxonomyWithDictionary(Dictionary{
        {"categories",
         Dictionary{{"G", Dictionary{{"House", Dictionary{{"a", Array{}}, {"b", Array{"below"}}}}}}}}});
    Taggings taggings = {TGRTTagging::initWithTag(taxonomy->findTagForLabel("a"), nullptr)};
    EXPECT_TRUE(renameTagWithLabel(taggings, "a", "b"));
    const Dictionary empty;
    EXPECT_EQ(PropertyList(taxonomy->findTagForLabel("House")->dictionary()),
              PropertyList(Dictionary{{"a", empty}, {"b", empty}}));
}

TEST(TaggingSet, Reassigns) {
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    const auto bass = taxonomy->findTagForLabel("Bass");
    Taggings taggings = {taggingOf("House", 0.5)};
    EXPECT_FALSE(reassignTagWithLabel(taggings, "House", nullptr));
    EXPECT_FALSE(reassignTagWithLabel(taggings, "", bass));
    EXPECT_FALSE(reassignTagWithLabel(taggings, "Techno", bass));
    EXPECT_TRUE(reassignTagWithLabel(taggings, "House", bass));
    EXPECT_EQ(taggings, Taggings{taggingOf("Bass", 0.5)});
}

TEST(Tag, OfTwoEqualChildrenTheLaterStays) {
    const auto category = TGRTCategory::initWithIdentifier("Genres");
    const auto parent = TGRTTag::initWithLabel("House", nullptr, category);
    TGRTTag::initWithLabel("Deep", parent, category);
    const auto later = TGRTTag::initWithLabel("Deep!", parent, category);
    EXPECT_THAT(parent->children().ordered(), ElementsAre(later));
}

}  // namespace
}  // namespace qvct

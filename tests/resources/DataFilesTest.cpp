// Holds the data files to the figures and labels that the rest of the system, and its hosts, count on.

#include "platform/text/Text.h"
#include "resources/QVCTCompiledResources.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <map>
#include <set>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

std::shared_ptr<TGRTTaxonomy> taxonomy() {
    return TGRTTaxonomy::defaultTaxonomy();
}

/// The labels, levels taken off, that the taxonomy does not know.
std::set<std::string> unknown(const std::vector<std::string>& labels) {
    std::set<std::string> missing;
    for (const std::string& text : labels) {
        const std::string label = labelFromString(text);
        if (!label.empty() && !taxonomy()->findTagForLabel(label)) missing.insert(label);
    }
    return missing;
}

std::size_t depthOf(const TGRTTag& tag) {
    return tag.ancestors().size() + 1;
}

TEST(DefaultTaxonomy, HoldsItsCategoriesInOrderEachWithItsTags) {
    struct Row {
        const char* category;
        std::size_t roots, all, depth;
    };
    const std::vector<Row> rows = {
        {"Artist", 13, 13, 1},
        {"Custom", 0, 0, 0},
        {"Source", 17, 156, 2},
        {"PlugIns", 1, 24, 2},
        {"General Characteristics", 9, 9, 1},
        {"Instrument Specifics", 23, 23, 1},
        {"Number Of Players", 9, 9, 1},
        {"Playing Techniques", 27, 27, 1},
        {"Development Over Time", 9, 15, 2},
        {"Part", 7, 7, 1},
        {"Effects", 16, 28, 2},
        {"Sound Descriptors", 11, 15, 2},
        {"Rhythm", 4, 4, 1},
        {"Negative Emotions", 5, 5, 1},
        {"Positive Emotions", 5, 5, 1},
        {"Genres", 13, 166, 3},
        {"Content Type", 8, 20, 2},
        {"Aesthetic", 11, 11, 1},
        {"Soundpack", 56, 56, 1},
        {"Maintenance", 1, 1, 1},
        {"System", 1, 1, 1},
        {"Loop Specifics", 3, 23, 2},
    };
    const auto& categories = taxonomy()->categories().ordered();
    ASSERT_EQ(categories.size(), rows.size());
    for (std::size_t i = 0; i < rows.size(); ++i) {
        const TGRTCategory& category = *categories[i];
        EXPECT_EQ(category.identifier(), rows[i].category);
        EXPECT_EQ(category.rootTags().size(), rows[i].roots) << rows[i].category;
        EXPECT_EQ(category.tags().size(), rows[i].all) << rows[i].category;
        std::size_t depth = 0;
        for (const auto& tag : category.tags()) depth = std::max(depth, depthOf(*tag));
        EXPECT_EQ(depth, rows[i].depth) << rows[i].category;
    }
    for (const auto& tag : taxonomy()->findCategoryWithIdentifier("Sound Descriptors")->rootTags()) {
        EXPECT_EQ(tag->valueType(), kTagValueBipolar) << tag->label();
    }
}

TEST(DefaultTaxonomy, KnowsEveryLabelThatTheCodeNames) {
    const struct {
        std::string_view category, parent;
        std::vector<std::string_view> labels;
    } rows[] = {
        {"Content Type",
         "",
         {QVTagPatch, QVTagTavioLoop, QVTagVorthalSetting, QVTagSXV, QVTagPST, QVTagCST, QVTagProject}},
        {"Content Type",
         QVTagPatch,
         {QVTagAudioPatch, QVTagAuxPatch, QVTagOutputPatch, QVTagInstrumentPatch}},
        {"Content Type", QVTagProject, {QVTagDemoSong, QVTagLiveLoopGrid, QVTagRemixSession}},
        {"Loop Specifics", QVTagTimeSignature, {"6/8"}},
        {"Loop Specifics",
         QVTagKeyType,
         {QVTagAnyKeyType, QVTagMinorKeyType, QVTagMajorKeyType, QVTagNeitherKeyType, QVTagBothKeyType}},
        {"Loop Specifics",
         QVTagKey,
         {QVTagCKey, QVTagCSharpKey, QVTagDKey, QVTagDSharpKey, QVTagEKey, QVTagFKey, QVTagFSharpKey,
          QVTagGKey, QVTagGSharpKey, QVTagAKey, QVTagASharpKey, QVTagBKey}},
        {"Sound Descriptors", "Simple / Complex", {"Rhythmic Density", "Rhythmic Complexity"}},
        {"System", "", {"User generated"}},
        {"PlugIns", "", {"Software Instrument"}},
    };
    for (const auto& [category, parent, labels] : rows) {
        const auto below =
            parent.empty() ? TGRTTaxonomy::OptionalLabel() : TGRTTaxonomy::OptionalLabel(parent);
        for (const std::string_view label : labels)
            EXPECT_NE(taxonomy()->findTagForLabel(label, below, category), nullptr) << label;
    }
}

TEST(KeywordMapping, HoldsItsKeywordsAndYieldsKnownLabels) {
    const auto mapping = *QVCTCompiledResources::DefaultKeywordMappingPlist();
    EXPECT_EQ(mapping.size(), 81U);
    std::vector<std::string> labels;
    for (const auto& [keyword, value] : mapping) {
        EXPECT_FALSE(keyword.starts_with("regex:")) << keyword;
        if (const std::string* label = value.string()) labels.push_back(*label);
        if (const auto* array = value.array()) {
            for (const auto& label : *array) labels.push_back(*label.string());
        }
    }
    // Misspelt since the first edition; content in the field counts on it.
    EXPECT_THAT(unknown(labels), ElementsAre("Mellow / Agressive"));
    const std::map<std::string, PropertyList> telling = {
        {"Drum Kit", PropertyList::Array{"Drums", "Acoustic"}},
        {"Stereo Kit", "Drum Kit"},
        {"Analog", "Analog / Digital (0.0)"},
        {"Agressive", "Mellow / Agressive (1.0)"},
        {"Riser", PropertyList::Array{"Riser", "Sound Effects"}},
        {"Wurly", PropertyList::Array{"Keyboard", "Piano", "Electric"}},
        {"Sax", PropertyList::Array{"Saxophone", "Woodwinds"}},
        {"/Bell/", "Bells"},
        {"Seventies", "70s"},
        {"Detuned", "Detune"}};
    for (const auto& [keyword, value] : telling) EXPECT_EQ(*mapping.value(keyword), value) << keyword;
}

TEST(Rules, AreSeventeenExpressionsThenFiveScriptsWithKnownTags) {
    const auto rules = *QVCTCompiledResources::DefaultRulesPlist();
    const PropertyList::Array& list = *rules.value("DefaultRules")->array();
    ASSERT_EQ(list.size(), 22U);
    std::vector<std::string> tags;
    for (std::size_t i = 0; i < list.size(); ++i) {
        const auto& rule = *list[i].dictionary();
        EXPECT_EQ(*rule.value("type")->string(), i < 17 ? "XPath" : "JavaScript") << i + 1;
        EXPECT_FALSE(rule.value("rule")->string()->empty()) << i + 1;
        if (i < 17) tags.push_back(*rule.value("tag")->string());
    }
    EXPECT_THAT(
        tags, ElementsAre("Track Stack", "Mono", "Stereo", "Surround", "Electric", "Layered", "Layered",
                          "Monophonic", "Monophonic", "Monophonic", "Monophonic", "Polyphonic", "Polyphonic",
                          "Polyphonic", "Arpeggiated", "Arpeggiated", "Physical Modelling"));
    EXPECT_THAT(unknown(tags), IsEmpty());
    EXPECT_THAT(unknown({"Swing", "Progress", "Triplet"}), IsEmpty());
}

TEST(PackDisplayNames, NameEveryContentPackAndNothingElse) {
    std::vector<std::string> identifiers;
    std::size_t artists = 0;
    const auto lines = QVCTCompiledResources::PackDisplayNames();
    ASSERT_TRUE(lines);
    for (const std::string& line : *lines) {
        if (line.empty()) continue;
        const auto fields = split(line, ";");
        ASSERT_EQ(fields.size(), 2U) << line;
        identifiers.push_back(fields[0]);
        artists += taxonomy()->findTagForLabel(fields[1], "Artist") ? 1 : 0;
    }
    std::vector<std::string> packs;
    for (const auto& tag : taxonomy()->findCategoryWithIdentifier("Soundpack")->tags())
        packs.push_back(tag->label());
    EXPECT_THAT(identifiers, testing::UnorderedElementsAreArray(packs));
    EXPECT_EQ(artists, 12U);
}

}  // namespace
}  // namespace qvct

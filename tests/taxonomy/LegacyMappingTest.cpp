#include "platform/text/Text.h"
#include "resources/LegacyMappingTable.h"
#include "resources/QVCTCompiledResources.h"
#include "support/CapturedLog.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/legacy/LegacyTagLookup.h"
#include "taxonomy/legacy/TGRTLegacyTaxonomyMapping.h"

#include <map>
#include <set>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using Lines = TGRTLegacyTaxonomyMapping::Lines;
using MappingPointer = std::shared_ptr<const TGRTLegacyTaxonomyMapping>;

/// "label" or "label weight" of each.
std::vector<std::string> texts(const ObjectSet<TGRTTagging>& taggings) {
    std::vector<std::string> result;
    for (const auto& tagging : taggings) {
        result.push_back(tagging->label() +
                         (tagging->level() ? " " + std::to_string(tagging->level()->weight()) : ""));
    }
    return result;
}

std::shared_ptr<TGRTTag> loopTag(std::string_view label, std::string_view category) {
    return findLegacyTag(*TGRTTaxonomy::legacyLoopTaxonomy(), label, {}, category);
}

std::string table(const std::vector<std::string>& rows, const std::string& lineEnd = "\n") {
    return std::string(kLegacyMappingHeader) + lineEnd + join(rows, lineEnd) + lineEnd;
}

MappingPointer mappingOfFile(const std::string& text) {
    const test::TemporaryFolder folder;
    return TGRTLegacyTaxonomyMapping::initWithTaxonomyMappingFileURL(
        URL::fileURLWithPath(folder.write("table.csv", text)), *TGRTTaxonomy::legacyLoopTaxonomy());
}

TEST(LegacyMapping, TranslatesByTheTellingRows) {
    const auto loops = TGRTLegacyTaxonomyMapping::legacyLoopTaxonomyMapping();
    const auto mapped = [&](const char* label) {
        return texts(loops->taggingsForLegacyTag(*loopTag(label, "LoopDescriptors")));
    };
    EXPECT_THAT(mapped("Cheerful"), ElementsAre("Happy"));
    EXPECT_THAT(mapped("Dark"), ElementsAre("Bright / Dark 0.800000"));
    EXPECT_THAT(mapped("Arrhythmic"), IsEmpty());
    EXPECT_TRUE(loops->hasRowForLegacyTag(*loopTag("Arrhythmic", "LoopDescriptors")));
    const auto synths = TGRTLegacyTaxonomyMapping::legacyVorthalTaxonomyMapping();
    const auto release =
        TGRTTaxonomy::legacyVorthalTaxonomy()->findTagForLabel("Long Release", "VorthalArticulation");
    EXPECT_THAT(texts(synths->taggingsForLegacyTag(*release)),
                ElementsAre("Synth", "Short / Long Release 0.800000"));
    EXPECT_TRUE(loops->taggingsForLegacyTag(*release).empty());
    EXPECT_EQ(TGRTLegacyTaxonomyMapping::legacyLoopTaxonomyMapping(), loops);
}

struct Vocabulary {
    const char* name;
    Lines lines;
    std::shared_ptr<TGRTTaxonomy> taxonomy;
    MappingPointer shared;
    std::map<std::string, std::size_t> rowsByType;
};

std::vector<Vocabulary> vocabularies() {
    return {{"loop",
             *QVCTCompiledResources::LegacyLoopTaxonomyMapping(),
             TGRTTaxonomy::legacyLoopTaxonomy(),
             TGRTLegacyTaxonomyMapping::legacyLoopTaxonomyMapping(),
             {{"LoopDescriptors", 18}, {"LoopGenres", 27}, {"LoopInstrumentTypes", 93}}},
            {"synth",
             *QVCTCompiledResources::LegacyVorthalTaxonomyMapping(),
             TGRTTaxonomy::legacyVorthalTaxonomy(),
             TGRTLegacyTaxonomyMapping::legacyVorthalTaxonomyMapping(),
             {{"VorthalArticulation", 23},
              {"VorthalCategory", 111},
              {"VorthalGenre", 18},
              {"VorthalTimbre", 21},
              {"VorthalVersion", 2}}}};
}

TEST(LegacyMapping, FileAndCompiledLinesAgreeAndGiveEveryTagItsOwnRow) {
    for (const Vocabulary& vocabulary : vocabularies()) {
        const test::TemporaryFolder folder;
        const auto file = TGRTLegacyTaxonomyMapping::initWithTaxonomyMappingFileURL(
            URL::fileURLWithPath(folder.write("table.csv", join(vocabulary.lines, "\r\n"))),
            *vocabulary.taxonomy);
        ASSERT_NE(file, nullptr) << vocabulary.name;
        const auto lines = TGRTLegacyTaxonomyMapping::initWithLines(vocabulary.lines, *vocabulary.taxonomy);
        std::map<std::string, std::size_t> rows;
        std::set<std::shared_ptr<TGRTTag>> tags;
        for (const std::string& line : vocabulary.lines) {
            const auto fields = split(line, ";");
            if (line.empty() || line == kLegacyMappingHeader) continue;
            ++rows[fields[0]];
            const auto tag = fields[2].empty()
                                 ? findLegacyTag(*vocabulary.taxonomy, fields[1], {}, fields[0])
                                 : findLegacyTag(*vocabulary.taxonomy, fields[2], fields[1], fields[0]);
            ASSERT_NE(tag, nullptr) << line;
            EXPECT_TRUE(tags.insert(tag).second) << line;
            EXPECT_TRUE(file->hasRowForLegacyTag(*tag)) << line;
            std::vector<std::string> expected;
            for (std::size_t i = 3; i <= 6; ++i) {
                std::optional<double> level;
                const std::string label = labelFromString(fields[i], &level);
                if (!label.empty()) expected.push_back(label + (level ? " " + std::to_string(*level) : ""));
            }
            for (const auto& mapping : {file, lines, vocabulary.shared}) {
                EXPECT_EQ(texts(mapping->taggingsForLegacyTag(*tag)), expected) << line;
            }
        }
        EXPECT_EQ(rows, vocabulary.rowsByType);
        EXPECT_EQ(vocabulary.taxonomy->allTags().size(), tags.size());
        EXPECT_THAT(vocabulary.shared->unknownNewLabels(), IsEmpty());
        EXPECT_THAT(vocabulary.shared->unknownLegacyKeywords(), IsEmpty());
    }
}

TEST(LegacyMapping, RefusesATableThatIsNotAsItShouldBe) {
    const std::string header(kLegacyMappingHeader);
    const std::string row = "LoopDescriptors;Cheerful;;Happy;;;;";
    struct {
        const char* what;
        std::string text;
        bool accepted;
    } const cases[] = {
        {"as it should be", table({row}), true},
        {"CR LF", table({row}, "\r\n"), true},
        {"header alone", header, true},
        {"header cut", header.substr(0, header.size() - 1) + "\n" + row, false},
        {"another letter in the header", "t" + header.substr(1) + "\n" + row, false},
        {"mark of UTF-8 before the header", "\xef\xbb\xbf" + table({row}), false},
        {"seven fields", table({row, "LoopDescriptors;Dark;;;;;"}), false},
        {"nine fields", table({"LoopDescriptors;Dark;;;;;;;", row}), false},
        {"a blank in an empty line", table({row, " "}), false},
        {"empty lines between", table({"", row, ""}), true},
        {"nothing", "", false},
        {"empty lines only", "\n\n", false},
        {"no Unicode", table({row + "\xff"}), false},
    };
    for (const auto& c : cases) EXPECT_EQ(mappingOfFile(c.text) != nullptr, c.accepted) << c.what;
    const auto& taxonomy = *TGRTTaxonomy::legacyLoopTaxonomy();
    EXPECT_EQ(TGRTLegacyTaxonomyMapping::initWithTaxonomyMappingFileURL(std::nullopt, taxonomy), nullptr);
    EXPECT_EQ(TGRTLegacyTaxonomyMapping::initWithTaxonomyMappingFileURL(URL::fileURLWithPath("/no/such.csv"),
                                                                        taxonomy),
              nullptr);
    EXPECT_EQ(TGRTLegacyTaxonomyMapping::initWithLines(std::nullopt, taxonomy), nullptr);
}

TEST(LegacyMapping, PassesOverRowsAndSaysWhy) {
    const test::CapturedLog log;
    const auto mapping = TGRTLegacyTaxonomyMapping::initWithLines(
        Lines{"no header", "LoopDescriptors;Cheerful;;Happy;;;;", "LoopDescriptors;Dark;;Happy;;;",
              "LoopDescriptors;Nonsense;Sub;Happy;;;;", ";Cheerful;;Sad;;;;", "LoopDescriptors;;;Sad;;;;",
              "LoopDescriptors;Cheerful;;Sad ( 0.5 );Angry (0.5);Nonsense (1);Angry (0.50);",
              "LoopDescriptors;Cheerful;;Nonsense;;;;", ""},
        *TGRTTaxonomy::legacyLoopTaxonomy());
    ASSERT_NE(mapping, nullptr);
    // The later row that yields something wins.
    EXPECT_THAT(texts(mapping->taggingsForLegacyTag(*loopTag("Cheerful", "LoopDescriptors"))),
                ElementsAre("Angry 0.500000"));
    EXPECT_THAT(texts(mapping->taggingsForLegacyTag(*loopTag("Dark", "LoopDescriptors"))), IsEmpty());
    EXPECT_THAT(log.messages(), ElementsAre("No legacy tag found for: LoopDescriptors Nonsense Sub",
                                            "No legacy tag found for:  Cheerful ",
                                            "No legacy tag found for: LoopDescriptors  ",
                                            "Label not found in new taxonomy: Sad ( 0.5 )",
                                            "Label not found in new taxonomy: Nonsense",
                                            "Label not found in new taxonomy: Nonsense"));
    EXPECT_THAT(mapping->unknownLegacyKeywords(),
                ElementsAre("LoopDescriptors;Nonsense;Sub", ";Cheerful;", "LoopDescriptors;;"));
    EXPECT_EQ(mapping->unknownNewLabels().size(), 3U);
}

TEST(LegacyMapping, RootTagsAreToldFromTagsBelowOthers) {
    const auto taxonomy = TGRTTaxonomy::legacyVorthalTaxonomy();
    EXPECT_EQ(findLegacyTag(*taxonomy, "Bass", {}, "VorthalCategory")->parent(), nullptr);
    EXPECT_EQ(findLegacyTag(*taxonomy, "Bass", "Rhythmic", "VorthalCategory")->parent()->label(), "Rhythmic");
    EXPECT_NE(findLegacyTag(*taxonomy, "Wobble", {}, "VorthalCategory"), nullptr);
    EXPECT_EQ(findLegacyTag(*taxonomy, "Bass", {}, "none"), nullptr);
}

TEST(LegacyMapping, KeepsTheTaxonomyOfItsTaggings) {
    TGRTTaxonomy::evictCache();
    const auto mapping = mappingOfFile(table({"LoopDescriptors;Cheerful;;Happy;;;;"}));
    const auto& taggings = mapping->taggingsForLegacyTag(*loopTag("Cheerful", "LoopDescriptors"));
    TGRTTaxonomy::evictCache();
    EXPECT_EQ(taggings.ordered()[0]->tag()->categoryIdentifier(), "Positive Emotions");
}

}  // namespace
}  // namespace qvct

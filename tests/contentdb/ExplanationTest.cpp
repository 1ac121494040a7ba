#include "Library.h"
#include "autotagging/ItemTagger.h"
#include "contentdb/Explanation.h"
#include "contentdb/store/codec/ExplanationCodec.h"
#include "contentdb/store/codec/ItemCodec.h"
#include "contentdb/store/upkeep/Salvage.h"

#include <fmt/format.h>
#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using namespace contentdb;

TagClaim claim(std::string_view service, double confidence, TagClaim::Evidence evidence = {},
               int distance = 0, std::string doubt = {}) {
    TagClaim result;
    result.service = service;
    result.confidence = confidence;
    result.evidence = std::move(evidence);
    result.distance = distance;
    result.doubt = std::move(doubt);
    return result;
}

std::string textOf(const std::vector<TagClaim>& claims) {
    std::string text;
    for (const TagClaim& its : claims)
        text += fmt::format("  {} {} {:.3f} '{}' in '{}' at {}, {} away; {}\n", its.label, its.service,
                            its.confidence, its.evidence.what, its.evidence.where, its.evidence.offset,
                            its.distance, its.doubt);
    return text;
}

std::string textOf(const Explanation& explanation) {
    std::string text = fmt::format("{} {} {} {} {}\n", explanation.isWhole,
                                   static_cast<int>(explanation.kind), explanation.tempo.value_or(0),
                                   explanation.isTempoFromLength, explanation.beats.value_or(-1));
    for (const Explanation::Held& held : explanation.held)
        text += fmt::format("{} {:.3f}\n{}", held.tagging, held.confidence, textOf(held.claims));
    for (const DroppedTag& dropped : explanation.dropped)
        text += fmt::format("{} {:.3f} {}\n{}", dropped.label, dropped.confidence, dropped.reason,
                            textOf(dropped.claims));
    return text;
}

/// An item with something of everything that can be said.
IndexedItem item() {
    IndexedItem result;
    result.path = "/Library/Deep \xff House/Kick 01.wav";
    result.name = "Kick 01";
    result.taggings = {{"House", "Genres", {}, {}, Provenance::stored, {}, true},
                       {"Kick", "Source", {"Drums"}, {}, Provenance::automatic, "names", true},
                       {"Drums", "Source", {}, {}, Provenance::automatic, {}, true},
                       {"Mono", "Effects", {}, 0.5F, Provenance::automatic, "of a host", true}};
    return result;
}

Explanation explanation() {
    const std::string folder = "Deep \xff House";
    Explanation result{true, SoundKind::oneShot, 97.56, true, 16, {}, {}};
    result.held = {
        {1,
         0.952,
         {claim("names", 0.952, {"Kick", "Kick 01", 0}), claim("keywords", 0.7, {"Kick", "Kick 01", 0}),
          claim("rules", 0.5, {std::string(79, 'x') + "\xc3\xbc//Channel", "rule 3", 0})}},
        {2, 0.952, {}},
        {0, 0.81, {claim("names", 0.81, {"House", folder, 7}, 1)}},
        {3, 0.6, {claim("host", 0.6)}}};
    result.dropped = {{"Bass",
                       0,
                       "part of \"Bass Drum\"",
                       {claim("keywords", 0, {"Bass", "no name of the path", 3}, 2, "part of \"Bass Drum\""),
                        claim("keywords", 0, {"01", "Kick 01", 5}, 0, "no key stands there")}}};
    return result;
}

TEST(Explanation, IsKeptInAFewBytes) {
    IndexedItem kept = item();
    Explanation expected = explanation();
    kept.explanation = encodedExplanation(expected, kept.path);
    for (Explanation::Held& held : expected.held)
        for (TagClaim& its : held.claims) its.label = kept.taggings[held.tagging].label;
    for (TagClaim& its : expected.dropped[0].claims) its.label = "Bass";
    expected.held[0].claims[2].evidence.what = std::string(79, 'x') + "...";
    EXPECT_EQ(textOf(explanationOf(kept)), textOf(expected));
    Explanation words = explanation();
    words.held[0].claims.pop_back();
    words.held.pop_back();
    words.dropped.clear();
    EXPECT_LE(encodedExplanation(words, kept.path).size(), 32U);
}

TEST(Explanation, SurvivesMergingAndSalvage) {
    const TemporaryFolder folder;
    std::vector<IndexedItem> items = generatedItems(8, 40);
    for (IndexedItem& its : items) {
        its.taggings = item().taggings;
        its.explanation = encodedExplanation(explanation(), its.path);
    }
    store(folder.path("db"), items);
    Error error;
    ASSERT_TRUE(mergeDatabases({folder.path("db")}, folder.path("merged"), &error)) << error.message();
    EXPECT_EQ(salvage(folder.path("db"), folder.path("salvaged")).items, 40);
    for (const char* name : {"db", "merged", "salvaged"}) {
        const auto database = ContentDatabase::open(folder.path(name));
        for (const IndexedItem& its : items) {
            const auto found = database->item(its.path);
            ASSERT_TRUE(found) << name;
            EXPECT_EQ(found->item.taggings, its.taggings) << name;
            EXPECT_EQ(textOf(explanationOf(found->item)), textOf(explanationOf(its))) << name;
        }
    }
}

/// As it was written before explanations were kept whole: of each tagging the confidence and the word.
std::string descriptionOfEarlierEdition() {
    IndexedItem plain = item();
    ByteWriter out;
    out.text("");     // the title
    out.number(0);    // House is stored
    out.number(953);  // 0.952
    out.text("Kick");
    out.number(953);
    out.text("");
    out.number(0);
    return encodedDescription(plain) + out.take();
}

TEST(Explanation, OfEarlierEditionsAndOtherDescribersIsWhatIsKnown) {
    IndexedItem earlier;
    ASSERT_TRUE(decodeDescription(descriptionOfEarlierEdition(), earlier));
    EXPECT_EQ(earlier.taggings, item().taggings);
    EXPECT_EQ(textOf(explanationOf(earlier)),
              "false 0 0 false -1\n1 0.952\n  Kick names 0.952 'Kick' in '' at 0, 0 away; \n2 0.952\n");
    const std::string outline =
        "false 0 0 false -1\n1 1.000\n  Kick names 1.000 '' in '' at 0, 0 away; \n2 1.000\n"
        "3 1.000\n  Mono host 1.000 '' in '' at 0, 0 away; \n";
    EXPECT_EQ(textOf(explanationOf(item())), outline);
    // What is no explanation is none; whatever the bytes, no more is read than is there.
    const std::string whole = encodedExplanation(explanation(), item().path);
    for (std::size_t size = 1; size < whole.size(); ++size) {
        IndexedItem cut = item();
        cut.explanation = whole.substr(0, size);
        EXPECT_EQ(textOf(explanationOf(cut)), outline) << size;
        IndexedItem changed = item();
        changed.explanation = whole;
        changed.explanation[size] = static_cast<char>(changed.explanation[size] ^ 0x7F);
        explanationOf(changed);
    }
}

}  // namespace
}  // namespace qvct::test

#include "autotagging/ContentItem.h"
#include "autotagging/ItemTagger.h"
#include "autotagging/QVTaggingAggregator.h"
#include "autotagging/services/TaggingServiceNames.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/ResourceBundle.h"
#include "support/AudioFixtures.h"
#include "support/CapturedLog.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTagging.h"

#include <algorithm>
#include <random>
#include <set>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::IsSupersetOf;
using testing::Not;
using testing::UnorderedElementsAre;

using Labels = std::vector<std::string>;

TagClaim claim(const std::string& label, double confidence, int distance = 0,
               std::string_view service = "names", const std::string& what = "word") {
    TagClaim result;
    result.label = label;
    result.confidence = confidence;
    result.distance = distance;
    result.service = service;
    result.evidence.what = what;
    return result;
}

Resolution resolve(std::vector<TagClaim> claims, SoundKind kind = SoundKind::oneShot) {
    static const ClaimResolver resolver(TGRTTaxonomy::defaultTaxonomy());
    return resolver.resolve(std::move(claims), kind);
}

Labels heldOf(const Resolution& resolution) {
    Labels labels;
    for (const HeldTag& held : resolution.held) labels.push_back(held.tag->label());
    std::sort(labels.begin(), labels.end());
    return labels;
}

double confidenceOf(const Resolution& resolution, std::string_view label) {
    for (const HeldTag& held : resolution.held)
        if (held.tag->label() == label) return held.confidence;
    return 0;
}

TEST(ClaimResolver, DecidesWhatHolds) {
    const struct {
        const char* what;
        std::vector<TagClaim> claims;
        SoundKind kind;
        Labels held;
    } rows[] = {
        {"the name outweighs its folder",
         {claim("Kick", 0.95), claim("Snare", 0.95, 1)},
         SoundKind::oneShot,
         {"Drums", "Kick"}},
        {"a hint does not outweigh the folder",
         {claim("Kick", 0.45), claim("Snare", 0.95, 1)},
         SoundKind::oneShot,
         {"Drums", "Snare"}},
        {"a folder says what the name does not",
         {claim("Snare", 0.95, 1)},
         SoundKind::oneShot,
         {"Drums", "Snare"}},
        {"a loop has several instruments",
         {claim("Bongo", 0.95), claim("Conga", 0.95)},
         SoundKind::loop,
         {"Bongo", "Conga", "Percussion"}},
        {"a hint alone says nothing", {claim("Kick", 0.45)}, SoundKind::oneShot, {}},
        {"a hint counts where its kind is told",
         {claim("Kick", 0.45), claim("Drums", 0.95, 1)},
         SoundKind::oneShot,
         {"Drums", "Kick"}},
        {"or a kind that goes with it",
         {claim("Woodblock", 0.45), claim("Drums", 0.95, 1)},
         SoundKind::oneShot,
         {"Percussion", "Woodblock"}},
        {"one key", {claim("A", 0.97), claim("C", 0.97, 1)}, SoundKind::loop, {"A", "Key"}},
        {"one mode",
         {claim("Major KeyType", 0.97), claim("Minor KeyType", 0.6)},
         SoundKind::loop,
         {"Key Type", "Major KeyType"}},
        {"key and mode are no alternatives",
         {claim("A", 0.97), claim("Minor KeyType", 0.97)},
         SoundKind::loop,
         {"A", "Key", "Key Type", "Minor KeyType"}},
        {"kinds of content bring no parents",
         {claim("One Shot", 1, 0, "content-type")},
         SoundKind::oneShot,
         {"One Shot"}},
        {"labels of no tag are dropped",
         {claim("Kick", 0.95), claim("No Such Tag", 1)},
         SoundKind::oneShot,
         {"Drums", "Kick"}},
        {"genres agree",
         {claim("House", 0.95), claim("Jazz", 0.95, 1)},
         SoundKind::oneShot,
         {"Electronic Music", "House", "Jazz"}},
    };
    for (const auto& row : rows) EXPECT_EQ(heldOf(resolve(row.claims, row.kind)), row.held) << row.what;
}

TEST(ClaimResolver, IsSurerWhenSourcesAgreeAndLessSureWhenTheyDoNot) {
    const double alone = confidenceOf(resolve({claim("Kick", 0.8)}), "Kick");
    const double agreed = confidenceOf(resolve({claim("Kick", 0.8), claim("Kick", 0.8, 0, "rules")}), "Kick");
    const double sameWord =
        confidenceOf(resolve({claim("Kick", 0.8), claim("Kick", 0.8, 0, "keywords")}), "Kick");
    const double doubted = confidenceOf(resolve({claim("Kick", 0.8), claim("Snare", 0.7)}), "Kick");
    EXPECT_DOUBLE_EQ(alone, 0.8);
    EXPECT_NEAR(agreed, 1 - 0.2 * (1 - 0.8 * 0.9), 1e-9);
    EXPECT_DOUBLE_EQ(sameWord, alone);
    EXPECT_LT(doubted, alone);
}

TEST(ClaimResolver, GivesAReasonForWhatItDrops) {
    TagClaim doubted = claim("Bass", 0.9, 0, "keywords");
    doubted.doubt = "\"Bass Drum\" is Kick";
    const Resolution resolution =
        resolve({claim("Kick", 0.95), claim("Snare", 0.9), claim("Nope", 1), claim("Glide", 0.3), doubted});
    std::map<std::string, std::string> reasons;
    for (const DroppedTag& dropped : resolution.dropped) reasons[dropped.label] = dropped.reason;
    EXPECT_THAT(reasons, UnorderedElementsAre(testing::Pair("Snare", "Kick is likelier"),
                                              testing::Pair("Nope", "the taxonomy has no such tag"),
                                              testing::Pair("Glide", "too unsure"),
                                              testing::Pair("Bass", "\"Bass Drum\" is Kick")));
}

TEST(ClaimResolver, DecidesTheSameInWhateverOrder) {
    const Labels labels = {"Kick",  "Snare",  "Drums",         "A",     "C",
                           "House", "Techno", "Minor KeyType", "Bongo", "Nope"};
    std::mt19937 random(7);
    std::vector<TagClaim> claims;
    for (int i = 0; i < 40; ++i) {
        claims.push_back(claim(labels[random() % labels.size()], 0.1 * static_cast<double>(1 + random() % 10),
                               static_cast<int>(random() % 4), random() % 2 == 0 ? "names" : "rules",
                               std::to_string(i)));
    }
    const auto textOf = [](const Resolution& resolution) {
        std::string text;
        for (const HeldTag& held : resolution.held)
            text += held.tag->label() + std::to_string(held.confidence) +
                    (held.claims.empty() ? "" : held.claims[0].evidence.what) + ";";
        for (const DroppedTag& dropped : resolution.dropped) text += dropped.label + dropped.reason + ";";
        return text;
    };
    const std::string expected = textOf(resolve(claims));
    for (int i = 0; i < 50; ++i) {
        std::shuffle(claims.begin(), claims.end(), random);
        ASSERT_EQ(textOf(resolve(claims)), expected);
    }
}

TEST(EvidenceWeights, TellWhichEntryIsWrong) {
    const std::string whole =
        "{ Strengths = { word = 1; abbreviation = 1; hint = 1; figure = 1; key = 1; }; Services = { rules = "
        "1; }; "
        "Distances = (1); Together = ((Drums, Percussion)); HeadWord = 0; Support = 0; Contradiction = 0; "
        "Threshold = 0.5; }";
    const auto read = [](const std::string& text, Error* error) {
        const auto list =
            parsePropertyList({reinterpret_cast<const unsigned char*>(text.data()), text.size()});
        return EvidenceWeights::weightsWithDictionary(*list->dictionary(), error);
    };
    Error none;
    ASSERT_TRUE(read(whole, &none)) << none.message();
    const struct {
        std::string entry, wrong, part;
    } faults[] = {{"hint = 1", "hint = 1.5", "Strengths, hint"},
                  {"hint = 1", "hint = much", "Strengths, hint"},
                  {"rules = 1", "rules = -1", "Services, rules"},
                  {"Distances = (1)", "Distances = ()", "Distances"},
                  {"Distances = (1)", "Distances = (1,\n nan)", "Distances"},
                  {"(Drums, Percussion)", "(Drums, (Percussion))", "Together"},
                  {"Threshold = 0.5;", "", "Threshold"}};
    for (const auto& [entry, wrong, part] : faults) {
        std::string text = whole;
        text.replace(text.find(entry), entry.size(), wrong);
        Error error;
        EXPECT_FALSE(read(text, &error)) << wrong;
        EXPECT_EQ(error.part, part) << wrong;
    }
    const test::TemporaryFolder folder;
    folder.write("EvidenceWeights.plist", "{ Strengths = {\n word = 2; }; }");
    ResourceBundle::setDirectory(folder.path());
    const test::CapturedLog log;
    for (int time = 0; time < 2; ++time) EXPECT_GT(EvidenceWeights::defaultWeights().threshold, 0);
    ResourceBundle::setDirectory("");
    EXPECT_THAT(log.messages(), ElementsAre(folder.path("EvidenceWeights.plist") +
                                            ": Strengths, word, line 2: is no number from 0 to 1 (using the "
                                            "built-in one)"));
}

class Tagging : public testing::Test {
  protected:
    Labels tag(const std::string& path, const std::string& root,
               std::uint64_t options = optionsForAllTaggingServices()) {
        const auto item = std::make_shared<ContentItem>(URL::fileURLWithPath(path));
        report_ = tagger_.report(item, ItemNames(path, root), options);
        return heldOf(report_.resolution);
    }
    std::string sound(const std::string& name) {
        const test::Wav wav;
        return folder_.write(name, wav.file(wav.format() + wav.data()));
    }

    test::TemporaryFolder folder_;
    ItemTagger tagger_{QVTaggingAggregator::defaultTaggingAggregator(), TGRTTaxonomy::defaultTaxonomy()};
    ItemReport report_;
};

TEST_F(Tagging, LetsNothingAboveTheFolderCount) {
    const std::string path = sound("Snare/C/Pack/BD0010.wav");
    EXPECT_THAT(tag(path, folder_.path("Snare/C/Pack")),
                ElementsAre("Drums", "Kick", "One Shot", "User generated"));
    EXPECT_THAT(tag(path, folder_.path("Snare")), Not(Contains("C")));
}

TEST_F(Tagging, DoubtsKeywordsThatSeeOnlyAPartOfWhatIsMeant) {
    const struct {
        std::string name, dropped, held;
    } rows[] = {{"Bass Drum 1.wav", "Bass", "Kick"},
                {"Hard Drive Kick.wav", "Drive", "Kick"},
                {"Synth A# Minor.wav", "A", "ASharp"},
                {"Drum'n'Bass/Snare 1.wav", "Bass", "Snare"},
                {"Snare Sample.wav", "Sample", "Snare"}};
    for (const auto& [name, dropped, held] : rows) {
        const Labels labels = tag(sound("Root/" + name), folder_.path("Root"));
        EXPECT_THAT(labels, Contains(held)) << name;
        EXPECT_THAT(labels, Not(Contains(dropped))) << name;
    }
}

TEST_F(Tagging, KeepsWhatOtherServicesSay) {
    const std::string path = sound("Root/Dark Pad.wav");
    EXPECT_THAT(tag(path, folder_.path("Root")),
                IsSupersetOf({"Bright / Dark", "Pad", "Synth", "One Shot", "User generated"}));
    for (const auto& tagging : report_.taggings()) {
        EXPECT_TRUE(tagging->isAutoTagging());
        EXPECT_EQ(tagging->level() ? tagging->level()->weight() : 0,
                  tagging->label() == "Bright / Dark" ? 1 : 0);
    }
    EXPECT_THAT(tag(path, "", QVCTAutoTaggingOptionContentType), ElementsAre("One Shot"));
    EXPECT_THAT(tag(path, "", 0), ElementsAre());
}

TEST_F(Tagging, OfNamesAloneNeedsNoFile) {
    const ItemReport report = tagger_.reportOfNames(
        ItemNames("/none/Loops/Funky Bass Loop 98 Em.wav", "/none"), SoundKind::oneShot);
    EXPECT_EQ(report.kind, SoundKind::loop);
    EXPECT_EQ(report.tempo, 98);
    EXPECT_THAT(heldOf(report.resolution), IsSupersetOf({"Bass", "E", "Minor KeyType"}));
}

}  // namespace
}  // namespace qvct

#include "autotagging/keywords/KeywordExpression.h"
#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "autotagging/services/QVCTFilenameKeywordExtractorTaggingService.h"
#include "support/CapturedLog.h"
#include "support/Corpus.h"
#include "support/OneByOneExtractor.h"
#include "support/PathGenerator.h"

#include <fstream>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using Dictionary = PropertyList::Dictionary;

std::shared_ptr<TGRTTaxonomy> smallTaxonomy() {
    return TGRTTaxonomy::taxonomyWithDictionary(
        Dictionary{{"categories", Dictionary{{"Source", Dictionary{{"Synth", Dictionary{}},
                                                                   {"Drums", PropertyList::Array{"Kick"}},
                                                                   {"Cold / Warm-+", Dictionary{}}}}}}});
}

std::vector<std::string> texts(const CountedSet& set) {
    std::vector<std::string> result;
    for (const auto& [text, _] : set) result.push_back(text);
    return result;
}

TEST(KeywordExtraction, FindsWholeWordsInAnyCase) {
    const Dictionary mapping{{"Synthesizer", "Synth"},
                             {"/Patches/", "Patch"},
                             {"C++", "Code"},
                             {"regex:\\bbd\\d+", "Kick"},
                             {"Warm", "Cold / Warm (1.0)"}};
    struct {
        const char* text;
        std::vector<std::string> found;
    } const cases[] = {
        {"SynthesizerLead", {}},
        {"synthesizer lead", {"Synth"}},
        {"synthesizer_lead", {}},  // an underscore is part of a word
        {"My Library/Patches/Instrument", {"Patch"}},
        {"/Patches/Instrument", {}},  // no word ends before the first slash
        {"cccc", {"Code"}},           // its plus signs are quantifiers
        {"bd808", {"Kick", "Drums"}},
        {"KICK", {"Kick", "Drums"}},
        {"Warm Pad", {"Cold / Warm (1.0)"}},
        {"Warm\xcc\x81", {}},      // the accent belongs to the last letter, where no word ends
        {"\xe9\x9f\xb3Warm", {}},  // but an ideograph is a letter
        {"\xf0\x9f\xa5\x81Warm", {"Cold / Warm (1.0)"}},
        {"\xe2\x84\xaaic\xe2\x84\xaa", {"Kick", "Drums"}},  // two Kelvin signs
        {"", {}},
    };
    const auto extractor = QVCTKeywordExtractor::initWithKeywordMappingDictionary(mapping, smallTaxonomy());
    for (const auto& c : cases)
        EXPECT_EQ(texts(extractor->extractKeywordsFromString(c.text)), c.found) << c.text;
    EXPECT_EQ(texts(extractor->extractKeywordsFromString(std::string_view("Kicks").substr(0, 4))),
              (std::vector<std::string>{"Kick", "Drums"}))
        << "what lies behind the text does not count";
}

TEST(KeywordExtraction, CountsWhatIsFoundBothWaysAndOneLevelOfParents) {
    const Dictionary mapping{{"Kick", PropertyList::Array{"Kick", "Drums"}}, {"ignored", 7}};
    const auto extractor = QVCTKeywordExtractor::initWithKeywordMappingDictionary(mapping, smallTaxonomy());
    const CountedSet found = extractor->extractKeywordsFromString("kick");
    // As a key and as a member of the keyword set: each time its two labels and itself; then the parent.
    EXPECT_EQ(found.count("Kick"), 4U);
    EXPECT_EQ(found.count("Drums"), 3U);
}

TEST(KeywordExtraction, WithoutAMappingFileThereIsNone) {
    Error error;
    EXPECT_EQ(QVCTKeywordExtractor::keywordExtractorWithKeywordMappingDictionaryURL(std::nullopt), nullptr);
    const URL missing = URL::fileURLWithPath("/missing.plist");
    EXPECT_EQ(QVCTKeywordExtractor::keywordExtractorWithKeywordMappingDictionaryURL(missing, &error),
              nullptr);
    EXPECT_EQ(error.path, "/missing.plist");
}

TEST(KeywordExtraction, FollowsATaxonomyThatGrows) {
    const auto taxonomy = smallTaxonomy();
    const auto extractor =
        QVCTKeywordExtractor::initWithKeywordMappingDictionary(Dictionary{{"zap", "Zap"}}, taxonomy);
    EXPECT_THAT(texts(extractor->extractKeywordsFromString("zap")), ElementsAre("Zap"));
    taxonomy->findOrCreateTagWithLabel("Zap", "Synth", "Source");
    EXPECT_THAT(texts(extractor->extractKeywordsFromString("zap")), ElementsAre("Zap", "Synth"));
}

TEST(KeywordExtraction, LogsABrokenKeywordOnEveryAttemptAndGoesOn) {
    const test::CapturedLog log;
    const auto extractor = QVCTKeywordExtractor::initWithKeywordMappingDictionary(
        Dictionary{{"(open", "Synth"}, {"kick", "Kick"}}, smallTaxonomy());
    for (int i = 0; i < 2; ++i)
        EXPECT_THAT(texts(extractor->extractKeywordsFromString("kick")), Contains("Kick"));
    EXPECT_THAT(log.messages(),
                ElementsAre("Error when evalating regex: (open", "Error when evalating regex: (open"));
}

TEST(KeywordExtraction, GivesUpAnExpressionThatBacktracksWithoutEnd) {
    const auto extractor = QVCTKeywordExtractor::initWithKeywordMappingDictionary(
        Dictionary{{"regex:(a+)+$", "Synth"}}, smallTaxonomy());
    EXPECT_THAT(texts(extractor->extractKeywordsFromString(std::string(60, 'a') + "!")), IsEmpty());
}

TEST(KeywordExtraction, EqualsOneExpressionPerKeywordForEveryPath) {
    struct {
        const char* what;
        std::shared_ptr<QVCTKeywordExtractor> extractor;
    } const cases[] = {
        {"default", QVCTKeywordExtractor::defaultKeywordExtractor()},
        {"expressions and other scripts", QVCTKeywordExtractor::initWithKeywordMappingDictionary(
                                              Dictionary{{"\xd0\xb1\xd0\xb0\xd1\x81", "Bass"},
                                                         {"Stra\xc3\x9f\x65", "A (0.5)"},
                                                         {"STRASSE", "B"},
                                                         {"Ta?ke", "Synth"},
                                                         {"Take|Dusty", "Drums"},
                                                         {"[Vv]2", "Piano"},
                                                         {"regex:0\\d", "Voice"},
                                                         {"\xc3\x89tude", "Keyboard"},
                                                         {"\xc3\xa9+t", "X"},
                                                         {"", "Empty"},
                                                         {"fi", "Ligature"}})},
    };
    for (const auto& c : cases) {
        test::OneByOneExtractor reference(*c.extractor);
        test::PathGenerator paths(*c.extractor, 42);
        for (int i = 0; i < 1500; ++i) {
            const std::string path = paths.next();
            ASSERT_EQ(c.extractor->extractKeywordsFromString(path), reference.extract(path))
                << c.what << ": " << path;
        }
    }
}

TEST(KeywordExtraction, EqualsTheReferenceOverRealPresetNames) {
    const auto folder = test::corpus("names");
    QVCT_SKIP_WITHOUT(folder);
    const auto extractor = QVCTKeywordExtractor::defaultKeywordExtractor();
    test::OneByOneExtractor reference(*extractor);
    std::ifstream file(folder / "presets.tsv");
    for (std::string line; std::getline(file, line);) {
        ASSERT_EQ(extractor->extractKeywordsFromString(line), reference.extract(line)) << line;
    }
}

TEST(KeywordExpression, KnowsEveryCharacterThatFoldsIntoAscii) {
    for (char32_t c = 0x80; c <= 0x10FFFF; ++c) {
        if (c >= 0xD800 && c <= 0xDFFF) continue;
        std::string text;
        const auto add = [&text](char32_t bits) { text += static_cast<char>(bits); };
        if (c < 0x800) {
            add(0xC0 | c >> 6U);
        } else {
            if (c < 0x10000) add(0xE0 | c >> 12U);
            if (c >= 0x10000) {
                add(0xF0 | c >> 18U);
                add(0x80 | ((c >> 12U) & 0x3FU));
            }
            add(0x80 | ((c >> 6U) & 0x3FU));
        }
        add(0x80 | (c & 0x3FU));
        const std::string folded = foldCase(text);
        const bool foldsApart = std::none_of(
            folded.begin(), folded.end(), [](char byte) { return static_cast<unsigned char>(byte) < 0x80; });
        ASSERT_EQ(foldsApartFromAscii(text), foldsApart) << std::hex << static_cast<std::uint32_t>(c);
    }
}

TagDictionarySet serviceTags(const char* path,
                             std::uint64_t options = QVCTAutoTaggingOptionFilenameKeywords) {
    return QVCTFilenameKeywordExtractorTaggingService::init()->tagsWithContentsOfURL(
        URL::fileURLWithPath(path), nullptr, nullptr, nullptr, options);
}

TEST(FilenameKeywords, GiveLabelsWithLevelsFromTheWholePath) {
    const auto tags = serviceTags("/Library/Patches/Instrument/Synthesizer/Warm 50% Pad.patch");
    EXPECT_THAT(tags, Contains(TagDictionary{{"label", "Cold / Warm"}, {"level", 1.0}}));
    EXPECT_THAT(tags, Contains(TagDictionary{{"label", "Synth"}}));
    EXPECT_THAT(tags, Contains(TagDictionary{{"label", "Instrument Patch"}}));
    EXPECT_THAT(serviceTags("/x/Warm.patch", ~std::uint64_t{QVCTAutoTaggingOptionFilenameKeywords}),
                IsEmpty());
    EXPECT_THAT(serviceTags("/x/Warm \xff.patch"), IsEmpty());
}

}  // namespace
}  // namespace qvct

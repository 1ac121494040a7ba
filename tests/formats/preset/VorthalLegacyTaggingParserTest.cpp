#include "formats/preset/TGRTVorthalLegacyTaggingParser.h"
#include "resources/QVCTCompiledResources.h"
#include "support/CapturedLog.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <map>
#include <set>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using Parser = TGRTVorthalLegacyTaggingParser;

/// "label" or "parent > label" of each legacy tag in a preset with that text.
std::vector<std::string> tagsOf(const std::string& text) {
    const test::TemporaryFolder folder;
    std::vector<std::string> result;
    for (const auto& tag :
         Parser::legacyTagsForFileURL(URL::fileURLWithPath(folder.write("preset.vcp", text)))) {
        result.push_back((tag->parent() ? tag->parent()->label() + " > " : "") + tag->label());
    }
    return result;
}

TEST(VorthalLegacyTagging, ReadsTheFirstAttributeLine) {
    const std::vector<std::string> three = {"Bass", "Bass > Classic", "Bright"};
    const std::vector<std::string> none;
    struct {
        const char* what;
        std::string text;
        std::vector<std::string> tags;
    } const cases[] = {
        {"plain", "Attribs = 4001,5012,6004", three},
        {"within others", "Name = x\nAttribs = 4001,5012,6004\nAttribs = 7000\n", three},
        {"CR LF", "Name = x\r\nAttribs = 4001,5012,6004\r\n", three},
        {"Unicode line ends", "a\xe2\x80\xa8\x41ttribs = 4001,5012,6004\xc2\x85Next", three},
        {"repeated", "Attribs = 4001,4001,5012,6004,6004", three},
        {"blank after the comma", "Attribs = 4001, 6004", {"Bass"}},
        {"unknown codes", "Attribs = 4018,04001,,5008,9000,x,6004", {"Bright"}},
        {"no codes", "Attribs = ", none},
        {"other token", "Attribs=4001", none},
        {"empty", "", none},
        // Ten characters are cut from the line's start, wherever the token stands in it.
        {"token further right", "x Attribs = 4001,6004", {"Bright"}},
        {"codes before the token", "\xc3\xa4\xc3\xb6\xf0\x9f\xa5\x81      4001,Attribs = 6004", {"Bass"}},
        {"no Unicode", "Attribs = 4001\n\xff", none},
    };
    for (const auto& c : cases) EXPECT_EQ(tagsOf(c.text), c.tags) << c.what;
    EXPECT_TRUE(Parser::legacyTagsForFileURL(URL::fileURLWithPath("/no/such.vcp")).empty());
}

TEST(VorthalLegacyTagging, TableHasARowForEveryTagOfTheVocabulary) {
    std::map<std::pair<std::string, bool>, std::size_t> counts;
    std::set<std::string> keys;
    const test::CapturedLog log;
    for (const auto& [code, row] : Parser::legacyTagIdMapping()) {
        ++counts[{row.category, row.parent.empty()}];
        const auto tags = tagsOf("Attribs = " + code);
        EXPECT_THAT(tags, ElementsAre(row.parent.empty() ? row.label : row.parent + " > " + row.label))
            << code;
        keys.insert(row.category + ";" + row.parent + ";" + row.label);
    }
    EXPECT_THAT(log.messages(), IsEmpty());
    const std::map<std::pair<std::string, bool>, std::size_t> expected = {
        {{"VorthalCategory", true}, 17}, {{"VorthalCategory", false}, 94},    {{"VorthalTimbre", true}, 21},
        {{"VorthalGenre", true}, 18},    {{"VorthalArticulation", true}, 23}, {{"VorthalVersion", true}, 2}};
    EXPECT_EQ(counts, expected);
    EXPECT_EQ(keys.size(), 175U);
    using Tag = Parser::LegacyTag;
    const std::pair<const char*, Tag> telling[] = {{"5009", {"VorthalCategory", "Sub", "Bass"}},
                                                   {"5125", {"VorthalCategory", "Vocal", "Arpeggiated"}},
                                                   {"6020", {"VorthalTimbre", "Mysterious", ""}},
                                                   {"8022", {"VorthalArticulation", "Filter Mod", ""}},
                                                   {"11001", {"VorthalVersion", "Ostra", ""}}};
    for (const auto& [code, tag] : telling) EXPECT_EQ(Parser::legacyTagIdMapping().at(code), tag) << code;
}

TEST(VorthalLegacyTagging, GivesOldAndNewTaggings) {
    const test::TemporaryFolder folder;
    const URL url = URL::fileURLWithPath(folder.write("preset.vcp", "Attribs = 8015,8009"));
    const auto old = Parser::legacyFormatTaggingsForFileURL(url);
    ASSERT_EQ(old.size(), 2U);
    EXPECT_EQ(old.ordered()[0]->category(), "VorthalArticulation");
    EXPECT_EQ(old.ordered()[0]->level(), nullptr);
    std::vector<std::string> labels;
    for (const auto& tagging : Parser::mappedTaggingsForFileURL(url)) labels.push_back(tagging->label());
    EXPECT_THAT(labels, ElementsAre("Synth", "Additive", "Short / Long Release"));
}

}  // namespace
}  // namespace qvct

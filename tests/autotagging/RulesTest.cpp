#include "autotagging/services/QVCTSoftwareInstrumentTaggingService.h"
#include "autotagging/services/QVCTXMLRulesTaggingService.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "platform/data/Json.h"
#include "platform/text/Text.h"
#include "support/CapturedLog.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <cstdlib>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

std::shared_ptr<QVCTXMLDocument> document(std::string_view text) {
    return QVCTXMLDocument::initWithXMLData(text, "test.xml");
}

std::string patch(const std::string& channels) {
    return "<Patch><Channels>" + channels + "</Channels></Patch>";
}

/// A patch of one channel with these plug-ins.
std::string strip(const std::string& plugIns) {
    return patch("<Channel><Plugins>" + plugIns + "</Plugins></Channel>");
}

std::string parameter(const std::string& name, const std::string& value, const std::string& text = "") {
    return "<Parameter name='" + name + "' value='" + value + "' valueString='" + text + "'/>";
}

/// A second parameter makes the parameters an array, as they are in real patches.
const std::string other = "<Parameter name='Other' value='0' valueString=''/>";

std::string plugIn(const std::string& name, const std::string& parameters,
                   const std::string& bypassed = "0") {
    return "<Plugin name='" + name + "' bypassed='" + bypassed + "'><Parameters>" + parameters +
           "</Parameters></Plugin>";
}

std::string onePlugIn(const std::string& name, const std::string& parameters,
                      const std::string& bypassed = "0") {
    return strip(plugIn(name, parameters + other, bypassed));
}

std::string json(const std::vector<TagDictionary>& tags) {
    PropertyList::Array array;
    for (const TagDictionary& tag : tags) array.emplace_back(tag);
    return jsonText(PropertyList(array), JsonStyle::compact);
}

std::string tagsOfRule(const QVCTXMLRulesTaggingService& service, std::size_t number,
                       const std::string& xml) {
    for (const RuleOutcome& outcome : service.outcomesForXMLDocument(document(xml))) {
        if (outcome.number != number) continue;
        EXPECT_EQ(outcome.evidence.empty(), outcome.tags.empty()) << number;
        return json(outcome.tags);
    }
    return "no such rule";
}

TEST(DefaultRules, EachMatchesItsDocumentAndNotTheOneBesideIt) {
    const std::string channel = "<Channel/>", instrument = "<Channel type='Instrument'/>";
    const struct {
        std::size_t number;
        std::string matching, tags, beside;
    } rows[] = {
        {1, patch(channel + channel), "Track Stack", patch(channel)},
        {2, patch("<Channel mode='Mono'/>"), "Mono", patch("<Channel mode='mono'/>")},
        {3, patch("<Channel mode='Stereo'/>"), "Stereo", patch("<Channel type='Stereo'/>")},
        {4, patch("<Channel mode='Surround'/>"), "Surround", patch("<Channel mode='Surround 5.1'/>")},
        {5, strip("<Plugin settingName='My Electric Piano'/>"), "Electric",
         strip("<Plugin settingName='electric'/>")},
        {6, patch(instrument + channel + instrument), "Layered", patch(instrument + channel)},
        {7, onePlugIn("Vorthal 2", parameter("1 IsLayered", "1")), "Layered",
         onePlugIn("Vorthal 2", parameter("1 IsLayered", "0"))},
        {8, onePlugIn("Tinewick", parameter("Polyphony", "0.5")), "Monophonic",
         onePlugIn("Tinewick", parameter("Polyphony", "1"))},
        {9, onePlugIn("Tinewick", parameter("Voices", "1")), "Monophonic",
         onePlugIn("Tinewick", parameter("Voices", "1.1"))},
        {10, onePlugIn("Vorthal", parameter("NmVoices", "0.9")), "Monophonic",
         onePlugIn("Vorthal", parameter("NmVoices", "1"))},
        {11, strip("<Plugin name='ZS Mono'/>"), "Monophonic", strip("<Plugin name='ZS E'/>")},
        {12, onePlugIn("Tinewick", parameter("Polyphony", "2")), "Polyphonic",
         onePlugIn("Tinewick", parameter("Polyphony", "1"))},
        {13, onePlugIn("Tinewick", parameter("Max Voices", "2")), "Polyphonic",
         onePlugIn("Vorthal", parameter("Max Voices", "2"))},
        {14, onePlugIn("Vorthal", parameter("NmVoices", "1")), "Polyphonic",
         onePlugIn("Vorthal", parameter("NmVoices", "0.9"))},
        {15, onePlugIn("Arpeggiator", parameter("Play/Stop", "1")), "Arpeggiated",
         onePlugIn("Arpeggiator", parameter("Play/Stop", "1"), "1")},
        {16, onePlugIn("Vorthal", parameter("IsArpeggiated", "1")), "Arpeggiated",
         onePlugIn("Vorthal", parameter("IsArpeggiated", "0"))},
        {17, onePlugIn("Modelith", ""), "Physical Modelling", onePlugIn("Modelith", "", "1")},
    };
    const auto service = QVCTXMLRulesTaggingService::init();
    for (const auto& row : rows) {
        EXPECT_EQ(tagsOfRule(*service, row.number, row.matching), "[{\"label\":\"" + row.tags + "\"}]")
            << row.number;
        EXPECT_EQ(tagsOfRule(*service, row.number, row.beside), "[]") << row.number;
    }
}

TEST(DefaultRules, EachScriptMatchesItsDocumentAndNotTheOneBesideIt) {
    const auto synced = [](const char* plugInName, const char* sync, const char* note, const char* text) {
        return onePlugIn(plugInName, parameter(sync, "1") + parameter(note, "0", text));
    };
    const char* const triplet = "[{\"label\":\"Triplet\"}]";
    const struct {
        std::size_t number;
        std::string matching, tags, beside;
    } rows[] = {
        {18, onePlugIn("Amp", parameter("Amp", "3", "Tweed") + parameter("Speaker", "1", "4x12"), "1"),
         R"([{"label":"Tweed"},{"label":"Amped"},{"label":"4x12"}])",
         strip(plugIn("Amp", parameter("Amp", "3", "Tweed")))},  // a single parameter is no array
        {18, onePlugIn("Bass Amp", parameter("Speaker", "1", "8x10")), R"([{"label":"8x10"}])",
         onePlugIn("Amplifier", parameter("Speaker", "1", "8x10"))},
        {20, onePlugIn("Arpeggiator", parameter("Swing", "0", "60")), R"([{"label":"Swing","level":0.6}])",
         onePlugIn("Arpeggiator", parameter("Swing", "0", "50"))},
        {20, onePlugIn("Beatforge", parameter("Swing Amnt Pat  24", "0", "75")),
         R"([{"label":"Swing","level":0.75}])",
         onePlugIn("Beatforge", parameter("Swing Amnt Pat 24", "0", "75"))},
        {20, onePlugIn("Vorthal", parameter("Swing Amnt Pat  1", "0", "90") + parameter("Swing", "0", "51")),
         R"([{"label":"Swing","level":0.51}])",  // the table's order decides, and the first that exists
         onePlugIn("Vorthal", parameter("Swing Amnt Pat  1", "0", "90") + parameter("Swing", "0", "40"))},
        {22, synced("Tape Delay", "Sync To Tempo", "Note", "1/8 triplet"), triplet,
         synced("Tape Delay", "Beat Sync", "Note", "1/8 triplet")},
        {22, synced("St-Delay", "Beat Sync", "Note Right", "1/4 triplet"), triplet,
         synced("St-Delay", "Beat Sync", "Note", "1/4 triplet")},
        {22, onePlugIn("Echo", parameter("Time", "0", "1/4 triplet")), triplet,
         onePlugIn("Echo", parameter("Time", "0", "1/4 Triplet"))},
        {22, synced("Delay D", "Sync To Tempo", "Grid", "1/12"), triplet,
         synced("Delay D", "Sync To Tempo", "Grid", "1/16 dotted")},
        {22, onePlugIn("Arpeggiator", parameter("Rate", "0", "triplet")), triplet,
         onePlugIn("Arpeggiator", parameter("Rate", "0", "triplet"), "1")},
        // Of "ArpRate" the single letters are looked up, which must stay.
        {22, synced("Vorthal", "ArpMode", "R", "1/8T"), triplet,
         synced("Vorthal", "ArpMode", "ArpRate", "1/8T")},
    };
    const auto service = QVCTXMLRulesTaggingService::init();
    for (const auto& row : rows) {
        EXPECT_EQ(tagsOfRule(*service, row.number, row.matching), row.tags) << row.number;
        EXPECT_EQ(tagsOfRule(*service, row.number, row.beside), "[]") << row.number << row.beside;
    }
}

TEST(DefaultRules, MaintenanceTagsEveryDocumentAndNoneElse) {
    const auto service = QVCTXMLRulesTaggingService::init();
    EXPECT_EQ(tagsOfRule(*service, 21, "<Other/>"), R"([{"label":"Progress","level":0}])");
    const URL url = URL::fileURLWithPath("/a.patch");
    const auto xml = document(patch("<Channel mode='Mono'/>"));
    const auto tags =
        service->tagsWithContentsOfURL(url, xml, nullptr, nullptr, QVCTAutoTaggingOptionXMLRules);
    EXPECT_EQ(json({tags.begin(), tags.end()}), R"([{"label":"Mono"},{"label":"Progress","level":0}])");
    EXPECT_TRUE(service->tagsWithContentsOfURL(url, xml, nullptr, nullptr, ~0x40ULL).empty());
    EXPECT_TRUE(service->tagsWithContentsOfURL(url, nullptr, nullptr, nullptr, ~0ULL).empty());
}

TEST(DefaultRules, TheTestRuleSpeaksOnlyWhenDebugged) {
    PropertyList::Dictionary rules = QVCTXMLRulesTaggingService::defaultRules();
    const std::string xml = strip("<Plugin name='Echo'/>");
    EXPECT_EQ(tagsOfRule(*QVCTXMLRulesTaggingService::initWithRules(rules), 19, xml), "[]");
    for (PropertyList& rule : *rules.value("DefaultRules")->array()) {
        const std::string text = *rule.dictionary()->value("rule")->string();
        rule.dictionary()->set("rule", replaceAll(text, "var debug = false", "var debug = true"));
    }
    const test::CapturedLog log;
    EXPECT_EQ(tagsOfRule(*QVCTXMLRulesTaggingService::initWithRules(rules), 19, xml),
              R"([{"label":"Autotagging Test"}])");
    EXPECT_THAT(log.messages(), testing::Contains("rule 19: JavaScript: Autotagging JS is working4"));
    EXPECT_THAT(log.messages(), testing::Contains(HasSubstr("\"name\": \"Echo\"")));
}

PropertyList::Dictionary rule(const std::string& text, const char* type = nullptr, const char* tag = "T") {
    PropertyList::Dictionary dictionary{{"rule", text}};
    if (type != nullptr) dictionary.set("type", type);
    if (tag != nullptr) dictionary.set("tag", tag);
    return dictionary;
}

std::shared_ptr<QVCTXMLRulesTaggingService> serviceFor(PropertyList::Array rules) {
    return QVCTXMLRulesTaggingService::initWithRules(
        PropertyList::Dictionary{{"DefaultRules", std::move(rules)}});
}

std::string tagsFor(PropertyList::Dictionary dictionary) {
    const auto tags = serviceFor({std::move(dictionary)})
                          ->tagsWithContentsOfURL(URL::fileURLWithPath("/a"), document("<a/>"), nullptr,
                                                  nullptr, QVCTAutoTaggingOptionXMLRules);
    return json({tags.begin(), tags.end()});
}

TEST(Rules, AreTakenByExactTypeAndFromFiles) {
    const test::TemporaryFolder folder;
    const test::CapturedLog log;
    const std::string scheme = "file://", given = "[{\"label\":\"T\"}]";
    const std::string script = "function main() { return [{label: 'S'}, 7, [1]]; }";
    EXPECT_EQ(tagsFor(rule("/a")), given);
    EXPECT_EQ(tagsFor(rule("/a", "XPath")), given);
    EXPECT_EQ(tagsFor(rule("/a", "xpath")), "[]");
    EXPECT_EQ(tagsFor(rule("/a", "Lua")), "[]");
    EXPECT_EQ(tagsFor(rule("/a", nullptr, nullptr)), "[]");
    EXPECT_EQ(tagsFor(rule("")), "[]");
    EXPECT_EQ(tagsFor(rule("", "JavaScript")), "[]");
    EXPECT_THAT(log.messages(), testing::IsEmpty()) << "each item would be told of a rule without a text";
    EXPECT_EQ(tagsFor(rule("/b")), "[]");
    EXPECT_EQ(tagsFor(rule(script, "JavaScript")), "[{\"label\":\"S\"}]");
    EXPECT_EQ(tagsFor(rule(scheme + folder.write("x y.xpath", "/a"))), given);
    EXPECT_EQ(tagsFor(rule(scheme + replaceAll(folder.path("x y.xpath"), " ", "%20"))), given);
    EXPECT_EQ(tagsFor(rule(scheme + folder.write("s.js", script), "JavaScript")), "[{\"label\":\"S\"}]");
    EXPECT_EQ(tagsFor(rule(scheme + folder.path("missing.xpath"))), "[]");
    EXPECT_EQ(tagsFor(rule(scheme + folder.write("latin.xpath", "/a[@x='\xe9']"))), "[]");
    EXPECT_EQ(tagsFor(rule(scheme + folder.path())), "[]");
    ::setenv("HOME", folder.path().c_str(), 1);
    EXPECT_EQ(tagsFor(rule("file://~/x y.xpath")), given);
}

std::vector<std::string> problemsOf(const QVCTXMLRulesTaggingService& service) {
    std::vector<std::string> problems;
    for (const RuleDescription& rule : service.rules()) {
        if (!rule.problem.empty()) problems.push_back(std::to_string(rule.number) + ": " + rule.problem);
    }
    return problems;
}

TEST(Rules, ProblemsNameTheRuleAndTheReason) {
    const auto service =
        serviceFor({rule("/a"), rule("/a["), PropertyList(7), rule("/a", "Lua"), rule("/a", nullptr, nullptr),
                    rule("var x = ;", "JavaScript"), rule("file:///missing"), rule(""),
                    rule("function main() {}", "JavaScript")});
    EXPECT_THAT(
        problemsOf(*service),
        ElementsAre(HasSubstr("2: XPath \"/a[\", character 4"),
                    HasSubstr("3: there is no text under \"rule\""), HasSubstr("4: unknown type \"Lua\""),
                    HasSubstr("5: there is no text under \"tag\""), HasSubstr("6: script, line 1: "),
                    HasSubstr("7: /missing: no such file"), HasSubstr("8: ")));
    EXPECT_THAT(problemsOf(*QVCTXMLRulesTaggingService::init()), IsEmpty());
}

TEST(SoftwareInstruments, EveryActiveOneGivesItsTag) {
    const auto service = QVCTSoftwareInstrumentTaggingService::init();
    const auto tags = [&](const std::string& xml, std::uint64_t options) {
        const auto set = service->tagsWithContentsOfURL(URL::fileURLWithPath("/a"), document(xml), nullptr,
                                                        nullptr, options);
        return json({set.begin(), set.end()});
    };
    const auto group = TGRTTaxonomy::defaultTaxonomy()->findTagForLabel("Software Instrument");
    ASSERT_EQ(group->children().size(), 23U);
    for (const auto& instrument : group->children()) {
        const std::string name = instrument->label();
        EXPECT_EQ(tags(onePlugIn(name, ""), QVCTAutoTaggingOptionSoftwareInstruments),
                  "[{\"label\":\"" + name + "\"}]");
        EXPECT_EQ(tags(onePlugIn(name, "", "1"), ~0ULL), "[]");
        EXPECT_EQ(tags(onePlugIn(name, ""), ~0x80ULL), "[]");
    }
    EXPECT_EQ(
        tags(strip(plugIn("Vorthal", "") + plugIn("Echo", "") + plugIn("Vorthal", "") + plugIn("ZS P", "")),
             ~0ULL),
        "[{\"label\":\"Vorthal\"},{\"label\":\"ZS P\"}]");
}

}  // namespace
}  // namespace qvct

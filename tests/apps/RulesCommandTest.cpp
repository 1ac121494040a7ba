#include "demo/Library.h"
#include "support/RunTool.h"
#include "support/Texts.h"

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <set>

#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;

const std::string kMono = "<Patch><Channels><Channel mode='Mono'/></Channels></Patch>";

/// A property list of these rules, each the inside of its dictionary.
std::string ruleList(const std::vector<std::string>& rules) {
    std::string text = "<plist version=\"1.0\"><dict><key>DefaultRules</key><array>";
    for (const std::string& rule : rules) text += "<dict>" + rule + "</dict>";
    return text + "</array></dict></plist>";
}

std::string xPathRule(const std::string& expression) {
    return "<key>rule</key><string>" + expression + "</string><key>tag</key><string>Mono</string>";
}

std::string scriptRule(const std::string& script) {
    return "<key>type</key><string>JavaScript</string><key>rule</key><string>" + script + "</string>";
}

std::ptrdiff_t lines(const std::string& text) {
    return std::count(text.begin(), text.end(), '\n');
}

class RulesCommand : public testing::Test {
  protected:
    RulesCommand() { folder_.write("A.patch/org.qvcontenttagging.intermediate.cache.xml", kMono); }

    /// The tool with this rule file over the one patch.
    ToolResult tryRules(const std::string& contents) const {
        return runTool({"--json", "rules", "test", folder_.write("r.plist", contents), patch_});
    }

    TemporaryFolder folder_;
    std::string patch_ = folder_.path("A.patch");
};

TEST_F(RulesCommand, ShowsWhichRulesMatchAndWhy) {
    const ToolResult result = runTool({"rules", patch_, "--json"});
    EXPECT_EQ(result.status, 0) << result.errors;
    ASSERT_EQ(result.json().size(), 1U);
    EXPECT_EQ(result.json()[0]["path"], patch_);
    EXPECT_EQ(result.json()[0]["rules"], json::parse(R"([
        {"number": 2, "type": "XPath", "tags": [{"label": "Mono"}], "evidence": "<Channel mode=\"Mono\"/>"},
        {"number": 21, "type": "JavaScript", "tags": [{"label": "Progress", "level": 0.0}],
         "evidence": "[{\"label\":\"Progress\",\"level\":0}]"}])"));
    EXPECT_THAT(runTool({"rules", patch_}).output,
                AllOf(HasSubstr("   2  XPath       Mono\n      <Channel mode=\"Mono\"/>\n"),
                      HasSubstr("Progress 0%")));
    EXPECT_THAT(runTool({"rules", "--json", folder_.write("Kick.wav", "")}).errors,
                HasSubstr("Kick.wav: has no XML description"));
}

TEST_F(RulesCommand, DemonstrationContentMeetsEveryDefaultRule) {
    demo::writeLibrary(folder_.path("demo"));
    const ToolResult result = runTool({"rules", folder_.path("demo/Patches"), "--json"});
    std::set<int> matched;
    for (const json& item : result.json()) {
        std::set<int> numbers;
        for (const json& rule : item["rules"]) numbers.insert(rule["number"].get<int>());
        EXPECT_TRUE(numbers.contains(21)) << item["path"] << " was not read";  // which tags every document
        matched.merge(numbers);
    }
    matched.insert(19);  // speaks only when it is debugged
    EXPECT_EQ(matched.size(), 22U) << testing::PrintToString(matched);
}

TEST_F(RulesCommand, TriesRulesAndCountsTheirMatches) {
    folder_.write("more/B.patch/org.qvcontenttagging.intermediate.cache.xml", "<Patch/>");
    const std::string rules = folder_.write(
        "r.plist", ruleList({xPathRule("//Channel"), xPathRule("/Patch"),
                             scriptRule("function main() { return document.isMatchingXPath('//Channel') "
                                        "? [{label: 'Swing'}] : []; }")}));
    const ToolResult result =
        runTool({"rules", "test", rules, "--json", patch_, folder_.path("more"), folder_.path("none")});
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.errors, HasSubstr("none: No such file"));
    const json report = result.json();
    EXPECT_EQ(report["items"], 2);
    const std::tuple<const char*, int> expected[] = {{"XPath", 1}, {"XPath", 2}, {"JavaScript", 1}};
    ASSERT_EQ(report["rules"].size(), std::size(expected));
    for (std::size_t i = 0; i < std::size(expected); ++i) {
        const json& rule = report["rules"][i];
        EXPECT_EQ(rule["number"], i + 1);
        EXPECT_EQ(std::tuple(rule["type"], rule["matches"]), expected[i]);
        EXPECT_GT(rule["microseconds"].get<double>(), 0);
    }
    EXPECT_THAT(runTool({"rules", "test", rules, patch_}).output,
                HasSubstr("matches of 1      time an item\n   1  XPath                      1 "));
    EXPECT_THAT(runTool({"rules", "--rules", rules, patch_}).output, HasSubstr("   3  JavaScript  Swing\n"));
    EXPECT_THAT(runTool({"autotag", "--services", "rules", "--rules", rules, patch_}).output,
                HasSubstr("Swing"));
}

TEST_F(RulesCommand, EndsWhereAScriptCannotBeStopped) {
    const std::string doubled = "var s = 'ab'; for (var i = 0; 28 > i; i++) s += s;";
    const struct {
        std::string script, reason;
    } rows[] = {
        {doubled + "s.charCodeAt(7)", "qvtag: rule 1: JavaScript takes too much and cannot be stopped"},
        {"for (var i = 0; 9 > i; i++) String(3n ** 660000n)", "qvtag: rule 1: JavaScript"},
        {"new Array(1e8).fill(0)", "qvtag: rule 1: JavaScript"},
        {"Array.prototype.reverse.call({length: 2 ** 53 - 1})",
         "rule 1: JavaScript Exception: stopped after 1000 ms"},
    };
    for (const auto& row : rows) {
        const auto start = std::chrono::steady_clock::now();
        const ToolResult result = tryRules(ruleList({scriptRule("function main() { " + row.script + " }")}));
        EXPECT_THAT(result.errors, HasSubstr(row.reason));
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(4)) << row.script;
    }
}

TEST_F(RulesCommand, WhatWasFoundBeforeAScriptThatEndsTheProcessIsPrinted) {
    folder_.write("B.patch/org.qvcontenttagging.intermediate.cache.xml", "<Deadly/>");
    const std::string rules = folder_.write(
        "r.plist", ruleList({scriptRule("function main() { if (document.isMatchingXPath('//Deadly')) "
                                        "new Array(1e8).fill(0); return [{label: 'Swing'}]; }")}));
    const ToolResult result = runTool(
        {"autotag", "--json", "--services", "rules", "--rules", rules, patch_, folder_.path("B.patch")});
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.output, HasSubstr("Swing"));
}

/// A taxonomy, a keyword mapping, rules, a record and a description, each of whose texts clears the screen.
TEST_F(RulesCommand, NoTextOfAFileReachesTheTerminalAsACommand) {
    const std::string clear =
                          "\xc2\x9b"
                          "2J",
                      key = "<key>" + clear, string = "<string>" + clear;
    const auto list = [](const std::string& entries) {
        return "<plist version=\"1.0\"><dict>" + entries + "</dict></plist>";
    };
    folder_.write("files/A" + clear + ".patch/org.qvcontenttagging.intermediate.cache.xml",
                  "<Patch name='" + clear + "'/>");
    folder_.write(
        "files/A" + clear + ".patch/tags.plist",
        list("<key>DisplayName</key>" + string + "d</string><key>KeyValueData</key><dict>" + key + "k</key>" +
             string + "v</string></dict><key>Tagging</key><dict>" + key + "c</key><array><dict>" +
             "<key>Name</key>" + string + "t</string></dict></array></dict>"));
    const std::string taxonomy = folder_.write(
        "t.plist",
        list("<key>categories</key><dict>" + key + "C</key><dict>" + key + "L</key><dict/></dict></dict>"));
    const std::string rules = folder_.write(
        "r.plist",
        ruleList({xPathRule("/Patch[@name = '" + clear + "']"), xPathRule("/Patch" + clear + "["),
                  "<key>rule</key><string>/Patch</string><key>tag</key>" + string + "L</string>",
                  scriptRule("throw '" + clear + "'"),
                  scriptRule("function main() { console.log('\\x1b[2J'); return [{label: '\\x1b[2J'}] }")}));
    const std::string files = folder_.path("files"), database = folder_.path("db");
    const std::vector<std::vector<std::string>> commands = {
        {"rules", "--rules", rules, files},
        {"rules", "test", rules, files},
        {"autotag", "--rules", rules, files},
        {"read", files},
        {"inspect", files},
        {"object", files},
        {"index", files, "--db", database},
        {"search", "A", "--db", database},
        {"facets", "A", "--db", database},
        {"taxonomy", "show"},
        {"taxonomy", "search", "L"},
        {"taxonomy", "find", clear + "L"},
        {"taxonomy", "find", "2J"},
        {"taxonomy", "coverage"},
        {"keywords", clear + "L"},
        {"write", "--name", clear, "--dry-run", files + "/A" + clear + ".patch"}};
    for (std::vector<std::string> command : commands) {
        command.insert(command.begin(), {"--taxonomy", taxonomy});
        const ToolResult result = runTool(command);
        for (const char* raw : {"\x1b[2J", "\xc2\x9b"}) {
            EXPECT_EQ(result.output.find(raw), std::string::npos) << testing::PrintToString(command);
            EXPECT_EQ(result.errors.find(raw), std::string::npos) << testing::PrintToString(command);
        }
    }
}

TEST_F(RulesCommand, NamesTheRuleThatIsWrong) {
    const std::string parentheses = std::string(20000, '(') + "1" + std::string(20000, ')');
    const std::string latin = "file://" + folder_.write("latin.xpath", "/a[@x='\xe9']");
    const struct {
        std::string rule, reason;
    } rows[] = {
        {xPathRule("/a["), "rule 2: XPath \"/a[\", character 4: "},
        {xPathRule("/Patch/\xc3\xa9["), "character 10: "},
        {xPathRule("/a[contain(@b, 'c')]"), "character 4: unknown function \"contain\""},
        {xPathRule("/a | b:c"), "character 6: undefined prefix \"b\""},
        {xPathRule("/a['$b' = $b]"), "character 11: undefined variable"},
        {scriptRule("async function main() {}"), "are not available to rules"},
        {xPathRule(parentheses), "rule 2: XPath \"((("},
        {xPathRule("file://" + folder_.path("none.xpath")), "none.xpath: no such file"},
        {xPathRule(latin), "latin.xpath: is not UTF-8 text"},
        {xPathRule("file://" + folder_.path()), ": is a folder"},
        {"<key>rule</key><string>/a</string>", "rule 2: there is no text under \"tag\""},
        {"<key>tag</key><string>Mono</string>", "rule 2: there is no text under \"rule\""},
        {"<key>type</key><string>Lua</string>" + xPathRule("/a"), "rule 2: unknown type \"Lua\""},
        {scriptRule("var x;\nvar y = ;"), "rule 2: script, line 2: SyntaxError"},
    };
    for (const auto& row : rows) {
        const ToolResult result = tryRules(ruleList({xPathRule("/Patch"), row.rule}));
        EXPECT_EQ(result.status, 1);
        EXPECT_EQ(result.json()["rules"][0]["matches"], 1) << row.reason;
        EXPECT_THAT(result.errors, AllOf(HasSubstr("r.plist: rule 2: "), HasSubstr(row.reason)));
        EXPECT_EQ(lines(result.errors), 1) << result.errors;
        EXPECT_LT(result.errors.size(), 1500U) << row.reason;
        EXPECT_THAT(result.json()["rules"][1]["problem"].get<std::string>(),
                    testing::Not(testing::IsEmpty()));
    }
    const std::string rules =
        folder_.write("r.plist", ruleList({xPathRule("/a["), xPathRule("//comment() and (1)")}));
    const ToolResult result = runTool({"rules", "test", rules, folder_.write("Kick.wav", "")});
    EXPECT_THAT(result.output,
                HasSubstr("   1  XPath          never matches\n   2  XPath                      0 "))
        << "also where no item has a description";
}

TEST_F(RulesCommand, ScriptsThatFailCostOnlyThemselves) {
    for (const char* script : {"var x = 1;", "function main() { return 'text'; }",
                               "function main() { return 5; }", "function main() { return [[1]]; }",
                               "function main() { return [{get label() { throw new Error('no'); }}]; }",
                               "function main() { for (;;); }", "function main() { return main(); }"}) {
        const ToolResult result = tryRules(ruleList({scriptRule(script), xPathRule("/Patch")}));
        EXPECT_EQ(result.json()["rules"][0]["matches"], 0) << script;
        EXPECT_EQ(result.json()["rules"][1]["matches"], 1) << script;
        EXPECT_THAT(result.errors, HasSubstr("rule 1: JavaScript Exception: ")) << script;
        EXPECT_EQ(lines(result.errors), 1) << script << result.errors;
    }
}

TEST_F(RulesCommand, RefusesWhatIsNoRuleFileAndAutotagGoesOnWithout) {
    const struct {
        std::string path, reason;
    } rows[] = {
        {folder_.path("none.plist"), "none.plist: No such file"},
        {folder_.path(), ": is a folder"},
        {folder_.write("latin.plist", "<plist><dict><key>\xe9</key></dict></plist>"), "latin.plist: XML"},
        {folder_.write("list.plist", "<plist version=\"1.0\"><array/></plist>"), "not a dictionary"},
        {folder_.write("other.plist", "<plist version=\"1.0\"><dict><key>Rules</key><array/></dict></plist>"),
         "there is no key \"DefaultRules\""},
    };
    for (const auto& row : rows) {
        for (const ToolResult& result : {runTool({"rules", "test", row.path, patch_}),
                                         runTool({"rules", "--rules", row.path, patch_})}) {
            EXPECT_EQ(result.status, 1);
            EXPECT_EQ(result.output, "");
            EXPECT_THAT(result.errors, HasSubstr(row.reason));
            EXPECT_EQ(lines(result.errors), 1) << result.errors;
        }
        const ToolResult tagged =
            runTool({"autotag", "--json", "--services", "rules", "--rules", row.path, patch_});
        EXPECT_EQ(tagged.status, 1);
        EXPECT_THAT(tagged.errors, AllOf(HasSubstr(row.reason), HasSubstr("using the built-in rules")));
        EXPECT_EQ(tagged.json()[0]["taggings"].size(), 2U) << row.path;
    }
    EXPECT_EQ(runTool({"rules"}).status, 2);
    EXPECT_EQ(runTool({"rules", "test", folder_.path("r.plist")}).status, 2);
}

TEST_F(RulesCommand, HostileDocumentsEndAndReadNothingElse) {
    const std::string deep = repeated(10000, "<a>");
    const std::string secret = folder_.write("secret.txt", "secret words");
    const std::string rules = folder_.write(
        "r.plist",
        ruleList({xPathRule("//*"), scriptRule("function main() { return [{label: 'got: ' + "
                                               "(document.JSONString() || '').substr(0, 500)}]; }")}));
    for (const std::string& xml : {entityBomb() + "<Patch><c>&k;</c></Patch>", deep,
                                   "<!DOCTYPE a [<!ENTITY e SYSTEM 'file://" + secret + "'>]><a>&e;</a>"}) {
        folder_.write("A.patch/org.qvcontenttagging.intermediate.cache.xml", xml);
        const ToolResult result = runTool({"rules", "--json", "--rules", rules, patch_});
        EXPECT_EQ(result.status, 0) << result.errors;
        EXPECT_THAT(result.output, HasSubstr("got: ")) << result.errors;
        EXPECT_LT(result.output.size(), 100000U);
        EXPECT_THAT(result.output, testing::Not(HasSubstr("secret words")));
    }
}

}  // namespace
}  // namespace qvct::test

#include "formats/TGRTFileNode.h"
#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <filesystem>
#include <set>

#include <gmock/gmock.h>
#include <unistd.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

std::vector<std::string> names(const json& items) {
    std::vector<std::string> result;
    for (const json& item : items)
        result.push_back(std::filesystem::path(item["path"].get<std::string>()).filename());
    return result;
}

TEST(Autotag, WritesOneStableRecordAnItem) {
    const TemporaryFolder folder;
    const std::string path = folder.write("Dark Kick.wav", "");
    const json expected = json::parse(R"([
        {"label":"Bright / Dark","parent":null,"category":"Sound Descriptors","level":1.0,"auto":true,"weightLevel":10},
        {"label":"Drums","parent":null,"category":"Source","level":null,"auto":true,"weightLevel":10},
        {"label":"Kick","parent":"Drums","category":"Source","level":null,"auto":true,"weightLevel":10}])");
    const ToolResult lines =
        runTool({"--jsonl", "autotag", "--services", "keywords", path, folder.write("b.wav", "")});
    EXPECT_EQ(std::count(lines.output.begin(), lines.output.end(), '\n'), 2);
    const json first = json::parse(lines.output.substr(0, lines.output.find('\n')));
    EXPECT_EQ(first["path"], path);
    EXPECT_EQ(first["type"], "audio");
    json withoutFolder = json::array();
    for (const json& tagging : first["taggings"]) withoutFolder.push_back(tagging);
    EXPECT_EQ(withoutFolder, expected);
}

TEST(Autotag, NamesWhatFailsAndDoesTheRest) {
    const TemporaryFolder folder;
    folder.write("Kick.wav", "");
    folder.write("bad \xff\n.wav", "");
    folder.write("list/DefaultTaxonomy.plist", "<plist><dict><key>categories</key>");
    const std::string keywords =
        "<plist version=\"1.0\"><dict><key>(open</key><string>Kick</string></dict></plist>";
    folder.write("keywords/DefaultKeywordMapping.plist", keywords);
    folder.write("table/LegacyLoopTaxonomyMapping.csv", "Keyword;Tag\n");
    const std::string kick = folder.path("Kick.wav");
    const std::string brokenKeyword = "Error when evalating regex: (open";
    const struct {
        std::vector<std::string> arguments, messages;
        int status = 1;
    } cases[] = {
        {{folder.path("none"), kick}, {folder.path("none") + ": No such file"}},
        {{folder.path()}, {"bad \\xff\\x0a.wav: the name is not UTF-8"}},
        {{"--resources", folder.path("list"), kick}, {"DefaultTaxonomy.plist", "using the built-in one"}},
        {{"--resources", folder.path("keywords"), kick}, {brokenKeyword}},
        {{"--keywords", folder.path("keywords/DefaultKeywordMapping.plist"), kick}, {brokenKeyword}},
        {{"--resources", folder.path("table"), kick},
         {"LegacyLoopTaxonomyMapping.csv: line 1: is not the expected header (using the built-in one)"}},
        {{"--resources", "/none", kick}, {"/none: no such resource folder"}},
        {{"--services", "keywords,magic", kick}, {"no service \"magic\""}, 2},
        {{"--keywords", "/none.plist", kick}, {"/none.plist: No such file"}},
    };
    for (const auto& c : cases) {
        std::vector<std::string> arguments = {"autotag", "--json"};
        arguments.insert(arguments.end(), c.arguments.begin(), c.arguments.end());
        const ToolResult result = runTool(arguments);
        EXPECT_EQ(result.status, c.status) << result.errors;
        EXPECT_THAT(names(result.json()), ElementsAre("Kick.wav")) << result.errors;
        for (const std::string& message : c.messages) EXPECT_THAT(result.errors, HasSubstr(message));
        EXPECT_EQ(std::count(result.errors.begin(), result.errors.end(), '\n'), 1) << result.errors;
    }
}

TEST(Autotag, CannotReadAFolderButGoesOn) {
    const TemporaryFolder folder;
    folder.write("a/Kick.wav", "");
    folder.write("b/Snare.wav", "");
    namespace fs = std::filesystem;
    fs::permissions(folder.path(), fs::perms::others_read | fs::perms::others_exec, fs::perm_options::add);
    fs::permissions(folder.path("a"), fs::perms::none);
    // The superuser reads every folder, so he becomes nobody for this.
    const ToolResult result =
        runTool({"autotag", "--json", folder.path()},
                ::geteuid() == 0 ? "setpriv --reuid=65534 --regid=65534 --clear-groups" : "");
    fs::permissions(folder.path("a"), fs::perms::owner_all);
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(names(result.json()), ElementsAre("Snare.wav"));
    EXPECT_THAT(result.errors, HasSubstr("/a: Permission denied"));
}

TEST(Links, ThatLeadOutOfTheFolderAreFollowedOnRequest) {
    namespace fs = std::filesystem;
    const TemporaryFolder folder;
    const std::string sound = Wav().file(Wav().format() + Wav().data());
    for (const char* name :
         {"in/a.wav", "in/.hidden/h.wav", "out/o.wav", "in-too/t.wav", "out/b.patch/#Root/x"})
        folder.write(name, sound);
    for (const auto& [link, target] : {std::pair("in/x", "../out"),
                                       {"in/y", "../in-too"},
                                       {"in/l.wav", "../out/o.wav"},
                                       {"in/b.patch", "../out/b.patch"},
                                       {"in/circle", "."},
                                       {"in/stays", "../out/up/.hidden"},
                                       {"out/up", "../in"},
                                       {"named", "in"}})
        fs::create_symlink(target, folder.path(link));
    const auto walked = [&](std::vector<std::string> arguments, const std::string& start,
                            const std::string& note) {
        arguments.insert(arguments.end(), {"--json", folder.path(start)});
        const ToolResult result = runTool(arguments);
        EXPECT_EQ(result.status, 0) << result.errors;
        EXPECT_EQ(result.errors.find("passed over") == std::string::npos, note.empty());
        EXPECT_THAT(result.errors, HasSubstr(note));
        std::vector<std::string> paths;
        for (const json& item : result.json())
            paths.push_back(fs::path(item["path"].get<std::string>()).lexically_relative(folder.path(start)));
        return paths;
    };
    const std::string one = ": leads out of the folder and was passed over (one of ";
    const std::string rest = " such links); --follow follows it";
    for (const char* start : {"in", "named"}) {
        EXPECT_THAT(walked({"write", "--add", "Source/Kick"}, start, "/b.patch" + one + "4" + rest),
                    ElementsAre("a.wav", "stays/h.wav"));
        for (const char* name : {"out/o.wav", "in-too/t.wav"}) EXPECT_EQ(readAll(folder.path(name)), sound);
        EXPECT_THAT(walked({"read"}, start, "/x" + one + "2" + rest),
                    ElementsAre("a.wav", "b.patch", "l.wav", "stays/h.wav"));
    }
    const std::vector<std::string> all = {"a.wav",     "b.patch", "l.wav",  "stays/h.wav",
                                          "x/b.patch", "x/o.wav", "y/t.wav"};
    EXPECT_EQ(walked({"read", "--follow"}, "in", ""), all);
    EXPECT_EQ(walked({"write", "--add", "Source/Kick", "--follow"}, "in", ""), all);
    EXPECT_NE(readAll(folder.path("out/o.wav")), sound);
}

TEST(Links, OfRecordsThatLeadAwayAreWrittenToOnRequest) {
    namespace fs = std::filesystem;
    const TemporaryFolder folder;
    const std::string foreign = runTool({"taxonomy", "export", "plist"}).output;
    for (const char* item : {"in/Bass.cst", "in/Pad.patch"}) {
        const std::string path = folder.path(item);
        item == std::string("in/Pad.patch") ? folder.write("in/Pad.patch/x", "") : folder.write(item, "");
        ASSERT_EQ(runTool({"write", "--add", "Source/Kick", path}).status, 0);
        const std::string record =
            TGRTFileNode::nodeWithFileURL(URL::fileURLWithPath(path))->recordURL().path();
        const std::string target = folder.write("out/foreign.plist", foreign);
        fs::remove(record);
        fs::create_symlink(target, record);
        const ToolResult refused = runTool({"write", "--add", "Source/Kick", path});
        EXPECT_EQ(refused.status, 1) << item;
        EXPECT_THAT(refused.errors, HasSubstr(record + ": leads out of its folder"));
        EXPECT_EQ(readAll(target), foreign) << item;
        EXPECT_EQ(runTool({"write", "--add", "Source/Kick", "--follow", path}).status, 0) << item;
        EXPECT_NE(readAll(target), foreign) << item;
    }
    const std::string longName = folder.write("in/" + std::string(247, 'x') + ".cst", "");
    for (const char* option : {"--dry-run", "--verify"}) {
        const ToolResult refused = runTool({"write", "--add", "Source/Kick", option, longName});
        EXPECT_EQ(refused.status, 1) << option;
        EXPECT_THAT(refused.errors, HasSubstr("x.cst.plist: cannot be opened: File name too long")) << option;
    }
}

TEST(Keywords, CountsLabels) {
    const ToolResult result = runTool({"keywords", "Drum Kit", "--json"});
    EXPECT_EQ(result.json()["Drum Kit"], 2);  // as a key it yields others and itself, as a label itself
    EXPECT_THAT(runTool({"keywords", "Warm Pad"}).output, HasSubstr("Cold / Warm (1.0)"));
    EXPECT_EQ(runTool({"keywords", "\xff"}).status, 1);
}

TEST(Taxonomy, ShowsFindsSearchesAndExports) {
    const json shown = runTool({"taxonomy", "show", "Rhythm", "--json"}).json();
    EXPECT_EQ(shown[0]["category"], "Rhythm");
    EXPECT_EQ(shown[0]["tags"].size(), 4U);
    EXPECT_EQ(runTool({"taxonomy", "show", "--json"}).json().size(), 22U);

    const json found = runTool({"taxonomy", "find", "Deep House", "--category", "Genres", "--json"}).json();
    EXPECT_EQ(found["parent"], "House");
    const ToolResult lost = runTool({"taxonomy", "find", "deep house"});
    EXPECT_EQ(lost.status, 1);
    EXPECT_THAT(lost.errors, HasSubstr("there are: Genres/Deep House"));
    EXPECT_THAT(runTool({"taxonomy", "find", "House", "--category", "Source", "--parent", "Bass"}).errors,
                HasSubstr("no tag \"House\" in Source below Bass; there are: Genres/House, "));
    EXPECT_THAT(runTool({"taxonomy", "search", "pop"}).output,
                AllOf(HasSubstr("Aesthetic > Pop\n"), HasSubstr("Genres > Pop\n")));
    const ToolResult category = runTool({"taxonomy", "show", "Rhythm", "Nonsense"});
    EXPECT_EQ(category.status, 1);
    EXPECT_THAT(category.output, HasSubstr("Triplet"));
    EXPECT_THAT(category.errors, HasSubstr("no category \"Nonsense\""));

    EXPECT_THAT(runTool({"taxonomy", "search", "REGGAE", "--json"}).json(),
                ElementsAre("Reggaeton", "Reggae & Ska", "Roots Reggae"));
    EXPECT_THAT(runTool({"taxonomy", "export", "mapping"}).output, HasSubstr("\nRhythm;Triplet;;;;;;\n"));
    EXPECT_THAT(runTool({"taxonomy", "export", "strings"}).output,
                HasSubstr("\"CSharp\" = \"Key: C#\";\n\n"));
}

TEST(Taxonomy, AnExportedOneServesAsTheTaxonomyAgain) {
    const TemporaryFolder folder;
    const std::string path = folder.write("own.plist", runTool({"taxonomy", "export", "plist"}).output);
    EXPECT_EQ(runTool({"--taxonomy", path, "taxonomy", "show", "--json"}).output,
              runTool({"taxonomy", "show", "--json"}).output);
    const ToolResult environment =
        runTool({"taxonomy", "show", "--json"}, "QVCT_RESOURCES=" + folder.path("nowhere"));
    EXPECT_EQ(environment.status, 1);
}

TEST(LegacyTaxonomy, ShowsWhatAKeywordHasBecome) {
    const json dark = runTool({"taxonomy", "map", "Dark", "--json"}).json();
    ASSERT_EQ(dark.size(), 2U);
    EXPECT_EQ(dark[0]["vocabulary"], "loop");
    EXPECT_EQ(dark[0]["category"], "LoopDescriptors");
    EXPECT_EQ(dark[0]["parent"], nullptr);
    EXPECT_EQ(dark[0]["taggings"][0]["label"], "Bright / Dark");
    EXPECT_EQ(dark[0]["taggings"][0]["weightLevel"], 8);
    EXPECT_EQ(dark[1]["category"], "VorthalTimbre");
    const json synth = runTool({"taxonomy", "map", "Bass", "--vocabulary", "synth", "--json"}).json();
    std::set<json> parents;
    for (const json& item : synth) {
        EXPECT_EQ(item["vocabulary"], "synth");
        parents.insert(item["parent"]);
    }
    EXPECT_EQ(parents, (std::set<json>{nullptr, "Arpeggiated", "Rhythmic"}));
    const ToolResult table = runTool({"taxonomy", "map", "Arrhythmic"});
    EXPECT_EQ(table.output, "loop   LoopDescriptors > Arrhythmic  (nothing)\n");
    const ToolResult lost = runTool({"taxonomy", "map", "dark"});
    EXPECT_EQ(lost.status, 1);
    EXPECT_THAT(lost.errors, HasSubstr("no retired keyword \"dark\"; there are: Dark"));
    EXPECT_EQ(runTool({"taxonomy", "map", "Dark", "--vocabulary", "tape"}).status, 2);
}

TEST(LegacyTaxonomy, ShowsWhatTheTablesLeaveOut) {
    const json builtIn = runTool({"taxonomy", "coverage", "--json"}).json();
    ASSERT_EQ(builtIn.size(), 2U);
    EXPECT_EQ(builtIn[0]["tags"], 138);
    EXPECT_EQ(builtIn[1]["tags"], 175);
    const json arrhythmic = {{"label", "Arrhythmic"}, {"parent", nullptr}, {"category", "LoopDescriptors"}};
    EXPECT_THAT(builtIn[0]["withEmptyRow"], testing::Contains(arrhythmic));
    for (const json& vocabulary : builtIn) {
        EXPECT_THAT(vocabulary["withoutRow"], IsEmpty());
        EXPECT_THAT(vocabulary["unknownLabels"], IsEmpty());
        EXPECT_THAT(vocabulary["unknownKeywords"], IsEmpty());
    }

    const TemporaryFolder folder;
    std::string table = runTool({"taxonomy", "export", "mapping"}).output;
    table.resize(table.find('\n') + 1);
    folder.write("LegacyLoopTaxonomyMapping.csv", table + "LoopDescriptors;Dark;;Darkish (0.5);Happy;;;\n" +
                                                      "LoopDescriptors;Nonsense;;;;;;\n");
    folder.write("LegacyVorthalTaxonomyMapping.csv", "no table");
    const ToolResult own = runTool({"--resources", folder.path(), "taxonomy", "coverage", "--json"});
    EXPECT_EQ(own.status, 1);
    EXPECT_THAT(own.errors,
                HasSubstr("LegacyVorthalTaxonomyMapping.csv: line 1: is not the expected header (using the"));
    ASSERT_EQ(own.json().size(), 2U);
    EXPECT_EQ(own.json()[0]["withoutRow"].size(), 137U);
    EXPECT_THAT(own.json()[0]["unknownLabels"], ElementsAre("Darkish"));
    EXPECT_THAT(own.json()[0]["unknownKeywords"], ElementsAre("LoopDescriptors;Nonsense;"));
    EXPECT_THAT(runTool({"taxonomy", "coverage"}).output, HasSubstr("loop  "));
}

TEST(Usage, WrongWordsEndWithTwo) {
    for (const std::vector<std::string>& arguments : {std::vector<std::string>{},
                                                      {"nonsense"},
                                                      {"autotag"},
                                                      {"taxonomy", "export", "pdf"},
                                                      {"autotag", "--nonsense", "x"}}) {
        const ToolResult result = runTool(arguments);
        EXPECT_EQ(result.status, 2);
        EXPECT_THAT(result.output, IsEmpty());
        EXPECT_THAT(result.errors, Not(IsEmpty()));
    }
    EXPECT_THAT(runTool({"--json", "autotg", "x"}).errors, HasSubstr("did you mean \"autotag\"?"));
    EXPECT_THAT(runTool({"read"}).errors, Not(HasSubstr("did you mean")));
    EXPECT_EQ(runTool({"--help"}).status, 0);
    for (const char* command : {"autotag", "inspect", "keywords", "read", "taxonomy", "write"}) {
        EXPECT_THAT(runTool({command, "--help"}).output, HasSubstr("Example:\n  qvtag ")) << command;
    }
}

/// A stream that takes nothing, in the words of a shell.
class BrokenStreams : public testing::Test {
  protected:
    BrokenStreams() {
        int pipe[2];
        EXPECT_EQ(::pipe(pipe), 0);
        ::close(pipe[0]);
        ::dup2(pipe[1], kPipe);
        ::close(pipe[1]);
    }
    ~BrokenStreams() override { ::close(kPipe); }

    /// The tool's exit status; -1 when it was killed.
    static int run(const std::string& arguments, const std::string& streams) {
        // The shell gives way to the tool, so that its end is seen as it is.
        const int raw = std::system(("exec " + quoted(QVCT_TOOL) + " " + arguments + " " + streams).c_str());
        return WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
    }

    static constexpr int kPipe = 9;  // whose reader has gone
    const TemporaryFolder folder_;
    const std::string sound_ = Wav().file(Wav().format() + Wav().data());
};

TEST_F(BrokenStreams, LostOutputIsAFailure) {
    const std::string file = quoted(folder_.write("Dark Kick.wav", sound_));
    for (const std::string& arguments :
         {std::string("--help"), std::string("--version"), std::string("generate zsh"),
          std::string("keywords Pad"), std::string("taxonomy show"), std::string("taxonomy export plist"),
          std::string("taxonomy map Dark"), "read " + file, "autotag " + file, "autotag --jsonl " + file,
          "inspect " + file, "object --options 256 " + file, "rules --json " + file,
          "write --dry-run --add Source/Kick " + file}) {
        for (const std::string stream : {"/dev/full", "&-", "&9"}) {
            EXPECT_EQ(run(arguments, ">" + stream + " 2>" + folder_.path("err")), 1) << arguments << stream;
            EXPECT_EQ(run(arguments, ">" + stream + " 2>" + stream), 1) << arguments << stream;
            const bool isTold = readAll(folder_.path("err")).find("standard output: ") != std::string::npos;
            EXPECT_EQ(isTold, stream != "&9") << arguments << stream;
        }
    }
}

TEST_F(BrokenStreams, ItemsAreWrittenAllTheSame) {
    const auto write = [this](const std::string& streams) {
        const std::string good = folder_.write("good.wav", sound_);
        const std::string bad = folder_.write("bad.wav", "no sound");
        EXPECT_EQ(run("write --add Source/Kick " + bad + " " + good + " " + bad, streams), 1) << streams;
        return readAll(good);
    };
    const std::string written = write(">/dev/null 2>/dev/null");
    ASSERT_NE(written, sound_);
    for (const std::string stream : {"/dev/full", "&-", "&9"}) {
        EXPECT_EQ(write(">/dev/null 2>" + stream), written) << stream;
        EXPECT_EQ(write(">" + stream + " 2>/dev/null"), written) << stream;
        EXPECT_EQ(write("<&- >" + stream + " 2>" + stream), written) << stream;
    }
}

}  // namespace
}  // namespace qvct::test

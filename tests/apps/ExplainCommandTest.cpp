#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <filesystem>

#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::Not;

std::string sound() {
    const Wav wav;
    return wav.file(wav.format() + wav.data());
}

std::string silence() {
    const Wav wav;
    return wav.file(wav.format() + wav.chunk("data", std::string(4000, '\0')));
}

const json* find(const json& list, const std::string& label) {
    for (const json& entry : list)
        if (entry["label"] == label) return &entry;
    return nullptr;
}

TEST(Explain, ShowsWhyEachTagIsThereAndWhatWasDropped) {
    const TemporaryFolder folder;
    const std::string path = folder.write("Pack/Snares/Bass Drum 01.wav", sound());
    ASSERT_EQ(runTool({"write", "--add", "Genres/House", path}).status, 0);
    const json item = runTool({"--json", "explain", folder.path("Pack")}).json()[0];
    EXPECT_EQ(item["path"], path);
    EXPECT_EQ(item["kind"], "one-shot");
    EXPECT_TRUE(item["tempo"].is_null());
    const json* kick = find(item["taggings"], "Kick");
    ASSERT_NE(kick, nullptr);
    EXPECT_EQ((*kick)["state"], "derived");
    EXPECT_GT((*kick)["confidence"], 0.5);
    EXPECT_EQ((*kick)["evidence"][0],
              json::parse(R"({"service":"names","what":"Bass Drum","where":"Bass Drum 01",
        "confidence":0.952})"));
    EXPECT_EQ((*find(item["taggings"], "Drums"))["state"], "parent");
    EXPECT_EQ((*find(item["taggings"], "House"))["state"], "stored");
    EXPECT_EQ((*find(item["dropped"], "Snare"))["reason"], "Kick is likelier");
    EXPECT_EQ((*find(item["dropped"], "Bass"))["reason"], "\"Bass Drum\" is Kick");
    const std::string table = runTool({"explain", folder.path("Pack")}).output;
    EXPECT_THAT(table, HasSubstr("\"Bass Drum\" in the name"));
    EXPECT_THAT(table, HasSubstr("\"Snares\" in the folder \"Snares\""));
}

/// The tags that only databases know, which follow from the file, are left out.
json withoutVirtual(json items) {
    for (json& item : items) {
        json taggings = json::array();
        for (json& tagging : item["taggings"])
            if (tagging["state"] != "virtual") taggings.push_back(std::move(tagging));
        item["taggings"] = std::move(taggings);
    }
    return items;
}

TEST(Explain, TellsThatTheLengthAgreesWithATempo) {
    const TemporaryFolder folder;
    const Wav wav;
    const std::string path =
        folder.write("Grooves/Funk (90).wav", wav.file(wav.format(1, 900, 8) + wav.data(600 * 16)));
    EXPECT_THAT(runTool({"explain", path}).output,
                HasSubstr("  loop  90 bpm, since it is as long as 16 beats\n"));
    ASSERT_EQ(runTool({"index", folder.path("Grooves"), "--db", folder.path("db")}).status, 0);
    const json items = runTool({"--json", "explain", folder.path("Grooves")}).json();
    EXPECT_EQ(withoutVirtual(runTool({"--json", "explain", "--db", folder.path("db"), path}).json()), items);
    const json& item = items[0];
    EXPECT_EQ(item["tempo"], 90);
    EXPECT_EQ(item["beats"], 16);
    EXPECT_EQ(item["tempoFromLength"], true);
}

TEST(Explain, OfADatabaseSaysTheSameWithoutTheFiles) {
    const TemporaryFolder folder;
    const std::string kick = folder.write("sounds/Pack/Snares/Bass Drum 01.wav", sound());
    const Wav wav;
    const std::string loop = folder.write("sounds/Pack/House Loops/Deep House Beat 122bpm Am.wav",
                                          wav.file(wav.format() + wav.acid(2, 57, 8, 122) + wav.data(40000)));
    const std::string drive = folder.write("sounds/Hard Drive/Snare Sample.wav", "RIFF");
    const std::string odd = folder.write("sounds/Zorp.wav", sound());
    ASSERT_EQ(runTool({"write", "--add", "Genres/House", kick}).status, 0);
    ASSERT_EQ(runTool({"write", "--create", "--add", "My Moods/Misty", odd}).status, 0);
    ASSERT_EQ(runTool({"index", folder.path("sounds"), "--db", folder.path("db")}).status, 1);  // no sound
    ASSERT_EQ(runTool({"db", "merge", folder.path("db"), "--db", folder.path("merged")}).status, 0);
    std::vector<std::string> paths;
    json fromFiles = json::array();
    const json all = runTool({"--json", "explain", folder.path("sounds")}).json();
    for (const json& item : all) {
        if (item["path"] == drive) continue;
        paths.push_back(item["path"]);
        fromFiles.push_back(item);
    }
    ASSERT_EQ(paths.size(), 3U);
    std::filesystem::remove_all(folder.path("sounds"));
    for (const char* name : {"db", "merged"}) {
        std::vector<std::string> words = {"--json", "explain", "--db", folder.path(name)};
        words.insert(words.end(), paths.begin(), paths.end());
        const ToolResult result = runTool(words);
        EXPECT_EQ(result.status, 0) << result.errors;
        EXPECT_EQ(withoutVirtual(result.json()), fromFiles) << name;
    }
    const ToolResult table = runTool({"explain", "--db", folder.path("db"), "--query", "tag:Kick", odd});
    EXPECT_THAT(table.output, testing::AllOf(HasSubstr(kick), HasSubstr("\"Bass Drum\" in the name"),
                                             HasSubstr("\"Snares\" in the folder \"Snares\""),
                                             HasSubstr("Misty"), Not(HasSubstr(loop))));
    const json found = runTool({"--json", "explain", "--db", folder.path("db"), "--query", "bpm:122"}).json();
    ASSERT_EQ(found.size(), 1U);
    EXPECT_EQ((*find(found[0]["taggings"], "A"))["state"], "virtual");
    // What stands in no database, or failed when it was indexed.
    for (const std::string& path : {drive, folder.path("none.wav"), folder.path("sounds")}) {
        const ToolResult failed = runTool({"explain", "--db", folder.path("db"), path});
        EXPECT_EQ(failed.status, 1) << path;
        EXPECT_THAT(failed.errors, HasSubstr(path + ": "));
    }
    const std::vector<std::string> wrong[] = {{"explain"},
                                              {"explain", "--db", folder.path("db")},
                                              {"explain", "--query", "kick", kick},
                                              {"explain", "--db", folder.path("db"), "--services=user", kick},
                                              {"explain", "--db", folder.path("db"), "--query", "bpm:x"}};
    for (const auto& words : wrong) EXPECT_EQ(runTool(words).status, 2) << words.back();
}

TEST(Explain, OfADatabaseWithoutReasonsSaysSo) {
    const TemporaryFolder folder;
    const std::string path = folder.write("sounds/Snare 1.wav", sound());
    ASSERT_EQ(
        runTool({"index", "--services=keywords", folder.path("sounds"), "--db", folder.path("db")}).status,
        0);
    const ToolResult result = runTool({"--json", "explain", "--db", folder.path("db"), path});
    const json item = result.json()[0];
    EXPECT_EQ((*find(item["taggings"], "Snare"))["evidence"][0]["service"], "keywords");
    EXPECT_TRUE(item["dropped"].empty());
    EXPECT_THAT(result.errors, HasSubstr("of 1 item only what holds is in the database"));
}

TEST(Explain, TellsOnceWhatIsWrongWithHabitsAndWeights) {
    const TemporaryFolder folder;
    folder.write("sounds/BD 1.wav", sound());
    folder.write("sounds/Snare 1.wav", sound());
    const std::pair<std::string, std::string> broken[] = {
        {"NamingHabits.plist", "{ Meanings = {\n Kick = bd; }; }"},
        {"EvidenceWeights.plist", "{ Strengths = {\n word = 2; }; }"}};
    for (const auto& [name, text] : broken) {
        const TemporaryFolder resources;
        const std::string path = resources.write(name, text);
        const std::vector<std::string> commands[] = {
            {"autotag", folder.path("sounds")},
            {"index", folder.path("sounds"), "--db", resources.path("db"), "--workers", "2"}};
        for (std::vector<std::string> words : commands) {
            words.insert(words.begin(), {"--resources", resources.path()});
            const ToolResult result = runTool(words);
            EXPECT_EQ(result.status, 1) << words[2];
            EXPECT_THAT(result.errors, HasSubstr("line 2: "));
            const std::size_t first = result.errors.find(path);
            EXPECT_NE(first, std::string::npos) << words[2];
            EXPECT_EQ(result.errors.find(path, first + 1), std::string::npos) << result.errors;
        }
        EXPECT_THAT(runTool({"search", "tag:Kick", "--db", resources.path("db")}).output, HasSubstr("BD 1"));
    }
}

TEST(Explain, LeavesToStrictTaggingWhatTheServicesSay) {
    const TemporaryFolder folder;
    const std::string path = folder.write("Bass Drum 01.wav", sound());
    const auto labels = [&](const char* option) {
        const json item = runTool({"--json", "autotag", option, path}).json()[0];
        std::string all;
        for (const json& tagging : item["taggings"]) all += tagging["label"].get<std::string>() + ";";
        return all;
    };
    for (const char* option : {"--strict", "--services=keywords,user"})
        EXPECT_THAT(labels(option), testing::AllOf(HasSubstr("Bass;"), Not(HasSubstr("Kick;")))) << option;
    EXPECT_THAT(labels("--all"), testing::AllOf(HasSubstr("Kick;"), Not(HasSubstr("Bass;"))));
}

TEST(Autotag, ShowsWhatTellsMostFirst) {
    const TemporaryFolder folder;
    folder.write("Dark House Kick.wav", sound());
    EXPECT_THAT(runTool({"autotag", folder.path()}).output, HasSubstr("  Kick  House  Bright / Dark 100%"));
    EXPECT_THAT(runTool({"autotag", "--all", folder.path()}).output, HasSubstr("Drums  Kick"));
    EXPECT_THAT(runTool({"autotag", "--all", folder.path()}).output, HasSubstr("User generated"));
}

TEST(Evaluate, CountsWhatIsRightAndListsWhatItLeavesOut) {
    const TemporaryFolder folder;
    for (const char* name : {"BD 1.wav", "BD 2.wav", "Snare 1.wav", "Zzz.wav", "Cowbell.wav", "Drum 1.wav"})
        folder.write(std::string("sounds/") + name, silence());
    const std::string truth = folder.write("truth.tsv",
                                           "path\tlabel\r\nBD 1.wav\tKick\r\nBD 2.wav\tTom|Kick\r\n"
                                           "Snare 1.wav\tClaps\r\nZzz.wav\tKick\r\nCowbell.wav\t-\r\n"
                                           "Drum 1.wav\tTom\r\nNone.wav\tKick\r\nBD 1.wav\tBoink\r\n");
    const ToolResult result = runTool({"--json", "evaluate", "--truth", truth, folder.path("sounds")});
    EXPECT_EQ(result.status, 1);
    const json all = result.json();
    EXPECT_EQ(all["items"], 7);
    // Said: Kick, Kick, Snare, Cowbell, Drums (a parent), and Kick where the label is unknown.
    EXPECT_EQ(all["overall"]["count"], 5);
    EXPECT_EQ(all["overall"]["said"], 6);
    EXPECT_EQ(all["overall"]["right"], 2);
    EXPECT_EQ(all["overall"]["parentOnly"], 1);
    EXPECT_DOUBLE_EQ(all["overall"]["precision"], 0.5);
    EXPECT_DOUBLE_EQ(all["overall"]["recall"], 0.4);
    EXPECT_DOUBLE_EQ(all["labels"]["Kick"]["recall"], 2.0 / 3);
    EXPECT_EQ(all["unknownPaths"], json::array({"None.wav"}));
    EXPECT_EQ(all["unknownLabels"], json::array({"Boink (line 9)"}));
    EXPECT_THAT(result.errors, HasSubstr("1 path that does not exist: None.wav"));
    EXPECT_EQ(runTool({"--json", "evaluate", "--names-only", "--truth", truth, folder.path("none")})
                  .json()["items"],
              8);
    const std::pair<std::string, std::string> broken[] = {
        {"a\tb\n", "line 1"}, {"path\tlabel\na b\n", "line 2"}, {"", "line 1"}};
    for (const auto& [text, place] : broken) {
        const ToolResult refused =
            runTool({"evaluate", "--truth", folder.write("broken.tsv", text), folder.path()});
        EXPECT_EQ(refused.status, 1);
        EXPECT_THAT(refused.errors, HasSubstr(place)) << text;
    }
}

}  // namespace
}  // namespace qvct::test

#include "support/AudioFixtures.h"
#include "support/RunTool.h"

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

TEST(Explain, TellsThatTheLengthAgreesWithATempo) {
    const TemporaryFolder folder;
    const Wav wav;
    const std::string path =
        folder.write("Funk (90).wav", wav.file(wav.format(1, 900, 8) + wav.data(600 * 16)));
    EXPECT_THAT(runTool({"explain", path}).output,
                HasSubstr("  loop  90 bpm, since it is as long as 16 beats\n"));
    const json item = runTool({"--json", "explain", path}).json()[0];
    EXPECT_EQ(item["tempo"], 90);
    EXPECT_EQ(item["beats"], 16);
    EXPECT_EQ(item["tempoFromLength"], true);
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
    EXPECT_THAT(runTool({"autotag", folder.path()}).output, HasSubstr("  Kick  House  Bright / Dark 100%\n"));
    EXPECT_THAT(runTool({"autotag", "--all", folder.path()}).output, HasSubstr("Drums  Kick"));
    EXPECT_THAT(runTool({"autotag", "--all", folder.path()}).output, HasSubstr("User generated"));
}

TEST(Evaluate, CountsWhatIsRightAndListsWhatItLeavesOut) {
    const TemporaryFolder folder;
    for (const char* name : {"BD 1.wav", "BD 2.wav", "Snare 1.wav", "Zzz.wav", "Cowbell.wav", "Drum 1.wav"})
        folder.write(std::string("sounds/") + name, sound());
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

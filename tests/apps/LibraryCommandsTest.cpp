#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <algorithm>
#include <filesystem>
#include <set>

#include <gmock/gmock.h>
#include <unistd.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

class LibraryCommands : public testing::Test {
  protected:
    LibraryCommands() {
        const std::string wav = Wav().file(Wav().format() + Wav().data());
        const std::pair<const char*, std::string> files[] = {
            {"Drums/Dark Kick 01.wav", wav},
            {"Drums/House Snare.wav", Wav().file(Wav().format() + Wav().data(5000))},
            {"Drums/Techno Kick.aif", Aiff::file(Aiff::common() + Aiff::sound())},
            {"Pads/Warm Pad.cst", "settings"},
            {"Pads/Deep House Bass.caf", Caf::file(Caf::description() + Caf::data())}};
        for (const auto& [name, bytes] : files) folder_.write(std::string("sounds/") + name, bytes);
        settle();
    }

    /// Until what was written is older than a tick of the file system's clock.
    static void settle() { ::usleep(40000); }

    ToolResult index(std::vector<std::string> more = {}, const std::string& database = "db") const {
        std::vector<std::string> arguments = {"index", folder_.path("sounds"), "--json", "--db",
                                              folder_.path(database)};
        arguments.insert(arguments.end(), more.begin(), more.end());
        return runTool(arguments);
    }
    ToolResult run(const std::vector<std::string>& words, const std::string& database = "db") const {
        std::vector<std::string> arguments = words;
        arguments.insert(arguments.begin() + 1, {"--db", folder_.path(database), "--json"});
        return runTool(arguments);
    }
    std::vector<std::string> names(const std::string& query, const std::string& database = "db") const {
        std::vector<std::string> names;
        const ToolResult result = run({"search", query}, database);
        EXPECT_EQ(result.status, 0) << result.errors;
        for (const json& item : result.json()) names.push_back(item["displayName"]);
        return names;
    }

    TemporaryFolder folder_;
};

TEST_F(LibraryCommands, IndexAndFind) {
    const ToolResult first = index();
    ASSERT_EQ(first.status, 0) << first.errors;
    EXPECT_EQ(first.errors, "");
    EXPECT_EQ(first.json()["indexed"], 5);
    EXPECT_EQ(index().json()["unchanged"], 5);
    EXPECT_THAT(names("kick"), ElementsAre("Dark Kick 01", "Techno Kick"));
    // What people mean by other words, but not in quotes.
    for (const char* query : {"bd", "bassdrum", "bass-drum", "tag:bd", "source:\"Kick\""})
        EXPECT_THAT(names(query), ElementsAre("Dark Kick 01", "Techno Kick")) << query;
    EXPECT_THAT(names("type:audio -bd"), testing::UnorderedElementsAre("House Snare", "Deep House Bass"));
    EXPECT_THAT(names("\"bd\""), testing::IsEmpty());
    EXPECT_THAT(run({"search", "tag:Tehcno"}).errors, testing::HasSubstr("did you mean \"Techno\"?"));
    EXPECT_EQ(run({"search", "tag:Techno"}).errors, "");
    EXPECT_THAT(names("source:drums kick name-"), ElementsAre("Techno Kick", "Dark Kick 01"));
    EXPECT_THAT(names("type:strip, bass"), ElementsAre("Deep House Bass", "Warm Pad"));
    EXPECT_THAT(names("type:audio -source:Kick"),
                testing::UnorderedElementsAre("House Snare", "Deep House Bass"));
    const json found = run({"search", "dark"}).json();
    ASSERT_EQ(found.size(), 1U);
    const auto kick = std::find_if(found[0]["taggings"].begin(), found[0]["taggings"].end(),
                                   [](const json& tagging) { return tagging["label"] == "Kick"; });
    ASSERT_NE(kick, found[0]["taggings"].end());
    EXPECT_EQ((*kick)["provenance"], "automatic");
    EXPECT_EQ((*kick)["service"], "names");
    EXPECT_EQ(run({"search", "", "--limit", "2"}).json().size(), 2U);
}

TEST_F(LibraryCommands, ShowTheNameOfTheFileAndItsTitle) {
    const std::string kick = folder_.path("sounds/Drums/Dark Kick 01.wav");
    ASSERT_EQ(runTool({"write", "--name", "Automated Build", kick}).status, 0);
    settle();
    index();
    for (const char* query : {"dark", "automated", "name:kick name:build"}) {
        const json found = run({"search", query}).json();
        ASSERT_EQ(found.size(), 1U) << query;
        EXPECT_EQ(found[0]["name"], "Dark Kick 01");
        EXPECT_EQ(found[0]["title"], "Automated Build");
    }
    EXPECT_EQ(run({"search", "snare"}).json()[0]["title"], nullptr);
    EXPECT_EQ(names("type:audio name+").front(), "Automated Build");  // Dark Kick comes first
    EXPECT_THAT(runTool({"search", "dark", "--db", folder_.path("db")}).output,
                HasSubstr("Dark Kick 01.wav  \"Automated Build\""));
}

TEST_F(LibraryCommands, KnowItemsAgainThatWereMovedAndTagged) {
    index();
    const json kick = run({"search", "dark"}).json()[0];
    const std::string moved = folder_.path("sounds/New/Thump.wav");
    std::filesystem::create_directories(folder_.path("sounds/New"));
    std::filesystem::rename(folder_.path("sounds/Drums/Dark Kick 01.wav"), moved);
    EXPECT_EQ(runTool({"write", "--add", "Genres/Jazz", moved}).status, 0);
    settle();
    const json again = index({"--prune"}).json();
    EXPECT_EQ(again["indexed"], 1);
    EXPECT_EQ(again["moved"], 1);
    EXPECT_EQ(again["pruned"], 0);
    const json thump = run({"search", "thump genre:jazz"}).json()[0];
    EXPECT_EQ(thump["id"], kick["id"]);
    EXPECT_EQ(thump["earlierPaths"], json::array({kick["path"]}));
    EXPECT_EQ(runTool({"db", "check", folder_.path("db")}).status, 0);
}

TEST_F(LibraryCommands, TagByTheNamedServicesAndTakeTheFoldersBehind) {
    const ToolResult result = runTool({"index", "--db", folder_.path("db"), "--json", "--services",
                                       "content-type,user", folder_.path("sounds")});
    ASSERT_EQ(result.status, 0) << result.errors;
    EXPECT_EQ(result.json()["indexed"], 5);
    std::set<std::string> services;
    for (const json& item : run({"search", ""}).json()) {
        for (const json& tagging : item["taggings"])
            services.insert(tagging["service"].is_null() ? tagging["provenance"] : tagging["service"]);
    }
    EXPECT_THAT(services, ElementsAre("content-type", "user"));
    EXPECT_EQ(index({"--services", "keywords,magic"}).status, 2);
    EXPECT_EQ(index({"--services", "content-type,user"}).json()["unchanged"], 5);
}

TEST_F(LibraryCommands, ReadAgainWhenOtherServicesOrResourcesDescribe) {
    const auto indexed = [this](const std::vector<std::string>& more) {
        const json run = index(more).json();
        EXPECT_EQ(run["indexed"].get<int>() + run["unchanged"].get<int>(), 5);
        return run["indexed"].get<int>();
    };
    const std::vector<std::string> resources = {"--resources", folder_.path("resources")};
    EXPECT_EQ(indexed({"--services", "content-type"}), 5);
    EXPECT_EQ(indexed({"--services", "content-type"}), 0);
    EXPECT_EQ(indexed({}), 5);
    EXPECT_EQ(names("source:drums").size(), 3U);
    for (const char* names : {"1,One\n", "1,Two\n"}) {
        folder_.write("resources/PackDisplayNames.csv", names);
        EXPECT_EQ(indexed(resources), 5);
        EXPECT_EQ(indexed(resources), 0);
    }
    EXPECT_EQ(indexed({}), 5);
    EXPECT_EQ(names("").size(), 5U);
    EXPECT_EQ(runTool({"db", "check", folder_.path("db")}).status, 0);
}

TEST_F(LibraryCommands, NameWhatCannotBeRead) {
    folder_.write("sounds/broken.wav", "RIFF");
    const ToolResult result = index();
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.errors, HasSubstr("broken.wav"));
    EXPECT_EQ(result.json()["failed"], 1);
    const std::string check = runTool({"db", "check", folder_.path("db")}).output;
    EXPECT_THAT(check, testing::StartsWith(folder_.path("sounds/broken.wav: ")));
    EXPECT_EQ(check.find("broken.wav"), check.rfind("broken.wav"));
    const ToolResult ofFile =
        runTool({"index", "--db", folder_.path("db"), folder_.path("sounds/broken.wav")});
    EXPECT_THAT(ofFile.errors, HasSubstr("broken.wav: is a file, not a folder"));
}

TEST_F(LibraryCommands, CountTagsAndFindSimilar) {
    index();
    std::int64_t kicks = 0;
    for (const json& facet : run({"facets", "type:audio"}).json()) {
        if (facet["label"] == "Kick" && facet["category"] == "Source") kicks = facet["count"];
    }
    EXPECT_EQ(kicks, 2);
    const json similar =
        run({"similar", folder_.path("sounds/Drums/Dark Kick 01.wav"), "--limit", "1"}).json();
    ASSERT_EQ(similar.size(), 1U);
    EXPECT_EQ(similar[0]["displayName"], "Techno Kick");
}

TEST_F(LibraryCommands, SayWhenNotAllCouldBeCounted) {
    folder_.write("sounds/" + std::string(40, 'a') + "!.cst", "");
    settle();
    index();
    const ToolResult result =
        runTool({"search", "name::^dark|^(a+)+$", "--limit", "1", "--db", folder_.path("db")});
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.errors, HasSubstr("takes too long"));
}

TEST_F(LibraryCommands, FindNumbersAsTheyAreWritten) {
    folder_.write("sounds/Odd.wav",
                  Wav().file(Wav().format() + Wav().acid(0, 60, 7, 86.6F) + Wav().data(5000)));
    EXPECT_EQ(runTool({"write", "--add", "Sound Descriptors/Cold / Warm=0.3", folder_.path("sounds/Odd.wav")})
                  .status,
              0);
    settle();
    index();
    const json found = run({"search", "bpm:86.6 level:\"Cold / Warm\"=0.3"}).json();
    ASSERT_EQ(found.size(), 1U);
    EXPECT_EQ(found[0]["keyValues"]["Tempo"], 86.6);
    EXPECT_EQ(found[0]["taggings"][0]["level"], 0.3);
}

TEST_F(LibraryCommands, PartsMergeToTheWhole) {
    index();
    for (const char* part : {"1", "2"}) index({"--part", part, "--parts", "2"}, std::string("part") + part);
    const ToolResult merged = runTool(
        {"db", "merge", folder_.path("part2"), folder_.path("part1"), "--db", folder_.path("all"), "--json"});
    EXPECT_EQ(merged.status, 0) << merged.errors;
    EXPECT_EQ(merged.json()["items"], 5);
    EXPECT_EQ(names("", "all"), names(""));
    EXPECT_EQ(runTool({"db", "check", folder_.path("all")}).status, 0);
    EXPECT_EQ(index({}, "all").json()["unchanged"], 5);
    // Of parts that different services described no word holds for all.
    const std::vector<std::string> byUser = {"--services", "user"};
    index({"--part", "1", "--parts", "2", "--services", "user"}, "other");
    for (const std::vector<std::string>& services : {std::vector<std::string>(), byUser}) {
        const std::string mixed = services.empty() ? "mixed" : "mixed too";
        const ToolResult merging = runTool(
            {"db", "merge", folder_.path("other"), folder_.path("part2"), "--db", folder_.path(mixed)});
        EXPECT_EQ(merging.status, 0) << merging.errors;
        EXPECT_EQ(index(services, mixed).json()["indexed"], 5) << mixed;
    }
}

TEST_F(LibraryCommands, RefuseNumbersOutOfRange) {
    index();
    const std::string kick = folder_.path("sounds/Drums/Dark Kick 01.wav");
    const struct {
        std::vector<std::string> command;
        std::string reason;
    } cases[] = {
        {{"search", "--db", folder_.path("db"), "--limit", "-3"}, "-3 is less than 0"},
        {{"similar", "--db", folder_.path("db"), "--limit=-1", kick}, "-1 is less than 0"},
        {{"object", "--options", "-1", kick}, "-1 is less than 0"},
        {{"index", "--db", folder_.path("db"), "--time-limit", "0", "."}, "0 not in range 1 to 86400"},
        {{"index", "--db", folder_.path("db"), "--workers", "-1", "."}, "-1 not in range 0 to 1024"}};
    for (const auto& [command, reason] : cases) {
        const ToolResult result = runTool(command);
        EXPECT_EQ(result.status, 2) << reason;
        EXPECT_THAT(result.errors, HasSubstr(reason));
    }
}

TEST_F(LibraryCommands, PointAtTheFaultOfAQuery) {
    index();
    const ToolResult result = run({"search", "kick colour:red"});
    EXPECT_EQ(result.status, 2);
    EXPECT_THAT(result.errors, HasSubstr("there is no field \"colour\""));
    EXPECT_THAT(result.errors, HasSubstr("  kick colour:red\n       ^^^^^^\n"));
}

TEST_F(LibraryCommands, TellWhatIsWrongWithADatabase) {
    index();
    std::string bytes = readAll(folder_.path("db"));
    for (std::size_t at = 100; at < bytes.size(); at += 8192) bytes[at] = static_cast<char>(bytes[at] ^ 4);
    folder_.write("db", bytes);
    for (const ToolResult& result : {run({"search", "kick"}), runTool({"db", "check", folder_.path("db")})}) {
        EXPECT_EQ(result.status, 1);
        EXPECT_THAT(result.errors, HasSubstr("damaged"));
        EXPECT_THAT(result.errors, HasSubstr("indexing it with `check` builds it anew"));
    }
    const ToolResult rebuilt = index();
    EXPECT_THAT(rebuilt.errors, HasSubstr("built anew"));
    // A page that does not hold what it should.
    bytes = readAll(folder_.path("db"));
    bytes[3 * 8192 + 100] = static_cast<char>(bytes[3 * 8192 + 100] ^ 4);
    folder_.write("broken", bytes);
    const std::string check = runTool({"db", "check", folder_.path("broken")}).errors;
    EXPECT_EQ(std::count(check.begin(), check.end(), '\n'), 1) << check;
    EXPECT_THAT(check, testing::Not(HasSubstr("***")));
    EXPECT_EQ(rebuilt.json()["indexed"], 5);
    EXPECT_EQ(run({"search", "kick"}, "none").status, 1);
}

}  // namespace
}  // namespace qvct::test

#include "support/RunTool.h"

#include <filesystem>

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
        for (const char* name : {"Drums/Dark Kick 01.wav", "Drums/House Snare.wav", "Drums/Techno Kick.aif",
                                 "Pads/Warm Pad.cst", "Pads/Deep House Bass.caf"}) {
            folder_.write(std::string("sounds/") + name, name);
        }
        ::usleep(40000);
    }

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
    EXPECT_THAT(names("source:drums kick name-"), ElementsAre("Techno Kick", "Dark Kick 01"));
    EXPECT_THAT(names("type:strip, bass"), ElementsAre("Deep House Bass", "Warm Pad"));
    EXPECT_THAT(names("type:audio -source:Kick"),
                testing::UnorderedElementsAre("House Snare", "Deep House Bass"));
    const json found = run({"search", "dark"}).json();
    ASSERT_EQ(found.size(), 1U);
    bool hasKick = false;
    for (const json& tagging : found[0]["taggings"]) {
        if (tagging["label"] != "Kick") continue;
        hasKick = true;
        EXPECT_EQ(tagging["provenance"], "automatic");
        EXPECT_EQ(tagging["service"], "keywords");
    }
    EXPECT_TRUE(hasKick);
    EXPECT_EQ(run({"search", "", "--limit", "2"}).json().size(), 2U);
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

TEST_F(LibraryCommands, PartsMergeToTheWhole) {
    index();
    for (const char* part : {"1", "2"}) index({"--part", part, "--parts", "2"}, std::string("part") + part);
    const ToolResult merged = runTool(
        {"db", "merge", folder_.path("part2"), folder_.path("part1"), "--db", folder_.path("all"), "--json"});
    EXPECT_EQ(merged.status, 0) << merged.errors;
    EXPECT_EQ(merged.json()["items"], 5);
    EXPECT_EQ(names("", "all"), names(""));
    EXPECT_EQ(runTool({"db", "check", folder_.path("all")}).status, 0);
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
    }
    const ToolResult rebuilt = index();
    EXPECT_THAT(rebuilt.errors, HasSubstr("built anew"));
    EXPECT_EQ(rebuilt.json()["indexed"], 5);
    EXPECT_EQ(run({"search", "kick"}, "none").status, 1);
}

}  // namespace
}  // namespace qvct::test

// Tags that a person rejected: qvtag write --reject, --accept and --folder, and all that shows tags
// afterwards.

#include "formats/FormatsSupport.h"
#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <chrono>
#include <filesystem>
#include <thread>

#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::IsSupersetOf;
using testing::Not;

using Labels = std::set<std::string>;

// Silence, so that nothing is heard: a noise might be a drum.
const std::string kSilence(4000, '\0');

std::string sound() {
    const Wav wav;
    return wav.file(wav.format() + wav.chunk("data", kSilence));
}

Labels labelsOf(const json& taggings) {
    Labels labels;
    for (const json& tagging : taggings) labels.insert(tagging["label"].get<std::string>());
    return labels;
}

/// What `autotag` says of one item.
Labels derived(const std::string& path, const std::string& option = "--all") {
    return labelsOf(runTool({"--json", "autotag", option, path}).json()[0]["taggings"]);
}

json recordOf(const std::string& path) {
    return runTool({"--json", "read", path}).json()[0];
}

/// Why a tag does not hold, as `explain` says; empty when it says nothing of it.
std::string reasonAgainst(const std::string& label, const json& item) {
    for (const json& dropped : item["dropped"])
        if (dropped["label"] == label) return dropped["reason"];
    return {};
}

json explained(const std::string& path) {
    return runTool({"--json", "explain", path}).json()[0];
}

void write(std::vector<std::string> arguments) {
    arguments.insert(arguments.begin(), "write");
    const ToolResult result = runTool(arguments);
    ASSERT_EQ(result.status, 0) << result.errors;
}

TEST(Reject, HoldsForItemsOfEveryKindAndIsTakenBack) {
    const TemporaryFolder folder;
    const std::string items[] = {
        folder.write("Kick a.wav", sound()),
        folder.write("Kick b.aif", Aiff::file(Aiff::common() + Aiff::chunk("SSND", big(0, 8) + kSilence))),
        folder.write("Kick c.caf", Caf::file(Caf::description() + Caf::chunk("data", big(0, 4) + kSilence))),
        folder.write("Kick d.cst", "settings"),
        folder.write("Kick e.vcp", "Cutoff 3\n"),
        folder.path("Kick f.patch"),
        folder.path("Kick g.ostrax")};
    folder.write("Kick f.patch/#Root.cst", "");
    folder.write("Kick g.ostrax/Media/x", "");
    for (const std::string& item : items) {
        ASSERT_THAT(derived(item), IsSupersetOf({"Kick", "Drums"})) << item;
        const Labels strict = derived(item, "--strict");
        const ToolResult promised = runTool({"write", "--dry-run", "--reject", "Kick", item});
        EXPECT_THAT(promised.output, HasSubstr("  reject Kick\n"));
        EXPECT_THAT(recordOf(item)["rejected"], IsEmpty());

        const json done = runTool({"--json", "write", "--verify", "--reject", "Source/Kick", item}).json()[0];
        EXPECT_EQ(done["rejected"], json::array({"Kick"}));
        EXPECT_EQ(done["written"], true);
        EXPECT_THAT(done["verified"]["faults"], IsEmpty()) << item;
        EXPECT_EQ(recordOf(item)["rejected"], json::array({"Kick"})) << item;
        EXPECT_THAT(runTool({"read", item}).output, HasSubstr("rejected            Kick\n"));
        EXPECT_THAT(derived(item), AllOf(Not(Contains("Kick")), Not(Contains("Drums")))) << item;
        EXPECT_EQ(derived(item, "--strict"), strict) << item;
        EXPECT_EQ(reasonAgainst("Kick", explained(item)), "rejected in its record") << item;
        EXPECT_THAT(runTool({"explain", item}).output, HasSubstr("rejected in its record: \"Kick\" in"));
        EXPECT_EQ(runTool({"--json", "write", "--reject", "Kick", item}).json()[0]["written"], false);

        write({"--accept", "Kick", item});
        EXPECT_THAT(recordOf(item)["rejected"], IsEmpty()) << item;
        EXPECT_THAT(derived(item), Contains("Kick")) << item;
    }
}

TEST(Reject, WhatIsSaidLastCounts) {
    const TemporaryFolder folder;
    const std::string item = folder.write("Kick.cst", "settings");
    const auto tags = [](const char* label, bool isAuto) {
        return Dictionary{{"Name", label}, {"AutoTagging", isAuto}};
    };
    writeList(folder, "Kick.cst.plist",
              {{"Mine", 7},
               {"Tagging", Dictionary{{"Source", PropertyList::Array{tags("Kick", true), tags("Snare", false),
                                                                     tags("Bass", true)}}}}});
    write({"--reject", "Drums", item});
    EXPECT_EQ(labelsOf(recordOf(item)["taggings"]), Labels{"Bass"}) << "kinds go with it";
    EXPECT_EQ(recordOf(item)["rejected"], json::array({"Drums"}));
    const json added = runTool({"--json", "write", "--add", "Source/Kick", item}).json()[0];
    EXPECT_EQ(added["accepted"], json::array({"Drums"})) << "a kick is a drum";
    EXPECT_THAT(recordOf(item)["rejected"], IsEmpty());
    EXPECT_EQ(readDictionaryFile(folder.path("Kick.cst.plist"))->integerValue("Mine"), 7);

    // What a service stored becomes the person's own.
    write({"--add", "Source/Bass", item});
    const json record = recordOf(item);
    EXPECT_EQ(labelsOf(record["taggings"]), (Labels{"Bass", "Kick"}));
    for (const json& tagging : record["taggings"]) EXPECT_EQ(tagging["auto"], false) << tagging;
}

TEST(Reject, OfAFolderHoldsForWhatIsPutIntoItLater) {
    const TemporaryFolder folder;
    const std::string root = folder.path("Library");
    const std::string first = folder.write("Library/Loops/Kick 1.wav", sound());
    const std::string other = folder.write("Library/Other/Kick.wav", sound());
    const std::string database = folder.path("db");
    const auto index = [&] {
        // What has just changed would be read again by the run after this one.
        std::this_thread::sleep_for(std::chrono::milliseconds(40));
        const ToolResult result = runTool({"--json", "index", root, "--db", database});
        EXPECT_EQ(result.status, 0) << result.errors;
        return result.json()["indexed"].get<int>();
    };
    const auto found = [&] {
        Labels names;
        for (const json& item : runTool({"--json", "search", "tag:Kick", "--db", database}).json())
            names.insert(std::filesystem::path(item["path"].get<std::string>()).filename());
        return names;
    };
    ASSERT_EQ(index(), 2);
    ASSERT_THAT(found(), ElementsAre("Kick 1.wav", "Kick.wav"));

    const ToolResult promised =
        runTool({"write", folder.path("Library/Loops"), "--folder", "--reject", "Drums", "--dry-run"});
    EXPECT_THAT(promised.output, HasSubstr("Library/Loops\n  reject Drums\n"));
    EXPECT_THAT(derived(root), Contains("Kick"));
    const json done =
        runTool({"--json", "write", folder.path("Library/Loops"), "--folder", "--reject", "Drums"}).json()[0];
    EXPECT_EQ(done["written"], true);
    EXPECT_EQ(done["rejected"], json::array({"Drums"}));

    const std::string second = folder.write("Library/Loops/More/Kick 2.wav", sound());
    EXPECT_EQ(index(), 2) << "the one that was there, and the new one";
    EXPECT_THAT(found(), ElementsAre("Kick.wav"));
    EXPECT_EQ(index(), 0);
    const std::string reason = "Drums is rejected in the folder \"Loops\"";
    for (const json& item : runTool({"--json", "explain", root}).json()) {
        const bool isBelow = item["path"] != other;
        EXPECT_EQ(reasonAgainst("Kick", item), isBelow ? reason : "") << item["path"];
    }
    EXPECT_EQ(derived(other).count("Kick"), 1U);
    // Of an item that is named itself two folders count.
    EXPECT_THAT(derived(second), Not(Contains("Kick")));

    // What a service stored before does not count either; what a person says does.
    write({"--add", "Source/Snare", first});
    EXPECT_THAT(labelsOf(explained(first)["taggings"]), Contains("Snare"));
    writeList(
        folder, "Library/Loops/Kick.cst.plist",
        {{"Tagging",
          Dictionary{{"Source", PropertyList::Array{Dictionary{{"Name", "Kick"}, {"AutoTagging", true}}}}}}});
    const std::string stored = folder.write("Library/Loops/Kick.cst", "settings");
    EXPECT_EQ(reasonAgainst("Kick", explained(stored)), reason);
    EXPECT_THAT(labelsOf(explained(stored)["taggings"]), Not(Contains("Kick")));
    index();
    EXPECT_THAT(found(), Not(Contains("Kick.cst")));

    write({root + "/Loops", "--folder", "--accept", "Drums"});
    EXPECT_EQ(index(), 3);
    EXPECT_THAT(found(), ElementsAre("Kick 1.wav", "Kick 2.wav", "Kick.cst", "Kick.wav"));
}

TEST(Reject, OfAFolderWhoseFileIsBrokenIsToldAndWritesNothing) {
    const TemporaryFolder folder;
    const std::string item = folder.write("Pack/Kick.wav", sound());
    const std::string file = folder.write("Pack/.qvct-folder.plist", "{ Rejected = Kick; }");
    for (const std::vector<std::string>& command :
         {std::vector<std::string>{"autotag"}, {"explain"}, {"index", "--db", folder.path("db")}}) {
        std::vector<std::string> arguments = command;
        arguments.push_back(folder.path("Pack"));
        const ToolResult result = runTool(arguments);
        EXPECT_EQ(result.status, 0) << result.errors;
        EXPECT_EQ(result.errors.find(file), result.errors.rfind(file)) << "told once: " << result.errors;
        EXPECT_THAT(result.errors, HasSubstr(file + ": \"Rejected\" is no array of labels"));
    }
    EXPECT_THAT(derived(item), Contains("Kick"));
    const ToolResult refused = runTool({"write", folder.path("Pack"), "--folder", "--reject", "Kick"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_THAT(refused.errors, HasSubstr(file));
    EXPECT_EQ(readAll(file), "{ Rejected = Kick; }");
}

TEST(Reject, OfFoldersFailsForWhatIsNone) {
    const TemporaryFolder folder;
    const std::string item = folder.write("Kick.wav", sound());
    folder.write("Warm.patch/x", "");
    folder.write("Pack/x", "");
    const ToolResult result = runTool({"--json", "write", "--folder", "--reject", "Kick", item,
                                       folder.path("Warm.patch"), folder.path("none"), folder.path("Pack")});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.json().size(), 1U);
    for (const char* reason : {"Kick.wav: is an item", "Warm.patch: is an item", "none: no such folder"})
        EXPECT_THAT(result.errors, HasSubstr(reason));
    EXPECT_FALSE(std::filesystem::exists(folder.path("Warm.patch/.qvct-folder.plist")));
    EXPECT_TRUE(std::filesystem::exists(folder.path("Pack/.qvct-folder.plist")));
}

}  // namespace
}  // namespace qvct::test

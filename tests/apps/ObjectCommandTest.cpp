#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <set>

#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

constexpr const char* kStripRecord = R"(<plist version="1.0"><dict>
<key>DisplayName</key><string>Vocal</string>
<key>ContentInfo</key><dict><key>Dependencies</key><array><string>/a.wav</string></array></dict>
<key>KeyValueData</key><dict><key>Tempo</key><integer>120</integer></dict>
<key>Tagging</key><dict>
<key>Soundpack</key><array><dict><key>Name</key><string>0010_toybox</string></dict></array>
</dict></dict></plist>)";

TEST(ObjectCommand, PrintsOneObjectAnItem) {
    const TemporaryFolder folder;
    const std::string path = folder.write("Vox.cst", "settings");
    folder.write("Vox.cst.plist", kStripRecord);
    folder.write("bare.pst", "settings");
    const ToolResult result = runTool({"object", "--json", folder.path()});
    EXPECT_EQ(result.status, 0);
    EXPECT_THAT(result.errors, HasSubstr("1 item that stores nothing about itself is left out"));
    ASSERT_EQ(result.json().size(), 1U);
    const json object = result.json()[0];
    EXPECT_EQ(object["path"], path);
    EXPECT_EQ(object["displayName"], "Vocal");
    EXPECT_EQ(object["fileType"], 6);
    EXPECT_EQ(object["subFileType"], 0);
    EXPECT_EQ(object["previewAvailable"], false);
    EXPECT_EQ(object["packages"], json({"0010_toybox"}));
    EXPECT_EQ(object["dependencies"][0]["path"], "/a.wav");
    EXPECT_EQ(object["dependencies"][0]["uuid"].get<std::string>().size(), 36U);
    EXPECT_EQ(object["keyValues"], json({{"Tempo", 120}}));
    ASSERT_EQ(object["taggings"].size(), 2U);
    EXPECT_EQ(object["taggings"][0]["label"], "CST");

    for (const char* options : {"256", "0x100"})
        EXPECT_EQ(runTool({"object", "--json", "--options", options, folder.path()}).json().size(), 2U);
    const std::string table = runTool({"object", path}).output;
    for (const char* text : {"Vocal", "0010_toybox", "/a.wav", "Tempo 120", "CST"})
        EXPECT_THAT(table, HasSubstr(text));
}

TEST(ObjectCommand, SaysTheSameAsASearch) {
    const TemporaryFolder folder;
    const std::string strip = folder.write("sounds/Vox.cst", "settings");
    folder.write("sounds/Vox.cst.plist", kStripRecord);
    const std::string loop = folder.write(
        "sounds/Odd.wav", Wav().file(Wav().format() + Wav().acid(2, 57, 7, 86.6F) + Wav().data(5000)));
    EXPECT_EQ(runTool({"write", "--add", "Sound Descriptors/Cold / Warm=0.3", loop}).status, 0);
    runTool({"index", "--services", "content-type", folder.path("sounds"), "--db", folder.path("db")});
    const json found = runTool({"search", "", "--json", "--db", folder.path("db")}).json();
    const json objects = runTool({"object", "--json", loop, strip}).json();
    ASSERT_EQ(found.size(), 2U);
    for (std::size_t i = 0; i < 2; ++i) {
        json expected = found[i];
        for (const char* ofDatabaseOnly : {"id", "earlierPaths", "taggings", "name", "title"})
            expected.erase(ofDatabaseOnly);
        json object = objects[i];
        object.erase("taggings");
        // The index takes these from the sound, too.
        for (const char* ofSound : {"Tempo", "SampleRate", "BitDepth", "ChannelCount"})
            expected["keyValues"].erase(ofSound);
        object["keyValues"].erase("Tempo");
        for (json* its : {&expected, &object}) {
            for (json& dependency : (*its)["dependencies"])
                EXPECT_EQ(dependency.erase("uuid"), 1U);  // made anew
        }
        EXPECT_EQ(expected.dump(), object.dump());
    }
    EXPECT_EQ(found[1]["keyValues"]["Tempo"].dump(), "120");
    EXPECT_EQ(found[1]["dependencies"].size(), 1U);
}

TEST(ObjectCommand, NamesWhatFails) {
    const TemporaryFolder folder;
    folder.write("a.wav", "RIFF");
    const std::string text = folder.write("notes.txt", "");
    const ToolResult result = runTool({"object", "--json", "--options", "256", folder.path("a.wav"), text});
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.errors, HasSubstr("a.wav"));
    EXPECT_THAT(result.errors, HasSubstr("notes.txt: no kind of content"));
    EXPECT_EQ(result.json().size(), 2U) << "what they are by name is shown all the same";
    EXPECT_EQ(runTool({"object", "--options", "many", text}).status, 2);
}

TEST(ObjectCommand, LeavesOutEffectsThatAreNotHeard) {
    const TemporaryFolder folder;
    const std::string path = folder.write("old.cst", "settings");
    folder.write("old.cst.plist", R"(<plist version="1.0"><dict><key>Tagging</key><dict>
<key>Effects</key><array><dict><key>Name</key><string>Reverb</string><key>Weight</key><real>0</real></dict></array>
<key>LoopDescriptors</key><array><dict><key>Name</key><string>Dry</string></dict>
<dict><key>Name</key><string>Distorted</string></dict></array></dict></dict></plist>)");
    std::string table = runTool({"taxonomy", "export", "mapping"}).output;
    table.resize(table.find('\n') + 1);
    folder.write("own/LegacyLoopTaxonomyMapping.csv",
                 table + "LoopDescriptors;Dry;;Delay (0);Clean;Bright / Dark (0);;\n" +
                     "LoopDescriptors;Distorted;;Distortion (0.5);;;;\n");
    const json object =
        runTool({"--resources", folder.path("own"), "object", "--json", "--options", "4", path}).json()[0];
    std::set<std::pair<std::string, json>> found;
    for (const json& tagging : object["taggings"]) found.emplace(tagging["label"], tagging["level"]);
    EXPECT_EQ(found, (std::set<std::pair<std::string, json>>{{"Reverb", 0.0},  // the item's own stays
                                                             {"Dry", nullptr},
                                                             {"Distorted", nullptr},
                                                             {"Clean", nullptr},
                                                             {"Bright / Dark", 0.0},
                                                             {"Distortion", 0.5},
                                                             {"CST", nullptr}}));
}

}  // namespace
}  // namespace qvct::test

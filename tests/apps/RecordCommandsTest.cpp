// qvtag read, write and inspect: one item of every kind, as a user has them.

#include "formats/FormatsSupport.h"
#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <filesystem>
#include <map>
#include <numeric>
#include <set>

#include <fmt/format.h>
#include <gmock/gmock.h>
#include <sys/stat.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

/// An item of each kind that can be written.
struct Items {
    TemporaryFolder folder;
    std::vector<std::string> names = {"loop.wav",    "shot.aif", "Pad.patch",
                                      "Song.ostrax", "Bass.cst", "Lead.vcp"};

    Items() {
        const Wav wav;
        folder.write("loop.wav", wav.file(wav.acid(0, 60, 4, 120) + wav.format() + wav.data()));
        folder.write("shot.aif", Aiff::file(Aiff::common() + Aiff::sound()));
        folder.write("Pad.patch/data.plist", "");
        folder.write("Song.ostrax/Media/x", "");
        folder.write("Bass.cst", "settings");
        folder.write("Lead.vcp", "Cutoff 3\n<tagging>\nAttribs = 4001,6004\n</tagging>\n");
    }

    std::vector<std::string> arguments(std::vector<std::string> before) const {
        for (const std::string& name : names) before.push_back(folder.path(name));
        return before;
    }
};

std::set<std::string> tagsOf(const json& item) {
    std::set<std::string> tags;
    for (const json& tagging : item["taggings"])
        tags.insert(tagging["category"].get<std::string>() + "/" + tagging["label"].get<std::string>() +
                    (tagging["level"].is_null() ? "" : "=" + tagging["level"].dump()));
    return tags;
}

TEST(Read, GivesOneRecordAnItem) {
    const Items items;
    const ToolResult result = runTool(items.arguments({"read", "--json"}));
    EXPECT_EQ(result.status, 0) << result.errors;
    const json records = result.json();
    std::vector<int> types;
    for (const json& record : records) {
        types.push_back(record["fileType"]);
        std::vector<std::string> keys;
        for (const auto& [key, value] : record.items()) keys.push_back(key);
        EXPECT_THAT(keys, testing::UnorderedElementsAre("path", "displayName", "fileType", "subFileType",
                                                        "taggings", "rejected", "keyValues", "contentInfo"));
        EXPECT_TRUE(record["displayName"].is_null());
        EXPECT_THAT(record["taggings"], IsEmpty());
    }
    EXPECT_THAT(types, ElementsAre(2, 7, 1, 8, 6, 3));
    EXPECT_EQ(records[0]["keyValues"]["BeatCount"], 4);
    const std::string preset = items.folder.path("Lead.vcp");
    EXPECT_THAT(tagsOf(runTool({"read", "--json", "--legacy", preset}).json()[0]),
                ElementsAre("VorthalCategory/Bass", "VorthalTimbre/Bright"));
    EXPECT_THAT(tagsOf(runTool({"read", "--json", "--mapped", preset}).json()[0]),
                testing::Contains(testing::StartsWith("Sound Descriptors/Bright / Dark=")));
}

TEST(Write, TwoAtOnceLoseNoTag) {
    const Items items;
    const std::string all = std::accumulate(items.names.begin(), items.names.end(), std::string(),
                                            [&](const std::string& text, const std::string& name) {
                                                return text + " " + items.folder.path(name);
                                            });
    for (int round = 0; round < 5; ++round) {
        std::string command;
        for (const char* tag : {"Genres/House", "Source/Bass", "Genres/Techno"})
            command += fmt::format("{} write --quiet --add {}{} >/dev/null & ", quoted(QVCT_TOOL), tag, all);
        ASSERT_EQ(std::system((command + "wait").c_str()), 0);
        for (const json& record : runTool(items.arguments({"read", "--json"})).json())
            EXPECT_THAT(tagsOf(record), testing::SizeIs(3)) << record["path"];
        const ToolResult cleared = runTool(items.arguments(
            {"write", "--remove", "Genres/House", "--remove", "Source/Bass", "--remove", "Genres/Techno"}));
        ASSERT_EQ(cleared.status, 0) << cleared.errors;
    }
}

TEST(Write, ChangesEveryKindOfItemAndVerifies) {
    const Items items;
    const std::vector<std::string> change = {
        "write", "--json",       "--verify", "--keep-times",
        "--add", "Genres/House", "--add",    "Sound Descriptors/Bright / Dark=25%"};
    const ToolResult result = runTool(items.arguments(change));
    EXPECT_EQ(result.status, 0) << result.errors;
    for (const json& item : result.json()) {
        EXPECT_EQ(item["written"], true);
        EXPECT_EQ(item["added"].size(), 2U);
        EXPECT_THAT(item["verified"]["faults"], IsEmpty());
    }
    EXPECT_EQ(result.json()[0]["verified"]["audioBytes"], 4000);
    for (const json& item : runTool(items.arguments({"read", "--json"})).json())
        EXPECT_THAT(tagsOf(item), ElementsAre("Genres/House", "Sound Descriptors/Bright / Dark=0.25"));
    EXPECT_EQ(runTool({"read", "--json", items.folder.path("loop.wav")}).json()[0]["fileType"], 2);

    // Another level replaces the tag; what is not there need not be removed.
    const ToolResult again =
        runTool(items.arguments({"write", "--json", "--add", "Sound Descriptors/Bright / Dark=1", "--remove",
                                 "Genres/House", "--remove", "Genres/Techno"}));
    EXPECT_EQ(again.status, 0) << again.errors;
    for (const json& item : runTool(items.arguments({"read", "--json"})).json())
        EXPECT_THAT(tagsOf(item), ElementsAre("Sound Descriptors/Bright / Dark=1.0"));
    const ToolResult unchanged = runTool(items.arguments({"write", "--json", "--remove", "Genres/House"}));
    for (const json& item : unchanged.json()) EXPECT_EQ(item["written"], false);
}

TEST(Write, NamesItemsAndKeepsTimes) {
    const Items items;
    const auto old = std::filesystem::file_time_type::clock::now() - std::chrono::hours(1000);
    for (const char* name : {"loop.wav", "shot.aif", "Lead.vcp"})
        std::filesystem::last_write_time(items.folder.path(name), old);
    const ToolResult result =
        runTool(items.arguments({"write", "--json", "--keep-times", "--name", "A = \"b\"\n"}));
    EXPECT_EQ(result.status, 0) << result.errors;
    for (const json& item : runTool(items.arguments({"read", "--json"})).json())
        EXPECT_EQ(item["displayName"], "A = \"b\"\n") << item["path"];
    for (const char* name : {"loop.wav", "shot.aif", "Lead.vcp"})
        EXPECT_EQ(std::filesystem::last_write_time(items.folder.path(name)), old) << name;
}

TEST(Write, DryRunShowsTheDifferenceAndTouchesNothing) {
    const Items items;
    const auto contents = [&] {
        std::map<std::string, std::string> files;
        for (const auto& entry : std::filesystem::recursive_directory_iterator(items.folder.path()))
            files[entry.path()] = entry.is_regular_file() ? readAll(entry.path()) : "";
        return files;
    };
    const auto before = contents();
    const ToolResult result = runTool(items.arguments({"write", "--dry-run", "--add", "Genres/House=0.5"}));
    EXPECT_EQ(result.status, 0) << result.errors;
    EXPECT_THAT(result.output, HasSubstr("loop.wav\n  + Genres/House 50%\n"));
    EXPECT_EQ(contents(), before);
}

TEST(Write, ADryRunRefusesWhatTheWriteRefuses) {
    const Items items;
    const Wav wav;
    items.folder.write("cut.wav", wav.file(wav.format() + wav.data()).substr(0, 400));
    items.folder.write("unreadable.wav", wav.file(wav.format() + wav.data() + wav.chunk("qvct", "bplist")));
    items.folder.write("open.vcp", "<tagging>\n");
    items.folder.write("broken.cst", "settings");
    items.folder.write("broken.cst.plist", "no list");
    items.folder.write("Folder.patch/tags.plist/inner", "");
    items.folder.write("Taken.ostrax/Resources", "no folder");
    std::filesystem::permissions(items.folder.path("shot.aif"), std::filesystem::perms::owner_read);
    for (const std::vector<std::string>& change : {std::vector<std::string>{"--name", "a\x01"},
                                                   {"--reject", "Kick"},
                                                   {"--add", "Genres/House"},
                                                   {"--name", "B", "--verify"}}) {
        std::vector<std::string> arguments = {"write", "--json", items.folder.path()};
        arguments.insert(arguments.end(), change.begin(), change.end());
        arguments.emplace_back("--dry-run");
        const ToolResult promised = runTool(arguments);
        arguments.pop_back();
        const ToolResult done = runTool(arguments);
        EXPECT_EQ(promised.status, 1);
        EXPECT_EQ(promised.errors, done.errors);
        ASSERT_EQ(promised.json().size(), done.json().size());
        for (std::size_t i = 0; i < done.json().size(); ++i) {
            EXPECT_EQ(promised.json()[i]["path"], done.json()[i]["path"]);
            EXPECT_EQ(promised.json()[i]["written"], false);
        }
    }
}

TEST(Write, RefusesWrongWordsBeforeAnythingIsTouched) {
    const Items items;
    const std::string item = items.folder.path("Bass.cst");
    struct {
        std::vector<std::string> arguments;
        const char* message;
    } const cases[] = {
        {{"--add", "Genres/Huose"}, "no tag \"Huose\" in Genres"},
        {{"--add", "Source/House"}, "no tag \"House\" in Source; there are: Genres/House, "},
        {{"--add", "Genre/House"}, "no category \"Genre\"; there are: Artist"},
        {{"--add", "House"}, "\"House\" is no Category/Label"},
        {{"--reject", "Kik"}, "no tag \"Kik\"; did you mean \"Source/Kick\"?"},
        {{"--reject", "Genres/Kick"}, "no tag \"Kick\" in Genres; there are: Source/Kick"},
        {{"--accept", "Sorce/Kick"}, "no category \"Sorce\""},
        {{"--reject", "Electronic Music"}, "\"Electronic Music\" is both added and rejected"},
        {{"--reject", "Kick", "--accept", "Source/Kick"}, "is both rejected and accepted"},
        {{"--create", "--reject", ""}, "\"\" is no label"},
        {{"--folder", "--reject", "Kick"}, "--folder"},
        {{"--create", "--add", "Genres/House=1.5"}, "\"Genres/House=1.5\": the level is out of range"},
        {{"--create", "--add", "Genres/House=150%"}, "the level is out of range, which is 0 to 1, or 0% to"},
        {{"--create", "--add", "Genres/House=-1"}, "out of range"},
        {{"--create", "--add", "Genres/House=.5.5"}, "out of range"},
        {{"--create", "--add", "Genres/House="}, "out of range"},
        {{"--create", "--add", "Genres/House=%"}, "out of range"},
        {{"--create", "--add", "Genres/House= NaN"}, "out of range"},
        {{"--add", "Genres/House=inf"}, "out of range"},
        {{"--remove", "Genres/%!"}, "\"%!\" is no label"},
        {{"--remove", "/House"}, "\"/House\" is no Category/Label"},
        {{}, "nothing to write"},
        {{""}, "an empty path names nothing"},  // and not all of the current folder
    };
    for (const auto& c : cases) {
        std::vector<std::string> arguments = {"write", item, "--add", "Genres/House"};
        if (c.arguments.empty()) arguments.resize(2);
        arguments.insert(arguments.end(), c.arguments.begin(), c.arguments.end());
        const ToolResult result = runTool(arguments);
        EXPECT_EQ(result.status, 2);
        EXPECT_THAT(result.errors, HasSubstr(c.message));
        EXPECT_FALSE(std::filesystem::exists(item + ".plist"));
    }
    EXPECT_EQ(runTool({"write", item, "--create", "--add", "Custom/Huose/x", "--add", "Custom/A=B"}).status,
              0);
    EXPECT_THAT(tagsOf(runTool({"read", "--json", item}).json()[0]),
                ElementsAre("Custom/A=B", "Custom/Huose/x"));
}

TEST(Write, NamesWhatFailsAndDoesTheRest) {
    const Items items;
    const std::string broken = items.folder.write("broken.wav", "RIFF");
    const std::string text = items.folder.write("words.txt", "words");
    const std::string list = items.folder.write("Sad.pst.plist", "no list");
    const std::string sad = items.folder.write("Sad.pst", "");
    items.folder.write("Pad.patch/tags.plist",
                       "<plist version=\"1.0\"><dict><key>Mine</key><true/></dict></plist>");
    const std::string patch = items.folder.path("Pad.patch");
    const std::string data = items.folder.write("d.data", "");
    const std::string inner = items.folder.write("Pad.patch/#Root.cst", "");
    const ToolResult result = runTool({"write", "--json", "--name", "New", broken, text, sad, patch, data,
                                       inner, items.folder.path("Bass.cst")});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.json().size(), 2U);
    for (const std::string& message :
         {broken, text + ": no kind of content", list, data + ": data files are never written\n",
          inner + ": belongs to the patch it lies in, " + patch + "\n"})
        EXPECT_THAT(result.errors, HasSubstr(message));
    EXPECT_EQ(readAll(list), "no list");
    EXPECT_EQ(runTool({"write", "--add", "Genres/House", patch}).status, 0);
    EXPECT_THAT(readAll(patch + "/tags.plist"), HasSubstr("<key>Mine</key>"));
}

TEST(Write, ABundlesSubTypeIsThatOfItsTags) {
    const TemporaryFolder folder;
    folder.write("one.ostrax/Media/x", "");
    const std::string project = folder.path("one.ostrax");
    struct {
        std::vector<std::string> arguments;
        int subType;
    } const steps[] = {
        {{"--add", "Content Type/Demo Song", "--name", "A"}, 1},
        {{"--remove", "Content Type/Demo Song", "--add", "Content Type/Remix Session", "--name", "B"}, 3},
        {{"--name", "C"}, 3},
        {{"--remove", "Content Type/Remix Session", "--name", "D"}, 0},
    };
    for (const auto& step : steps) {
        std::vector<std::string> arguments = {"write", project};
        arguments.insert(arguments.end(), step.arguments.begin(), step.arguments.end());
        ASSERT_EQ(runTool(arguments).status, 0);
        const json record = runTool({"read", "--json", project}).json()[0];
        EXPECT_EQ(record["subFileType"], step.subType) << record;
        EXPECT_EQ(record["displayName"], step.arguments.back());
    }
}

TEST(Write, TakesLabelsAsTheyAreWrittenAndOfSeveralLevelsTheLast) {
    const Items items;
    const std::string item = items.folder.path("Bass.cst");
    const std::string label = "Genres/My%Tag!";
    const auto tagsAfter = [&](std::vector<std::string> change) {
        change.insert(change.begin(), {"write", item, "--create"});
        const ToolResult result = runTool(change);
        EXPECT_EQ(result.status, 0) << result.errors;
        return tagsOf(runTool({"read", "--json", item}).json()[0]);
    };
    EXPECT_THAT(tagsAfter({"--add", label}), ElementsAre("Genres/MyTag"));
    const ToolResult both = runTool({"write", item, "--create", "--add", label, "--remove", label});
    EXPECT_EQ(both.status, 2);
    EXPECT_THAT(both.errors, HasSubstr("is both added and removed"));
    EXPECT_THAT(tagsAfter({"--remove", label}), IsEmpty());
    EXPECT_THAT(tagsAfter({"--add", "Source/Bass=0.5", "--add", "Source/Bass=0.75"}),
                ElementsAre("Source/Bass=0.75"));
}

const json* partWithId(const json& parts, const std::string& id) {
    for (const json& part : parts) {
        if (part["id"] == id) return &part;
        if (const json* child = partWithId(part["parts"], id)) return child;
    }
    return nullptr;
}

TEST(Write, StoresOnlyWhatCanBeReadBack) {
    const Items items;
    const std::set<std::string> house = {"Genres/House"};
    ASSERT_EQ(runTool({"write", "--add", "Genres/House", items.folder.path()}).status, 0);
    for (const char* text : {"a\x01"
                             "b",
                             "\xEF\xBF\xBE", "Caf\xc3\xa9", "two\nlines"}) {
        runTool({"write", "--name", text, items.folder.path()});
        const ToolResult result = runTool(items.arguments({"read", "--json"}));
        EXPECT_EQ(result.status, 0) << result.errors;
        for (const json& item : result.json()) EXPECT_EQ(tagsOf(item).count("Genres/House"), 1U) << item;
    }
    for (const std::vector<std::string>& wrong :
         {std::vector<std::string>{"--name", "Caf\xe9"}, {"--create", "--add", "Genres/Caf\xe9"}})
        EXPECT_EQ(runTool({"write", wrong[0], wrong[1], wrong.back(), items.folder.path()}).status, 2);
}

TEST(Write, VerifiesAPresetThatHadNoRecord) {
    for (const char* contents : {"", "a = b", "a = b\n", "<tagging>\nAttribs = 4001\n</tagging>"}) {
        const TemporaryFolder folder;
        const std::string preset = folder.write("P.vcp", contents);
        const ToolResult result =
            runTool({"write", "--add", "Genres/House", "--name", "P", "--verify", preset});
        EXPECT_EQ(result.status, 0) << contents << result.errors;
    }
}

TEST(Read, ShowsNoControlCharactersOfFiles) {
    const TemporaryFolder folder;
    const Wav wav;
    const std::string record =
        serializePropertyList(test::Dictionary{{"Tagging", taggingDictionary("Ca\x1b[32mt", "\x1b[31mRED")}},
                              PropertyListFormat::binary);
    const std::string path =
        folder.write("red.wav", wav.file(wav.format() + wav.data() + wav.chunk("qvct", record)));
    for (const char* command : {"read", "inspect", "autotag"}) {
        const ToolResult result = runTool({command, path});
        EXPECT_EQ(result.status, 0) << result.errors;
        EXPECT_EQ(result.output.find('\x1b'), std::string::npos) << command << result.output;
    }
}

TEST(Read, FindsEveryKindOfAudioInAFolderAndNamesPreviews) {
    const TemporaryFolder folder;
    const Wav wav;
    folder.write("loop.wav", wav.file(wav.format() + wav.data()) + "what an editor left");
    folder.write("shot.aifc", Aiff::file(Aiff::common() + Aiff::sound(), "AIFC"));
    folder.write("Bass.cst", "settings");
    const std::string preview = folder.write("Bass.cst.caf", Caf::file(Caf::description() + Caf::data()));
    EXPECT_EQ(runTool({"read", "--json", folder.path()}).json().size(), 3U);
    const ToolResult named = runTool({"read", preview});
    EXPECT_EQ(named.status, 1);
    EXPECT_THAT(named.errors, HasSubstr("is the recorded preview of another item"));
    const json parts = runTool({"inspect", "--json", folder.path("loop.wav")}).json()[0]["parts"];
    EXPECT_THAT(parts.dump(), HasSubstr("bytes behind the last chunk"));
}

TEST(Audio, IsToldByItsContentsWhateverItsExtension) {
    const Wav wav;
    const std::string riff = wav.file(wav.format(1, 1000) + wav.data(4000));
    const std::string form = Aiff::file(Aiff::common(1, 2000, 16, Aiff::rate(1000)) + Aiff::sound(4000));
    const std::string packed =
        Aiff::file(Aiff::common(1, 2000, 16, Aiff::rate(1000), "sowt") + Aiff::sound(4000), "AIFC");
    const std::string caf = Caf::file(Caf::description(1000) + Caf::data(8000));
    const TemporaryFolder folder;
    const std::vector<std::string> found = {folder.write("s/a.aif", riff), folder.write("s/b.aifc", packed),
                                            folder.write("s/c.aiff", caf), folder.write("s/d.caf", form),
                                            folder.write("s/e.wav", form), folder.write("s/f.wav", caf),
                                            folder.write("s/g.wave", riff)};
    // Not looked for, but taken where it is named.
    const std::vector<std::string> named = {folder.write("h.snd", riff), folder.write("i", packed)};
    ASSERT_EQ(
        runTool({"write", "--verify", "--add", "Genres/House", folder.path("s"), named[0], named[1]}).status,
        0);
    const ToolResult indexed = runTool({"index", folder.path("s"), "--db", folder.path("db")});
    EXPECT_EQ(indexed.status, 0) << indexed.errors;
    const std::size_t all = found.size() + named.size();
    struct {
        std::vector<std::string> arguments;
        std::size_t count;
    } const cases[] = {{{"read", "--json", folder.path("s"), named[0], named[1]}, all},
                       {{"object", "--json", folder.path("s"), named[0], named[1]}, all},
                       {{"search", "tag:House", "--json", "--db", folder.path("db")}, found.size()}};
    for (const auto& c : cases) {
        const ToolResult result = runTool(c.arguments);
        EXPECT_EQ(result.status, 0) << result.errors;
        EXPECT_EQ(result.json().size(), c.count) << c.arguments[0];
        for (const json& item : result.json()) {
            EXPECT_EQ(item["keyValues"]["LengthInSeconds"], 2.0) << item;
            EXPECT_EQ(item["fileType"], 7) << item;
            EXPECT_EQ(tagsOf(item).count("Genres/House"), 1U) << item;
        }
    }
}

TEST(Inspect, ShowsWhatIsInEveryKindOfItem) {
    const Items items;
    items.folder.write("Bass.cst", std::string("QVST\0\2\0\xff\0\0\0\10MELCefx1tdly", 24));
    items.folder.write("bits.data", "xxbplist00" + noise(60));
    ASSERT_EQ(runTool(items.arguments({"write", "--quiet", "--add", "Genres/House"})).status, 0);
    const ToolResult result = runTool(items.arguments({"inspect", "--json"}));
    EXPECT_EQ(result.status, 0) << result.errors;
    const json all = result.json();
    struct {
        std::size_t item;
        const char* id;
        json offset;
        json size;
        const char* meaning;
    } const cases[] = {
        {0, "acid", 12, 24, "loop"},
        {0, "Name", nullptr, nullptr, "House"},
        {1, "SSND", nullptr, nullptr, ""},
        {2, "tags.plist", nullptr, nullptr, "record, 2 entries"},
        {3, "Type", nullptr, nullptr, "8"},
        {4, "header", 0, 24, "plug-in"},
        {4, "sub ID", 7, 1, "-1"},
        {4, "manufacturer", 12, 4, "\"MELC\" 0x4D454C43"},
        {4, "Bass.cst.plist", nullptr, nullptr, "record"},
        {5, "<tagging>", 9, nullptr, "3 items"},
        {5, "Attribs", nullptr, nullptr, "4001,6004"},
    };
    for (const auto& c : cases) {
        const json* part = partWithId(all[c.item]["parts"], c.id);
        ASSERT_NE(part, nullptr) << c.id;
        if (!c.offset.is_null()) {
            EXPECT_EQ((*part)["offset"], c.offset) << c.id;
        }
        if (!c.size.is_null()) {
            EXPECT_EQ((*part)["size"], c.size) << c.id;
        }
        EXPECT_THAT((*part)["meaning"].get<std::string>(), HasSubstr(c.meaning)) << c.id;
    }
    const ToolResult data = runTool({"inspect", items.folder.path("bits.data")});
    EXPECT_EQ(data.status, 1);
    EXPECT_THAT(data.errors, HasSubstr("bits.data: embedded property list, byte 2: has no end"));
    const ToolResult once = runTool({"read", items.folder.path("bits.data")});
    EXPECT_EQ(once.status, 1);
    EXPECT_EQ(once.errors,
              "qvtag: " + items.folder.path("bits.data") + ": embedded property list, byte 2: has no end\n");
}

TEST(Inspect, ListsTheTracksOfMidiFiles) {
    const TemporaryFolder folder;
    const std::string notes = emptyMidi();
    const ToolResult midi = runTool({"inspect", "--json", folder.write("a.mid", notes)});
    EXPECT_EQ(midi.status, 0) << midi.errors;
    const json parts = midi.json()[0]["parts"];
    const json* track = partWithId(parts, "track 1");
    ASSERT_NE(track, nullptr) << midi.output;
    EXPECT_EQ((*track)["meaning"], "0 notes, 0 beats");
    const ToolResult cut = runTool({"inspect", folder.write("cut.mid", notes.substr(0, notes.size() - 2))});
    EXPECT_THAT(cut.output, HasSubstr("FAULT: "));
}

}  // namespace
}  // namespace qvct::test

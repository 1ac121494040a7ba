#include "autotagging/services/QVCTRhythmicTaggingService.h"
#include "demo/Library.h"
#include "listening/rhythm/LoopRhythm.h"
#include "media/loopfile/LCFileParser.h"
#include "media/loopfile/LCFileWriter.h"
#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <cmath>
#include <map>
#include <tuple>

#include <gmock/gmock.h>
#include <sys/stat.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;

/// A file of 96 ticks a beat with notes of a quarter beat at these sixteenths.
std::string midi(const std::vector<unsigned>& sixteenths, const std::string& facts = {}) {
    std::string events = facts;
    unsigned now = 0;
    for (const unsigned start : sixteenths) {
        const unsigned wait = start * 24 - now;
        events += {static_cast<char>(0x80U | wait >> 7U), static_cast<char>(wait & 0x7FU)};
        events += std::string("\x90\x24\x64\x18\x80\x24\x40", 7);
        now = start * 24 + 24;
    }
    events += std::string("\0\xFF\x2F\0", 4);
    return "MThd" + big(6, 4) + big(0, 2) + big(1, 2) + big(96, 2) + "MTrk" + big(events.size(), 4) + events;
}

/// Tempo 100 and 3/4, as events at the start.
const std::string kFacts = std::string("\0\xFF\x51\x03\x09\x27\xC0\0\xFF\x58\x04\x03\x02\x18\x08", 15);

/// Clicks at these frames of two seconds in 16 bits, one channel.
std::string samplesOfClicks(const std::vector<std::size_t>& frames,
                            std::string (*number)(std::uint64_t, std::size_t)) {
    std::string samples(2 * 88200, '\0');
    for (const std::size_t frame : frames) {
        for (unsigned i = 0; i < 1000; ++i) {
            const double value = 20000 * std::sin(0.3 * i) * std::exp(-0.005 * i);
            samples.replace((frame + i) * 2, 2, number(static_cast<std::uint64_t>(std::llround(value)), 2));
        }
    }
    return samples;
}

/// The same as a WAV, with tempo facts if asked for.
std::string clicks(const std::vector<std::size_t>& frames, const std::string& facts = {}) {
    const Wav wav;
    return wav.file(wav.format(1) + facts + wav.chunk("data", samplesOfClicks(frames, little)));
}

/// A loop of that type and metre which holds notes beside its sound.
std::string writeLoop(const std::string& path, int type, const LoopMetre& metre, const std::string& notes) {
    std::ofstream(path, std::ios::binary)
        << Aiff::file(Aiff::common(1, 88200) +
                      Aiff::chunk("SSND", big(0, 8) + samplesOfClicks({0, 11025, 33075, 66150}, big)));
    const URL url = URL::fileURLWithPath(path);
    const auto data = LCFileParser::fileParserForURL(url)->fileData();
    data->setTavioLoopType(type);
    data->setBpm(metre.bpm);
    data->setBeatCount(metre.beatCount);
    data->setSignatureTop(metre.signatureTop);
    data->setSignatureBottom(metre.signatureBottom);
    data->setMidiData({notes.begin(), notes.end()});
    EXPECT_TRUE(LCFileWriter::fileWriterForURL(url)->writeFileData(data)) << path;
    return path;
}

/// Several one-track files in one.
std::string together(const std::vector<std::string>& files) {
    std::string all = "MThd" + big(6, 4) + big(1, 2) + big(files.size(), 2) + big(96, 2);
    for (const std::string& file : files) all += file.substr(14);
    return all;
}

ToolResult rhythm(std::vector<std::string> arguments) {
    arguments.insert(arguments.begin(), {"rhythm", "--json"});
    return runTool(arguments);
}

/// What must hold whatever the file was.
void expectSound(const json& item, const std::string& what) {
    for (const char* key : {"density", "complexity"}) {
        ASSERT_TRUE(item[key].is_number()) << what << key;  // JSON writes null for what is no number
        EXPECT_GE(item[key].get<double>(), 0) << what;
        EXPECT_LE(item[key].get<double>(), 1) << what;
    }
    for (const json& onset : item["onsets"]) EXPECT_TRUE(onset.is_number()) << what;
    EXPECT_GE(item["beatCount"].get<int>(), 1) << what;
    EXPECT_TRUE(item["tempo"].is_number()) << what;
}

TEST(RhythmCommand, TakesTempoMetreAndLengthFromAMidiFileOrTheOptions) {
    const TemporaryFolder folder;
    const std::string file = folder.write("a.mid", midi({0, 4, 6, 14}, kFacts));
    const json told = rhythm({file}).json()[0];
    EXPECT_EQ(told["path"], file);
    EXPECT_EQ(told["onsets"], json({0.0, 1.0, 1.5, 3.5}));
    EXPECT_EQ(told["tempo"], 100.0);
    EXPECT_EQ(told["signature"], "3/4");
    EXPECT_EQ(told["beatCount"], 6) << "the last note ends at 3.75, in the second bar";
    EXPECT_NEAR(told["density"].get<double>(), std::log(4 / 48.0 * 0.9502129 + 0.0497871) / 3 + 1, 1e-6);

    const json asked = rhythm({file, "--tempo", "90.5", "--beats", "12", "--signature", "12/8"}).json()[0];
    EXPECT_EQ(asked["tempo"], 90.5);
    EXPECT_EQ(asked["beatCount"], 12);
    EXPECT_EQ(asked["signature"], "12/8");
    EXPECT_NEAR(asked["density"].get<double>(), std::log(4 / 48.0 * 0.9502129 + 0.0497871) / 3 + 1, 1e-6);

    const json bare = rhythm({folder.write("b.MID", midi({0, 16}))}).json()[0];
    EXPECT_EQ(bare["signature"], "4/4");
    EXPECT_EQ(bare["tempo"], 120.0);
    EXPECT_EQ(bare["beatCount"], 8);
    EXPECT_THAT(runTool({"rhythm", file}).output, HasSubstr("4 onsets in 6 beats of 3/4 at 100 bpm\n"));
}

/// How many of the files the tagging service grades; each as the tool does.
std::size_t expectAgreement(const std::vector<std::string>& files) {
    std::size_t graded = 0;
    std::map<std::string, json> measured;
    for (const json& item : rhythm(files).json()) measured[item["path"]] = item;
    for (const std::string& file : files) {
        const URL url = URL::fileURLWithPath(file);
        const TagDictionarySet tags = QVCTRhythmicTaggingService().tagsWithContentsOfURL(
            url, nullptr, nullptr, LCFileParser::fileParserForURL(url)->enhancedFileData(),
            QVCTAutoTaggingOptionRhythm);
        graded += tags.empty() ? 0 : 1;
        for (const TagDictionary& tag : tags) {
            const bool isDensity = *tag.value(kTagDictionaryLabelKey)->string() == "Rhythmic Density";
            const json& item = measured[file];
            EXPECT_EQ(item[isDensity ? "density" : "complexity"],
                      *tag.value(kTagDictionaryLevelKey)->doubleValue())
                << file << item;
        }
    }
    return graded;
}

TEST(RhythmCommand, GivesTheNumbersOfTheTaggingService) {
    const TemporaryFolder folder;
    const std::string one = midi({0, 3, 6, 10, 17, 22}), other = midi({0, 2, 4, 5, 8, 12, 13});
    std::vector<std::string> files;
    std::size_t graded = 0;
    for (const int type : {-1, 0, 1, 2}) {
        for (const auto& [top, bottom] : {std::pair(4, 4), {3, 4}, {6, 8}, {12, 8}, {2, 2}, {5, 4}, {7, 8}}) {
            for (const std::string& notes :
                 {one, together({one, other}), together({other, one}), together({emptyMidi(), one, other})}) {
                const std::string name = std::to_string(files.size()) + ".aif";
                files.push_back(writeLoop(folder.path(name), type, {120, 2 * top, top, bottom}, notes));
                graded += type >= 0 && top != 5 && top != 7 ? 1 : 0;
            }
        }
    }
    EXPECT_EQ(expectAgreement(files), graded);
}

TEST(RhythmCommand, TellsWhatMoreItKnows) {
    const TemporaryFolder folder;
    const std::string sparse = midi({0, 8}), dense = midi({0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13});
    const std::string both = folder.write("both.mid", together({sparse, dense}));
    const json alone = rhythm({folder.write("alone.mid", sparse), "--beats", "4"}).json()[0];
    const json item = rhythm({both, "--beats", "4"}).json()[0];
    EXPECT_EQ(alone["allTracks"], json());
    for (const char* key : {"density", "complexity", "onsets"}) EXPECT_EQ(item[key], alone[key]) << key;
    EXPECT_EQ(item["allTracks"]["tracks"], 2);
    EXPECT_GT(item["allTracks"]["density"], item["density"]);
    EXPECT_THAT(runTool({"rhythm", both}).output, HasSubstr("\n  first of 2 tracks; all together: density "));
    EXPECT_THAT(rhythm({folder.write("late.mid", together({emptyMidi(), emptyMidi(), sparse}))}).errors,
                HasSubstr("late.mid: nothing sounds in its first track"));

    const std::string file = folder.write("a.mid", midi({0, 3, 6, 10}));
    EXPECT_EQ(rhythm({file}).json()[0]["reasonForZero"], json());
    for (const auto& [beats, signature, reason] :
         {std::tuple("5", "5/4", "bars of 5 beats are not graded"),
          {"7", "7/8", "bars of 7 beats are not graded"},
          {"8", "8/8", "bars of 8 beats have no metric weights"},
          {"6", "4/4", "6 beats are no whole bars of 4/4"},
          {"2", "4/4", "2 beats are no whole bars of 4/4"},
          {"4", "4/8", "bars of 4/8 have no metric weights"},
          {"20", "4/4", "20 beats do not divide into halves and thirds down to an eighth of a beat"}}) {
        const json zero = rhythm({file, "--beats", beats, "--signature", signature}).json()[0];
        EXPECT_EQ(zero["complexity"], 0) << reason;
        EXPECT_EQ(zero["reasonForZero"], reason);
    }
    EXPECT_THAT(runTool({"rhythm", file, "--signature", "5/4"}).output,
                HasSubstr("\n  complexity 0%: bars of 5 beats are not graded\n"));
}

TEST(RhythmCommand, ABarPlayedSeveralTimesIsAsDenseAsOnce) {
    const TemporaryFolder folder;
    struct {
        unsigned top, bottom;
        std::vector<unsigned> sixteenths;  // of a bar
    } const cases[] = {{4, 4, {0, 3, 6, 10}},
                       {3, 4, {0, 4, 11}},
                       {6, 8, {0, 2, 6, 11}},
                       {3, 8, {0, 4}},
                       {2, 2, {0, 6, 8, 15}}};
    for (const auto& c : cases) {
        const std::string facts = std::string("\0\xFF\x58\x04", 4) + big(c.top, 1) +
                                  big(static_cast<unsigned>(std::countr_zero(c.bottom)), 1) + "\x18\x08";
        json once;
        for (unsigned bars = 1; bars <= 4; ++bars) {
            std::vector<unsigned> starts;
            for (unsigned bar = 0; bar < bars; ++bar) {
                for (const unsigned start : c.sixteenths)
                    starts.push_back(bar * 16 * c.top / c.bottom + start);
            }
            const json item = rhythm({folder.write("a.mid", midi(starts, facts))}).json()[0];
            if (bars == 1) once = item;
            const std::string what = once["signature"].get<std::string>() + " x " + std::to_string(bars);
            EXPECT_EQ(item["beatCount"], bars * c.top) << what;
            ASSERT_EQ(item["onsets"].size(), starts.size()) << what;
            EXPECT_EQ(item["onsets"].back(), starts.back() * c.bottom / 16.0) << what;
            EXPECT_NEAR(item["density"].get<double>(), once["density"].get<double>(), 1e-6) << what;
        }
    }
    // The same of a sound: two seconds of 6/8 at 90 quarter notes a minute.
    const std::string sound = folder.write("c.wav", clicks({11025, 33075}));
    EXPECT_EQ(rhythm({sound, "--tempo", "90", "--signature", "6/8"}).json()[0]["beatCount"], 6);
    EXPECT_EQ(rhythm({sound, "--beats", "6", "--signature", "6/8"}).json()[0]["tempo"], 90.0);
}

TEST(RhythmCommand, ReadsTheNotesInALoopAndListensToOthers) {
    const TemporaryFolder folder;
    demo::writeLibrary(folder.path());
    const json notes =
        rhythm({folder.path("Loops/African/Marimba Mallet Pattern G Major 112bpm.caf")}).json()[0];
    ASSERT_EQ(notes["onsets"].size(), 16U);
    for (std::size_t i = 0; i < 16; ++i) EXPECT_EQ(notes["onsets"][i], 0.5 * static_cast<double>(i));
    EXPECT_EQ(notes["tempo"], 112.0);

    const json sound = rhythm({folder.path("Loops/Drum'n'Bass/Jungle Drum Break 174bpm.wav")}).json()[0];
    EXPECT_EQ(sound["tempo"], 174.0);
    EXPECT_GE(sound["onsets"].size(), 8U);
    expectSound(sound, "wav");
    EXPECT_EQ(notes["accentedComplexity"], json());
    EXPECT_NE(sound["accentedComplexity"], sound["complexity"]) << "its strokes are not equally loud";
    for (const json& onset : sound["onsets"]) {
        const double sixteenths = onset.get<double>() * 4;
        EXPECT_NEAR(sixteenths, std::round(sixteenths), 0.15) << "breaks are played on sixteenths";
    }
}

TEST(RhythmCommand, AsksForTheLengthThatASoundDoesNotTell) {
    const TemporaryFolder folder;
    const std::string file = folder.write("c.wav", clicks({11025, 33075, 55125}));
    const ToolResult unknown = rhythm({file});
    EXPECT_EQ(unknown.status, 1);
    EXPECT_THAT(unknown.errors, HasSubstr("c.wav: its length in beats is unknown; say --beats or --tempo"));
    const json told = rhythm({file, "--beats", "4"}).json()[0];
    EXPECT_EQ(told["accentedComplexity"], told["complexity"]) << "clicks are equally loud";
    EXPECT_EQ(told["tempo"], 120.0) << "four beats in two seconds";
    ASSERT_EQ(told["onsets"].size(), 3U);
    for (std::size_t i = 0; i < 3; ++i) EXPECT_NEAR(told["onsets"][i], 0.5 + static_cast<double>(i), 0.01);
    EXPECT_EQ(rhythm({file, "--tempo", "60"}).json()[0]["beatCount"], 2);
    const Wav wav;
    const std::string empty = folder.write("e.wav", wav.file(wav.format(1) + wav.chunk("data", "")));
    const std::string brief = folder.write("s.wav", wav.file(wav.format(1) + wav.data(2000)));
    for (const char* tempo : {"120", "60"}) {
        EXPECT_THAT(rhythm({empty, "--tempo", tempo}).errors, HasSubstr("e.wav: it has no samples\n"));
        EXPECT_THAT(rhythm({brief, "--tempo", tempo}).errors,
                    HasSubstr("s.wav: it is shorter than half a beat; say --beats\n"));
    }
}

TEST(RhythmCommand, DrawsAPlot) {
    const TemporaryFolder folder;
    const std::string plot = folder.path("p.svg"), file = folder.write("a.mid", midi({0, 4, 6, 14}));
    EXPECT_EQ(runTool({"rhythm", file, "--plot", plot}).status, 0);
    EXPECT_THAT(readAll(plot), AllOf(HasSubstr("<svg "), HasSubstr("a.mid"), HasSubstr("</svg>")));
    const ToolResult two = runTool({"rhythm", file, file, "--plot", plot});
    EXPECT_EQ(two.status, 2);
    EXPECT_THAT(two.errors, HasSubstr("--plot draws one file"));
    const ToolResult lost = runTool({"rhythm", file, "--plot", folder.path("no/p.svg")});
    EXPECT_EQ(lost.status, 1);
    EXPECT_THAT(lost.errors, HasSubstr("no/p.svg: cannot make a file beside it: No such file"));

    struct {
        std::string target;
        const char* reason;
    } const refused[] = {
        {file, "is one of the files to be measured"},
        {folder.path("hard.svg"), "is one of the files to be measured"},
        {folder.write("other.mid", midi({0})), "exists and is not an SVG file"},
        {folder.write("words.svg", "words"), "exists and is not an SVG file"},
        {folder.write("drawing.txt", "<svg "), "exists and is not an SVG file"},
        {folder.path(), "exists and is not an SVG file"},
    };
    std::filesystem::create_hard_link(file, refused[1].target);
    for (const auto& c : refused) {
        const std::string before = std::filesystem::is_directory(c.target) ? "" : readAll(c.target);
        const ToolResult result = runTool({"rhythm", file, "--plot", c.target});
        EXPECT_EQ(result.status, 2) << c.target;
        EXPECT_THAT(result.errors, HasSubstr(c.target + ": " + c.reason));
        EXPECT_EQ(result.output, "");
        if (!before.empty()) {
            EXPECT_EQ(readAll(c.target), before) << c.target;
        }
    }
    for (const std::string& target : {plot, folder.write("x.SVG", "<?xml version=\"1.0\"?><svg/>")})
        EXPECT_EQ(runTool({"rhythm", file, "--plot", target}).status, 0) << target;
}

TEST(RhythmCommand, NamesWhatCannotBeMeasuredAndDoesTheRest) {
    const TemporaryFolder folder;
    const std::string good = folder.write("a.mid", midi({0, 4}));
    const Wav wav;
    const std::string pipe = folder.path("pipe.wav");
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    const struct {
        std::string path, reason;
    } rows[] = {
        {pipe, "pipe.wav: is not a regular file"},
        {folder.path("none.mid"), "none.mid: No such file"},
        {folder.path("none.wav"), "none.wav: "},
        {folder.write("text.mid", "no notes"), "text.mid: byte 0: "},
        {folder.write("text.wav", "no sound"), "text.wav: "},
        {folder.write("d.mid", "MThd" + big(6, 4) + big(0, 2) + big(1, 2) + big(0, 2)), "d.mid: byte 12: "},
        {folder.write("empty.mid", emptyMidi()), "empty.mid: nothing sounds in it"},
        {folder.write("silence.wav", clicks({})), "silence.wav: nothing sounds in it"},
        {folder.write("nothing.wav", wav.file(wav.format(1) + wav.chunk("data", ""))),
         "nothing.wav: it has no samples"},
        {folder.path(), folder.path() + ": "}};
    for (const auto& row : rows) {
        const ToolResult result = rhythm({row.path, good, "--beats", "4"});
        EXPECT_EQ(result.status, 1) << row.path;
        EXPECT_THAT(result.errors, HasSubstr(row.reason));
        EXPECT_EQ(std::count(result.errors.begin(), result.errors.end(), '\n'), 1) << result.errors;
        EXPECT_EQ(result.json().size(), 1U) << row.path;
    }
    for (const std::vector<std::string>& words : {std::vector<std::string>{"--beats", "0"},
                                                  {"--beats", "-4"},
                                                  {"--beats", "16385"},
                                                  {"--tempo", "0"},
                                                  {"--tempo", "nan"},
                                                  {"--signature", "0/4"},
                                                  {"--signature", "4/3"},
                                                  {"--signature", "4/128"},
                                                  {"--signature", "4"}}) {
        const ToolResult result = rhythm({good, words[0], words[1]});
        EXPECT_EQ(result.status, 2) << words[0] << words[1];
        EXPECT_EQ(result.output, "");
    }
}

TEST(RhythmCommand, LengthsThatDoNotFitGiveNumbersAllTheSame) {
    const TemporaryFolder folder;
    const std::string notes = folder.write("a.mid", midi({0, 4, 7}));
    const std::string sound = folder.write("c.wav", clicks({11025, 33075}));
    for (const char* beats : {"1", "3", "1000", "16384"}) {
        for (const char* signature : {"4/4", "5/4", "7/8", "4/64", "64/1"}) {
            const ToolResult result = rhythm({notes, sound, "--beats", beats, "--signature", signature});
            EXPECT_EQ(result.status, 0) << result.errors;
            for (const json& item : result.json()) expectSound(item, std::string(beats) + signature);
        }
    }
    EXPECT_THAT(rhythm({sound, "--beats", "100000"}).errors,
                HasSubstr("--beats: Value 100000 not in range 1 to 16384"));
    std::vector<unsigned> starts;
    for (unsigned i = 0; i < 100; ++i) starts.push_back(680 * i);
    EXPECT_THAT(rhythm({folder.write("long.mid", midi(starts))}).errors,
                HasSubstr("a loop of 16832 beats cannot be measured; 1 to 16384 can"));
}

TEST(RhythmCommand, TellsWhatIsDamagedInAMidiFile) {
    const TemporaryFolder folder;
    const std::string whole = midi({0, 4});
    const std::string cut = folder.write("cut.mid", whole.substr(0, whole.size() - 6));
    const ToolResult partly = rhythm({cut});
    EXPECT_EQ(partly.status, 0);
    EXPECT_EQ(partly.json()[0]["onsets"].size(), 2U);
    EXPECT_THAT(partly.errors, HasSubstr("cut.mid: byte "));
    EXPECT_EQ(rhythm({cut, "--quiet"}).errors, "");
    const ToolResult nothing = rhythm({folder.write("none.mid", emptyMidi().substr(0, 24))});
    EXPECT_EQ(nothing.status, 1);
    EXPECT_THAT(nothing.errors, HasSubstr("none.mid: nothing sounds in it: byte "));
}

TEST(Autotag, GradesTheRhythmOfEveryLoopOnRequest) {
    const TemporaryFolder folder;
    const Wav wav;
    const std::string loop = folder.write("a.wav", clicks({11025, 33075}, wav.acid(0, 60, 4, 120)));
    const std::string shot = folder.write("b.wav", clicks({11025, 33075}));
    const auto levels = [](const json& item) {
        std::vector<std::string> found;
        for (const json& tagging : item["taggings"]) {
            if (tagging["label"] != "Rhythmic Density" && tagging["label"] != "Rhythmic Complexity") continue;
            EXPECT_TRUE(tagging["level"].is_number() && tagging["auto"].get<bool>()) << tagging;
            found.push_back(tagging["label"]);
        }
        return found;
    };
    const json plain = runTool({"autotag", "--json", loop, shot}).json();
    EXPECT_THAT(levels(plain[0]), testing::IsEmpty()) << "the service takes other kinds of loops only";
    const json any = runTool({"autotag", "--json", "--rhythm-any", loop, shot}).json();
    EXPECT_THAT(levels(any[0]), testing::UnorderedElementsAre("Rhythmic Density", "Rhythmic Complexity"));
    EXPECT_THAT(levels(any[1]), testing::IsEmpty()) << "its length in beats is unknown";

    demo::writeLibrary(folder.path("demo"));  // a loop with notes inside, which the service does grade
    const std::string caf = folder.path("demo/Loops/Techno/Acid Synth Bass F Minor 132bpm.caf");
    const json service = runTool({"autotag", "--json", caf}).json();
    EXPECT_EQ(levels(service[0]).size(), 2U);
    EXPECT_EQ(runTool({"autotag", "--json", "--rhythm-any", caf}).json(), service);
}

}  // namespace
}  // namespace qvct::test

#include "autotagging/names/ItemNames.h"
#include "autotagging/names/NameReader.h"
#include "platform/files/ResourceBundle.h"
#include "resources/QVCTCompiledResources.h"
#include "support/CapturedLog.h"
#include "support/ProcessorClock.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <algorithm>
#include <set>

#include <fmt/format.h>
#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

using Labels = std::vector<std::string>;

NameReading readingOf(std::string_view name) {
    static NameReader reader;
    const std::string_view names[] = {name};
    return reader.read(names);
}

/// Labels that the name says plainly or by an abbreviation, sorted, each once.
Labels labelsOf(const NameReading& reading) {
    std::set<std::string> labels;
    for (const TagClaim& claim : reading.claims)
        if (claim.confidence > 0.5) labels.insert(claim.label);
    return {labels.begin(), labels.end()};
}

TEST(Names, AreReadAsPeopleWriteThem) {
    const struct {
        std::string name;
        Labels labels;
    } rows[] = {
        {"BD0010", {"Kick"}},
        {"Kick_01", {"Kick"}},
        {"KICKS", {"Kick"}},
        {"kickdrum", {"Kick"}},
        {"MyKickDrum2", {"Kick"}},
        {"Bass Drum 3", {"Kick"}},
        {"hihat 1", {"Hi-Hat"}},
        {"HiHatOpen", {"Hi-Hat"}},
        {"HHClosed01", {"Hi-Hat"}},
        {"openhat", {"Hi-Hat"}},
        {"OH_707", {"Hi-Hat"}},
        {"rim-shot(2)", {"Rim"}},
        {"Gro\xc3\x9f"
         "e Trommel",
         {"Kick"}},
        {"Gu\xc3\xad"
         "ro lang",
         {"Guiro"}},
        {"Synth Bass 2", {"Synth Bass"}},
        {"drumloop", {"Drums"}},
        {"deephouse_lead", {"Deep House", "Lead"}},
        {"Deep_House_Pad", {"Deep House", "Pad"}},
        {"Muted Trumpet", {"Muted", "Trumpet"}},
        {"Drum Fill", {"Drums", "Fill"}},
        {"Drum'n'Bass", {"Drum'n'Bass"}},
        {"drum & bass", {"Drum'n'Bass"}},
        {"\xd1\x82\xd0\xbe\xd0\xbc", {"Tom"}},
        {"Harmnica 2", {"Harmonica"}},
        {"SlowStrng", {"Strings"}},
        {"Triang 1", {"Triangle"}},
        {"vibrophone", {"Vibraphone"}},
        {"Shakuhatchi", {"Shakuhachi"}},
        {"hoarseorgan", {"Organ"}},
        {"FMbass", {"Bass"}},
        {"Electric Pno", {"Electric", "Electric Piano", "Piano"}},
        {"Synvox 3", {"Synth", "Synth Voice", "Voice"}},
        {"Bell\xff"
         "Clap",
         {"Bells", "Claps"}},
        {"ANMLBat_Flutter In A Cave_MK_LIB", {"Nature"}},
        {"AMBForst-Dusk_Quiet Woods_Kick_Snare", {"Atmosphere", "Nature", "Sound Effects"}},
        {"GLASCrsh_Window Crash", {"Sound Effects"}},
        {"VOXFem_Woman Calls", {"Female Voice", "Sound Effects"}},
        {"MUSCPerc_Snare Roll", {"Percussion", "Roll", "Snare"}},
        {"METLImpt", {"Impact"}},
        {"WIND_Gusty Canyon_MK_LIB", {"Nature"}},
        {"WIND_Flute", {"Flute"}},
        {"GLASPad_Kick", {"Kick", "Pad"}},
        {"METLImpt Kick", {"Kick"}},
        {"metlimpt_Kick", {"Kick"}},
        {"Kick_METLImpt_Snare", {"Kick", "Snare"}},
        {"80s Pad", {"80s", "Pad"}},
        {"dog bark 02", {"Sound Effects"}},
        {"Rainfall On Roof", {"Nature"}},
        {"shotgunreload", {"Sound Effects"}},
        {"Chip Osc", {"Synth"}},
        {"ab2closedhh", {"Hi-Hat"}},
        {"Contrabass Fs1", {"Double Bass"}},
    };
    for (const auto& [name, labels] : rows) EXPECT_EQ(labelsOf(readingOf(name)), labels) << name;
}

TEST(Names, BeginWithTheCodeOfAnyCategory) {
    const auto habits = QVCTCompiledResources::NamingHabitsPlist();
    std::set<std::string> codes;
    for (const auto& [label, list] : *habits->dictionary("Prefixes")) {
        for (const PropertyList& code : *list.array()) {
            codes.insert(*code.string());
            EXPECT_THAT(labelsOf(readingOf(*code.string() + "_One Two_AB_CD")), Contains(label))
                << *code.string();
        }
    }
    EXPECT_EQ(codes.size(), 729U);
}

TEST(Names, DoNotSayWhatTheyOnlySeemToSay) {
    for (const char* name : {"",
                             "808",
                             "v127 rr2",
                             "Hard Drive",
                             "Section B",
                             "Plan B",
                             "3 AM",
                             "Vol 2",
                             "C",
                             "A Day",
                             "Take C",
                             "TR808",
                             "abcdefgh",
                             "Kit",
                             "()[]--__",
                             "9A",
                             "Sat",
                             "Bdelay",
                             "Charm",
                             "Miami Vice",
                             "Monkeys",
                             "Strong",
                             "Symbol",
                             "Override",
                             "Clip 3",
                             "Sounds",
                             "Club",
                             "Rinse",
                             "Recorded",
                             "TM Wandering Star",
                             "Electron",
                             "Music",
                             "Osc Osc",
                             "Kick Starter",
                             "What Our Toaster Never Toasted"}) {
        const NameReading reading = readingOf(name);
        EXPECT_THAT(labelsOf(reading), IsEmpty()) << name;
        EXPECT_FALSE(reading.tempo) << name;
    }
}

TEST(Names, TellKeyTempoAndKindWhereTheyStand) {
    const struct {
        std::string name, key, mode;
        double tempo = 0;
        SoundKind kind = SoundKind::unsaid;
        int bars = 0, beats = 0;
    } rows[] = {
        {"VEH_Deep_House_Synth_Loop_124_Am", "A", "Minor", 124, SoundKind::loop},
        {"Piano Loop 90 Bbmaj", "ASharp", "Major", 90, SoundKind::loop},
        {"Lead_F#min_128bpm", "FSharp", "Minor", 128},
        {"bpm_87.5 Strings C# minor", "CSharp", "Minor", 87.5},
        {"Pluck A_minor", "A", "Minor"},
        {"Groove 8A 126bpm", "A", "Minor", 126},
        {"Groove 8B 126bpm", "C", "Major", 126},
        {"Groove 12A 126bpm", "CSharp", "Minor", 126},
        {"Synth A# Minor", "ASharp", "Minor"},
        {"Bajo Re menor", "D", "Minor"},
        {"Strings C Lydian", "C", ""},
        {"Bass Loop 124 F", "F", "", 124, SoundKind::loop},
        {"Strings B\xe2\x99\xadm 90bpm", "ASharp", "Minor", 90},
        {"Pad Fis-Moll", "FSharp", "Minor"},
        {"Lead E harmonic minor", "E", "Minor"},
        {"Melody 92 Am", "A", "Minor", 92},
        {"E String Guitar 90bpm", "", "", 90},
        {"Clarinet in Bb 100bpm", "", "", 100},
        {"Bb Trumpet 100bpm", "", "", 100},
        {"Deep G-House Bass Loop 124", "", "", 124, SoundKind::loop},
        {"Like A Synth Loop 120", "", "", 120, SoundKind::loop},
        {"Bass Loop 01 A 120bpm", "", "", 120, SoundKind::loop},
        {"Synth D50 Loop 120", "", "", 120, SoundKind::loop},
        {"Synth_A_B_120bpm", "", "", 120},
        {"Strings 90 C loop", "C", "", 90, SoundKind::loop},
        {"Drone in D", "D", ""},
        {"Pad_Fsus2", "F", ""},
        {"Synth Group C 120bpm", "", "", 120},
        {"Fm Pad", "F", "Minor"},
        {"FM Pad", "", ""},
        {"Piano A2", "", ""},
        {"Piano C#3 v127", "", ""},
        {"Drum Loop 124 A", "", "", 124, SoundKind::loop},
        {"Bass Loop B", "", "", 0, SoundKind::loop},
        {"Loop Am Cm 120", "", "", 120, SoundKind::loop},
        {"Loop 120 130", "", "", 0, SoundKind::loop},
        {"Kick 124 one shot", "", "", 0, SoundKind::oneShot},
        {"Snare 101", "", ""},
        {"Cello_ff_R", "", ""},
        {"Piano_f_L", "", ""},
        {"Clarinet_Bb_ff", "", ""},
        {"Tpt_C#_rr2", "", ""},
        {"MF_Synth Am_124", "A", "Minor", 124},
        {"Synth Loop mf Am", "A", "Minor", 0, SoundKind::loop},
        {"Drums 4bars 120", "", "", 120, SoundKind::loop, 4},
        {"Groove 120 8-bar am", "A", "Minor", 120, SoundKind::loop, 8},
        {"Bass 64 Beats 120", "", "", 120, SoundKind::loop, 0, 64},
        {"Loop 90 Beats", "", "", 0, SoundKind::loop},
        {"Loop 64 steps", "", "", 0, SoundKind::loop},
        {"Loop 96 kHz", "", "", 0, SoundKind::loop},
        {"One Shot 2 bars", "", "", 0, SoundKind::oneShot, 2},
        {"Vol 2 Beats", "", ""},
        {"SP12 Beats", "", ""},
        {"Bar 3 A", "", ""},
        {"bloop", "", ""},
        {"Pad Emi 120bpm", "E", "Minor", 120},
        {"Bass_128_Csm", "CSharp", "Minor", 128},
        {"Bass_128_Cs", "", ""},
        {"Piano Fa# 100bpm", "FSharp", "", 100},
        {"Piano Fa 100bpm", "", "", 100},
        {"Synth key of E", "E", ""},
        {"Vox_Dm_02", "D", "Minor"},
        {"Vox Dm 02", "", ""},
        {"G 128 Synth Loop", "G", "", 128, SoundKind::loop},
        {"A 128 Synth Loop", "", "", 128, SoundKind::loop},
        {"G 128 Drum Loop", "", "", 128, SoundKind::loop},
        {"[128] Synth Loop [G]", "G", "", 128, SoundKind::loop},
        {"Synth Loop [B]", "", "", 0, SoundKind::loop},
        {"Pad_C-Sharp_120", "CSharp", "", 120},
        {"Pad D Phrygian 80", "D", "", 80},
        {"Piano (key C) 120", "C", "", 120},
        {"hatloop", "", "", 0, SoundKind::loop},
        {"Strings H-Moll", "B", "Minor"},
        {"Strings_dmin", "D", "Minor"},
        {"Chord Stab Ebm9", "DSharp", "Minor"},
        {"loop_synth_g_97", "G", "", 97, SoundKind::loop},
        {"loop_synth_a_97", "", "", 97, SoundKind::loop},
        {"loop_synth_97_x_g", "", "", 97, SoundKind::loop},
        {"Chords Am F C G 90", "", "", 90},
        {"Chords Am 90", "A", "Minor", 90},
        {"Loop 70bpm 140bpm", "", "", 0, SoundKind::loop},
        {"Lead_140_A#", "ASharp", "", 140},
        {"Lead_140_A#2", "", ""},
        {"128Gm_Lead", "G", "Minor", 128},
        {"Lead 128x Gm 90bpm", "G", "Minor", 90},
        {"Bass Am120bpm", "A", "Minor", 120},
        {"Rhodes Cm7b5 90bpm", "C", "Minor", 90},
        {"Strings in the key of D", "D", ""},
        {"VX_90_Bb_Strange_Piano", "ASharp", "", 90},
        {"static-synth-C-138", "C", "", 138},
        {"Synth_101_B", "", ""},
        {"Kick_90_D", "", ""},
        {"Tumbao_(96)_G", "G", "", 96},
        {"Pad_120bpm_Cshm", "CSharp", "Minor", 120},
        {"DBM_85_Synth_Loop_Gm", "G", "Minor", 85, SoundKind::loop},
        {"DB_128_Pad_Loop", "", "", 128, SoundKind::loop},
        {"DB_128_PAD_LOOP", "CSharp", "", 128, SoundKind::loop},
        {"Who_Am_I", "", ""},
        {"I Am 120bpm", "", "", 120},
        {"Bass_fm_120bpm", "F", "Minor", 120},
        {"Bass_fm_120 loop", "", "", 120, SoundKind::loop},
        {"OS_140_chords_G#m", "GSharp", "Minor", 140},
        {"Kick OS 140", "", "", 0, SoundKind::oneShot},
        {"Orch Hit Loop 120 Am", "A", "Minor", 120, SoundKind::loop},
        {"Your Type 165bpm", "", "", 165},
        {"Your Type 165", "", ""},
        {"forALongTime160bpm", "", "", 160},
        {"01-byte-bass-csharp", "CSharp", ""},
        {"Bassline124F#m", "FSharp", "Minor", 124},
        {"DnB 174 Am", "A", "Minor", 174},
        {"Cello_Fs3", "", ""},
        {"Foley Loop_140BPM (89)", "", "", 140, SoundKind::loop},
        {"choir e 140bpm", "E", "", 140},
        {"how to be a 140bpm choir", "", "", 140},
        {"Bass_Loop_80_D_125bpm", "D", "", 125, SoundKind::loop},
        {"Synth Loop 6d 126", "", "", 126, SoundKind::loop},
        {"B9-Am", "A", "Minor"},
        {"B9-A", "", ""},
        {"Piano B9 Am", "", ""},
        {"Stab_Cm9", "C", "Minor"},
        {"Pad_Grains_Am_Data", "A", "Minor"},
        {"Loop124", "", "", 124, SoundKind::loop},
        {"Loop64", "", "", 0, SoundKind::loop},
        {"SH101 Loop", "", "", 0, SoundKind::loop},
        {"xy123_Loop 99", "", "", 99, SoundKind::loop},
    };
    for (const auto& row : rows) {
        const NameReading reading = readingOf(row.name);
        std::string key, mode;
        for (const TagClaim& claim : reading.claims) {
            const auto parent = TGRTTaxonomy::defaultTaxonomy()->findTagForLabel(claim.label)->parent();
            if (parent && parent->label() == "Key") key += claim.label;
            if (parent && parent->label() == "Key Type") mode += claim.label.substr(0, claim.label.find(' '));
        }
        EXPECT_EQ(key, row.key) << row.name;
        EXPECT_EQ(mode, row.mode) << row.name;
        EXPECT_EQ(reading.tempo.value_or(0), row.tempo) << row.name;
        EXPECT_EQ(reading.kind, row.kind) << row.name;
        EXPECT_EQ(reading.bars.value_or(0), row.bars) << row.name;
        EXPECT_EQ(reading.beats.value_or(0), row.beats) << row.name;
    }
}

TEST(Names, OfPresetsAreOftenFiguresOfSpeech) {
    NameReader reader;
    const std::string_view chainsaw[] = {"Chainsaw"}, osc[] = {"Chip Osc"};
    EXPECT_THAT(labelsOf(reader.read(chainsaw, "wav")), ElementsAre("Sound Effects"));
    EXPECT_THAT(labelsOf(reader.read(chainsaw, ItemNames("/a/Chainsaw.fxp").extension())), IsEmpty());
    EXPECT_THAT(labelsOf(reader.read(osc, "fxp")), ElementsAre("Synth"));
}

TEST(Names, OfFoldersTellWhetherANumberIsATempo) {
    const struct {
        std::vector<std::string_view> names;
        double tempo;
        Labels labels;
    } rows[] = {
        {{"MK_145_shade", "Drum Loops"}, 145, {"Drums"}},
        {{"MK_145_shade", "Shades"}, 0, {}},
        {{"MK_145_one_shot", "Loops"}, 0, {}},
        {{"101", "Loops 124bpm"}, 124, {}},
        {{"xy80_stand_F", "80"}, 80, {"F"}},
        {{"xy80_stand_F", "90"}, 0, {}},
        {{"xy20_stand_F", "20"}, 0, {}},
    };
    for (const auto& row : rows) {
        const NameReading reading = NameReader().read(row.names);
        EXPECT_EQ(reading.tempo.value_or(0), row.tempo) << row.names[0] << " in " << row.names[1];
        EXPECT_EQ(labelsOf(reading), row.labels) << row.names[0] << " in " << row.names[1];
    }
}

TEST(Names, OfFoldersThatAreAKeyTellIt) {
    const auto keyIn = [](std::string_view folder) {
        const std::string_view names[] = {"Top 3", folder};
        return labelsOf(NameReader().read(names));
    };
    EXPECT_THAT(keyIn("Am"), ElementsAre("A", "Minor KeyType"));
    EXPECT_THAT(keyIn("A"), IsEmpty());
    EXPECT_THAT(keyIn("am"), IsEmpty());
}

TEST(Names, SayWhereTheirWordsStand) {
    const std::string name = "99_Ti\xc3\xabsto_Snare(2)";
    const NameReading reading = readingOf(name);
    ASSERT_EQ(reading.claims.size(), 1U);
    EXPECT_EQ(name.substr(reading.claims[0].evidence.offset, 5), "Snare");
    EXPECT_EQ(reading.claims[0].evidence.what, "Snare");
}

TEST(Names, CountFromTheItemUpToTheFolderThatWasNamed) {
    const auto names = [](const std::string& path, const std::string& root) {
        const ItemNames its(path, root);
        return Labels(its.all().begin(), its.all().end());
    };
    EXPECT_THAT(names("/C/Pack/Drums/Kick.01.wav", "/C/Pack"), ElementsAre("Kick.01", "Drums", "Pack"));
    EXPECT_THAT(names("/C/Pack/Drums/Kick.wav", "/C/Pack/"), ElementsAre("Kick", "Drums", "Pack"));
    EXPECT_THAT(names("/a/b/c/Kick.wav", "/a/b/c/Kick.wav"), ElementsAre("Kick", "c", "b"));
    EXPECT_THAT(names("/a/b/c/Warm.patch/", ""), ElementsAre("Warm", "c", "b"));
    EXPECT_THAT(names("/.wav", ""), ElementsAre(".wav"));
    EXPECT_THAT(names("/a/bc/d/e/Kick.wav", "/a/b"), ElementsAre("Kick", "e", "d"));
    EXPECT_THAT(ItemNames("/C/Pack/Kick.1/Kick.wav", "/C/Pack").folders(),
                ElementsAre("/C/Pack/Kick.1", "/C/Pack"));
    EXPECT_THAT(ItemNames("/a/b/c/Warm.patch/", "").folders(), ElementsAre("/a/b/c", "/a/b"));
    EXPECT_THAT(ItemNames("/Kick.wav", "").folders(), ElementsAre());
}

TEST(Names, CostLittleHoweverLongTheyAre) {
    const auto repeated = [](const std::string& text, int times) {
        std::string all;
        for (int i = 0; i < times; ++i) all += text;
        return all;
    };
    std::string deep = "/root";
    for (int i = 0; i < 10'000; ++i) deep += fmt::format("/Kick {}", i);
    const std::string hostile[] = {repeated("k", 255),
                                   repeated("kick", 1'000'000),
                                   repeated("\xcc\x81", 100'000),
                                   repeated("\xd7\xa9\xd7\x9c\xd7\x95\xd7\x9d ", 10'000),
                                   repeated("\xff", 1000),
                                   repeated("A#", 100'000),
                                   repeated("1 ", 100'000),
                                   repeated("(", 100'000)};
    const test::ProcessorClock::time_point start = test::ProcessorClock::now();
    for (const std::string& name : hostile) {
        for (const TagClaim& claim : readingOf(name).claims) {
            EXPECT_EQ(claim.evidence.where, name);
            EXPECT_TRUE(
                std::string_view(name).substr(claim.evidence.offset).starts_with(claim.evidence.what));
        }
    }
    NameReader reader;
    EXPECT_LE(reader.read(ItemNames(deep, "/root").all()).claims.size(), 65U);
    EXPECT_LT(std::chrono::duration<double>(test::ProcessorClock::now() - start).count(), 2.0);
}

// MARK: - Habits

TEST(NamingHabits, TellWhichEntryIsWrongAndOnWhichLine) {
    const struct {
        std::string text;
        std::uint64_t line;
        std::string part, reason;
    } rows[] = {
        {"{ Meanings = {\n Kick = { words = (boink); };\n Snare = { words = (a,\n boink); }; }; }", 4,
         "Meanings, Snare, words", "\"boink\" stands in another entry as well, for Kick"},
        {"{ Meanings = { Kick = { words = (boink);\n short = (Boink); }; }; }", 2, "Meanings, Kick, short",
         "stands in another"},
        {"{ Meanings = { Kick = { words = (\"--\"); }; }; }", 1, "Meanings, Kick, words",
         "is no word or phrase"},
        {"{ Meanings = { Kick = { words = (\"a b c d e f\"); }; }; }", 1, "Meanings, Kick, words",
         "is no word or phrase"},
        {"{ Meanings = {\n Kick = {\n words = ({ a = b; }); }; }; }", 3, "Meanings, Kick, words",
         "is no list of texts"},
        {"{ Meanings = { Kick = { words = boink; }; }; }", 1, "Meanings, Kick, words", "is no list of texts"},
        {"{ Meanings = {\n Kick = (boink); }; }", 2, "Meanings, Kick", "has no lists"},
        {"{ Meanings = (boink); }", 1, "Meanings", "is no dictionary"},
        {"{ Meanings = { Kick = { hints = (a, a, a, a, a, a, a, a,\n a, a); }; }; }", 2,
         "Meanings, Kick, hints", "more than 8 things"},
        {"{ Notes = { do = 0;\n re = 12; }; }", 2, "Notes, re", "is no note"},
        {"{ Notes = { re = d; }; }", 1, "Notes, re", "is no note"},
        {"{ Tempo = (boink);\nCounts = (boink); }", 2, "Counts", "stands in another"},
        {"{ Kinds = { Loop = (boink);\n\"One Shot\" = (boink); }; }", 2, "Kinds, One Shot",
         "stands in another"},
        {"{ Pitched = Bass; }", 1, "Pitched", "is no list of texts"},
        {"{ InFolders = { Kick = (Drums); }; }", 1, "InFolders, Kick", "is no label"},
        {"{ InFolders = { Tom = Kick;\n Kick = Drums;\n Drums = Percussion;\n Percussion = Kick; }; }", 2,
         "InFolders, Kick", "leads back to itself"},
        {"{ Adds = YES;\n InFolders = { Drums = \"Drum Kit\"; }; }", 2, "InFolders, Drums",
         "leads back to itself"},
        {"<plist><dict>\n<key>Meanings</key><dict><key>Kick</key><dict>\n<key>words</key><array>\n"
         "<string>boink</string>\n</array><key>short</key><array>\n"
         "<string>boink</string></array></dict></dict></dict></plist>",
         6, "Meanings, Kick, short", "stands in another"},
        {"{ Meanings = {\n Kick = ; }; }", 2, "old-style property list", "an unexpected character"},
        {"{ Programs = {\n Kick = boink; }; }", 2, "Programs, Kick", "is no list of texts"},
        {"{ Prefixes = { Kick = (KICKOne, { a = b; }); }; }", 1, "Prefixes, Kick", "is no list of texts"},
        {"{ Combined = { Kick = ((Drums)); }; }", 1, "Combined, Kick", "is no pair of lists"},
    };
    for (const auto& row : rows) {
        const test::TemporaryFolder folder;
        const std::string path = folder.write("NamingHabits.plist", row.text);
        ResourceBundle::setDirectory(folder.path());
        const test::CapturedLog log;
        Error error;
        EXPECT_FALSE(replacementFile(NamingHabits::file(), &error)) << row.text;
        ResourceBundle::setDirectory("");
        EXPECT_EQ(error.path, path) << row.text;
        EXPECT_EQ(error.line, row.line) << row.text;
        EXPECT_EQ(error.part, row.part) << row.text;
        EXPECT_THAT(error.reason, HasSubstr(row.reason)) << row.text;
        EXPECT_THAT(log.messages(), ElementsAre(error.message()));
    }
}

TEST(NamingHabits, OfTheUserAddToOrReplaceTheBuiltInOnes) {
    const struct {
        std::string text;
        Labels kick, boink, sub;  // what is read in "kick", "boink" and "snare"
        std::string logged;
    } rows[] = {
        {"{ Adds = 1; Meanings = { Cowbell = { words = (boink, snare); }; }; }",
         {"Kick"},
         {"Cowbell"},
         {"Cowbell"},
         ""},
        {"{ Meanings = { Cowbell = { words = (boink); }; }; }", {}, {"Cowbell"}, {}, ""},
        {"{ Meanings = { \"No Such Tag\" = { words = (boink); }; }; Adds = 1; }",
         {"Kick"},
         {},
         {"Snare"},
         ""},
        {"{ Meanings = { Kick = boink; }; }",
         {"Kick"},
         {},
         {"Snare"},
         "Meanings, Kick, line 1: has no lists of words (using the built-in one)"},
        {"{ Meanings = ", {"Kick"}, {}, {"Snare"}, "NamingHabits.plist"},
    };
    for (const auto& row : rows) {
        const test::TemporaryFolder folder;
        folder.write("NamingHabits.plist", row.text);
        ResourceBundle::setDirectory(folder.path());
        const test::CapturedLog log;
        for (int time = 0; time < 2; ++time) NamingHabits::defaultHabits();
        NameReader reader(NamingHabits::defaultHabits());
        ResourceBundle::setDirectory("");
        const auto labels = [&reader](std::string_view name) {
            const std::string_view names[] = {name};
            return labelsOf(reader.read(names));
        };
        EXPECT_EQ(labels("kick"), row.kick) << row.text;
        EXPECT_EQ(labels("boink"), row.boink) << row.text;
        EXPECT_EQ(labels("snare"), row.sub) << row.text;
        const std::string logged = testing::PrintToString(log.messages());
        EXPECT_THAT(logged, HasSubstr(row.logged));
        EXPECT_EQ(log.messages().size(), row.logged.empty() ? 0U : 1U) << logged;
    }
}

}  // namespace
}  // namespace qvct

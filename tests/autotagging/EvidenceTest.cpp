#include "autotagging/ContentItem.h"
#include "autotagging/ItemTagger.h"
#include "autotagging/QVTaggingAggregator.h"
#include "autotagging/services/TaggingServiceNames.h"
#include "formats/TGRTFileNode.h"
#include "formats/library/FolderRejections.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/ResourceBundle.h"
#include "platform/text/Text.h"
#include "support/AudioFixtures.h"
#include "support/CapturedLog.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <iterator>
#include <random>
#include <set>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::IsSupersetOf;
using testing::Not;
using testing::UnorderedElementsAre;

using Labels = std::vector<std::string>;

TagClaim claim(const std::string& label, double confidence, int distance = 0,
               std::string_view service = "names", const std::string& what = "word") {
    TagClaim result;
    result.label = label;
    result.confidence = confidence;
    result.distance = distance;
    result.service = service;
    result.evidence.what = what;
    return result;
}

Resolution resolve(std::vector<TagClaim> claims, SoundKind kind = SoundKind::oneShot) {
    static const ClaimResolver resolver(TGRTTaxonomy::defaultTaxonomy());
    return resolver.resolve(std::move(claims), kind);
}

Labels heldOf(const Resolution& resolution) {
    Labels labels;
    for (const HeldTag& held : resolution.held) labels.push_back(held.tag->label());
    std::sort(labels.begin(), labels.end());
    return labels;
}

double confidenceOf(const Resolution& resolution, std::string_view label) {
    for (const HeldTag& held : resolution.held)
        if (held.tag->label() == label) return held.confidence;
    return 0;
}

TEST(ClaimResolver, DecidesWhatHolds) {
    const struct {
        const char* what;
        std::vector<TagClaim> claims;
        SoundKind kind;
        Labels held;
    } rows[] = {
        {"the name outweighs its folder",
         {claim("Kick", 0.95), claim("Snare", 0.95, 1)},
         SoundKind::oneShot,
         {"Drums", "Kick"}},
        {"a hint does not outweigh the folder",
         {claim("Kick", 0.45), claim("Snare", 0.95, 1)},
         SoundKind::oneShot,
         {"Drums", "Snare"}},
        {"a folder says what the name does not",
         {claim("Snare", 0.95, 1)},
         SoundKind::oneShot,
         {"Drums", "Snare"}},
        {"a loop has several instruments",
         {claim("Bongo", 0.95), claim("Conga", 0.95)},
         SoundKind::loop,
         {"Bongo", "Conga", "Percussion"}},
        {"a hint alone says nothing", {claim("Kick", 0.45)}, SoundKind::oneShot, {}},
        {"a hint counts where its kind is told",
         {claim("Kick", 0.45), claim("Drums", 0.95, 1)},
         SoundKind::oneShot,
         {"Drums", "Kick"}},
        {"or a kind that goes with it",
         {claim("Woodblock", 0.45), claim("Drums", 0.95, 1)},
         SoundKind::oneShot,
         {"Percussion", "Woodblock"}},
        {"one key", {claim("A", 0.97), claim("C", 0.97, 1)}, SoundKind::loop, {"A", "Key"}},
        {"one mode",
         {claim("Major KeyType", 0.97), claim("Minor KeyType", 0.6)},
         SoundKind::loop,
         {"Key Type", "Major KeyType"}},
        {"key and mode are no alternatives",
         {claim("A", 0.97), claim("Minor KeyType", 0.97)},
         SoundKind::loop,
         {"A", "Key", "Key Type", "Minor KeyType"}},
        {"kinds of content bring no parents",
         {claim("One Shot", 1, 0, "content-type")},
         SoundKind::oneShot,
         {"One Shot"}},
        {"labels of no tag are dropped",
         {claim("Kick", 0.95), claim("No Such Tag", 1)},
         SoundKind::oneShot,
         {"Drums", "Kick"}},
        {"genres agree",
         {claim("House", 0.95), claim("Jazz", 0.95, 1)},
         SoundKind::oneShot,
         {"Electronic Music", "House", "Jazz"}},
    };
    for (const auto& row : rows) EXPECT_EQ(heldOf(resolve(row.claims, row.kind)), row.held) << row.what;
}

TEST(ClaimResolver, IsSurerWhenSourcesAgreeAndLessSureWhenTheyDoNot) {
    const double alone = confidenceOf(resolve({claim("Kick", 0.8)}), "Kick");
    const double agreed = confidenceOf(resolve({claim("Kick", 0.8), claim("Kick", 0.8, 0, "rules")}), "Kick");
    const double sameWord =
        confidenceOf(resolve({claim("Kick", 0.8), claim("Kick", 0.8, 0, "keywords")}), "Kick");
    const double doubted = confidenceOf(resolve({claim("Kick", 0.8), claim("Snare", 0.7)}), "Kick");
    EXPECT_DOUBLE_EQ(alone, 0.8);
    EXPECT_NEAR(agreed, 1 - 0.2 * (1 - 0.8 * 0.9), 1e-9);
    EXPECT_DOUBLE_EQ(sameWord, alone);
    EXPECT_LT(doubted, alone);
}

TEST(ClaimResolver, HoldsOneOfTwoPoles) {
    const auto brightness = [](double confidence, double level, std::string_view service) {
        TagClaim its = claim("Bright / Dark", confidence, 0, service);
        its.level = level;
        return its;
    };
    const auto alone = resolve({brightness(0.9, 0, "names")});
    const auto agreed = resolve({brightness(0.9, 0, "names"), brightness(0.9, 0.2, "rules")});
    const auto opposed = resolve({brightness(0.8, 1, "rules"), brightness(0.9, 0, "names")});
    EXPECT_GT(agreed.held.at(0).confidence, alone.held.at(0).confidence);
    EXPECT_DOUBLE_EQ(opposed.held.at(0).confidence, alone.held.at(0).confidence);
    EXPECT_EQ(opposed.held.at(0).level, 0);
    EXPECT_EQ(opposed.held.at(0).claims.back().doubt, "the opposite is likelier");
}

TEST(ClaimResolver, GivesAReasonForWhatItDrops) {
    TagClaim doubted = claim("Bass", 0.9, 0, "keywords");
    doubted.doubt = "\"Bass Drum\" is Kick";
    const Resolution resolution =
        resolve({claim("Kick", 0.95), claim("Snare", 0.9), claim("Nope", 1), claim("Glide", 0.3), doubted});
    std::map<std::string, std::string> reasons;
    for (const DroppedTag& dropped : resolution.dropped) reasons[dropped.label] = dropped.reason;
    EXPECT_THAT(reasons, UnorderedElementsAre(testing::Pair("Snare", "Kick is likelier"),
                                              testing::Pair("Nope", "the taxonomy has no such tag"),
                                              testing::Pair("Glide", "too unsure"),
                                              testing::Pair("Bass", "\"Bass Drum\" is Kick")));
}

TEST(ClaimResolver, DecidesTheSameInWhateverOrder) {
    const Labels labels = {"Kick",  "Snare",  "Drums",         "A",     "C",
                           "House", "Techno", "Minor KeyType", "Bongo", "Nope"};
    std::mt19937 random(7);
    std::vector<TagClaim> claims;
    for (int i = 0; i < 40; ++i) {
        claims.push_back(claim(labels[random() % labels.size()], 0.1 * static_cast<double>(1 + random() % 10),
                               static_cast<int>(random() % 4), random() % 2 == 0 ? "names" : "rules",
                               std::to_string(i)));
    }
    const auto textOf = [](const Resolution& resolution) {
        std::string text;
        for (const HeldTag& held : resolution.held)
            text += held.tag->label() + std::to_string(held.confidence) +
                    (held.claims.empty() ? "" : held.claims[0].evidence.what) + ";";
        for (const DroppedTag& dropped : resolution.dropped) text += dropped.label + dropped.reason + ";";
        return text;
    };
    const std::string expected = textOf(resolve(claims));
    for (int i = 0; i < 50; ++i) {
        std::shuffle(claims.begin(), claims.end(), random);
        ASSERT_EQ(textOf(resolve(claims)), expected);
    }
}

TEST(EvidenceWeights, TellWhichEntryIsWrong) {
    const std::string whole =
        "{ Strengths = { word = 1; abbreviation = 1; likeness = 1; hint = 1; figure = 1; key = 1; }; "
        "Services = { rules = "
        "1; }; "
        "Distances = (1); Together = ((Drums, Percussion)); HeadWord = 0; Support = 0; Contradiction = 0; "
        "Threshold = 0.5; }";
    const auto read = [](const std::string& text, Error* error) {
        const auto list =
            parsePropertyList({reinterpret_cast<const unsigned char*>(text.data()), text.size()});
        return EvidenceWeights::weightsWithDictionary(*list->dictionary(), error);
    };
    Error none;
    ASSERT_TRUE(read(whole, &none)) << none.message();
    const struct {
        std::string entry, wrong, part;
    } faults[] = {{"hint = 1", "hint = 1.5", "Strengths, hint"},
                  {"hint = 1", "hint = much", "Strengths, hint"},
                  {"rules = 1", "rules = -1", "Services, rules"},
                  {"Distances = (1)", "Distances = ()", "Distances"},
                  {"Distances = (1)", "Distances = (1,\n nan)", "Distances"},
                  {"(Drums, Percussion)", "(Drums, (Percussion))", "Together"},
                  {"Threshold = 0.5;", "", "Threshold"}};
    for (const auto& [entry, wrong, part] : faults) {
        std::string text = whole;
        text.replace(text.find(entry), entry.size(), wrong);
        Error error;
        EXPECT_FALSE(read(text, &error)) << wrong;
        EXPECT_EQ(error.part, part) << wrong;
    }
    const test::TemporaryFolder folder;
    folder.write("EvidenceWeights.plist", "{ Strengths = {\n word = 2; }; }");
    ResourceBundle::setDirectory(folder.path());
    const test::CapturedLog log;
    for (int time = 0; time < 2; ++time) EXPECT_GT(EvidenceWeights::defaultWeights().threshold, 0);
    ResourceBundle::setDirectory("");
    EXPECT_THAT(log.messages(), ElementsAre(folder.path("EvidenceWeights.plist") +
                                            ": Strengths, word, line 2: is no number from 0 to 1 (using the "
                                            "built-in one)"));
}

/// The fixtures are noise, which may sound like anything.
constexpr std::uint64_t kAllButSound = optionsForAllTaggingServices() & ~QVCTAutoTaggingOptionSound;

class Tagging : public testing::Test {
  protected:
    Labels tag(const std::string& path, const std::string& root, std::uint64_t options = kAllButSound) {
        const auto item = std::make_shared<ContentItem>(URL::fileURLWithPath(path));
        report_ = tagger_.report(item, ItemNames(path, root), options);
        return heldOf(report_.resolution);
    }
    std::string sound(const std::string& name) {
        const test::Wav wav;
        return folder_.write(name, wav.file(wav.format() + wav.data()));
    }

    test::TemporaryFolder folder_;
    ItemTagger tagger_{QVTaggingAggregator::defaultTaggingAggregator(), TGRTTaxonomy::defaultTaxonomy()};
    ItemReport report_;
};

TEST_F(Tagging, LetsNothingAboveTheFolderCount) {
    const std::string path = sound("Snare/C/Pack/BD0010.wav");
    EXPECT_THAT(tag(path, folder_.path("Snare/C/Pack")),
                ElementsAre("Drums", "Kick", "One Shot", "User generated"));
    EXPECT_THAT(tag(path, folder_.path("Snare")), Not(Contains("C")));
}

TEST_F(Tagging, DoubtsKeywordsThatSeeOnlyAPartOfWhatIsMeant) {
    const struct {
        std::string name, dropped, held;
    } rows[] = {{"Bass Drum 1.wav", "Bass", "Kick"},
                {"Hard Drive Kick.wav", "Drive", "Kick"},
                {"Synth A# Minor.wav", "A", "ASharp"},
                {"Drum'n'Bass/Snare 1.wav", "Bass", "Snare"},
                {"Snare Sample.wav", "Sample", "Snare"},
                {"House Guitar Vol 2/01.wav", "Guitar", "House"},
                {"Synth Fm.wav", "FM", "F"},
                {"The Mysterious Bank/Kick 1.wav", "Mysterious", "Kick"},
                {"SD_Pop_Strings.wav", "Snare", "Strings"},
                {"TM Sweep Pad.wav", "Tom", "Pad"},
                {"Jazz Guitar 1.wav", "Jazz", "Electric Guitar"}};
    for (const auto& [name, dropped, held] : rows) {
        const Labels labels = tag(sound("Root/" + name), folder_.path("Root"));
        EXPECT_THAT(labels, Contains(held)) << name;
        EXPECT_THAT(labels, Not(Contains(dropped))) << name;
    }
}

TEST_F(Tagging, KeepsWhatOtherServicesSay) {
    const std::string path = sound("Root/Dark Pad.wav");
    EXPECT_THAT(tag(path, folder_.path("Root")),
                IsSupersetOf({"Bright / Dark", "Pad", "Synth", "One Shot", "User generated"}));
    for (const auto& tagging : report_.taggings()) {
        EXPECT_TRUE(tagging->isAutoTagging());
        EXPECT_EQ(tagging->level() ? tagging->level()->weight() : 0,
                  tagging->label() == "Bright / Dark" ? 1 : 0);
    }
    EXPECT_THAT(tag(path, "", QVCTAutoTaggingOptionContentType), ElementsAre("One Shot"));
    EXPECT_THAT(tag(path, "", 0), ElementsAre());
}

TEST_F(Tagging, DoesNotSayAgainWhatAPersonRejected) {
    const std::string path = sound("Root/Drums/Kick Dark.wav");
    const URL url = URL::fileURLWithPath(path);
    const Labels all = {"Bright / Dark", "Drums", "Kick", "One Shot", "User generated"};
    const auto without = [&all](const Labels& rejected) {
        Labels left;
        std::set_difference(all.begin(), all.end(), rejected.begin(), rejected.end(),
                            std::back_inserter(left));
        return left;
    };
    using Rejected = std::set<std::string>;
    const auto kick = TGRTTagging::initWithTag(TGRTTaxonomy::defaultTaxonomy()->findTagForLabel("Kick"), {});
    const struct {
        const char* what;
        Rejected item, folder, root;
        bool hasKick;  // a person says that it is one
        Labels dropped;
        const char* reason;  // of the first that is dropped
    } rows[] = {
        {"nothing is rejected", {}, {}, {}, false, {}, ""},
        {"a folder says what a rejected tag is a kind of",
         {"Kick"},
         {},
         {},
         false,
         {"Kick"},
         "in its record"},
        {"what is no drum is no kick", {"Drums"}, {}, {}, false, {"Drums", "Kick"}, "in its record"},
        {"in its folder", {}, {"Kick"}, {}, false, {"Kick"}, "in the folder \"Drums\""},
        {"in the folder that was named", {}, {}, {"Kick"}, false, {"Kick"}, "in the folder \"Root\""},
        {"what a service alone says", {"One Shot"}, {}, {}, false, {"One Shot"}, "in its record"},
        {"a label of no tag", {"Boink"}, {"Boink"}, {}, false, {}, ""},
        {"a person outranks folders", {}, {"Kick"}, {"Drums"}, true, {}, ""},
    };
    for (const auto& row : rows) {
        const auto record = TGRTMetaData::init();
        record->setRejectedLabels(row.item);
        if (row.hasKick) record->setTaggings({kick});
        ASSERT_TRUE(
            TGRTFileNode::nodeWithFileURL(url)->metaDataWriterForFileURL(url)->writeMetaData(record, url));
        ASSERT_TRUE(setRejectedLabelsOfFolder(row.folder, folder_.path("Root/Drums")));
        ASSERT_TRUE(setRejectedLabelsOfFolder(row.root, folder_.path("Root")));
        ASSERT_TRUE(setRejectedLabelsOfFolder({"Bright / Dark"}, folder_.path()));  // above the root
        ItemTagger tagger(QVTaggingAggregator::defaultTaggingAggregator(), TGRTTaxonomy::defaultTaxonomy());
        const ItemReport report = tagger.report(std::make_shared<ContentItem>(url),
                                                ItemNames(path, folder_.path("Root")), kAllButSound);
        EXPECT_EQ(heldOf(report.resolution), without(row.dropped)) << row.what;
        for (const std::string& label : row.dropped) {
            const auto hit = std::find_if(report.resolution.dropped.begin(), report.resolution.dropped.end(),
                                          [&label](const DroppedTag& tag) { return tag.label == label; });
            ASSERT_NE(hit, report.resolution.dropped.end()) << row.what << label;
            EXPECT_THAT(hit->reason,
                        testing::AllOf(testing::HasSubstr("rejected "), testing::HasSubstr(row.reason)))
                << row.what;
        }
    }
}

TEST_F(Tagging, OfNamesAloneNeedsNoFile) {
    const ItemReport report = tagger_.reportOfNames(
        ItemNames("/none/Loops/Funky Bass Loop 98 Em.wav", "/none"), SoundKind::oneShot);
    EXPECT_EQ(report.kind, SoundKind::loop);
    EXPECT_EQ(report.tempo, 98);
    EXPECT_THAT(heldOf(report.resolution), IsSupersetOf({"Bass", "E", "Minor KeyType"}));
}

TEST_F(Tagging, OfWhatOnlyDescribesAnInstrumentHoldsTheInstrument) {
    for (const std::string name : {"Dog Bass 2", "Bass Motorcycle", "ThunderBass"}) {
        const Labels held =
            heldOf(tagger_.reportOfNames(ItemNames("/none/" + name + ".wav", "/none"), SoundKind::oneShot)
                       .resolution);
        EXPECT_THAT(held, testing::Contains("Bass")) << name;
        EXPECT_THAT(held, testing::Not(testing::Contains("Sound Effects"))) << name;
    }
}

TEST_F(Tagging, KnowsWhatGeneralMidiAndItsVariantsCallTheirSounds) {
    constexpr std::string_view kTheSame = "=";
    const std::pair<std::string_view, std::string_view> rows[] = {
        {kTheSame,
         "Harpsichord, Celesta, Vibraphone, Marimba, Xylophone, Tubular Bells, Harmonica, "
         "Acoustic Bass, Violin, Viola, Cello, Timpani, Trombone, Tuba, Oboe, Bassoon, Clarinet, "
         "Recorder, Pan Flute, Ocarina, Sitar, Banjo, Shamisen, Koto, Kalimba, Fiddle, Tambourine, "
         "Cowbell, Cabasa, Maracas, Castanets"},
        {"Piano", "Acoustic Grand Piano, Bright Acoustic Piano, Honky-tonk Piano, HnkyTonk"},
        {"Electric Piano", "Electric Grand Piano, Electric Piano 1, Electric Piano 2, E.Grand"},
        {"Clavinet", "Clavi"},
        {"Glockenspiel", "Glockenspiel, Music Box"},
        {"Dulcimer", "Dulcimer, Santur"},
        {"Organ", "Drawbar Organ, Percussive Organ, Rock Organ, Church Organ, Reed Organ"},
        {"Accordion", "Accordion, Tango Accordion"},
        {"Classical Guitar", "Acoustic Guitar (nylon), Nylon-str.Gt, NylonGtr"},
        {"Acoustic Guitar", "Acoustic Guitar (steel), Steel-str.Gt"},
        {"Electric Guitar",
         "Electric Guitar (jazz), Electric Guitar (clean), Electric Guitar (muted), Overdriven Guitar, "
         "Distortion Guitar, Jazz Gt., DistortionGt, Dist.Gtr, CleanGtr, Guitar harmonics"},
        {"Guitar", "Guitar Fret Noise, Gt.FretNoise"},
        {"Electric Bass",
         "Electric Bass (finger), Electric Bass (pick), Fretless Bass, Slap Bass 1, Slap Bass 2, Fingered "
         "Bs., FngrBass, SlapBas1"},
        {"Synth Bass", "Synth Bass 1, Synth Bass 2"},
        {"Double Bass", "Contrabass"},
        {"String Ensemble", "Tremolo Strings, Pizzicato Strings, String Ensemble 1, String Ensemble 2"},
        {"Harp", "Orchestral Harp"},
        {"Synth Strings", "SynthStrings 1, SynthStrings 2, SynStr1"},
        {"Choir", "Choir Aahs, Voice Oohs"},
        {"Synth Voice", "Synth Voice, SynVox"},
        {"Stab", "Orchestra Hit"},
        {"Trumpet", "Trumpet, Muted Trumpet"},
        {"Horn", "French Horn"},
        {"Brass Section", "Brass Section, BrasSect"},
        {"Synth Brass", "SynthBrass 1, SynthBrass 2, SynBras1"},
        {"Saxophone", "Soprano Sax, Alto Sax, Tenor Sax, Baritone Sax"},
        {"English Horn", "English Horn, Eng.Horn"},
        {"Flute", "Piccolo, Flute, Blown Bottle"},
        {"Shakuhachi", "Shakuhachi, Shakhchi"},
        {"Tin Whistle", "Whistle"},
        {"Lead",
         "Lead 1 (square), Lead 2 (sawtooth), Lead 3 (calliope), Lead 4 (chiff), Lead 5 (charang), Lead 6 "
         "(voice), Lead 7 (fifths), Lead 8 (bass + lead)"},
        {"Pad",
         "Pad 1 (new age), Pad 2 (warm), Pad 3 (polysynth), Pad 4 (choir), Pad 5 (bowed), Pad 6 (metallic), "
         "Pad 7 (halo), Pad 8 (sweep)"},
        {"Sound Effects",
         "FX 1 (rain), FX 2 (soundtrack), FX 3 (crystal), FX 4 (atmosphere), FX 5 (brightness), FX 6 "
         "(goblins), FX 7 (echoes), FX 8 (sci-fi), Telephone Ring, Helicopter, Applause, Gunshot"},
        {"Bagpipes", "Bag pipe"},
        {"Woodwinds", "Shanai"},
        {"Bells", "Tinkle Bell"},
        {"Agogo", "Agogo, High Agogo, Low Agogo"},
        {"Steel Drum", "Steel Drums, SteelDrm"},
        {"Woodblock", "Woodblock, Hi Wood Block, Low Wood Block"},
        {"Taiko", "Taiko Drum"},
        {"Tom", "Melodic Tom, Low Floor Tom, High Floor Tom, Low Tom, Low-Mid Tom, Hi-Mid Tom, High Tom"},
        {"Drums", "Synth Drum"},
        {"Cymbal", "Reverse Cymbal, Chinese Cymbal, Splash Cymbal, RevCymbl"},
        {"Noise", "Breath Noise"},
        {"Nature", "Seashore, Bird Tweet"},
        {"Kick", "Acoustic Bass Drum, Bass Drum 1, 808 Bass Drum, Concert BD"},
        {"Rim", "Side Stick"},
        {"Snare", "Acoustic Snare, Electric Snare, Brush Slap"},
        {"Claps", "Hand Clap"},
        {"Hi-Hat", "Closed Hi Hat, Pedal Hi-Hat, Open Hi-Hat, TR-808 CHH"},
        {"Crash", "Crash Cymbal 1, Crash Cymbal 2"},
        {"Ride", "Ride Cymbal 1, Ride Bell, Ride Cymbal 2"},
        {"Percussion", "Vibraslap, Short Whistle, Long Whistle, Samba Whistle H, Metronome Bell"},
        {"Bongo", "Hi Bongo, Low Bongo"},
        {"Conga", "Mute Hi Conga, Open Hi Conga, Low Conga, Conga H Mute"},
        {"Timbales", "High Timbale, Low Timbale"},
        {"Guiro", "Short Guiro, Long Guiro"},
        {"Clave", "Claves"},
        {"Cuica", "Mute Cuica, Open Cuica"},
        {"Triangle", "Mute Triangle, Open Triangle"},
        {"Turntable", "Scratch Push"},
        {"Sleigh Bells", "Jingle Bell"},
        {"Surdo", "Mute Surdo"},
        {"Wind Chimes", "Bell Tree"},
    };
    for (const auto& [label, names] : rows) {
        for (const std::string& name : split(names, ", ")) {
            const ItemReport report =
                tagger_.reportOfNames(ItemNames("/none/" + name + ".wav", "/none"), SoundKind::oneShot);
            std::string instruments;  // without the parents, which the last one brings
            for (const HeldTag& held : report.resolution.held)
                if (held.tag->categoryIdentifier() == QVCategorySourceIdentifier && !held.claims.empty())
                    instruments += held.tag->label();
            EXPECT_EQ(instruments, label == kTheSame ? name : label) << name;
        }
    }
}

TEST_F(Tagging, TakesANumberThatAgreesWithTheLengthForTheTempo) {
    const struct {
        const char* name;
        double seconds, tempo;
        int beats;
        bool isLoop = true;
    } rows[] = {
        {"Funk (90)", 16 * 60 / 90.0, 90, 16},
        {"Funk 90", 8 * 60 / 90.0 * 1.01, 0, 0, false},
        {"Funk 95 120 4 bars", 16 * 60 / 95.0 * 1.008, 95, 16},
        {"Waltz 100 140 8 bars", 24 * 60 / 140.0, 140, 24},
        {"Funk 60 120", 8, 0, 0, false},
        {"Funk 120", 2, 0, 0, false},
        {"Kick 120 one shot", 4, 0, 0, false},
        {"Drum Loop 70", 8, 70, 0},
    };
    const test::Wav wav;
    for (const auto& row : rows) {
        const auto frames = static_cast<std::size_t>(row.seconds * 1000);
        const std::string path = folder_.write(std::string("Root/") + row.name + ".wav",
                                               wav.file(wav.format(1, 1000, 8) + wav.data(frames)));
        const Labels labels = tag(path, folder_.path("Root"));
        EXPECT_EQ(report_.tempo.value_or(0), row.tempo) << row.name;
        EXPECT_EQ(report_.beats.value_or(0), row.beats) << row.name;
        EXPECT_EQ(report_.kind == SoundKind::loop, row.isLoop) << row.name;
        EXPECT_EQ(std::count(labels.begin(), labels.end(), "One Shot"), row.isLoop ? 0 : 1) << row.name;
    }
}

}  // namespace
}  // namespace qvct

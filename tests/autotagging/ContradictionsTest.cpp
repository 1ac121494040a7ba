#include "autotagging/ContentItem.h"
#include "autotagging/Contradictions.h"
#include "autotagging/ItemTagger.h"
#include "listening/HeardSound.h"
#include "metadata/TGRTMetaData.h"
#include "support/AudioFixtures.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using test::Wav;

constexpr std::size_t kBytesOfSecond = std::size_t{44100} * 4;

std::string fileOf(std::size_t seconds, const std::string& chunks = {}) {
    const Wav wav;
    return wav.file(wav.format() + wav.data(seconds * kBytesOfSecond) + chunks);
}

HeldTag heldOf(const std::string& label, const std::string& service) {
    TagClaim claim;
    claim.label = label;
    claim.service = service == "sound" ? "sound" : "names";
    return {TGRTTaxonomy::defaultTaxonomy()->findTagForLabel(label), std::nullopt, 0.9, {claim}};
}

/// What an item's names and its sound say, as far as a row needs it.
struct Said {
    std::string file = fileOf(1);
    double tempo = 0;
    int beats = 0;
    std::vector<std::string> tags = {};
    SoundKind kind = SoundKind::unsaid;
    HeardSound heard = {};
};

HeardSound tempos(std::vector<HeardSound::Tempo> candidates) {
    HeardSound sound;
    sound.tempos = std::move(candidates);
    return sound;
}

HeardSound key(int tonic, bool isMinor, double confidence = 0.9) {
    HeardSound sound;
    sound.key = {tonic, isMinor, confidence};
    return sound;
}

HeardSound note(int number, double confidence = 0.95) {
    HeardSound sound;
    sound.note = {number, 0, confidence};
    return sound;
}

HeardSound instrument(const std::string& label, double confidence = 0.95) {
    HeardSound sound;
    sound.instruments = {{label, confidence}};
    return sound;
}

HeardSound loopOrNot(double confidence) {
    HeardSound sound;
    sound.loopConfidence = confidence;
    return sound;
}

/// "tempo: 124 bpm by name, 97 bpm by sound", a line each.
std::string contradictionsOf(const Said& said) {
    const test::TemporaryFolder folder;
    ContentItem item(URL::fileURLWithPath(folder.write("sound.wav", said.file)));
    ItemReport report;
    if (said.tempo > 0) report.tempo = said.tempo;
    if (said.beats > 0) report.beats = said.beats;
    for (const std::string& tag : said.tags) report.resolution.held.push_back(heldOf(tag, "names"));
    report.kind = said.kind;
    report.sound = std::make_shared<const HeardSound>(said.heard);
    std::string text;
    for (const auto& its : contradictionsIn(item, report, *TGRTTaxonomy::defaultTaxonomy()))
        text += std::string(its.subject) + ": " + its.stated.value + " by " + std::string(its.stated.source) +
                ", " + its.against.value + " by " + std::string(its.against.source) + "\n";
    return text;
}

TEST(Contradictions, BetweenWhatIsWrittenAndWhatIsHeard) {
    const Wav wav;
    const std::string at90 = fileOf(1, wav.acid(0, 60, 0, 90));
    const std::string rootA = fileOf(1, wav.acid(3, 57, 0, 0));
    const std::string rootUnset = fileOf(1, wav.acid(3, 60, 0, 0));
    constexpr SoundKind kLoop = SoundKind::loop, kOneShot = SoundKind::oneShot;
    const struct {
        std::string what;
        Said said;
        std::string expected;
    } rows[] = {
        {"nothing said", {}, ""},
        {"chunk and name", {.file = at90, .tempo = 124}, "tempo: 90 bpm by file, 124 bpm by name\n"},
        {"half time", {.file = at90, .tempo = 180}, ""},
        {"another tempo",
         {.tempo = 124, .heard = tempos({{97, 8, 0.9}, {101, 8, 0.1}})},
         "tempo: 124 bpm by name, 97 bpm by sound\n"},
        {"the second candidate", {.tempo = 124, .heard = tempos({{97, 8, 0.9}, {123, 8, 0.1}})}, ""},
        {"in triplets", {.tempo = 120, .heard = tempos({{80, 8, 0.9}})}, ""},
        {"as four count three", {.tempo = 120, .heard = tempos({{90, 8, 0.9}})}, ""},
        {"not sure", {.tempo = 124, .heard = tempos({{97, 8, 0.79}})}, ""},
        {"too short",
         {.file = fileOf(3), .tempo = 120, .beats = 8},
         "length: 8 beats by name, 6 beats by sound\n"},
        {"rings on", {.file = fileOf(6), .tempo = 120, .beats = 8}, ""},
        {"a bar too long",
         {.file = fileOf(7), .tempo = 120, .beats = 8},
         "length: 8 beats by name, 14 beats by sound\n"},
        {"another key",
         {.tags = {"A", "Minor KeyType"}, .heard = key(2, false)},
         "key: A minor by name, D major by sound\n"},
        {"relative key", {.tags = {"A", "Minor KeyType"}, .heard = key(0, false)}, ""},
        {"not the relative one",
         {.tags = {"A", "Major KeyType"}, .heard = key(0, false)},
         "key: A major by name, C major by sound\n"},
        {"the other mode", {.tags = {"A", "Minor KeyType"}, .heard = key(9, false)}, ""},
        {"unclear key", {.tags = {"A", "Minor KeyType"}, .heard = key(2, false, 0.79)}, ""},
        {"root note", {.file = rootA, .heard = note(58)}, "root note: A by file, A# by sound\n"},
        {"octaves", {.file = rootA, .heard = note(33)}, ""},
        {"what unknown roots are", {.file = rootUnset, .heard = note(58)}, ""},
        {"unclear note", {.file = rootA, .heard = note(58, 0.8)}, ""},
        {"another drum",
         {.tags = {"Drums", "Kick"}, .heard = instrument("Hi-Hat")},
         "instrument: Kick by name, Hi-Hat by sound\n"},
        {"one of the drums", {.tags = {"Drums"}, .heard = instrument("Hi-Hat")}, ""},
        {"kick",
         {.tags = {"Kick"}, .heard = instrument("Hi-Hat")},
         "instrument: Kick by name, Hi-Hat by sound\n"},
        {"its parent", {.tags = {"Hi-Hat"}, .heard = instrument("Drums")}, ""},
        {"a loop of many", {.tags = {"Kick"}, .kind = kLoop, .heard = instrument("Hi-Hat")}, ""},
        {"heard as percussion", {.tags = {"Cabasa"}, .heard = instrument("Shaker")}, ""},
        {"percussion, but no kick",
         {.tags = {"Cabasa"}, .heard = instrument("Kick")},
         "instrument: Cabasa by name, Kick by sound\n"},
        {"unclear", {.tags = {"Kick"}, .heard = instrument("Hi-Hat", 0.89)}, ""},
        {"one-shot", {.kind = kLoop, .heard = loopOrNot(0.05)}, "kind: loop by name, one-shot by sound\n"},
        {"loop", {.kind = kOneShot, .heard = loopOrNot(0.95)}, "kind: one-shot by name, loop by sound\n"},
        {"either", {.kind = kLoop, .heard = loopOrNot(0.5)}, ""},
    };
    for (const auto& [what, said, expected] : rows) EXPECT_EQ(contradictionsOf(said), expected) << what;
}

/// What only the sound claims is no statement that it could contradict.
TEST(Contradictions, NeedAStatement) {
    const test::TemporaryFolder folder;
    ContentItem item(URL::fileURLWithPath(folder.write("sound.wav", fileOf(1))));
    ItemReport report;
    report.resolution.held.push_back(heldOf("Kick", "sound"));
    report.sound = std::make_shared<const HeardSound>(instrument("Hi-Hat"));
    EXPECT_THAT(contradictionsIn(item, report, *TGRTTaxonomy::defaultTaxonomy()), testing::IsEmpty());
    report.sound = nullptr;
    EXPECT_THAT(contradictionsIn(item, report, *TGRTTaxonomy::defaultTaxonomy()), testing::IsEmpty());
}

}  // namespace
}  // namespace qvct

#include "autotagging/QVTaggingAggregator.h"
#include "contentdb/ContentDescriber.h"
#include "formats/TGRTFileNode.h"
#include "indexing/TGRTIndexableContentObject.h"
#include "platform/files/ResourceBundle.h"
#include "support/AudioFixtures.h"
#include "support/RunTool.h"
#include "support/TemporaryFolder.h"

#include <cmath>
#include <filesystem>
#include <map>
#include <numbers>
#include <set>

#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using namespace contentdb;
using testing::Contains;
using testing::HasSubstr;
using testing::Not;
using testing::Pair;
using testing::UnorderedElementsAre;

constexpr const char* kPatchXml =
    "<Patch><Channels><Channel type='Instrument'><Plugins>"
    "<Plugin name='Space Designer' bypassed='0'/></Plugins></Channel></Channels></Patch>";

std::string loop() {
    const Wav wav;
    return wav.file(wav.format() + wav.acid(2, 57, 8, 122) + wav.data(40000));
}

class Describing : public testing::Test {
  protected:
    IndexedItem describe(const std::string& path,
                         std::uint64_t services = optionsForAllTaggingServices()) const {
        Error error;
        const auto item = ContentDescriber(services).describe(path, &error);
        EXPECT_TRUE(item) << error.message();
        return item.value_or(IndexedItem{});
    }

    static void tag(const std::string& path, std::string_view category, std::string_view label) {
        const URL url = URL::fileURLWithPath(path);
        const auto tag = TGRTTaxonomy::mutableDefaultTaxonomy()->findOrCreateTagWithLabel(
            std::string(label), std::string(category));
        Error error;
        EXPECT_TRUE(TGRTFileNode::nodeWithFileURL(url)->taggingWriterForFileURL(url)->writeTaggings(
            {TGRTTagging::initWithTag(tag, nullptr)}, url, &error))
            << error.message();
    }

    /// One item of each kind, with its content apart from the record.
    std::map<std::string, std::string> writeItems() const {
        const Wav wav;
        folder_.write("Warm Pad.patch/#Root.cst", "channel strip");
        folder_.write("Warm Pad.patch/org.qvcontenttagging.intermediate.cache.xml", kPatchXml);
        folder_.write("Song.ostrax/Resources/Media/Kick.wav", wav.file(wav.format() + wav.data()));
        const std::map<std::string, std::string> items = {
            {folder_.write("House/Dark Kick 122bpm.wav", loop()), ""},
            {folder_.write("Snare.aif", Aiff::file(Aiff::common() + Aiff::sound())), ""},
            {folder_.write("Long.caf", Caf::file(Caf::description() + Caf::data(200000))), ""},
            {folder_.write("Lead.vcp", "<synth>\nCutoff = 3\n</synth>\n"), ""},
            {folder_.write("Vocal.cst", "settings"), ""},
            {folder_.path("Warm Pad.patch"), "/#Root.cst"},
            {folder_.path("Song.ostrax"), "/Resources/Media/Kick.wav"}};
        return items;
    }

    TemporaryFolder folder_;
};

TEST_F(Describing, KeepsTheNameOfTheFileBesideTheTitleOfItsRecord) {
    const std::string path = folder_.write("House/Dark Kick 122bpm.wav", loop());
    EXPECT_EQ(describe(path).title, "");
    for (const std::string title : {"Automated Build", "Dark Kick 122bpm"}) {
        const URL url = URL::fileURLWithPath(path);
        const auto record = TGRTMetaData::init();
        record->setDisplayName(title);
        ASSERT_TRUE(TGRTFileNode::nodeWithFileURL(url)->metaDataWriterForFileURL(url)->writeMetaData(
            record, url, nullptr));
        const IndexedItem item = describe(path);
        EXPECT_EQ(item.name, "Dark Kick 122bpm");
        EXPECT_EQ(item.title, title == item.name ? "" : title);
    }
}

TEST_F(Describing, TellsWhereATaggingComesFrom) {
    const std::string path = folder_.write("House/Dark Kick 122bpm.wav", loop());
    tag(path, "My Moods", "Misty");
    std::map<std::string, std::pair<Provenance, std::string>> origins;
    std::map<std::string, std::vector<std::string>> ancestors;
    for (const IndexedTagging& tagging : describe(path).taggings) {
        origins[tagging.label] = {tagging.provenance, tagging.service};
        ancestors[tagging.label] = tagging.ancestors;
    }
    EXPECT_THAT(origins, Contains(Pair("Misty", Pair(Provenance::stored, ""))));
    EXPECT_THAT(origins, Contains(Pair("A", Pair(Provenance::virtualTag, ""))));
    EXPECT_THAT(origins, Contains(Pair("Kick", Pair(Provenance::automatic, "names"))));
    EXPECT_THAT(origins, Contains(Pair("Audio Loop", Pair(Provenance::automatic, "content-type"))));
    EXPECT_THAT(ancestors["A"], testing::ElementsAre("Key"));
    EXPECT_THAT(ancestors["House"], Contains("Electronic Music"));
}

TEST_F(Describing, HasWhatObjectAndAggregatorSayAndNoMore) {
    constexpr std::uint64_t kExactServices = optionsForAllTaggingServices() & ~QVCTAutoTaggingOptionNames;
    using Said = std::set<std::tuple<std::string, std::string, float>>;
    const auto said = [](const ObjectSet<TGRTTagging>& taggings) {
        Said result;
        for (const auto& tagging : taggings)
            result.emplace(tagging->label(), tagging->category(),
                           tagging->level() ? tagging->level()->weight() : -1);
        return result;
    };
    const auto aggregator = QVTaggingAggregator::defaultTaggingAggregator();
    std::set<std::string> services;
    for (const auto& [path, content] : writeItems()) {
        const URL url = URL::fileURLWithPath(path);
        tag(path, "Genres", "House");
        const auto object = TGRTIndexableContentObject::indexableContentObjectForURL(url, 0x104);
        Said expected = said(object->taggingDatas());
        expected.merge(said(
            aggregator->taggingsWithContentsOfURL(url, *TGRTTaxonomy::defaultTaxonomy(), kExactServices)));
        const IndexedItem item = describe(path, kExactServices);
        Said found;
        for (const IndexedTagging& tagging : item.taggings) {
            EXPECT_TRUE(found.emplace(tagging.label, tagging.category, tagging.level.value_or(-1)).second)
                << path << " twice: " << tagging.label;
            services.insert(tagging.service);
        }
        EXPECT_EQ(found, expected) << path;
        EXPECT_EQ(item.fileType, object->fileType()) << path;
        EXPECT_EQ(item.previewAvailable, object->previewAvailable()) << path;
    }
    EXPECT_THAT(services, testing::IsSupersetOf({"", "keywords", "content-type", "user"}));
}

TEST_F(Describing, AsksNoServiceButTheNamed) {
    const std::string path = folder_.write("House/Dark Kick.wav", loop());
    std::set<std::string> services;
    for (const IndexedTagging& tagging : describe(path, QVCTAutoTaggingOptionContentType).taggings)
        services.insert(tagging.service);
    EXPECT_THAT(services, UnorderedElementsAre("", "content-type"));
}

TEST_F(Describing, GivesValuesThatAreKnown) {
    const Wav wav;
    const struct {
        std::string name;
        std::string bytes;
        std::map<std::string, double> values;
    } cases[] = {{"acid 99bpm.wav",
                  wav.file(wav.format() + wav.acid(2, 57, 8, 122) + wav.data(44100 * 4)),
                  {{"Tempo", 122},
                   {"BeatCount", 8},
                   {"MidiRootNote", 57},
                   {"SignatureTop", 3},
                   {"SignatureBottom", 4}}},
                 {"86.6 in single precision.wav",
                  wav.file(wav.format() + wav.acid(0, 60, 7, 86.6F) + wav.data()),
                  {{"Tempo", 86.6}, {"BeatCount", 7}, {"SignatureTop", 3}, {"SignatureBottom", 4}}},
                 {"Kick 122bpm.wav", wav.file(wav.format() + wav.data()), {{"Tempo", 122}}},
                 {"Kick_97.5 BPM_A.wav", wav.file(wav.format() + wav.data()), {{"Tempo", 97.5}}},
                 {"Beat 2 bars.wav", wav.file(wav.format() + wav.data()), {{"BeatCount", 8}}},
                 {"Kick 1122bpm.wav", wav.file(wav.format() + wav.data()), {}},
                 {"Kick 120bpmx.wav", wav.file(wav.format() + wav.data()), {}},
                 {"empty.wav", wav.file(wav.format() + wav.data(0)), {}}};
    for (const auto& [name, bytes, expected] : cases) {
        std::map<std::string, double> values;
        constexpr std::uint64_t kAllButSound = optionsForAllTaggingServices() & ~QVCTAutoTaggingOptionSound;
        for (const IndexedValue& value : describe(folder_.write(name, bytes), kAllButSound).values)
            values[value.key] = std::get<double>(value.value);
        EXPECT_EQ(values.erase("LengthInSeconds"), name == "empty.wav" ? 0U : 1U) << name;
        values.erase("TavioLoopType");
        values.erase("KeyType");
        for (const auto& [key, value] :
             {std::pair(kSampleRateKey, 44100.0), {kBitDepthKey, 16}, {kChannelCountKey, 2}}) {
            EXPECT_EQ(values[std::string(key)], value) << name;
            values.erase(std::string(key));
        }
        EXPECT_EQ(values, expected) << name;
    }
}

TEST_F(Describing, KeepsWhatIsHeard) {
    constexpr double kRate = 44100;
    const Wav wav;
    std::string bytes;
    for (int i = 0; i < 22050; ++i) {
        const double decay = std::exp(-4 * i / kRate);
        double sample = 0;
        for (int partial = 1; partial <= 8; ++partial)
            sample += std::sin(2 * std::numbers::pi * 110 * partial * i / kRate) / partial;
        bytes += wav.number(static_cast<std::uint64_t>(std::lround(12000 * decay * sample)), 2);
    }
    const std::string path =
        folder_.write("untitled 7.wav", wav.file(wav.format(1) + wav.chunk("data", bytes)));
    std::map<std::string, double> values;
    for (const IndexedValue& value : describe(path).values)
        if (const auto* number = std::get_if<double>(&value.value)) values[value.key] = *number;
    EXPECT_EQ(values["Note"], 45);
    EXPECT_NEAR(values["Cents"], 0, 3);
    EXPECT_LT(values["Noisiness"], 0.5);
    EXPECT_NEAR(values["TruePeak"], 20 * std::log10(12000 * 1.85 / 32768), 1.5);
    for (const char* key :
         {"Brightness", "Warmth", "Hardness", "Roughness", "Height", "Width", "Complexity"}) {
        ASSERT_TRUE(values.contains(key)) << key;
        EXPECT_TRUE(values[key] >= 0 && values[key] <= 1) << key;
    }
}

TEST_F(Describing, HashesTheContentAndNotTheRecord) {
    std::set<std::string> hashes;
    for (const auto& [path, content] : writeItems()) {
        const std::string before = describe(path).payloadHash;
        EXPECT_EQ(before.size(), 16U) << path;
        EXPECT_TRUE(hashes.insert(before).second) << path;
        tag(path, "Genres", "House");
        EXPECT_EQ(describe(path).payloadHash, before) << path;
        tag(path, "Genres", "Jazz");
        EXPECT_EQ(describe(path).payloadHash, before) << path;
        const std::filesystem::path moved =
            folder_.path("elsewhere") / std::filesystem::path(path).filename();
        std::filesystem::create_directories(moved.parent_path());
        std::filesystem::rename(path, moved);
        EXPECT_EQ(describe(moved.string()).payloadHash, before) << path;

        std::string bytes = readAll(moved.string() + content);
        const std::size_t sound = bytes.find(noise(64));
        const std::size_t at = sound != std::string::npos ? sound + 40 : bytes.find_first_of("3s");
        bytes[at] = static_cast<char>(bytes[at] + 1);
        std::ofstream(moved.string() + content, std::ios::binary) << bytes;
        EXPECT_NE(describe(moved.string()).payloadHash, before) << path;
    }
}

TEST_F(Describing, HashesTheEndOfALongSoundAndItsNotes) {
    const Wav wav;
    std::string data = noise(300000);
    const auto hashOf = [&] {
        return describe(folder_.write("a.wav", wav.file(wav.format() + wav.chunk("data", data)))).payloadHash;
    };
    const std::string whole = hashOf();
    data.back() = static_cast<char>(data.back() ^ 1);
    const std::string changed = hashOf();
    EXPECT_NE(changed, whole);
    data += "longer";
    EXPECT_NE(hashOf(), changed);
    const auto withNotes = [&](const std::string& midi) {
        return describe(folder_.write("b.caf",
                                      Caf::file(Caf::description() + Caf::data() + Caf::chunk("midi", midi))))
            .payloadHash;
    };
    EXPECT_NE(withNotes(emptyMidi()), withNotes(emptyMidi() + "more"));
}

TEST_F(Describing, HashesABundleWhateverTheOrderOfItsFolder) {
    // The files of a folder in memory come in the order in which they were made.
    const std::string memory = "/dev/shm";
    const TemporaryFolder folder(std::filesystem::is_directory(memory) ? memory : folder_.path());
    for (const std::string names : {"ab", "ba"}) {
        for (const char name : names)
            folder.write(names + ".patch/" + name, std::string("settings of ") + name);
    }
    EXPECT_EQ(describe(folder.path("ab.patch")).payloadHash, describe(folder.path("ba.patch")).payloadHash);
}

TEST_F(Describing, IsAnotherWithOtherServicesAndOtherFiles) {
    std::set<std::uint64_t> digests = {ContentDescriber::digest(0), ContentDescriber::digest(1)};
    for (const char* bytes : {"1;", "2;"}) {
        const std::string script = folder_.write("script.js", bytes);
        for (const char* name : {"QVSearchKit", "ExtractSoftwareInstrumentsRule"}) {
            ResourceBundle::setPathForResource(name, "js", script);
            digests.insert(ContentDescriber::digest(0));
            ResourceBundle::setPathForResource(name, "js", std::nullopt);
        }
    }
    EXPECT_EQ(digests.size(), 6U);
}

TEST_F(Describing, SaysWhyAnItemCannotBeRead) {
    folder_.write("b.cst", "settings");
    folder_.write("b.cst.plist", "<plist><dict><key>");
    folder_.write("c.patch/tags.plist", "bplist00 and no more");
    const std::pair<std::string, std::string> cases[] = {{folder_.write("a.wav", "RIFF"), "a.wav"},
                                                         {folder_.path("b.cst"), "b.cst.plist"},
                                                         {folder_.path("c.patch"), "tags.plist"},
                                                         {folder_.path("none.aif"), "none.aif"}};
    for (const auto& [path, place] : cases) {
        Error error;
        EXPECT_FALSE(ContentDescriber().describe(path, &error)) << path;
        EXPECT_THAT(error.message(), HasSubstr(place));
    }
}

}  // namespace
}  // namespace qvct::test

#include "listening/instrument/SoundFeatures.h"
#include "platform/files/ResourceBundle.h"
#include "resources/DefaultListeningModels.h"
#include "resources/EmbeddedFiles.h"
#include "support/CapturedLog.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <functional>
#include <numbers>
#include <random>
#include <tuple>

#include <gmock/gmock.h>

namespace qvct {
namespace {

constexpr double kRate = 44100;

using Wave = std::function<double(double seconds, double noise)>;

std::optional<InstrumentJudgement> judged(const Wave& wave, double seconds) {
    std::mt19937 random(11);
    std::normal_distribution<double> noise(0, 0.3);
    std::vector<float> samples(static_cast<std::size_t>(seconds * kRate));
    for (std::size_t i = 0; i < samples.size(); ++i)
        samples[i] = static_cast<float>(0.5 * wave(static_cast<double>(i) / kRate, noise(random)));
    return defaultInstrumentModel()->judge(SoundFeatures(kRate).of(samples));
}

double sine(double turns) {
    return std::sin(2 * std::numbers::pi * turns);
}

TEST(DefaultInstrumentModel, KnowsPlainDrums) {
    std::array<double, 2> before{};
    const auto high =
        [&before](double noise) {  // what a line through the two samples before does not foretell
            const double bend = noise - 2 * before[0] + before[1];
            before = {noise, before[0]};
            return bend;
        };
    const struct {
        const char* label;
        const char* detail;
        double seconds;
        Wave wave;
    } rows[] = {
        {"Kick", "", 0.5,
         [](double t, double) { return sine(50 * t + 4 * (1 - std::exp(-t * 40))) * std::exp(-t * 9); }},
        {"Snare", "", 0.4,
         [](double t, double noise) {
             return 0.5 * sine(190 * t) * std::exp(-t * 25) + noise * std::exp(-t * 18);
         }},
        {"Hi-Hat", "closed", 0.15, [&](double t, double noise) { return high(noise) * std::exp(-t * 60); }},
    };
    for (const auto& [label, detail, seconds, wave] : rows) {
        const auto found = judged(wave, seconds);
        ASSERT_TRUE(found) << label;
        EXPECT_EQ(found->label, label);
        EXPECT_EQ(found->detail, detail) << label;
        EXPECT_GT(found->confidence, 0.5) << label;
    }
}

TEST(DefaultInstrumentModel, SaysNothingOfSilence) {
    EXPECT_FALSE(judged([](double, double) { return 0; }, 1));
}

TEST(DefaultInstrumentModel, SaysLabelsOfTheTaxonomy) {
    const auto model = defaultInstrumentModel();
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    for (std::size_t i = 0; i < model->classes(); ++i)
        EXPECT_NE(taxonomy->findTagForLabel(model->label(i)), nullptr) << model->label(i);
}

TEST(DefaultListeningModels, PlaceTheSameSoundTogetherHoweverItIsRecorded) {
    const auto model = defaultLikenessModel();
    const auto placed = [&](double hertz, double decay, double noisiness, double gain, double rate,
                            double silence) {
        std::mt19937 random(11);
        std::normal_distribution<double> noise(0, 0.3);
        std::vector<float> samples(static_cast<std::size_t>(0.5 * rate));
        for (std::size_t i = 0; i < samples.size(); ++i) {
            const double time = static_cast<double>(i) / rate - silence;
            if (time > 0)
                samples[i] = static_cast<float>(gain * std::exp(-decay * time) *
                                                (sine(hertz * time) + noisiness * noise(random)));
        }
        return *model->of(SoundFeatures(rate).of(samples));
    };
    const std::tuple<double, double, double> sounds[] = {
        {50, 9, 0}, {190, 18, 1}, {440, 4, 0}, {2000, 40, 0.2}, {110, 2, 0.1}};
    for (std::size_t i = 0; i < std::size(sounds); ++i) {
        const auto [hertz, decay, noisiness] = sounds[i];
        const SoundLikeness copies[] = {placed(hertz, decay, noisiness, 0.1, kRate, 0),
                                        placed(hertz, decay, noisiness, 0.8, 48000, 0),
                                        placed(hertz, decay, noisiness, 0.8, kRate, 0.1)};
        for (const SoundLikeness& copy : copies) {
            std::vector<int> distances;
            for (const auto& [otherHertz, otherDecay, otherNoisiness] : sounds)
                distances.push_back(
                    squaredDistance(copy, placed(otherHertz, otherDecay, otherNoisiness, 0.8, kRate, 0)));
            const auto nearest = std::min_element(distances.begin(), distances.end());
            EXPECT_EQ(static_cast<std::size_t>(nearest - distances.begin()), i);
        }
    }
    EXPECT_FALSE(model->of(SoundFeatures(kRate).of(std::vector<float>(10000))));
    EXPECT_EQ(model->cells(), 1024U);
}

TEST(DefaultListeningModels, AreReplacedByAFileUnlessThatIsBroken) {
    const test::TemporaryFolder folder;
    ResourceBundle::setDirectory(folder.path());
    std::string bytes(reinterpret_cast<const char*>(InstrumentModel_bin), InstrumentModel_bin_len);
    bytes.replace(bytes.find("Kick"), 4, "Bump");
    bytes.replace(bytes.find("Kick"), 4, "Bump");
    folder.write("InstrumentModel.bin", bytes);
    EXPECT_EQ(defaultInstrumentModel()->label(0), "Bump");

    std::string likeness(reinterpret_cast<const char*>(LikenessModel_bin), LikenessModel_bin_len);
    likeness.replace(likeness.size() - SoundLikeness::kSize, SoundLikeness::kSize, SoundLikeness::kSize, 127);
    folder.write("LikenessModel.bin", likeness);
    SoundLikeness corner;
    corner.coordinates.fill(127);
    EXPECT_EQ(defaultListeningModels().likeness->nearestCell(corner), 1023);

    const test::CapturedLog log;
    bytes.pop_back();
    folder.write("InstrumentModel.bin", bytes);
    EXPECT_EQ(defaultInstrumentModel()->label(0), "Kick");
    ResourceBundle::setDirectory("");
    EXPECT_THAT(log.messages(),
                testing::ElementsAre(testing::AllOf(testing::HasSubstr("InstrumentModel.bin"),
                                                    testing::HasSubstr("is cut off"),
                                                    testing::HasSubstr("(using the built-in one)"))));
}

}  // namespace
}  // namespace qvct

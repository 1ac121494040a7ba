#include "listening/instrument/SoundFeatures.h"
#include "listening/likeness/LikenessModel.h"
#include "listening/likeness/LoopLikeness.h"
#include "resources/DefaultListeningModels.h"

#include <cmath>
#include <numbers>
#include <string_view>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using Samples = std::vector<float>;
constexpr double kRate = 44100;
constexpr std::size_t kStep = 8820;  // samples from stroke to stroke

// A stroke for each letter, a loud one for a capital: k is low, h is high, anything else a rest.
struct Loop {
    Samples samples;
    std::vector<Onset> onsets;

    explicit Loop(std::string_view strokes) : samples(strokes.size() * kStep) {
        for (std::size_t i = 0; i < strokes.size(); ++i) {
            const char letter = strokes[i];
            const bool isLoud = letter == 'K' || letter == 'H';
            if (!isLoud && letter != 'k' && letter != 'h') continue;
            const double hertz = letter == 'k' || letter == 'K' ? 60 : 7000, level = isLoud ? 0.8 : 0.2;
            onsets.push_back({static_cast<std::int64_t>(i * kStep), static_cast<float>(level)});
            for (std::size_t k = 0; k < kStep; ++k) {
                const double time = static_cast<double>(k) / kRate;
                samples[i * kStep + k] = static_cast<float>(level * std::exp(-20 * time) *
                                                            std::sin(2 * std::numbers::pi * hertz * time));
            }
        }
    }
    std::optional<SoundLikeness> place() const { return placeWith(onsets); }
    std::optional<SoundLikeness> placeWith(const std::vector<Onset>& its) const {
        static SoundFeatures features(kRate);
        return likenessOfLoop(samples, kRate, its, features, *defaultLikenessModel());
    }
};

TEST(LoopLikeness, IsTheMiddleOfTheLoudestStrokes) {
    const struct {
        std::string_view one, other;
        bool isSame;
    } rows[] = {
        {"K", "KKKK", true},                     // equal strokes have one place
        {"KHKH", "HKHK", true},                  // in any order
        {"KHKH", "K.H.K.H.", true},              // at any tempo
        {"KKKKKK", "KKKKKKhh", true},            // softer ones than the six loudest do not count
        {"KKKKKK", "hhKKKKKK", true},            // wherever they are
        {"KKKKK", "KKKKKh", false},              // up to six do
        {"KKKK", "HHHH", false},                 //
        {"K", "KH", false},                      // not the first one alone
        {"KKKKKKHHHHHH", "KKKKKK......", true},  // of equally loud ones the first
    };
    for (const auto& [one, other, isSame] : rows)
        EXPECT_EQ(Loop(one).place() == Loop(other).place(), isSame) << one << ' ' << other;
    const auto low = *Loop("K").place(), high = *Loop("H").place(), both = *Loop("KH").place();
    for (std::size_t i = 0; i < SoundLikeness::kSize; ++i)
        EXPECT_NEAR(both.coordinates[i], (low.coordinates[i] + high.coordinates[i]) / 2.0, 0.51) << i;
}

TEST(LoopLikeness, TakesOnsetsAsTheyAre) {
    const Loop loop("KH");
    const auto first = Loop("K").place();
    const struct {
        const char* what;
        std::vector<Onset> onsets;
        bool isFirst;
    } rows[] = {
        {"none", {}, true},
        {"behind the end", {{2 * kStep + 5, 1}}, true},
        {"before the beginning", {{-7, 1}, {kStep, 0}}, false},
        {"one that is cut off at once",
         {{0, 1}, {kStep, 0.5F}, {kStep + 3, 0.5F}, {2 * kStep - 9, 1}},
         false},
        {"not ascending", {{kStep, 1}, {0, 1}}, true},
    };
    for (const auto& [what, onsets, isFirst] : rows) {
        const auto place = loop.placeWith(onsets);
        ASSERT_TRUE(place) << what;
        EXPECT_EQ(place == first, isFirst) << what;
    }
    EXPECT_EQ(loop.placeWith({{-7, 1}, {kStep, 0}}), loop.placeWith({{0, 1}, {kStep, 0}}));
    // Two strokes, the second one late, among some of a few samples.
    EXPECT_EQ(loop.placeWith({{0, 1}, {kStep, 1}, {kStep + 5, 2}, {kStep + 7, 2}, {9 * kStep, 3}}),
              loop.placeWith({{0, 1}, {kStep + 7, 2}}));
    EXPECT_FALSE(Loop("...").place());
    EXPECT_FALSE(Loop("...").placeWith({{0, 1}, {kStep, 1}}));
    EXPECT_FALSE(Loop("").place());
    EXPECT_TRUE(Loop("..K").placeWith({{0, 1}, {2 * kStep, 1}}) == first) << "a silent stroke";
}

}  // namespace
}  // namespace qvct

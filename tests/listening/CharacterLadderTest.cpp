// The scales of character, by sounds whose order is known from how they are made.
#include "Waves.h"

#include <ostream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

namespace qvct {
namespace {

using namespace waves;

struct Ladder {
    std::string name;
    CharacterScale scale;
    std::vector<Samples> rungs;  // each is to lie higher on the scale than the one before
};

void PrintTo(const Ladder& ladder, std::ostream* out) {
    *out << ladder.name;
}

std::vector<Ladder> ladders() {
    const Wave chord = sawtooth(262) + sawtooth(330) + sawtooth(392);
    const auto detuned = [](double cents) {
        return sampled(sawtooth(220) + sawtooth(220 * std::exp2(cents / 1200)));
    };
    const auto swinging = [](double depth) {
        return sampled(sine(1000) * ([=](double time) { return 1 + sine(70, depth)(time); }));
    };
    const auto filtered = [](double hertz) { return lowPassed(noise(1), hertz); };
    const auto arriving = [](double seconds) { return sampled(sawtooth(220) * fadingIn(seconds)); };
    const auto bassArriving = [](double seconds) { return sampled(sine(60) * fadingIn(seconds)); };
    const auto hiss = [](float gain) { return mixed(sampled(sawtooth(220)), 1, noise(2), gain); };
    using Scale = CharacterScale;
    return {
        {"low-pass darkens",
         Scale::kBrightDark,
         {noise(1), filtered(5000), filtered(2000), filtered(800), filtered(300)}},
        {"low-pass warms",
         Scale::kColdWarm,
         {noise(1), filtered(5000), filtered(2000), filtered(800), filtered(300)}},
        {"faster attacks are harder",
         Scale::kSoftHard,
         {arriving(0.4), arriving(0.1), arriving(0.03), arriving(0.01), arriving(0.001)}},
        {"no attack in each period of a low tone",
         Scale::kSoftHard,
         {bassArriving(0.3), bassArriving(0.1), bassArriving(0.03)}},
        {"brighter attacks are harder",
         Scale::kSoftHard,
         {filtered(300), filtered(1000), filtered(4000), noise(1)}},
        {"detuned copies roughen",
         Scale::kSmoothRough,
         {sampled(sawtooth(220)), detuned(10), detuned(20), detuned(40)}},
        {"a swinging amplitude roughens",
         Scale::kSmoothRough,
         {sampled(sine(1000)), swinging(0.3), swinging(0.6), swinging(1)}},
        {"hiss takes the tone away",
         Scale::kTonalNonTonal,
         {sampled(sawtooth(220)), hiss(0.03F), hiss(0.1F), hiss(0.3F), hiss(1), noise(2)}},
        {"octaves of a sine",
         Scale::kLowHigh,
         {sampled(sine(55)), sampled(sine(110)), sampled(sine(220)), sampled(sine(440)), sampled(sine(880)),
          sampled(sine(1760)), sampled(sine(3520))}},
        {"octaves of a sawtooth",
         Scale::kLowHigh,
         {sampled(sawtooth(55)), sampled(sawtooth(110)), sampled(sawtooth(220)), sampled(sawtooth(440)),
          sampled(sawtooth(880))}},
        {"more partials",
         Scale::kSimpleComplex,
         {sampled(sine(262)), sampled(sine(262) + sine(392)), sampled(sine(262) + sine(330) + sine(392)),
          sampled(sawtooth(262)), sampled(chord), noise(3)}},
    };
}

class CharacterLadderTest : public testing::TestWithParam<Ladder> {};

TEST_P(CharacterLadderTest, EachRungIsHigher) {
    const Ladder& ladder = GetParam();
    double before = -1;
    for (const Samples& rung : ladder.rungs) {
        const double level = (*characterOf(rung))[ladder.scale].level;
        EXPECT_GT(level, before + 0.002) << &rung - ladder.rungs.data();
        EXPECT_LE(level, 1);
        before = level;
    }
}

INSTANTIATE_TEST_SUITE_P(Character, CharacterLadderTest, testing::ValuesIn(ladders()));

}  // namespace
}  // namespace qvct

#pragma once

#include <array>
#include <cstddef>
#include <string_view>

namespace qvct {

/// The bipolar scales of a sound's character: the first word is the pole at level 0, the second that at 1.
enum class CharacterScale {
    kBrightDark,
    kColdWarm,
    kSoftHard,
    kSmoothRough,
    kTonalNonTonal,
    kLowHigh,
    kNarrowWide,
    kSimpleComplex,
};

inline constexpr std::size_t kCharacterScales = 8;

constexpr CharacterScale characterScale(std::size_t index) {
    return static_cast<CharacterScale>(index);
}
constexpr std::size_t indexOf(CharacterScale scale) {
    return static_cast<std::size_t>(scale);
}

/// "Bright / Dark".
std::string_view nameOf(CharacterScale scale);
/// What is measured, with its unit: "sharpness, acum".
std::string_view measureOf(CharacterScale scale);

/// The levels between which the curve of each scale is straight: where that share of many sounds lies below.
inline constexpr std::array<double, 13> kCharacterShares = {0,   0.02, 0.1, 0.2, 0.3,  0.4, 0.5,
                                                            0.6, 0.7,  0.8, 0.9, 0.98, 1};

/// Where a measure lies between the poles, from 0 to 1: monotone, and such that the sounds of ordinary
/// libraries spread evenly.
///
/// The ends are those of what can be measured. docs/character.md has the table and says which sounds it is
/// from.
double levelOf(CharacterScale scale, double measure);

}  // namespace qvct

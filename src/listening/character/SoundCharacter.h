#pragma once

#include "listening/character/CharacterScale.h"

#include <array>
#include <memory>
#include <optional>
#include <span>

namespace qvct {

/// The character of a sound on each of the eight scales.
struct SoundCharacter {
    struct Value {
        double measure;  ///< in its own unit (`measureOf`)
        double level;    ///< 0 to 1 (`levelOf`)
    };

    const Value& operator[](CharacterScale scale) const { return values[indexOf(scale)]; }

    std::array<Value, kCharacterScales> values;
};

/// Measures the character of sounds: of their first 10 s.
///
/// Louder or softer changes nothing. Rates differ only by what they can hold. docs/character.md tells what
/// each scale measures, and how well.
///
/// @cost  For a sound of half a second about 100 us, for 10 s about 2 ms; the first sound of another rate
/// than
///        the one before takes 50 us more. One meter serves one thread.
class CharacterMeter {
  public:
    CharacterMeter();
    ~CharacterMeter();

    /// Nothing for silence, a constant, less than a millisecond, and rates below 2 kHz. `mono` is the mix of
    /// both channels; those of a sound that has one channel are the same span. All samples are finite and
    /// within 16 times full scale. REQUIRES: spans of the same length, 1 <= sampleRate <= 64,000.
    std::optional<SoundCharacter> measure(std::span<const float> left, std::span<const float> right,
                                          std::span<const float> mono, double sampleRate);

  private:
    struct Tables;

    std::unique_ptr<Tables> tables_;  // of the last rate
};

}  // namespace qvct

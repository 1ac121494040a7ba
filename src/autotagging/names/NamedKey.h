#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

namespace qvct {

class NamingHabits;
struct NamePiece;

/// A key or note that the pieces of a name spell.
struct NamedKey {
    enum class Mode : std::uint8_t { unsaid, major, minor };

    int tonic = 0;  ///< Semitones above C, 0 to 11.
    Mode mode = Mode::unsaid;
    bool hasAccidental = false;
    bool isCamelot = false;
    bool hasOctave = false;     ///< "A2", "C#3": a note of a scale, and no key.
    bool isSpelledOut = false;  ///< The mode is a word ("A minor", "Amin"), not a letter.
    std::size_t pieces = 0;     ///< So many it takes.
    std::uint32_t offset = 0;   ///< In the name, in bytes.
    std::uint32_t end = 0;
};

/// The key that begins with the first piece: "A", "Bb", "C#m", "F# minor", "Ebmaj", "A_min", "a moll", "E
/// harmonic minor", "8A". Nothing when no key is spelled there. Whether one can stand there is not judged.
std::optional<NamedKey> namedKeyAt(std::span<const NamePiece> pieces, const NamingHabits& habits);

}  // namespace qvct

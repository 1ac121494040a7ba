#pragma once

#include "autotagging/names/KeyChoice.h"
#include "autotagging/names/NamePieces.h"

#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace qvct {

struct NameReading;

/// A number of a name that may be a tempo.
struct ScannedTempo {
    double number;
    bool isSaid;        ///< "bpm" stands beside it.
    bool isPartOfWord;  ///< "TR808", "drm80"
    std::size_t end;    ///< The piece behind it.
};

/// What else the name says that lets a number be a tempo, or not.
struct TempoContext {
    std::string_view name;
    std::span<const NamePiece> pieces;
    std::span<const ScannedKey> keys;
    bool isItem = false;  ///< It is no folder's.
    bool isLoop = false;  ///< It says so, or what stands around it does.
    bool isOneShot = false;
    bool isPassage = false;   ///< Music that is played, which has a tempo as a loop has: "Melody 120".
    bool hasPitched = false;  ///< Some word is of something with a pitch.
};

/// The tempo that a name states; nothing when no number can be one where it stands, or several can.
std::optional<double> chosenTempo(std::span<const ScannedTempo> tempos, const TempoContext& context);

/// The numbers that can be a tempo without a word that says so, as dance and film music has them.
std::vector<double> lonelyTempos(std::span<const ScannedTempo> tempos);

/// A tempo at which a sound is so many beats long.
struct FittingTempo {
    double tempo;
    int beats;
};

/// The one of the numbers in a name that is its tempo, as far as the length of the sound tells: at it the
/// sound has the bars or beats that the name states, to within 1 %, or else 2, 4, 8 or 16 bars of four beats,
/// to within 0.5 %, since many a number fits some length by chance. Nothing when none fits, or several.
std::optional<FittingTempo> tempoThatFits(const NameReading& reading, double seconds);

}  // namespace qvct

#pragma once

#include <optional>

namespace qvct {

struct NameReading;

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

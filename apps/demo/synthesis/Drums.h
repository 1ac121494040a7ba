#pragma once

#include "demo/synthesis/Synthesis.h"

namespace qvct::demo {

enum class Drum {
    kick,
    snare,
    clap,
    rim,
    closedHat,
    openHat,
    ride,
    crash,
    lowTom,
    highTom,
    cowbell,
    shaker,
    tambourine,
    bongo,
    conga
};

/// The character that a kit gives to each of its drums.
enum class Kit { acoustic, house, techno, boomBap, loFi };

/// One hit, as loud as the drum is among the others of its kit; the kick peaks at 1.
Signal drumHit(Drum drum, Kit kit, int rate);

}  // namespace qvct::demo

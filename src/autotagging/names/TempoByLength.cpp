#include "autotagging/names/TempoByLength.h"

#include "autotagging/names/NameReader.h"

#include <algorithm>
#include <cmath>
#include <vector>

namespace qvct {
namespace {

std::vector<int> likelyBeats(const NameReading& reading) {
    if (reading.beats) return {*reading.beats};
    constexpr int beatsOfWaltz = 3;
    if (reading.bars) return {*reading.bars * kUsualBeatsOfBar, *reading.bars * beatsOfWaltz};
    return {8, 16, 32, 64};
}

}  // namespace

std::optional<FittingTempo> tempoThatFits(const NameReading& reading, double seconds) {
    const bool isSaid = reading.beats || reading.bars;
    const double tolerance = isSaid ? 0.01 : 0.005;
    const std::vector<int> likely = likelyBeats(reading);
    std::optional<FittingTempo> found;
    for (const double tempo : reading.possibleTempos) {
        const double beats = seconds * tempo / 60;
        const auto fitting = std::find_if(likely.begin(), likely.end(), [&](int count) {
            return std::abs(beats - count) <= tolerance * count;
        });
        if (fitting == likely.end()) continue;
        if (found && found->tempo != tempo) return std::nullopt;
        found = {tempo, *fitting};
    }
    return found;
}

}  // namespace qvct

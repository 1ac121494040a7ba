#include "autotagging/names/TempoChoice.h"

#include "autotagging/names/NameReader.h"

#include <algorithm>
#include <cmath>
#include <vector>

namespace qvct {
namespace {

bool canStandAlone(double tempo) {
    constexpr double slowest = 60, fastest = 190;
    return tempo >= slowest && tempo <= fastest;
}

class TempoChoice {
  public:
    TempoChoice(std::span<const ScannedTempo> tempos, const TempoContext& context)
        : tempos_(tempos), its_(context) {}

    std::optional<double> tempo() const {
        const auto isSaid = [](const ScannedTempo& tempo) { return tempo.isSaid; };
        if (std::any_of(tempos_.begin(), tempos_.end(), isSaid)) return onlyOne(isSaid);
        if (its_.isOneShot) return std::nullopt;
        const bool hasSureKey = std::any_of(its_.keys.begin(), its_.keys.end(),
                                            [this](const ScannedKey& key) { return isSure(key); });
        if (!its_.isLoop && !hasSureKey && !its_.isPassage) return std::nullopt;
        const auto isAlone = [](const ScannedTempo& tempo) {
            return !tempo.isPartOfWord && canStandAlone(tempo.number);
        };
        if (std::any_of(tempos_.begin(), tempos_.end(), isAlone)) return onlyOne(isAlone);
        if (!its_.isItem || !(its_.isLoop || hasSureKey)) return std::nullopt;
        // "Loop124", but no "Loop64" and no "SH101 Loop".
        return onlyOne([](const ScannedTempo& tempo) {
            constexpr double slowest = 111;
            return tempo.number >= slowest && canStandAlone(tempo.number);
        });
    }

  private:
    template <class Condition>
    std::optional<double> onlyOne(Condition counts) const {
        std::optional<double> only;
        for (const ScannedTempo& tempo : tempos_) {
            if (!counts(tempo)) continue;
            if (only && *only != tempo.number) return std::nullopt;
            only = tempo.number;
        }
        return only;
    }

    /// More than a letter, which may be any; or a letter where packs put the key.
    bool isSure(const ScannedKey& key) const {
        const NamePiece& last = its_.pieces[key.piece + key.key.pieces - 1];
        const bool hasSignWord = key.key.hasAccidental && key.key.pieces > 1 && last.isWord();
        return key.key.mode != NamedKey::Mode::unsaid || key.key.isSpelledOut || key.isAnnounced ||
               last.kind == NamePiece::Kind::sharp || hasSignWord || isBesideNumber(key);
    }

    /// "90_Bb_Strange_Piano", "static-synth-C-138", "(96)_G"; "Bass_101_B" is the second of them.
    bool isBesideNumber(const ScannedKey& key) const {
        const char letter = its_.pieces[key.piece].text.front();
        if (letter < 'A' || letter > 'G' || (letter < 'C' && !key.key.hasAccidental)) return false;
        const std::size_t behind = key.piece + key.key.pieces;
        const auto isMark = [this](std::uint32_t at) { return its_.name[at] == '_' || its_.name[at] == '-'; };
        const std::uint32_t end = its_.pieces[behind - 1].end();
        if (key.piece == 0 || !isMark(its_.pieces[key.piece].offset - 1)) return false;
        if (end < its_.name.size() && !isMark(end)) return false;
        return std::any_of(tempos_.begin(), tempos_.end(), [&](const ScannedTempo& tempo) {
            return !tempo.isPartOfWord && (tempo.end == key.piece || tempo.end == behind + 1) &&
                   (its_.hasPitched || its_.pieces[tempo.end - 1].isInBrackets);
        });
    }

    std::span<const ScannedTempo> tempos_;
    const TempoContext& its_;
};

std::vector<int> likelyBeats(const NameReading& reading) {
    if (reading.beats) return {*reading.beats};
    constexpr int beatsOfWaltz = 3;
    if (reading.bars) return {*reading.bars * kUsualBeatsOfBar, *reading.bars * beatsOfWaltz};
    return {8, 16, 32, 64};
}

}  // namespace

std::optional<double> chosenTempo(std::span<const ScannedTempo> tempos, const TempoContext& context) {
    return TempoChoice(tempos, context).tempo();
}

std::vector<double> lonelyTempos(std::span<const ScannedTempo> tempos) {
    std::vector<double> numbers;
    for (const ScannedTempo& tempo : tempos)
        if (!tempo.isPartOfWord && canStandAlone(tempo.number)) numbers.push_back(tempo.number);
    return numbers;
}

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

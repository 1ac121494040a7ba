#pragma once

#include "Corpus.h"

#include <algorithm>
#include <cstddef>
#include <vector>

namespace qvct::bench {

/// A groove cut to whole bars, beside what it truly is.
struct GrooveLoop {
    std::vector<float> samples;  ///< Mono, kRate.
    double bpm = 0;
    int bars = 0;  ///< Without the tail.
};

/// Loops of 1, 2, 4 and 8 bars from the second bar of a groove on, as far as it goes; from the first where it
/// has no more. With a tail, the last sounds die away for 0.15 to 1 s after the last bar; else it ends with
/// the bar.
inline std::vector<GrooveLoop> loopsOf(const DrumCorpus& corpus, std::size_t number, const Setting& setting,
                                       bool hasTail) {
    const MidiSequence& groove = corpus.grooves[number];
    std::vector<GrooveLoop> loops;
    const double bpm = groove.tempos().empty() ? 120 : groove.tempos()[0].bpm;
    const double bar =
        groove.meters().empty() ? 4 : 4.0 * groove.meters()[0].numerator / groove.meters()[0].denominator;
    const double barSeconds = bar * 60 / bpm / setting.tempoFactor;
    const double played = groove.endOfNotes() / bar;
    for (const int bars : {1, 2, 4, 8}) {
        const int first = played >= bars + 1 - 0.1 ? 1 : 0;
        if (played < first + bars - 0.1) break;
        const double begin = kLead + first * barSeconds, end = begin + bars * barSeconds;
        std::vector<float> all = corpus.render(number, setting, hasTail ? end - 0.02 : end + 0.1).samples;
        // Tails of different lengths, the same in each run.
        const double tail = hasTail ? 0.15 + 0.85 * static_cast<double>(all.size() % 997) / 997 : 0;
        const auto from = static_cast<std::size_t>(begin * kRate);
        if (hasTail && all.size() <= from) continue;
        std::size_t to = static_cast<std::size_t>((end + tail) * kRate);
        if (hasTail) to = std::min(to, all.size());
        all.resize(std::max(to, from));
        loops.push_back(
            {{all.begin() + static_cast<std::ptrdiff_t>(from), all.begin() + static_cast<std::ptrdiff_t>(to)},
             bpm * setting.tempoFactor,
             bars});
    }
    return loops;
}

}  // namespace qvct::bench

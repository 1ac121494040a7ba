// How well the complexity of a rhythm heard in sound agrees with that of the notes it was rendered from: the
// correlation over loops of four bars of the grooves, for onsets of equal loudness and for accented ones.
// Usage: bench_rhythm_agreement [tuning]
#include "Corpus.h"
#include "Measure.h"
#include "listening/onsets/OnsetDetector.h"
#include "listening/rhythm/LoopRhythm.h"
#include "listening/rhythm/QVCTMidiAnalysis.h"

#include <cmath>
#include <string_view>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

constexpr std::int32_t kBeats = 16;

struct Pair {
    double fromMidi, fromSound;
};

double correlation(const std::vector<Pair>& pairs) {
    double x = 0, y = 0, xx = 0, yy = 0, xy = 0;
    for (const auto& [a, b] : pairs) x += a, y += b, xx += a * a, yy += b * b, xy += a * b;
    const auto n = static_cast<double>(pairs.size());
    return (n * xy - x * y) / std::sqrt((n * xx - x * x) * (n * yy - y * y));
}

struct Agreement {
    std::vector<Pair> equal, accented;

    void print(const char* setting) const {
        printRow(fmt::format("{}: r of complexity from sound and from notes", setting),
                 fmt::format("{:.3f}, accented {:.3f}", correlation(equal), correlation(accented)),
                 fmt::format("of {} loops", equal.size()));
        std::fflush(stdout);
    }
};

double complexityOf(const std::vector<Note>& notes, const LoopMetre& metre) {
    return static_cast<double>(analysisOf(notes, metre)->computeRhythmicComplexity());
}

// Four bars from `first` on, as notes and as onsets in the rendering of the whole groove.
void compare(const MidiSequence& groove, double first, const std::vector<Onset>& found, double lead,
             Agreement& agreement) {
    const double bpm = groove.tempos().empty() ? 120 : groove.tempos().front().bpm;
    const LoopMetre metre{static_cast<float>(bpm), kBeats, 4, 4};
    std::vector<Note> notes;
    for (const MidiNote& note : groove.tracks().at(0).notes) {
        if (note.start < first || note.start >= first + kBeats) continue;
        notes.push_back({note.start - first, note.end() - first, note.pitch, note.velocity});
    }
    const double start = lead + beatsToSeconds(groove, first),
                 end = lead + beatsToSeconds(groove, first + kBeats);
    const auto frames = static_cast<std::int64_t>((end - start) * kRate);
    std::vector<Onset> onsets;
    for (Onset onset : found) {
        // Late by a little at most, but early strokes on the first beat belong to it.
        onset.frame -= static_cast<std::int64_t>(start * kRate);
        if (onset.frame < -kRate / 100 || onset.frame >= frames - kRate / 100) continue;
        onset.frame = std::max<std::int64_t>(0, onset.frame);
        onsets.push_back(onset);
    }
    if (notes.size() < 8 || onsets.empty()) return;
    const double truth = complexityOf(notes, metre);
    agreement.equal.push_back({truth, complexityOf(notesOfOnsets(framesOf(onsets), frames, kBeats), metre)});
    agreement.accented.push_back({truth, complexityOf(accentedNotesOfOnsets(onsets, frames, kBeats), metre)});
}

void measure(const DrumCorpus& corpus, const Setting& setting, Part part) {
    constexpr double kSeconds = 60;
    Agreement agreement;
    for (std::size_t i = part; i < corpus.grooves.size(); i += 2) {
        const MidiSequence& groove = corpus.grooves[i];
        const bool common = groove.meters().empty() || (groove.meters().front().numerator == 4 &&
                                                        groove.meters().front().denominator == 4);
        if (!common) continue;
        const Rendering rendering = corpus.render(i, setting, kSeconds);
        OnsetDetector detector(kRate, 1);
        detector.process(rendering.samples);
        const auto onsets = detector.finishWithLoudness();
        for (double first = 0; kLead + beatsToSeconds(groove, first + kBeats) < kSeconds; first += kBeats) {
            if (first + kBeats > groove.endOfNotes() + 4) break;
            compare(groove, first, onsets, kLead, agreement);
        }
    }
    agreement.print(setting.name);
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    using namespace qvct::bench;
    const Part part = count > 1 && std::string_view(arguments[1]) == "tuning" ? kTuning : kMeasuring;
    const DrumCorpus corpus = DrumCorpus::loadOrExit(QVCT_CORPUS, QVCT_SOUNDS);
    const Setting acoustic{.name = "acoustic kit", .player = Setting::kAcousticKit};
    measure(corpus, {.name = "drum machines"}, part);
    if (corpus.canPlay(acoustic)) measure(corpus, acoustic, part);
}

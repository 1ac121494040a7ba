// How long the rhythm of a MIDI loop takes, from the bytes of the file to both levels, and how long the
// clustering of 10,000 notes takes.
#include "Corpus.h"
#include "Measure.h"
#include "listening/rhythm/AgglomerativeClustering.h"
#include "listening/rhythm/QVCTMidiAnalysis.h"
#include "platform/files/FileAccess.h"

#include <random>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

// Four bars of a groove, as a loop of a library has them.
double secondsForLoop(const std::vector<std::uint8_t>& bytes, std::size_t& notes) {
    constexpr int kBeats = 16;
    constexpr int kRounds = 20;
    double best = 1e300;
    for (int round = 0; round < kRounds; ++round) {
        const double start = clockTime();
        const auto sequence = MidiSequence::parse(bytes);
        const auto analysis = QVCTMidiAnalysis::initWithTempo(120, kBeats, 4, 4);
        for (const MidiNote& note : sequence->tracks()[0].notes) {
            if (note.start < kBeats) analysis->addNote({note.start, note.end(), note.pitch, note.velocity});
        }
        notes = analysis->notes().size();
        volatile float level = analysis->computeRhythmicComplexity() + analysis->computeRhythmicDensity();
        static_cast<void>(level);
        best = std::min(best, clockTime() - start);
    }
    return best;
}

void measureLoops(const std::string& folder) {
    double worst = 0, sum = 0;
    std::size_t loops = 0, mostNotes = 0;
    for (const auto& entry : std::filesystem::directory_iterator(folder)) {
        const auto bytes = readFile(entry.path().string());
        if (entry.path().extension() != ".mid" || !bytes || bytes->size() > 8192) continue;
        std::size_t notes = 0;
        const double seconds = secondsForLoop(*bytes, notes);
        worst = std::max(worst, seconds);
        mostNotes = std::max(mostNotes, notes);
        sum += seconds;
        ++loops;
    }
    printRow(fmt::format("{} MIDI loops of 16 beats, up to {} notes", loops, mostNotes),
             fmt::format("{:.1f} µs, worst {:.1f} µs", sum / double(loops) * 1e6, worst * 1e6),
             "under 200 µs");
}

void measureClustering() {
    for (const double beats : {10000.0, 1000.0, 1.0}) {
        std::mt19937 random(1);
        std::uniform_real_distribution<double> time(0, beats);
        std::vector<Note> notes;
        for (int i = 0; i < 10000; ++i) notes.push_back({time(random), 0, 60, 100});
        const double start = clockTime();
        AgglomerativeClustering clustering(notes);
        clustering.setThreshold(0.125);
        clustering.runAnalysis(AgglomerativeClustering::kStartInThreshold);
        const double seconds = clockTime() - start;
        printRow(
            fmt::format("10,000 notes over {:.0f} beats in {} clusters", beats, clustering.clusters().size()),
            fmt::format("{:.2f} ms", seconds * 1e3), "under 50 ms");
    }
}

}  // namespace
}  // namespace qvct::bench

int main() {
    using namespace qvct::bench;
    const std::string folder = QVCT_CORPUS "/midi/groove";
    if (std::filesystem::is_directory(folder)) measureLoops(folder);
    measureClustering();
}

// How well the keys of pieces are told, on the sounds of `bench/render-pieces`, and how long it takes.
// Usage: bench_key_accuracy FOLDER
#include "Measure.h"
#include "RenderedSounds.h"
#include "listening/pitch/LoopKey.h"

#include <map>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

struct Key {
    int tonic;
    bool isMinor;
};

// As the evaluation campaign MIREX weighs keys: 1 for the right one, 0.5 for a fifth up or down, 0.3 for the
// relative, 0.2 for the parallel key.
double weightOf(const Key& found, const Key& truth) {
    const int interval = (found.tonic - truth.tonic + 12) % 12;
    if (found.isMinor == truth.isMinor) return interval == 0 ? 1 : interval == 5 || interval == 7 ? 0.5 : 0;
    if (interval == 0) return 0.2;
    return interval == (truth.isMinor ? 3 : 9) ? 0.3 : 0;
}

struct Score {
    int pieces = 0, right = 0;
    double weighted = 0;
};

void measure(const std::string& folder) {
    LoopKeyDetector detector;
    std::map<std::string, Score> scores;
    double seconds = 0, busy = 0;
    for (const RenderedSound& sound : soundsOrExit(folder)) {
        const SoundExcerpt excerpt = sound.excerpt(30);
        std::optional<LoopKey> key;
        busy += secondsOf([&] { key = detector.keyOf(excerpt.mono(), excerpt.sampleRate()); }, processorTime);
        seconds += excerpt.seconds();
        const Key truth = {std::atoi(sound.number.c_str()), sound.truth == "minor"};
        const double weight = key ? weightOf({key->tonic, key->mode == LoopKey::Mode::kMinor}, truth) : 0;
        for (const std::string& kind : {sound.kind, std::string("piece")}) {
            Score& score = scores[kind];
            ++score.pieces;
            score.weighted += weight;
            score.right += weight == 1;
        }
    }
    for (const auto& [kind, score] : scores) {
        printRow(
            fmt::format("key of {} {}s: weighted, right", score.pieces, kind),
            fmt::format("{:.3f}, {:.3f}", score.weighted / score.pieces, double(score.right) / score.pieces),
            kind == "piece" ? "0.85 weighted" : "");
    }
    printRow("key of 30 s of sound", fmt::format("{:.0f} times real time", seconds / busy), "5000");
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    if (count < 2) return 1;
    qvct::bench::measure(arguments[1]);
}

// How well the tempos of loops are told: grooves played by people, rendered with the one-shots of drum
// machines and cut to whole bars, with and without the tails of their last sounds. Every other groove of the
// corpus is for building. Usage: bench_tempo_accuracy [develop]
#include "Corpus.h"
#include "GrooveLoops.h"
#include "Measure.h"
#include "listening/onsets/OnsetDetector.h"
#include "listening/tempo/LoopTempo.h"

#include <cmath>
#include <initializer_list>
#include <map>
#include <utility>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

constexpr Setting kSettings[] = {{.name = "dry"}, {.name = "noise at -50 dB", .kitShift = 3, .whiteDb = -50}};

struct Score {
    int loops = 0, first = 0, anyLevel = 0, amongThree = 0, whole = 0;

    void add(const LoopTempo& found, double bpm, bool isWhole) {
        const auto is = [&](std::size_t i, std::initializer_list<double> ratios) {
            if (i >= found.candidates.size()) return false;
            return std::any_of(ratios.begin(), ratios.end(), [&](double ratio) {
                return std::abs(found.candidates[i].bpm / (bpm * ratio) - 1) <= 0.01;
            });
        };
        ++loops;
        first += is(0, {1});
        anyLevel += is(0, {1, 2, 0.5, 3, 1.0 / 3, 1.5, 2.0 / 3});
        amongThree += is(0, {1}) || is(1, {1}) || is(2, {1});
        whole += found.isWhole() == isWhole;
    }
};

// What confidences are worth: of the tempos that are said with about the same, how many are right.
class Reliability {
  public:
    void add(const LoopTempo& found, double bpm) {
        if (found.candidates.empty()) return;
        const auto& [its, beats, isWhole, confidence] = found.candidates[0];
        Bin& bin = bins_[std::min(std::size(bins_) - 1, static_cast<std::size_t>(confidence * 5))];
        ++bin.count;
        bin.said += confidence;
        bin.right += std::abs(its / bpm - 1) <= 0.01;
    }
    void print() const {
        for (const Bin& bin : bins_) {
            if (bin.count == 0) continue;
            printRow(fmt::format("  {} beats: confidence, right", bin.count),
                     fmt::format("{:.2f}, {:.2f}", bin.said / bin.count, double(bin.right) / bin.count), "");
        }
    }

  private:
    struct Bin {
        int count = 0, right = 0;
        double said = 0;
    };
    Bin bins_[5];
};

void print(const std::string& name, const Score& score, const char* target) {
    const auto share = [&](int part) { return score.loops > 0 ? double(part) / score.loops : 0; };
    printRow(fmt::format("{}: tempo, any level, among three", name),
             fmt::format("{:.3f}, {:.3f}, {:.3f}", share(score.first), share(score.anyLevel),
                         share(score.amongThree)),
             target);
    printRow(fmt::format("  {} loops: whole or not is told right", score.loops),
             fmt::format("{:.3f}", share(score.whole)), "");
}

// The names of the grooves, which say whether a groove is a beat or a fill and in what metre, in the order of
// the corpus.
std::vector<std::string> grooveNames() {
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(QVCT_CORPUS "/midi/groove"))
        if (entry.path().extension() == ".mid") names.push_back(entry.path().stem().string());
    std::sort(names.begin(), names.end());
    return names;
}

std::string kindOf(const std::string& name, int bars) {
    if (name.find("_fill_") != std::string::npos) return "fills";
    if (!name.ends_with("_4-4")) return "beats in other metres";
    return bars > 1 ? "beats in 4/4 of 2 to 8 bars" : "beats in 4/4 of 1 bar";
}

void measure(const DrumCorpus& corpus, std::size_t part) {
    const std::vector<std::string> names = grooveNames();
    std::map<bool, Score> beats;
    Reliability reliability;
    std::map<std::pair<bool, std::string>, Score> kinds;
    std::vector<double> times;
    const auto measureLoop = [&](const GrooveLoop& loop, const std::string& name, bool hasTail) {
        OnsetDetector detector(kRate, 1);
        detector.process(loop.samples);
        const std::vector<Onset> onsets = detector.finishWithLoudness();
        const auto frames = static_cast<std::int64_t>(loop.samples.size());
        LoopTempo tempo;
        times.push_back(medianSeconds([&] { tempo = LoopTempo::of(onsets, frames, kRate); }, 3, clockTime));
        const std::string kind = kindOf(name, loop.bars);
        if (kind != "fills") {
            beats[hasTail].add(tempo, loop.bpm, !hasTail);
            reliability.add(tempo, loop.bpm);
        }
        kinds[{hasTail, kind}].add(tempo, loop.bpm, !hasTail);
    };
    for (std::size_t i = part; i < std::min(names.size(), corpus.grooves.size()); i += 2) {
        for (const Setting& setting : kSettings) {
            for (const bool hasTail : {false, true}) {
                for (const GrooveLoop& loop : loopsOf(corpus, i, setting, hasTail))
                    measureLoop(loop, names[i], hasTail);
            }
        }
    }
    for (const bool hasTail : {false, true}) {
        const std::string tail = hasTail ? "with tails" : "of whole bars";
        print("beats " + tail, beats[hasTail], hasTail ? "0.90" : "0.98");
        for (const auto& [key, score] : kinds)
            if (key.first == hasTail) print("  " + key.second + " " + tail, score, "");
    }
    reliability.print();
    printRow("time of a loop, its onsets known", fmt::format("{:.0f} µs", medianOf(times) * 1e6), "");
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    using namespace qvct::bench;
    const bool develops = count > 1 && arguments[1] == std::string("develop");
    measure(DrumCorpus::loadOrExit(QVCT_CORPUS), develops ? 0 : 1);
}

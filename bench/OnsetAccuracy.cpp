// How well onsets are found: grooves played by people, rendered with the one-shots of drum machines, so that
// every true onset is known; beside aubioonset on the same files. Usage: bench_onset_accuracy [seconds of
// each groove]
#include "Aubio.h"
#include "Corpus.h"
#include "Measure.h"
#include "OnsetScore.h"
#include "WavFile.h"
#include "listening/onsets/OnsetDetector.h"
#include "media/audio/AudioDecoder.h"

#include <cstdlib>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

constexpr Setting kSettings[] = {{"dry", 1, 0, 0, false, 0},
                                 {"dry, next kit", 1, 0, 0, false, 1},
                                 {"dry, third kit", 1, 0, 0, false, 2},
                                 {"dry, fourth kit", 1, 0, 0, false, 3},
                                 {"1.3 times faster", 1.3, 0, 0, false, 2},
                                 {"noise at -50 dB", 1, -50, 0, false, 3},
                                 {"room of 0.8 s", 1, 0, 0.8, false, 0},
                                 {"bass and pad", 1, 0, 0, true, 1}};

struct Scores {
    OnsetScore tight{0.010}, loose{0.025};

    void add(const std::vector<double>& truth, const std::vector<double>& found) {
        tight.add(truth, found);
        loose.add(truth, found);
    }
};

std::vector<double> ourOnsets(const std::string& path) {
    const auto decoder = AudioDecoder::open(path);
    std::vector<double> onsets;
    for (const std::int64_t frame : OnsetDetector::detect(*decoder)) {
        onsets.push_back(static_cast<double>(frame) / decoder->sampleRate());
    }
    return onsets;
}

void measure(const DrumCorpus& corpus, const Setting& setting, double seconds, const std::string& wav) {
    Scores ours, aubio;
    bool hasAubio = true;
    for (std::size_t i = 0; i < corpus.grooves.size(); ++i) {
        const Rendering rendering = render(corpus.grooves[i], corpus.kitFor(i, setting), setting, seconds);
        writeWav(wav, rendering.samples, kRate, 1);
        ours.add(rendering.onsets, ourOnsets(wav));
        const auto theirs = hasAubio ? aubioOnsets(wav) : std::nullopt;
        hasAubio = theirs.has_value();
        if (theirs) aubio.add(rendering.onsets, *theirs);
    }
    const auto compare = [&](const char* what, const OnsetScore& score, const OnsetScore& theirs) {
        printRow(fmt::format("{}: F at ±{}", setting.name, what),
                 hasAubio ? fmt::format("{:.3f}, aubioonset {:.3f}, {:+.3f}", score.f(), theirs.f(),
                                        score.f() - theirs.f())
                          : fmt::format("{:.3f}", score.f()),
                 "0.06 above");
    };
    compare("10 ms", ours.tight, aubio.tight);
    compare("25 ms", ours.loose, aubio.loose);
    printRow("  precision, recall, mean offset",
             fmt::format("{:.3f}, {:.3f}, {:+.2f} ms", ours.loose.precision(), ours.loose.recall(),
                         ours.loose.meanOffset() * 1000),
             "offset within 2 ms");
    std::fflush(stdout);
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    using namespace qvct::bench;
    const double seconds = count > 1 ? std::atof(arguments[1]) : 30;
    const DrumCorpus corpus = DrumCorpus::loadOrExit(QVCT_CORPUS);
    const TemporaryFile wav;
    for (const Setting& setting : kSettings) measure(corpus, setting, seconds, wav.path());
}

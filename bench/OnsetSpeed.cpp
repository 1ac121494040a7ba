// How fast onsets are found, decoding included: a stereo file of 16 bits at 44.1 kHz, beside aubioonset on
// the same file, both in processor time of one core. Usage: bench_onset_speed [minutes]
#include "Aubio.h"
#include "Corpus.h"
#include "Measure.h"
#include "WavFile.h"
#include "listening/onsets/OnsetDetector.h"
#include "media/audio/AudioDecoder.h"

#include <cstdlib>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

std::vector<float> stereoGrooves(const DrumCorpus& corpus, double minutes) {
    const Setting plain{.name = "dry"};
    const auto samples = static_cast<std::size_t>(minutes * 60 * kRate) * 2;
    std::vector<float> stereo;
    for (std::size_t i = 0; stereo.size() < samples; i = (i + 1) % corpus.grooves.size()) {
        for (const float sample : corpus.render(i, plain, 60).samples) {
            stereo.push_back(sample);
            stereo.push_back(0.8F * sample);
        }
    }
    stereo.resize(samples);
    return stereo;
}

void report(const char* name, double audio, double processor, std::size_t onsets, const char* target) {
    printRow(fmt::format("onsets of {:.0f} s of stereo, decoded and found by {}", audio, name),
             fmt::format("{:.3f} s = {:.0f} times real time", processor, audio / processor), target);
    printRow("  onsets", fmt::format("{}", onsets), "");
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    using namespace qvct::bench;
    const double minutes = count > 1 ? std::atof(arguments[1]) : 10;
    const DrumCorpus corpus = DrumCorpus::loadOrExit(QVCT_CORPUS);
    const TemporaryFile wav;
    writeWav(wav.path(), stereoGrooves(corpus, minutes), kRate, 2);

    double ours = 1e300;  // the best of three, as other programs share the machine
    for (int round = 0; round < 3; ++round) {
        const double start = processorTime();
        const auto decoder = qvct::AudioDecoder::open(wav.path());
        const auto onsets = qvct::OnsetDetector::detect(*decoder);
        ours = std::min(ours, processorTime() - start);
        if (round == 2) report("us", minutes * 60, ours, onsets.size(), "1,250 times");
    }
    double theirs = 1e300;
    for (int round = 0; round < 3; ++round) {
        const double start = processorTime();
        const auto onsets = aubioOnsets(wav.path());
        if (!onsets) {
            fmt::print("aubioonset is not installed\n");
            break;
        }
        theirs = std::min(theirs, processorTime() - start);
        if (round == 2) {
            report("aubioonset", minutes * 60, theirs, onsets->size(), "");
            printRow("  ratio", fmt::format("{:.2f}", theirs / ours), "at least 5");
        }
    }
}

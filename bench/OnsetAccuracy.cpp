// How well onsets are found: grooves played by people, rendered with the one-shots of drum machines, with an
// acoustic kit, or as a melody of pitched instruments, so that every true onset is known; beside aubioonset
// on the same files. Then what is no onset: noise, and ends within a sound. Usage: bench_onset_accuracy
// [seconds of each groove] [tuning]; "tuning" takes the part of the corpus that parameters are chosen by,
// which Corpus.h tells.
#include "Aubio.h"
#include "Corpus.h"
#include "Effects.h"
#include "Measure.h"
#include "OnsetScore.h"
#include "WavFile.h"
#include "listening/onsets/OnsetDetector.h"
#include "media/audio/AudioDecoder.h"

#include <cmath>
#include <cstdlib>
#include <numbers>
#include <string_view>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

constexpr Setting kSettings[] = {
    {.name = "dry"},
    {.name = "dry, next kit", .kitShift = 1},
    {.name = "dry, third kit", .kitShift = 2},
    {.name = "dry, fourth kit", .kitShift = 3},
    {.name = "1.3 times faster", .kitShift = 2, .tempoFactor = 1.3},
    {.name = "noise at -50 dB", .kitShift = 3, .whiteDb = -50},
    {.name = "room of 0.8 s", .roomSeconds = 0.8},
    {.name = "bass and pad", .kitShift = 1, .bassAndPad = true},
    {.name = "acoustic kit", .player = Setting::kAcousticKit},
    {.name = "acoustic kit, room of 1.2 s", .player = Setting::kAcousticKit, .roomSeconds = 1.2},
    {.name = "acoustic kit, rides that wash", .player = Setting::kAcousticKit, .wash = true},
    {.name = "acoustic kit, pink noise at -45 dB", .player = Setting::kAcousticKit, .pinkDb = -45},
    {.name = "acoustic kit below 11 kHz, cut",
     .player = Setting::kAcousticKit,
     .lowPassHertz = 11000,
     .cutSeconds = 0.2},
    {.name = "acoustic kit, bass and pad", .player = Setting::kAcousticKit, .bassAndPad = true},
    {.name = "melody", .player = Setting::kMelody},
    {.name = "melody, room of 1.2 s, cut",
     .player = Setting::kMelody,
     .roomSeconds = 1.2,
     .cutSeconds = 0.15}};

struct Scores {
    OnsetScore loose{0.050}, middle{0.025}, tight{0.010};

    void add(const std::vector<double>& truth, const std::vector<double>& found) {
        for (OnsetScore* score : {&loose, &middle, &tight}) score->add(truth, found);
    }
    std::string text() const { return fmt::format("{:.3f} {:.3f} {:.3f}", loose.f(), middle.f(), tight.f()); }
};

std::vector<double> ourOnsets(const std::string& path) {
    const auto decoder = AudioDecoder::open(path);
    std::vector<double> onsets;
    for (const std::int64_t frame : OnsetDetector::detect(*decoder)) {
        onsets.push_back(static_cast<double>(frame) / decoder->sampleRate());
    }
    return onsets;
}

void measure(const DrumCorpus& corpus, const Setting& setting, Part part, double seconds,
             const std::string& wav) {
    Scores ours, aubio;
    bool hasAubio = true;
    for (std::size_t i = part; i < corpus.grooves.size(); i += 2) {
        const Rendering rendering = corpus.render(i, setting, seconds);
        writeWav(wav, rendering.samples, kRate, 1);
        ours.add(rendering.onsets, ourOnsets(wav));
        const auto theirs = hasAubio ? aubioOnsets(wav) : std::nullopt;
        hasAubio = theirs.has_value();
        if (theirs) aubio.add(rendering.onsets, *theirs);
    }
    printRow(fmt::format("{}: F at ±50, 25, 10 ms", setting.name),
             hasAubio ? fmt::format("{}, aubioonset {}", ours.text(), aubio.text()) : ours.text(),
             ".98 .97 .95");
    printRow("  precision, recall at ±50 ms, mean offset",
             fmt::format("{:.3f}, {:.3f}, {:+.2f} ms", ours.loose.precision(), ours.loose.recall(),
                         ours.middle.meanOffset() * 1000),
             "offset within 2 ms");
    std::fflush(stdout);
}

std::size_t onsetsAfter(double seconds, const std::vector<float>& samples) {
    OnsetDetector detector(kRate, 1);
    detector.process(samples);
    const auto onsets = detector.finish();
    return static_cast<std::size_t>(std::count_if(
        onsets.begin(), onsets.end(), [&](std::int64_t onset) { return double(onset) > seconds * kRate; }));
}

void measureNoise() {
    constexpr unsigned kSeeds = 10;
    std::size_t white = 0, pink = 0;
    for (unsigned seed = 1; seed <= kSeeds; ++seed) {
        const std::vector<float> silence(30 * kRate);
        std::vector<float> noise = silence;
        addWhiteNoise(noise, -20, seed);
        white += onsetsAfter(0.1, noise);
        noise = silence;
        addPinkNoise(noise, -20, seed);
        pink += onsetsAfter(0.1, noise);
    }
    printRow("onsets in 30 s of white noise, of pink noise, after its beginning",
             fmt::format("{:.1f}, {:.1f}", double(white) / kSeeds, double(pink) / kSeeds), "0");
}

void measureCutSines() {
    constexpr int kSines = 16;
    std::size_t found = 0;
    for (int sine = 0; sine < kSines; ++sine) {
        const double hertz = 80 * std::pow(1.4, sine);
        std::vector<float> samples(static_cast<std::size_t>(kRate + 37 * sine));
        for (std::size_t i = 0; i < samples.size(); ++i) {
            const double turn = 2 * std::numbers::pi * hertz / kRate;
            samples[i] = static_cast<float>(0.5 * std::sin(turn * double(i) + sine));
        }
        found += onsetsAfter(0.1, samples);
    }
    printRow(fmt::format("onsets at the ends of {} cut sines", kSines), fmt::format("{}", found), "0");
}

// Each sound ends at a third of its length, where most still ring.
void measureCutSounds(const DrumCorpus& corpus, Part part) {
    constexpr double kEnd = 0.030;
    std::size_t found = 0, count = 0;
    for (const Sound& sound : corpus.notes[part]) {
        const std::vector<float> cut(sound.samples.begin(),
                                     sound.samples.begin() + static_cast<long>(sound.samples.size() / 3));
        const double end = double(cut.size()) / kRate - kEnd;
        if (double(sound.attack) / kRate > end) continue;
        found += onsetsAfter(end, cut);
        ++count;
    }
    if (count)
        printRow(fmt::format("onsets at the ends of {} cut notes", count), fmt::format("{}", found), "0");
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    using namespace qvct::bench;
    const double seconds = count > 1 ? std::atof(arguments[1]) : 30;
    const Part part = count > 2 && std::string_view(arguments[2]) == "tuning" ? kTuning : kMeasuring;
    const DrumCorpus corpus = DrumCorpus::loadOrExit(QVCT_CORPUS, QVCT_SOUNDS);
    const TemporaryFile wav;
    for (const Setting& setting : kSettings)
        if (corpus.canPlay(setting)) measure(corpus, setting, part, seconds, wav.path());
    measureNoise();
    measureCutSines();
    measureCutSounds(corpus, part);
}

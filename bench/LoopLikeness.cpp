// Whether loops lie near others of their kind: grooves of the measuring half, each played by every drum
// machine, an acoustic kit and as a melody of each instrument, two bars at a time. Of each loop, how many of
// its ten nearest that play another groove are of its kit or instrument, and whether the next two bars of
// itself are among its ten nearest of all; beside places of the first two seconds, and chance.
#include "listening/likeness/LoopLikeness.h"

#include "Corpus.h"
#include "Measure.h"
#include "listening/instrument/SoundFeatures.h"
#include "listening/likeness/LikenessModel.h"
#include "listening/onsets/OnsetDetector.h"
#include "resources/DefaultListeningModels.h"

#include <numeric>

namespace qvct::bench {
namespace {

constexpr std::size_t kNearest = 10;

struct Loop {
    std::size_t kind, groove;
    bool isMelody;
    std::vector<float> samples;
};

using Places = std::vector<SoundLikeness>;

std::vector<Sound> notesOf(const std::string& instrument) {
    std::vector<std::string> files;
    for (const auto& entry : std::filesystem::directory_iterator(QVCT_SOUNDS "/" + instrument))
        files.push_back(entry.path());
    std::sort(files.begin(), files.end());
    std::vector<Sound> notes;
    notes.reserve(files.size());
    for (const std::string& file : files) notes.push_back(loadSound(file, 0.1F));
    return notes;
}

// Bars 2 and 3, then 4 and 5, as far as it goes.
void addLoops(const MidiSequence& groove, const Band& band, const Setting& setting, Loop loop,
              std::vector<Loop>& loops) {
    const double bar = 4 * 60 / (groove.tempos().empty() ? 120 : groove.tempos()[0].bpm);
    const auto frame = [&](double bars) { return static_cast<std::size_t>((kLead + bars * bar) * kRate); };
    const std::vector<float> all = render(groove, band, setting, kLead + 5 * bar).samples;
    for (const int first : {1, 3}) {
        if (all.size() < frame(first + 2)) break;
        loop.samples.assign(all.begin() + static_cast<std::ptrdiff_t>(frame(first)),
                            all.begin() + static_cast<std::ptrdiff_t>(frame(first + 2)));
        loops.push_back(loop);
    }
}

std::vector<Loop> loopsOf(const DrumCorpus& corpus) {
    std::vector<Kit> kits = corpus.machines;
    kits.push_back(*corpus.acoustic[kMeasuring]);
    std::vector<std::vector<Sound>> instruments;
    for (const char* name : {"acoustic-bass", "acoustic-guitar", "electric-guitar", "saxophone"})
        instruments.push_back(notesOf(name));
    std::vector<Loop> loops;
    for (std::size_t i = 0; i < corpus.grooves.size(); ++i) {
        if (DrumCorpus::partOf(i) != kMeasuring) continue;
        const MidiSequence& groove = corpus.grooves[i];
        for (std::size_t k = 0; k < kits.size(); ++k)
            addLoops(groove, {&kits[k], nullptr}, {.name = "drums"}, {k, i, false, {}}, loops);
        for (std::size_t k = 0; k < instruments.size(); ++k)
            addLoops(groove, {nullptr, &instruments[k]}, {.name = "melody", .player = Setting::kMelody},
                     {kits.size() + k, i, true, {}}, loops);
    }
    return loops;
}

// The other loops, the nearest first.
std::vector<std::size_t> byDistance(const Places& places, std::size_t self) {
    std::vector<std::size_t> order(places.size());
    std::iota(order.begin(), order.end(), std::size_t{0});
    order.erase(order.begin() + static_cast<std::ptrdiff_t>(self));
    std::stable_sort(order.begin(), order.end(), [&](std::size_t one, std::size_t other) {
        return squaredDistance(places[self], places[one]) < squaredDistance(places[self], places[other]);
    });
    return order;
}

struct Score {
    double same = 0, chance = 0, twins = 0;
    int loops = 0, withTwin = 0;

    void add(const std::vector<Loop>& loops_, const Places& places, std::size_t self) {
        const Loop& loop = loops_[self];
        std::size_t rank = 0, others = 0, near = 0, kin = 0;
        for (const std::size_t i : byDistance(places, self)) {
            const bool isKin = loops_[i].kind == loop.kind;
            if (loops_[i].groove == loop.groove) {
                if (isKin) twins += rank < kNearest ? 1 : 0, ++withTwin;
            } else {
                if (others++ < kNearest) near += isKin ? 1 : 0;
                kin += isKin ? 1 : 0;
            }
            ++rank;
        }
        same += static_cast<double>(near) / kNearest;
        chance += static_cast<double>(kin) / static_cast<double>(others);
        ++loops;
    }
};

void report(const std::string& name, const std::vector<Loop>& loops, const Places& places) {
    for (const bool isMelody : {false, true}) {
        Score score;
        for (std::size_t i = 0; i < loops.size(); ++i)
            if (loops[i].isMelody == isMelody) score.add(loops, places, i);
        printRow(fmt::format("{} {}: {}", score.loops, isMelody ? "melodies" : "drum loops", name),
                 fmt::format("{:.2f}, chance {:.2f}", score.same / score.loops, score.chance / score.loops),
                 "");
        printRow("  their next two bars are among the ten nearest",
                 fmt::format("{:.2f} of {}", score.twins / score.withTwin, score.withTwin), "");
    }
}

}  // namespace
}  // namespace qvct::bench

int main() {
    using namespace qvct;
    using namespace qvct::bench;
    const auto loops = loopsOf(DrumCorpus::loadOrExit(QVCT_CORPUS, QVCT_SOUNDS));
    const auto model = defaultLikenessModel();
    SoundFeatures features(kRate);
    Places places, beginnings;
    std::vector<double> times;
    for (const Loop& loop : loops) {
        OnsetDetector detector(kRate, 1);
        detector.process(loop.samples);
        const auto onsets = detector.finishWithLoudness();
        SoundLikeness place;
        times.push_back(medianSeconds(
            [&] { place = likenessOfLoop(loop.samples, kRate, onsets, features, *model).value(); }, 3,
            clockTime));
        places.push_back(place);
        beginnings.push_back(model->of(features.of(loop.samples)).value());
    }
    report("ten nearest of their kit or instrument", loops, places);
    report("the same by the first two seconds alone", loops, beginnings);
    printRow("place of a loop, its onsets known", fmt::format("{:.2f} ms", medianOf(times) * 1e3), "");
}

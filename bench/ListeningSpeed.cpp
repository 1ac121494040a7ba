// How fast whole sounds are listened to, decoding included: every sound below a folder, in processor time of
// one core, loops (by what is heard) and single sounds apart. Usage: bench_listening_speed [FOLDER]; without
// one, grooves played by drum machines and the machines' own one-shots.
#include "Corpus.h"
#include "GrooveLoops.h"
#include "Measure.h"
#include "WavFile.h"
#include "listening/Listener.h"
#include "media/audio/AudioDecoder.h"
#include "resources/DefaultListeningModels.h"

#include <fmt/format.h>

namespace qvct::bench {
namespace {

namespace fs = std::filesystem;

std::vector<std::string> soundsBelow(const std::string& folder) {
    std::vector<std::string> paths;
    for (const auto& entry : fs::recursive_directory_iterator(folder))
        if (entry.is_regular_file() && AudioDecoder::open(entry.path())) paths.push_back(entry.path());
    std::sort(paths.begin(), paths.end());
    return paths;
}

struct Cost {
    int sounds = 0;
    double length = 0, time = 0;  // seconds

    void print(const std::string& name, const std::string& measured, const char* target) const {
        printRow(fmt::format("{} {} of {:.1f} s listened to", sounds, name, length / sounds), measured,
                 target);
    }
};

void measure(const std::vector<std::string>& paths) {
    Listener listener(defaultListeningModels());
    Cost loops, singles;
    for (const std::string& path : paths) {
        HeardSound heard;
        const double time = medianSeconds([&] { heard = listener.listen(*AudioDecoder::open(path)); }, 5);
        Cost& cost = heard.loopConfidence.value_or(0) > 0.5 ? loops : singles;
        ++cost.sounds, cost.length += heard.seconds, cost.time += time;
    }
    if (loops.sounds > 0)
        loops.print("loops", fmt::format("{:.0f} times real time", loops.length / loops.time), "1,000 times");
    if (singles.sounds > 0)
        singles.print("one-shots", fmt::format("{:.0f}/s", singles.sounds / singles.time), "750/s on 1");
}

// Stereo, the channels a little different, as most loops are.
void writeLoops(const DrumCorpus& corpus, const std::string& folder) {
    for (std::size_t i = 0; i < corpus.grooves.size(); i += 4) {
        for (const GrooveLoop& loop : loopsOf(corpus, i, {.name = "dry"}, false)) {
            std::vector<float> stereo;
            for (const float sample : loop.samples) stereo.insert(stereo.end(), {sample, 0.8F * sample});
            writeWav(fmt::format("{}/{}-{}.wav", folder, i, loop.bars), stereo, kRate, 2);
        }
    }
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    using namespace qvct::bench;
    if (count > 1) return measure(soundsBelow(arguments[1])), 0;
    const std::string folder = fs::temp_directory_path() / fmt::format("qvct-listening-{}", ::getpid());
    fs::create_directories(folder);
    writeLoops(DrumCorpus::loadOrExit(QVCT_CORPUS), folder);
    auto paths = soundsBelow(folder);
    const auto machines = soundsBelow(QVCT_CORPUS "/audio/drum-machines");
    paths.insert(paths.end(), machines.begin(), machines.end());
    measure(paths);
    fs::remove_all(folder);
}

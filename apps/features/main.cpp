// The features of sounds, for programs that train models: so training hears what judging hears.
//
// Reads sounds from standard input, each as its rate in Hz and its length (two 32-bit numbers) and mono
// samples (32-bit floats). Writes the version of the features and how many there are (two 32-bit numbers),
// then those of each sound (32-bit floats), all 0 for silence. Everything is in the machine's own byte order.
// With "--loops" the features are what tells loops from one-shots; "--tempos" is told of in Tempos.h.
#include "Tempos.h"
#include "listening/instrument/LoopMeasures.h"
#include "listening/instrument/SoundFeatures.h"
#include "listening/onsets/OnsetDetector.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <map>
#include <string_view>
#include <vector>

namespace {

using qvct::LoopMeasures;
using qvct::SoundFeatures;

constexpr std::uint32_t kMostFrames = 1U << 24U;

bool readAll(void* to, std::size_t size) {
    return std::fread(to, 1, size, stdin) == size;
}

int complain(const char* about) {
    std::fprintf(stderr, "qvct-features: %s\n", about);
    return 1;
}

std::vector<float> instrumentFeatures(const std::vector<float>& samples, std::uint32_t rate) {
    static std::map<std::uint32_t, SoundFeatures> byRate;
    auto values = byRate.try_emplace(rate, rate).first->second.of(samples);
    values.resize(SoundFeatures::count(), 0);
    return values;
}

std::vector<float> loopFeatures(const std::vector<float>& samples, std::uint32_t rate) {
    qvct::OnsetDetector detector(rate, 1);
    detector.process(samples);
    const auto measures = LoopMeasures::of(samples, rate, detector.finish());
    return {measures.values.begin(), measures.values.end()};
}

}  // namespace

int main(int count, char** arguments) {
    const std::string_view option = count > 1 ? arguments[1] : "";
    if (option == "--tempos") return qvct::writeTempoFeatures() ? 0 : complain("a loop that is cut off");
    const bool loops = option == "--loops";
    const std::size_t features = loops ? LoopMeasures::kCount : SoundFeatures::count();
    const std::uint32_t head[] = {SoundFeatures::kVersion, static_cast<std::uint32_t>(features)};
    std::fwrite(head, sizeof(head), 1, stdout);
    std::vector<float> samples;
    std::uint32_t sound[2];
    while (readAll(sound, sizeof(sound))) {
        const auto [rate, frames] = sound;
        if (rate < SoundFeatures::kLowestRate || rate > 64'000) return complain("a rate out of bounds");
        if (frames > kMostFrames) return complain("a sound that is too long");
        samples.resize(frames);
        if (!readAll(samples.data(), frames * sizeof(float))) return complain("a sound that is cut off");
        for (float& sample : samples) sample = std::isfinite(sample) ? std::clamp(sample, -16.0F, 16.0F) : 0;
        const auto values = loops ? loopFeatures(samples, rate) : instrumentFeatures(samples, rate);
        std::fwrite(values.data(), sizeof(float), values.size(), stdout);
    }
    return std::fflush(stdout) != 0 || std::ferror(stdout) != 0 ? complain("cannot write") : 0;
}

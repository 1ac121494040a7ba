// Any bytes as blocks of samples, at any rate and channel count: onsets ascend and lie within the signal, and
// the size of the blocks does not matter.
#include "ExactInput.h"
#include "listening/onsets/OnsetDetector.h"

#include <algorithm>
#include <cstring>

namespace {

constexpr double kRates[] = {1, 50, 8000, 22050, 44100, 48000, 96000, 2147483647};

std::vector<std::int64_t> onsetsOf(const std::vector<float>& samples, double rate, int channels,
                                   std::size_t frames) {
    qvct::OnsetDetector detector(rate, channels);
    const std::size_t block = frames * static_cast<std::size_t>(channels);
    for (std::size_t at = 0; at < samples.size(); at += block) {
        detector.process(std::span(samples).subspan(at, std::min(block, samples.size() - at)));
    }
    return detector.finish();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 8) return 0;
    const double rate = kRates[data[0] % 8];
    const int channels = data[1] % 8 + 1;
    const std::size_t block = data[2] + 1U;
    const std::size_t repeats = data[3] % 16 + 1U;  // few bytes make a long signal
    std::vector<float> part((size - 4) / sizeof(float));
    std::memcpy(part.data(), data + 4, part.size() * sizeof(float));
    std::vector<float> samples;
    for (std::size_t i = 0; i < repeats; ++i) samples.insert(samples.end(), part.begin(), part.end());

    const auto onsets = onsetsOf(samples, rate, channels, block);
    const auto frames = static_cast<std::int64_t>(samples.size()) / channels;
    std::int64_t last = -1;
    for (const std::int64_t onset : onsets) {
        qvct::fuzz::require(onset > last && onset < frames);
        last = onset;
    }
    qvct::fuzz::require(onsets == onsetsOf(samples, rate, channels, 100000));
    return 0;
}

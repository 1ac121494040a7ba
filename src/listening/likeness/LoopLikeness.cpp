#include "listening/likeness/LoopLikeness.h"

#include "listening/instrument/SoundFeatures.h"
#include "listening/likeness/LikenessModel.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <vector>

namespace qvct {
namespace {

constexpr std::size_t kMostStrokes = 6;
constexpr double kMostSeconds = 0.15, kLeastSeconds = 0.01;  // of a stroke

struct Part {
    std::span<const float> samples;
    float loudness;
};

// Each until the next one begins; those that are cut off at once tell nothing.
std::vector<Part> strokesOf(std::span<const float> samples, double sampleRate,
                            std::span<const Onset> onsets) {
    const auto length = static_cast<std::int64_t>(samples.size());
    const auto least = static_cast<std::int64_t>(kLeastSeconds * sampleRate);
    const auto most = static_cast<std::int64_t>(kMostSeconds * sampleRate);
    std::vector<Part> strokes;
    for (std::size_t i = 0; i < onsets.size(); ++i) {
        const std::int64_t begin = std::clamp<std::int64_t>(onsets[i].frame, 0, length);
        const std::int64_t next = i + 1 < onsets.size() ? std::min(onsets[i + 1].frame, length) : length;
        if (next - begin <= least) continue;
        const auto part = samples.subspan(static_cast<std::size_t>(begin));
        strokes.push_back(
            {part.first(static_cast<std::size_t>(std::min(next - begin, most))), onsets[i].loudness});
    }
    if (strokes.empty())
        strokes.push_back({samples.first(static_cast<std::size_t>(std::min(length, most))), 0});
    return strokes;
}

}  // namespace

std::optional<SoundLikeness> likenessOfLoop(std::span<const float> samples, double sampleRate,
                                            std::span<const Onset> onsets, SoundFeatures& features,
                                            const LikenessModel& model) {
    std::vector<Part> strokes = strokesOf(samples, sampleRate, onsets);
    std::stable_sort(strokes.begin(), strokes.end(),
                     [](const Part& one, const Part& other) { return one.loudness > other.loudness; });
    strokes.resize(std::min(strokes.size(), kMostStrokes));
    std::array<int, SoundLikeness::kSize> sums{};
    int count = 0;
    for (const Part& stroke : strokes) {
        const auto place = model.of(features.of(stroke.samples));
        if (!place) continue;
        ++count;
        for (std::size_t i = 0; i < sums.size(); ++i) sums[i] += place->coordinates[i];
    }
    if (count == 0) return std::nullopt;
    SoundLikeness middle;
    for (std::size_t i = 0; i < sums.size(); ++i)
        middle.coordinates[i] = static_cast<std::int8_t>(std::lround(static_cast<double>(sums[i]) / count));
    return middle;
}

}  // namespace qvct

#include "listening/pitch/LoopKey.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>

namespace qvct {
namespace {

constexpr double kLeastTuned = 4;

/// How much the root of each note's share, counted from the tonic, speaks for a mode. Roots, since a note
/// that is rarely heard may tell more than one that is heard more often than the others.
struct KeyProfile {
    std::array<double, 12> bass, treble;
    double constant;
};

// Fitted by logistic regression: docs/analysis.md says on what. Major, minor.
constexpr std::array<KeyProfile, 2> kProfiles = {
    {{{2.46, -3.02, 1.00, 0.90, -2.24, 0.12, -3.57, 3.79, -1.79, -1.43, -0.39, -1.55},
      {13.41, -5.33, 0.18, -7.37, 10.11, -0.84, -7.36, 12.77, -2.08, -1.80, -13.60, 9.21},
      -0.56},
     {{3.74, -3.08, -0.37, 3.32, -0.98, 2.90, -1.60, 2.50, -2.18, -4.31, 3.94, 1.09},
      {6.42, -22.00, 13.57, 5.97, -6.38, -7.29, -0.05, 12.21, -0.32, -14.01, 2.20, 0.99},
      0.56}}};

double agreement(const Chroma& chroma, const KeyProfile& profile, std::size_t tonic) {
    double sum = profile.constant;
    for (std::size_t i = 0; i < 12; ++i) {
        const std::size_t note = (tonic + i) % 12;
        sum += profile.bass[i] * std::sqrt(chroma.bass[note]) +
               profile.treble[i] * std::sqrt(chroma.treble[note]);
    }
    return sum;
}

}  // namespace

std::optional<LoopKey> LoopKeyDetector::keyOf(std::span<const float> mono, double sampleRate) {
    const std::optional<Chroma> chroma = chromagram_.of(mono, sampleRate);
    if (!chroma || chroma->tuned < kLeastTuned) return std::nullopt;
    std::array<double, 24> scores{};
    for (std::size_t key = 0; key < scores.size(); ++key)
        scores[key] = agreement(*chroma, kProfiles[key / 12], key % 12);
    const auto best = std::max_element(scores.begin(), scores.end());
    double sum = 0;
    for (const double score : scores) sum += std::exp(score - *best);
    const auto key = static_cast<int>(best - scores.begin());
    return LoopKey{key % 12, key < 12 ? LoopKey::Mode::kMajor : LoopKey::Mode::kMinor, 1 / sum,
                   chroma->tuning};
}

}  // namespace qvct

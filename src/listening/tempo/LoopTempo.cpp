#include "listening/tempo/LoopTempo.h"

#include "listening/tempo/BeatGrid.h"
#include "listening/tempo/OnsetSpectrum.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numeric>

namespace qvct {
namespace {

constexpr std::size_t kMost = 5;
constexpr std::size_t kMostOnsets = 512;
constexpr double kSame = 0.01;  // share of a tempo by which others differ at least

// Fitted by logistic regression: docs/analysis.md says on what. In the order of BeatGrid::Feature.
constexpr std::array<double, BeatGrid::kFeatures> kWeights = {4.14, 3.37, 7.28, 1.31,  -3.04,
                                                              0.99, 0.68, 1.82, -2.22, -2.27};

// Unites a tempo with a likelier one that is the same.
void add(std::vector<TempoCandidate>& found, const TempoCandidate& candidate) {
    const auto same = std::find_if(found.begin(), found.end(), [&](const TempoCandidate& other) {
        return std::abs(other.bpm / candidate.bpm - 1) <= kSame;
    });
    if (same != found.end()) {
        same->confidence += candidate.confidence;
    } else {
        found.push_back(candidate);
    }
}

std::vector<double> timesOf(std::span<const std::int64_t> onsets, std::int64_t frames, double sampleRate) {
    const double most = std::min(static_cast<double>(frames), OnsetSpectrum::kMostSeconds * sampleRate);
    std::vector<double> times;
    for (const std::int64_t onset : onsets) {
        if (onset < 0 || static_cast<double>(onset) >= most || times.size() == kMostOnsets) continue;
        times.push_back(static_cast<double>(onset) / sampleRate);
    }
    return times;
}

}  // namespace

LoopTempo LoopTempo::of(std::span<const std::int64_t> onsets, std::int64_t frames, double sampleRate) {
    const double seconds = static_cast<double>(frames) / sampleRate;
    std::vector<TempoCandidate> all;
    for (const BeatGrid& grid : BeatGrid::candidates(timesOf(onsets, frames, sampleRate), seconds)) {
        const double score = std::inner_product(kWeights.begin(), kWeights.end(), grid.features.begin(), 0.0);
        all.push_back({grid.bpm, grid.beats, grid.features[BeatGrid::kWhole] > 0, score});
    }
    const auto isLikelier = [](const TempoCandidate& a, const TempoCandidate& b) {
        return a.confidence > b.confidence;
    };
    std::sort(all.begin(), all.end(), isLikelier);
    const double best = all.empty() ? 0 : all.front().confidence;
    double sum = 0;
    for (TempoCandidate& candidate : all) {
        candidate.confidence = std::exp(candidate.confidence - best);
        sum += candidate.confidence;
    }
    LoopTempo tempo;
    for (TempoCandidate& candidate : all) {
        candidate.confidence /= sum;
        add(tempo.candidates, candidate);
    }
    std::stable_sort(tempo.candidates.begin(), tempo.candidates.end(), isLikelier);
    if (tempo.candidates.size() > kMost) tempo.candidates.resize(kMost);
    return tempo;
}

}  // namespace qvct

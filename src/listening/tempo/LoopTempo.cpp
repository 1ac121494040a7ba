#include "listening/tempo/LoopTempo.h"

#include "listening/tempo/BeatGrid.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>
#include <numeric>

namespace qvct {
namespace {

constexpr std::size_t kMost = 5;
constexpr double kSame = 0.01;  // share of a tempo by which others differ at least

// Fitted: docs/analysis.md says how. In the order of BeatGrid::Feature.
constexpr std::array<double, BeatGrid::kFeatures> kWeights = {
    1.37, 2.79,  -0.88, 8.00, 2.11, -1.05, -1.05, 3.17,  4.30, 2.19, -1.51, -7.90,
    1.60, -0.15, -0.30, 0.69, 2.17, 5.54,  1.72,  -0.66, 1.18, 0.77, -1.15, -1.73};

// Their probabilities, in the order of the tempos.
std::vector<TempoCandidate> weighed(const std::vector<BeatGrid>& grids) {
    std::vector<TempoCandidate> all;
    double best = -std::numeric_limits<double>::infinity();
    for (const BeatGrid& grid : grids) {
        const double score = std::inner_product(kWeights.begin(), kWeights.end(), grid.features.begin(), 0.0);
        all.push_back({grid.bpm, grid.beats, grid.isWhole(), score});
        best = std::max(best, score);
    }
    double sum = 0;
    for (TempoCandidate& candidate : all) {
        candidate.confidence = std::exp(candidate.confidence - best);
        sum += candidate.confidence;
    }
    for (TempoCandidate& candidate : all) candidate.confidence /= sum;
    std::sort(all.begin(), all.end(),
              [](const TempoCandidate& a, const TempoCandidate& b) { return a.bpm < b.bpm; });
    return all;
}

// The tempo that most of the probability lies near, of those the one that is itself likeliest; its confidence
// is that of all near it. Takes out also what is a little further off: the rest of the same peak.
TempoCandidate takeBest(std::vector<TempoCandidate>& all) {
    std::size_t from = 0, to = 0, best = 0;
    double near = 0, most = -1, confidence = 0;
    for (std::size_t i = 0; i < all.size(); ++i) {
        for (; to < all.size() && all[to].bpm <= all[i].bpm * (1 + kSame); ++to) near += all[to].confidence;
        for (; all[from].bpm < all[i].bpm * (1 - kSame); ++from) near -= all[from].confidence;
        if (near + all[i].confidence <= most) continue;
        most = near + all[i].confidence, best = i, confidence = near;
    }
    TempoCandidate candidate = all[best];
    candidate.confidence = std::clamp(confidence, 0.0, 1.0);
    std::erase_if(all, [&](const TempoCandidate& other) {
        return std::abs(other.bpm / candidate.bpm - 1) <= 2 * kSame;
    });
    return candidate;
}

}  // namespace

LoopTempo LoopTempo::of(std::span<const Onset> onsets, std::int64_t frames, double sampleRate) {
    std::vector<TempoCandidate> all = weighed(BeatGrid::candidates(onsets, frames, sampleRate));
    LoopTempo tempo;
    while (!all.empty() && tempo.candidates.size() < kMost) tempo.candidates.push_back(takeBest(all));
    std::stable_sort(
        tempo.candidates.begin(), tempo.candidates.end(),
        [](const TempoCandidate& a, const TempoCandidate& b) { return a.confidence > b.confidence; });
    return tempo;
}

}  // namespace qvct

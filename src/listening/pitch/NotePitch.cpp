#include "listening/pitch/NotePitch.h"

#include "listening/pitch/HarmonicSeries.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numeric>

namespace qvct {
namespace {

constexpr double kLowestHertz = 20, kHighestHertz = 8000;
constexpr double kRangeDb = 50;
constexpr std::size_t kPeaks = 40;

// Fitted by logistic regression: docs/analysis.md says on what. In the order of HarmonicSeries::Feature.
constexpr std::array<double, HarmonicSeries::kFeatures> kWeights = {
    4.68, 12.08, -2.21, 8.64, 3.96, -2.86, -4.81, 2.61, -0.95, 0.26, 2.85, 1.82, 3.66, -1.55};
// Confidence: a constant, the candidate's share among all, the level share of its partials, their share of
// the spectrum, the logarithm of the number of periods.
constexpr std::array<double, 5> kConfidence = {-13.64, 1.85, 1.73, 10.87, 0.77};

double scoreOf(const HarmonicSeries& series) {
    return std::inner_product(kWeights.begin(), kWeights.end(), series.features.begin(), 0.0);
}

// The share of the spectrum's power that lies within two bins of a partial.
double tonalShare(const SteadySpectrum& spectrum, std::span<const SpectralPeak> peaks, double fundamental) {
    const std::span<const float> powers = spectrum.powers();
    const auto binOf = [&](double hertz) {
        return std::min(powers.size() - 3,
                        static_cast<std::size_t>(std::lround(hertz / spectrum.hertzPerBin())));
    };
    double all = 0, tonal = 0;
    for (std::size_t bin = binOf(kLowestHertz); bin <= binOf(kHighestHertz); ++bin)
        all += static_cast<double>(powers[bin]);
    for (const SpectralPeak& peak : peaks) {
        std::size_t number = 1;
        if (partialWeight(peak.hertz, fundamental, number) < 0.2) continue;
        const std::size_t bin = std::max<std::size_t>(2, binOf(peak.hertz));
        for (std::size_t i = bin - 2; i <= bin + 2; ++i) tonal += static_cast<double>(powers[i]);
    }
    return all > 0 ? std::min(1.0, tonal / all) : 0;
}

NotePitch noteOf(double hertz, double confidence) {
    const double pitch = 69 + 12 * std::log2(hertz / 440);
    const double note = std::round(pitch);
    return {static_cast<int>(note), 100 * (pitch - note), hertz, confidence};
}

}  // namespace

std::optional<NotePitch> NotePitchDetector::pitchOf(std::span<const float> mono, double sampleRate) {
    if (!spectrum_.measure(mono, sampleRate)) return std::nullopt;
    findPeaks(spectrum_.powers(), spectrum_.hertzPerBin(), kLowestHertz, kHighestHertz, kRangeDb, kPeaks,
              peaks_);
    const std::vector<HarmonicSeries> candidates = harmonicSeriesOf(peaks_);
    if (candidates.empty()) return std::nullopt;

    std::vector<double> scores;
    scores.reserve(candidates.size());
    for (const HarmonicSeries& series : candidates) scores.push_back(scoreOf(series));
    const auto best = std::max_element(scores.begin(), scores.end());
    double sum = 0;
    for (const double score : scores) sum += std::exp(score - *best);
    const HarmonicSeries& winner = candidates[static_cast<std::size_t>(best - scores.begin())];

    const double periods = spectrum_.seconds() * winner.hertz;
    const double evidence = kConfidence[0] + kConfidence[1] / sum +
                            kConfidence[2] * winner.features[HarmonicSeries::kLevelShare] +
                            kConfidence[3] * tonalShare(spectrum_, peaks_, winner.hertz) +
                            kConfidence[4] * std::log(periods);
    const double confidence = 1 / (1 + std::exp(-evidence));
    if (!(confidence >= 0.5)) return std::nullopt;
    return noteOf(refinedFundamental(peaks_, winner.hertz), confidence);
}

}  // namespace qvct

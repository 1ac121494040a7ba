#include "listening/pitch/HarmonicSeries.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace qvct {
namespace {

constexpr double kLowestHertz = 24, kHighestHertz = 4700;
constexpr std::size_t kStrongest = 8, kMostFraction = 8;
constexpr double kSame = 1.012;  // candidates closer than that are one
constexpr std::size_t kPartials = 16;
constexpr double kPresent = 0.03;                      // level of a partial, 60 dB below the strongest peak
constexpr double kDetuned = 0.06, kStretched = 0.008;  // of the fundamental; of the peak
constexpr double kMostDetuned = 0.5;                   // of the fundamental
constexpr double kMiddleC = 260;

struct Tone {
    double hertz, level, energy;
};

std::vector<Tone> tonesOf(std::span<const SpectralPeak> peaks) {
    double strongest = 0;
    for (const SpectralPeak& peak : peaks) strongest = std::max(strongest, peak.power);
    std::vector<Tone> tones;
    tones.reserve(peaks.size());
    for (const SpectralPeak& peak : peaks) {
        const double energy = strongest > 0 ? peak.power / strongest : 0;
        tones.push_back({peak.hertz, std::sqrt(std::sqrt(energy)), energy});
    }
    return tones;
}

std::vector<double> candidatesOf(std::vector<Tone> tones) {
    const std::size_t count = std::min(kStrongest, tones.size());
    std::partial_sort(tones.begin(), tones.begin() + static_cast<std::ptrdiff_t>(count), tones.end(),
                      [](const Tone& a, const Tone& b) { return a.energy > b.energy; });
    std::vector<double> candidates;
    for (std::size_t i = 0; i < count; ++i) {
        for (std::size_t fraction = 1; fraction <= kMostFraction; ++fraction) {
            const double hertz = tones[i].hertz / static_cast<double>(fraction);
            if (hertz > kLowestHertz && hertz < kHighestHertz) candidates.push_back(hertz);
        }
    }
    std::sort(candidates.begin(), candidates.end());
    const auto isSame = [](double a, double b) { return b < a * kSame; };
    candidates.erase(std::unique(candidates.begin(), candidates.end(), isSame), candidates.end());
    return candidates;
}

double ratio(double part, double whole) {
    return whole > 0 ? part / whole : 0;
}

// The levels of the partials by their number; what the peaks say as a whole goes into the features at once.
std::array<double, kPartials + 1> matched(std::span<const Tone> tones, HarmonicSeries& series) {
    std::array<double, kPartials + 1> levels{};
    double allLevels = 0, allEnergy = 0;
    auto& features = series.features;
    for (const Tone& tone : tones) {
        std::size_t number = 1;
        const double weight = partialWeight(tone.hertz, series.hertz, number);
        const double phase = std::cos(2 * std::numbers::pi * tone.hertz / series.hertz);
        allLevels += tone.level;
        allEnergy += tone.energy;
        features[HarmonicSeries::kLevelShare] += tone.level * weight;
        features[HarmonicSeries::kEnergyShare] += tone.energy * weight;
        if (number <= 8) features[HarmonicSeries::kLowLevelShare] += tone.level * weight;
        features[HarmonicSeries::kPeriodicity] += tone.energy * phase;
        features[HarmonicSeries::kLevelPeriodicity] += tone.level * phase;
        if (number <= kPartials) levels[number] = std::max(levels[number], tone.level * weight);
    }
    for (const auto feature :
         {HarmonicSeries::kLevelShare, HarmonicSeries::kLowLevelShare, HarmonicSeries::kLevelPeriodicity})
        features[feature] = ratio(features[feature], allLevels);
    for (const auto feature : {HarmonicSeries::kEnergyShare, HarmonicSeries::kPeriodicity})
        features[feature] = ratio(features[feature], allEnergy);
    return levels;
}

void measurePartials(const std::array<double, kPartials + 1>& levels, HarmonicSeries& series) {
    double sum = 0, weight = 1, odd = 0, ten = 0, notThirds = 0, eleven = 0;
    std::size_t top = 0;
    for (std::size_t n = 1; n <= kPartials; ++n) {
        sum += levels[n] * weight;
        weight *= 0.8;
        if (levels[n] > 0) top = n;
        if (n <= 10) odd += n % 2 == 1 ? levels[n] : 0, ten += levels[n];
        if (n <= 11) notThirds += n % 3 != 0 ? levels[n] : 0, eleven += levels[n];
    }
    top = std::min<std::size_t>(top, 8);
    const auto gaps = std::count_if(levels.begin() + 1, levels.begin() + 1 + static_cast<std::ptrdiff_t>(top),
                                    [](double level) { return level < kPresent; });
    auto& features = series.features;
    features[HarmonicSeries::kHarmonicSum] = sum;
    features[HarmonicSeries::kFundamental] = std::sqrt(levels[1]);
    features[HarmonicSeries::kHasFundamental] = levels[1] > kPresent ? 1 : 0;
    features[HarmonicSeries::kSecond] = levels[2];
    features[HarmonicSeries::kLowest] = std::max({levels[1], levels[2], levels[3]});
    features[HarmonicSeries::kGaps] = ratio(static_cast<double>(gaps), static_cast<double>(top));
    features[HarmonicSeries::kOddShare] = ratio(odd, ten);
    features[HarmonicSeries::kNotThirds] = ratio(notThirds, eleven);
    features[HarmonicSeries::kOctave] = std::log2(series.hertz / kMiddleC);
}

}  // namespace

double partialWeight(double peakHertz, double fundamental, std::size_t& number) {
    const double partial = std::max(1.0, std::round(peakHertz / fundamental));
    number = static_cast<std::size_t>(partial);
    const double tolerance =
        std::min(kDetuned * fundamental + kStretched * peakHertz, kMostDetuned * fundamental);
    const double off = (peakHertz - partial * fundamental) / tolerance;
    return std::max(0.0, 1 - off * off);
}

double refinedFundamental(std::span<const SpectralPeak> peaks, double hertz) {
    constexpr std::size_t kFirst = 6;
    double sum = 0, weights = 0;
    for (const SpectralPeak& peak : peaks) {
        std::size_t number = 1;
        const double inTune = partialWeight(peak.hertz, hertz, number);
        if (number > kFirst) continue;
        const double weight = inTune * std::sqrt(peak.power) * static_cast<double>(number);
        sum += weight * peak.hertz / static_cast<double>(number);
        weights += weight;
    }
    return weights > 0 ? sum / weights : hertz;
}

std::vector<HarmonicSeries> harmonicSeriesOf(std::span<const SpectralPeak> peaks) {
    const std::vector<Tone> tones = tonesOf(peaks);
    std::vector<HarmonicSeries> all;
    for (const double hertz : candidatesOf(tones)) {
        HarmonicSeries& series = all.emplace_back();
        series.hertz = hertz;
        measurePartials(matched(tones, series), series);
    }
    return all;
}

}  // namespace qvct

#include "listening/tempo/BeatGrid.h"

#include "listening/tempo/OnsetSpectrum.h"

#include <algorithm>
#include <cmath>
#include <numbers>
#include <utility>

namespace qvct {
namespace {

constexpr double kUsualTempo = 115;
constexpr double kMostBeats = 256;      // of a sound that is assumed to last a whole number of them
constexpr std::size_t kMostPeaks = 24;  // of each kind
constexpr double kOrigin = 3;           // onsets that the beginning of the sound weighs as much as
constexpr double kMostRefined = 0.04;   // share of the tempo that the fit may change

struct Fit {
    double hertz, regularity;
};

// The grid of `parts` cells a beat that the onsets lie nearest to, by least squares; that the sound begins on
// a beat weighs like kOrigin onsets.
Fit fitted(std::span<const double> times, double hertz, double parts) {
    double period = 1 / (hertz * parts);
    for (int round = 0; round < 3; ++round) {
        double cells = 0, squares = 0, sum = 0, products = 0;
        for (const double time : times) {
            const double cell = std::round(time / period);
            cells += cell, squares += cell * cell, sum += time, products += cell * time;
        }
        const double count = static_cast<double>(times.size()) + kOrigin;
        const double determinant = count * squares - cells * cells;
        if (determinant < 1) break;
        const double slope = (count * products - cells * sum) / determinant;
        if (!(slope > 0)) break;
        period = slope;
    }
    double regularity = 0;
    for (const double time : times) regularity += std::cos(2 * std::numbers::pi * time / period);
    return {1 / (period * parts), regularity / static_cast<double>(times.size())};
}

// In quarters of a beat, or in thirds where the onsets agree with those clearly better.
double refined(std::span<const double> times, double hertz) {
    constexpr double kClearly = 0.05;
    const Fit quarters = fitted(times, hertz, 4), thirds = fitted(times, hertz, 3);
    const double best = thirds.regularity > quarters.regularity + kClearly ? thirds.hertz : quarters.hertz;
    return std::abs(best / hertz - 1) < kMostRefined ? best : hertz;
}

// The frequencies between the slowest and the fastest at which onsets are most regular on the levels that a
// beat of this metre has.
void addPeaks(const OnsetSpectrum& spectrum, std::span<const double> levels, std::vector<double>& found) {
    const double step = spectrum.hertzPerBin();
    const auto regularity = [&](double hertz) {
        double sum = 0;
        for (const double level : levels) sum += spectrum.at(level * hertz);
        return sum;
    };
    std::vector<std::pair<double, double>> peaks;  // regularity, frequency
    const auto first = static_cast<std::size_t>(std::ceil(BeatGrid::kSlowest / 60 / step));
    const auto last = static_cast<std::size_t>(BeatGrid::kFastest / 60 / step);
    double before = 0, here = 0;
    for (std::size_t bin = first; bin <= last; ++bin) {
        const double after = regularity(static_cast<double>(bin) * step);
        if (here > before && here >= after) peaks.emplace_back(here, (static_cast<double>(bin) - 1) * step);
        before = std::exchange(here, after);
    }
    const auto count = std::min(kMostPeaks, peaks.size());
    std::partial_sort(peaks.begin(), peaks.begin() + static_cast<std::ptrdiff_t>(count), peaks.end(),
                      std::greater<>());
    for (std::size_t i = 0; i < count; ++i) found.push_back(peaks[i].second);
}

void measure(BeatGrid& grid, const OnsetSpectrum& spectrum, bool isWhole) {
    const double hertz = grid.bpm / 60;
    const double octaves = std::log2(grid.bpm / kUsualTempo);
    const auto is = [](bool value) { return value ? 1.0 : 0.0; };
    const auto whole = static_cast<int>(isWhole ? grid.beats : 0);
    auto& features = grid.features;
    features[BeatGrid::kBeat] = spectrum.at(hertz);
    features[BeatGrid::kHalf] = spectrum.at(2 * hertz);
    features[BeatGrid::kFinest] = std::max(spectrum.at(3 * hertz), spectrum.at(4 * hertz));
    features[BeatGrid::kTwoBeats] = spectrum.at(hertz / 2);
    features[BeatGrid::kFourBeats] = spectrum.at(hertz / 4);
    features[BeatGrid::kWhole] = is(isWhole);
    features[BeatGrid::kWholeBars] = is(isWhole && whole % 4 == 0);
    features[BeatGrid::kPowerOfTwo] = is(whole >= 4 && whole <= 64 && (whole & (whole - 1)) == 0);
    features[BeatGrid::kTempo] = octaves;
    features[BeatGrid::kTempoSquared] = octaves * octaves;
}

}  // namespace

std::vector<BeatGrid> BeatGrid::candidates(std::span<const double> onsets, double seconds) {
    std::vector<BeatGrid> grids;
    if (onsets.empty() || !(seconds > 0)) return grids;
    const OnsetSpectrum spectrum(onsets, seconds);
    const auto least = static_cast<int>(std::clamp(std::ceil(kSlowest / 60 * seconds), 1.0, kMostBeats + 1));
    const auto most = static_cast<int>(std::clamp(std::floor(kFastest / 60 * seconds), 0.0, kMostBeats));
    for (int beats = least; beats <= most; ++beats) {
        grids.push_back({60 * beats / seconds, static_cast<double>(beats), {}});
        measure(grids.back(), spectrum, true);
    }
    std::vector<double> peaks;
    addPeaks(spectrum, std::array{1.0, 2.0, 4.0}, peaks);
    addPeaks(spectrum, std::array{1.0, 3.0}, peaks);
    for (const double peak : peaks) {
        const double hertz = refined(onsets, peak);
        grids.push_back({60 * hertz, hertz * seconds, {}});
        measure(grids.back(), spectrum, false);
    }
    return grids;
}

}  // namespace qvct

#include "listening/tempo/BeatGrid.h"

#include "listening/tempo/OnsetSpectrum.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <numbers>
#include <utility>

namespace qvct {
namespace {

constexpr double kUsualTempo = 115;
constexpr double kMostBeats = 256;  // of a sound that is assumed to last a whole number of them
constexpr int kMostHalfBeats = 12;
constexpr std::size_t kMostPeaks = 24;  // of each kind
constexpr std::size_t kMostOnsets = 512;
constexpr double kOrigin = 3;          // onsets that the beginning of the sound weighs as much as
constexpr double kMostRefined = 0.04;  // share of the tempo that the fit may change

struct Fit {
    double hertz, regularity;
};

// The grid of `parts` cells a beat that the onsets lie nearest to, by least squares; that the sound begins on
// a beat weighs like kOrigin onsets.
Fit fitted(std::span<const Stroke> onsets, double hertz, double parts) {
    double period = 1 / (hertz * parts);
    for (int round = 0; round < 3; ++round) {
        double cells = 0, squares = 0, sum = 0, products = 0;
        for (const Stroke& onset : onsets) {
            const double cell = std::round(onset.seconds / period);
            cells += cell, squares += cell * cell, sum += onset.seconds, products += cell * onset.seconds;
        }
        const double count = static_cast<double>(onsets.size()) + kOrigin;
        const double determinant = count * squares - cells * cells;
        if (determinant < 1) break;
        const double slope = (count * products - cells * sum) / determinant;
        if (!(slope > 0)) break;
        period = slope;
    }
    double regularity = 0;
    for (const Stroke& onset : onsets) regularity += std::cos(2 * std::numbers::pi * onset.seconds / period);
    return {1 / (period * parts), regularity / static_cast<double>(onsets.size())};
}

// In quarters of a beat, or in thirds where the onsets agree with those clearly better.
double refined(std::span<const Stroke> onsets, double hertz) {
    constexpr double kClearly = 0.05;
    const Fit quarters = fitted(onsets, hertz, 4), thirds = fitted(onsets, hertz, 3);
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
    const auto first = static_cast<std::size_t>(std::ceil(BeatGrid::kSlowest / 60.0 / step));
    const auto last = static_cast<std::size_t>(BeatGrid::kFastest / 60.0 / step);
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

double is(bool value) {
    return value ? 1 : 0;
}

void measureRegularity(BeatGrid& grid, const OnsetSpectrum& spectrum) {
    const double hertz = grid.bpm / 60;
    auto& features = grid.features;
    features[BeatGrid::kBeat] = spectrum.at(hertz);
    features[BeatGrid::kHalf] = spectrum.at(2 * hertz);
    features[BeatGrid::kThird] = spectrum.at(3 * hertz);
    features[BeatGrid::kQuick] = std::max(features[BeatGrid::kThird], spectrum.at(4 * hertz));
    features[BeatGrid::kQuickest] = std::max(spectrum.at(6 * hertz), spectrum.at(8 * hertz));
    features[BeatGrid::kTwoBeats] = spectrum.at(hertz / 2);
    features[BeatGrid::kFourBeats] = spectrum.at(hertz / 4);
    features[BeatGrid::kAccentBeat] = spectrum.accentAt(hertz);
    features[BeatGrid::kAccentHalf] = spectrum.accentAt(2 * hertz);
    features[BeatGrid::kAccentThird] = spectrum.accentAt(3 * hertz);
    features[BeatGrid::kAccentFourth] = spectrum.accentAt(4 * hertz);
    features[BeatGrid::kAccentTwo] = spectrum.accentAt(hertz / 2);
    features[BeatGrid::kAccentFour] = spectrum.accentAt(hertz / 4);
}

void measureTempo(BeatGrid& grid) {
    constexpr double kNearly = 0.01;  // beats a minute
    const double octaves = std::log2(grid.bpm / kUsualTempo);
    const double nearest = std::round(grid.bpm);
    const bool isWholeNumber = std::abs(grid.bpm - nearest) < kNearly;
    auto& features = grid.features;
    features[BeatGrid::kWholeNumber] = is(isWholeNumber);
    features[BeatGrid::kFives] = is(isWholeNumber && std::fmod(nearest, 5) == 0);
    features[BeatGrid::kTens] = is(isWholeNumber && std::fmod(nearest, 10) == 0);
    features[BeatGrid::kTempo] = octaves;
    features[BeatGrid::kTempoSquared] = octaves * octaves;
}

// Of a tempo at which the sound lasts whole or half beats. A length that is cut to whole frames at both ends
// may be a little more than a frame off.
void measureLength(BeatGrid& grid, double seconds, double frame) {
    constexpr double kFrames = 1.2, kLeast = 0.003;
    const double tolerance = std::max(kLeast, grid.bpm * kFrames * frame / seconds);
    const bool isWhole = std::fmod(grid.beats, 1) == 0;
    const auto beats = static_cast<unsigned>(grid.beats);
    auto& features = grid.features;
    features[BeatGrid::kWhole] = 1;
    features[BeatGrid::kEven] = is(isWhole && beats % 2 == 0);
    features[BeatGrid::kWholeBars] = is(isWhole && beats % 4 == 0);
    features[BeatGrid::kPowerOfTwo] = is(isWhole && beats >= 4 && beats <= 64 && std::has_single_bit(beats));
    features[BeatGrid::kExact] = is(std::abs(grid.bpm - std::round(grid.bpm)) <= tolerance);
}

// Of a tempo at which it does not. Bars that end as the last sound begins are played a little early.
void measureTail(BeatGrid& grid, double lastOnset, double seconds) {
    constexpr double kShortest = 0.1, kLongest = 2, kEarly = 0.03;
    const double earliest = std::max(lastOnset - kEarly, seconds - kLongest), latest = seconds - kShortest;
    for (int beats = 4; beats <= 64; beats *= 2) {
        const double end = beats * 60 / grid.bpm;
        if (end > earliest && end <= latest) grid.features[BeatGrid::kTail] = 1;
    }
}

// From one beat on; half beats, as bars of 5/8 last, only up to kMostHalfBeats.
std::vector<double> wholeLengths(double seconds) {
    const double least = std::max(2.0, std::ceil(BeatGrid::kSlowest / 60.0 * seconds * 2));
    const double most = std::min(kMostBeats, BeatGrid::kFastest / 60.0 * seconds) * 2;
    std::vector<double> lengths;
    if (least > most) return lengths;
    for (int halves = static_cast<int>(least); halves <= static_cast<int>(most); ++halves)
        if (halves % 2 == 0 || halves < 2 * kMostHalfBeats) lengths.push_back(halves / 2.0);
    return lengths;
}

// How loud each is, in proportion to all.
std::vector<Stroke> strokesOf(std::span<const Onset> onsets, std::int64_t frames, double sampleRate) {
    const double most = std::min(static_cast<double>(frames), OnsetSpectrum::kMostSeconds * sampleRate);
    std::vector<Stroke> strokes;
    double sum = 0;
    for (const auto& [frame, loudness] : onsets) {
        if (frame < 0 || static_cast<double>(frame) >= most || strokes.size() == kMostOnsets) continue;
        const double finite = std::isfinite(loudness) ? std::max(0.0F, loudness) : 0.0F;
        strokes.push_back({static_cast<double>(frame) / sampleRate, finite});
        sum += finite;
    }
    for (Stroke& stroke : strokes)
        stroke.accent = sum > 0 ? stroke.accent * static_cast<double>(strokes.size()) / sum - 1 : 0;
    return strokes;
}

}  // namespace

std::vector<BeatGrid> BeatGrid::candidates(std::span<const Onset> onsets, std::int64_t frames,
                                           double sampleRate) {
    std::vector<BeatGrid> grids;
    const std::vector<Stroke> strokes = strokesOf(onsets, frames, sampleRate);
    const double seconds = static_cast<double>(frames) / sampleRate;
    if (strokes.empty() || !(seconds > 0)) return grids;
    const OnsetSpectrum spectrum(strokes, seconds);
    const auto add = [&](double tempo, double length) -> BeatGrid& {
        grids.push_back({tempo, length, {}});
        measureRegularity(grids.back(), spectrum);
        measureTempo(grids.back());
        return grids.back();
    };
    for (const double beats : wholeLengths(seconds))
        measureLength(add(60 * beats / seconds, beats), seconds, 1 / sampleRate);
    const auto addUnbound = [&](double tempo) {
        measureTail(add(tempo, tempo / 60 * seconds), strokes.back().seconds, seconds);
    };
    for (int bpm = kSlowest; bpm <= kFastest; ++bpm) addUnbound(bpm);
    std::vector<double> peaks;
    addPeaks(spectrum, std::array{1.0, 2.0, 4.0}, peaks);
    addPeaks(spectrum, std::array{1.0, 3.0}, peaks);
    for (const double peak : peaks) addUnbound(60 * refined(strokes, peak));
    return grids;
}

}  // namespace qvct

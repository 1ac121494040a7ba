#include "listening/pitch/SpectralPeaks.h"

#include <algorithm>
#include <cmath>

namespace qvct {
namespace {

bool isPeak(const float* power) {
    return power[0] > power[-1] && power[0] > power[-2] && power[0] >= power[1] && power[0] > power[2];
}

void interpolate(SpectralPeak& peak, std::span<const float> powers, double hertzPerBin) {
    constexpr float kNothing = 1e-30F;
    const float* power = &powers[static_cast<std::size_t>(peak.hertz)];
    const double before = std::log(static_cast<double>(power[-1] + kNothing));
    const double here = std::log(static_cast<double>(power[0] + kNothing));
    const double after = std::log(static_cast<double>(power[1] + kNothing));
    const double curvature = before - 2 * here + after;
    const double offset = curvature < 0 ? std::clamp((before - after) / (2 * curvature), -0.5, 0.5) : 0;
    peak = {(peak.hertz + offset) * hertzPerBin, std::exp(here - (before - after) * offset / 4)};
}

}  // namespace

void findPeaks(std::span<const float> powers, double hertzPerBin, double lowest, double highest,
               double rangeDb, std::size_t most, std::vector<SpectralPeak>& peaks) {
    peaks.clear();
    const auto first = static_cast<std::size_t>(std::max(2.0, std::ceil(lowest / hertzPerBin)));
    const auto end = static_cast<std::size_t>(
        std::clamp(highest / hertzPerBin, 0.0, std::max(0.0, static_cast<double>(powers.size()) - 2)));
    float strongest = 0;
    for (std::size_t i = first; i < end; ++i) {
        if (!isPeak(&powers[i])) continue;
        // Bins for now: most peaks of noise are dropped again.
        peaks.push_back({static_cast<double>(i), powers[i]});
        strongest = std::max(strongest, powers[i]);
    }
    const float floor = strongest * static_cast<float>(std::pow(10, -rangeDb / 10));
    std::erase_if(peaks, [&](const SpectralPeak& peak) { return !(peak.power > double{floor}); });
    if (peaks.size() > most) {
        std::nth_element(peaks.begin(), peaks.begin() + static_cast<std::ptrdiff_t>(most), peaks.end(),
                         [](const SpectralPeak& a, const SpectralPeak& b) { return a.power > b.power; });
        peaks.resize(most);
        std::sort(peaks.begin(), peaks.end(),
                  [](const SpectralPeak& a, const SpectralPeak& b) { return a.hertz < b.hertz; });
    }
    for (SpectralPeak& peak : peaks) interpolate(peak, powers, hertzPerBin);
}

}  // namespace qvct

#include "listening/instrument/PartialTones.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace qvct {
namespace {

constexpr double kRate = 22'050;
constexpr double kWindowSeconds = 0.093;
constexpr std::array<double, PartialTones::kMoments> kStarts{0, 0.04, 0.15,
                                                             0.45};  // of the windows, in seconds
constexpr double kLowestHertz = 35, kHighestHertz = 9000;
constexpr double kConcert = 440;
constexpr float kQuiet = 1e-7F;  // of the total power: -70 dB
constexpr std::size_t kMostPeaks = 40;
constexpr std::size_t kCandidates = 5;  // fundamentals: the strongest peaks divided by 1 to kDivisors
constexpr std::size_t kDivisors = 4;

float level(float power, float total) {
    return std::log10(std::max(power / total, kQuiet));
}

}  // namespace

PartialTones::PartialTones(double sampleRate)
    : decimator_(sampleRate, kRate),
      spectra_(FourSpectra::sizeFor(kWindowSeconds, decimator_.sampleRate())),
      binWidth_(decimator_.sampleRate() / static_cast<double>(spectra_.size())),
      powers_(spectra_.bins()) {}

void PartialTones::append(std::span<const float> samples, std::vector<float>& values) {
    lower_.clear();
    decimator_.append(samples, lower_);
    std::array<const float*, kMoments> frames{};
    const auto startOf = [this](double seconds) {
        return static_cast<std::size_t>(seconds * decimator_.sampleRate());
    };
    lower_.resize(std::max(lower_.size(), startOf(kStarts.back()) + spectra_.size()), 0);
    for (std::size_t i = 0; i < kMoments; ++i) frames[i] = lower_.data() + startOf(kStarts[i]);
    const auto powers = spectra_.powers(frames);
    for (int moment = 0; moment < static_cast<int>(kMoments); ++moment) {
        for (std::size_t bin = 0; bin < powers.size(); ++bin) powers_[bin] = powers[bin].v[moment];
        appendMoment(powers_, values);
    }
}

// Local maxima, the strongest first, each moved to the top of the parabola through its neighbours.
void PartialTones::findPeaks(std::span<const float> powers) {
    peaks_.clear();
    const auto first = std::max<std::size_t>(2, static_cast<std::size_t>(kLowestHertz / binWidth_));
    const auto end = std::min(powers.size() - 2, static_cast<std::size_t>(kHighestHertz / binWidth_));
    for (std::size_t i = first; i < end; ++i) {
        const float here = powers[i];
        if (here <= powers[i - 1] || here < powers[i + 1] || here < powers[i - 2] || here < powers[i + 2])
            continue;
        const float left = std::log2(std::max(powers[i - 1], here * kQuiet) / here);
        const float right = std::log2(std::max(powers[i + 1], here * kQuiet) / here);
        const float bend = left + right;
        const float shift = bend < 0 ? (left - right) / (2 * bend) : 0;
        peaks_.push_back(
            {static_cast<float>(i) + std::clamp(shift, -0.5F, 0.5F), here + powers[i - 1] + powers[i + 1]});
    }
    const std::size_t kept = std::min(peaks_.size(), kMostPeaks);
    std::partial_sort(
        peaks_.begin(), peaks_.begin() + static_cast<std::ptrdiff_t>(kept), peaks_.end(),
        [](const Peak& a, const Peak& b) { return a.power != b.power ? a.power > b.power : a.bin < b.bin; });
    peaks_.resize(kept);
}

float PartialTones::powerNear(std::span<const float> powers, float bin) const {
    const auto middle = static_cast<std::size_t>(std::lround(bin));
    if (middle < 1 || middle + 1 >= powers.size()) return 0;
    return powers[middle - 1] + powers[middle] + powers[middle + 1];
}

// The candidate whose harmonics hold the most: loud ones count more, each by its square root; low candidates
// have more bins under their harmonics, so that they pay for it.
float PartialTones::fundamentalOf(std::span<const float> powers) const {
    float best = 0, bestSum = 0;
    const auto lowest = static_cast<float>(kLowestHertz / binWidth_);
    for (std::size_t p = 0; p < std::min(kCandidates, peaks_.size()); ++p) {
        for (std::size_t divisor = 1; divisor <= kDivisors; ++divisor) {
            const float candidate = peaks_[p].bin / static_cast<float>(divisor);
            if (candidate < std::max(lowest, 2.5F)) break;
            float sum = 0;
            for (std::size_t h = 1; h <= kHarmonics; ++h)
                sum += std::sqrt(powerNear(powers, candidate * static_cast<float>(h))) *
                       std::pow(0.9F, static_cast<float>(h));
            sum *= std::pow(0.93F, static_cast<float>(divisor - 1));
            if (sum > bestSum) {
                bestSum = sum;
                best = candidate;
            }
        }
    }
    return best;
}

void PartialTones::appendMoment(std::span<const float> powers, std::vector<float>& values) {
    const std::size_t end = values.size() + kValuesOfMoment;
    float total = 0;
    for (std::size_t i = 1; i < powers.size(); ++i) total += powers[i];
    findPeaks(powers);
    if (total < 1e-20F || peaks_.empty()) {
        values.resize(end, -7);
        return;
    }
    const auto octaves = [this](float bin) {
        return static_cast<float>(std::log2(static_cast<double>(bin) * binWidth_ / kConcert));
    };
    float inPeaks = 0;
    for (const Peak& peak : peaks_) inPeaks += peak.power;
    const float fundamental = fundamentalOf(powers);
    const float base = fundamental > 0 ? fundamental : peaks_.front().bin;
    float inHarmonics = 0;
    for (std::size_t h = 1; h <= 2 * kHarmonics; ++h)
        inHarmonics += powerNear(powers, base * static_cast<float>(h));
    values.push_back(octaves(peaks_.front().bin));
    values.push_back(octaves(base));
    values.push_back(level(inHarmonics, total));
    values.push_back(level(inPeaks, total));
    values.push_back(level(peaks_.front().power, total));
    for (std::size_t i = 0; i < kPeaks; ++i) {
        const Peak peak = i < peaks_.size() ? peaks_[i] : Peak{peaks_.front().bin, 0};
        values.push_back(std::log2(peak.bin / peaks_.front().bin));
        values.push_back(level(peak.power, total));
    }
    for (std::size_t h = 1; h <= kHarmonics; ++h)
        values.push_back(level(powerNear(powers, base * static_cast<float>(h)), total));
}

}  // namespace qvct

#include "listening/pitch/SteadySpectrum.h"

#include "listening/pitch/Decimation.h"

#include <algorithm>
#include <cmath>

namespace qvct {
namespace {

constexpr double kMostSeconds = 3;
constexpr double kReducedRate = 22'050;
constexpr double kBlock = 0.005;     // seconds of one value of the envelope
constexpr float kLoud = 0.063F;      // of the largest energy, -12 dB: the attack is nearly over
constexpr float kFaint = 0.001F;     // -30 dB: what comes later is not steady
constexpr std::size_t kAttack = 3;   // blocks that are left out
constexpr double kLongest = 1;       // seconds of the steady part
constexpr double kShortest = 0.030;  // seconds of it that are wanted at least
constexpr double kTooLittle = 0.020;

}  // namespace

bool SteadySpectrum::measure(std::span<const float> mono, double sampleRate) {
    const auto most = static_cast<std::size_t>(std::ceil(kMostSeconds * sampleRate));
    const auto factor = static_cast<std::size_t>(std::max(1L, std::lround(sampleRate / kReducedRate)));
    decimate(mono.first(std::min(mono.size(), most)), factor, samples_);
    rate_ = sampleRate / static_cast<double>(factor);
    const Section section = steadySection();
    const std::size_t size = section.end - section.begin;
    seconds_ = static_cast<double>(size) / rate_;
    if (seconds_ < kTooLittle || size < 8) return false;

    const std::size_t length = std::min(size, kSize);
    std::array<const float*, 4> starts{};
    for (std::size_t k = 0; k < starts.size(); ++k)
        starts[k] = &samples_[section.begin + k * (size - length) / (starts.size() - 1)];
    const std::span<const Lanes> powers = spectra_.powers(starts, length);
    Lanes sums(0);
    for (const Lanes power : powers) sums += power;
    Lanes weights;
    for (int k = 0; k < 4; ++k) weights.v[k] = sums.v[k] > 0 ? 1 / std::sqrt(sums.v[k]) : 0;
    powers_.resize(powers.size());
    for (std::size_t i = 0; i < powers.size(); ++i) {
        const Lanes power = powers[i] * weights;
        powers_[i] = power.v[0] + power.v[1] + power.v[2] + power.v[3];
    }
    return sums.v[0] > 0;
}

SteadySpectrum::Section SteadySpectrum::steadySection() const {
    const auto block = static_cast<std::size_t>(std::max(1.0, kBlock * rate_));
    const std::size_t blocks = samples_.size() / block;
    std::vector<float> energies(blocks);
    for (std::size_t b = 0; b < blocks; ++b) {
        for (std::size_t i = b * block; i < (b + 1) * block; ++i) energies[b] += samples_[i] * samples_[i];
    }
    const float loudest = blocks > 0 ? *std::max_element(energies.begin(), energies.end()) : 0;
    if (!(loudest > 0)) return {0, 0};
    std::size_t first = 0, last = blocks - 1;
    while (energies[first] < kLoud * loudest) ++first;
    while (energies[last] < kFaint * loudest) --last;

    const auto longest = static_cast<std::size_t>(kLongest * rate_);
    const auto shortest = static_cast<std::size_t>(kShortest * rate_);
    std::size_t begin = (first + kAttack) * block, end = (last + 1) * block;
    if (end < begin + shortest) {
        begin = first * block;
        end = std::min(samples_.size(), std::max(end, begin + shortest));
    }
    return {begin, std::min(end, begin + longest)};
}

}  // namespace qvct

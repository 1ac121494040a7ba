#include "listening/character/Loudness.h"

#include "listening/character/Emphasis.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <numbers>
#include <vector>

namespace qvct {
namespace {

constexpr double kLowestRate = 4000;
constexpr std::size_t kStepsOfBlock = 4;  // a block begins with each step of 100 ms
constexpr double kWarmUpSeconds =
    0.06;  // after which the filters have forgotten what came before, to -100 dB
constexpr double kAbsoluteGate = -70;
constexpr double kRelativeGate = -10;
constexpr float kInaudible = 1e-15F;  // added to samples: with less, processors slow down

double loudnessOf(double energy) {
    return -0.691 + 10 * std::log10(energy);
}

// The stretches of a sound that are filtered at once: two times four, so that the processor need not wait for
// each.
constexpr std::size_t kStretches = 8;
using Stretches = std::array<Lanes, kStretches / 4>;

// A filter of second order (transposed direct form II).
struct Biquad {
    float b0, b1, b2, a1, a2;
    Stretches first{}, second{};

    Lanes next(Lanes in, std::size_t i) {
        const Lanes out = in * b0 + first[i];
        first[i] = in * b1 - out * a1 + second[i];
        second[i] = in * b2 - out * a2;
        return out;
    }
};

// The two filters of BS.1770, whose table is for 48 kHz, for any rate: a head raises what is above 1.7 kHz by
// 4 dB; what is below 38 Hz is hardly heard. The analogue prototypes are those that give the table.
Biquad headFilter(double sampleRate) {
    const double k = std::tan(std::numbers::pi * 1681.974450955533 / sampleRate);
    const double q = k / 0.7071752369554196;
    const double high = std::pow(10, 3.999843853973347 / 20);
    const double band = std::pow(high, 0.4996667741545416) * q;
    const double a0 = 1 + q + k * k;
    const auto scaled = [a0](double value) { return static_cast<float>(value / a0); };
    return {scaled(high + band + k * k), scaled(2 * (k * k - high)), scaled(high - band + k * k),
            scaled(2 * (k * k - 1)), scaled(1 - q + k * k)};
}

Biquad lowCut(double sampleRate) {
    const double k = std::tan(std::numbers::pi * 38.13547087602444 / sampleRate);
    const double q = k / 0.5003270373238773;
    const double a0 = 1 + q + k * k;
    return {1, -2, 1, static_cast<float>(2 * (k * k - 1) / a0), static_cast<float>((1 - q + k * k) / a0)};
}

// Adds the energies of a channel's steps, K-weighted. The stretches are filtered each from a little before
// its beginning on.
class KWeightedSteps {
  public:
    KWeightedSteps(double sampleRate, std::size_t samples)
        : rate_(sampleRate),
          length_(static_cast<std::size_t>(std::lround(sampleRate / 10))),
          warmUp_(static_cast<std::size_t>(kWarmUpSeconds * sampleRate)),
          stepsOfStretch_(((samples + length_ - 1) / length_ + kStretches - 1) / kStretches),
          energies_(kStretches * stepsOfStretch_) {}

    std::size_t length() const { return length_; }
    const std::vector<double>& energies() const { return energies_; }

    void add(std::span<const float> channel) {
        Filters filters{headFilter(rate_), lowCut(rate_)};
        run(channel, 0, warmUp_, filters);
        for (std::size_t step = 0; step < stepsOfStretch_; ++step) {
            const Stretches energies = run(channel, warmUp_ + step * length_, length_, filters);
            for (std::size_t i = 0; i < kStretches; ++i)
                energies_[i * stepsOfStretch_ + step] += double{energies[i / 4].v[i % 4]};
        }
    }

  private:
    struct Filters {
        Biquad head, low;
    };

    // The energies of so many samples of each stretch. `begin` is counted from the warm-up on.
    Stretches run(std::span<const float> channel, std::size_t begin, std::size_t count,
                  Filters& filters) const {
        std::array<Stretches, 128> block;
        Stretches sums{};
        for (std::size_t done = 0; done < count; done += block.size()) {
            const std::size_t size = std::min(block.size(), count - done);
            for (std::size_t i = 0; i < kStretches; ++i)
                load(channel, begin + done + i * stepsOfStretch_ * length_, size,
                     reinterpret_cast<float*>(block.data()) + i);
            Stretches energies{};
            auto [head, low] = filters;  // a copy, which can be kept in registers
            for (std::size_t at = 0; at < size; ++at) {
                for (std::size_t i = 0; i < energies.size(); ++i) {
                    const Lanes out = low.next(head.next(block[at][i] + Lanes(kInaudible), i), i);
                    energies[i] += out * out;
                }
            }
            filters = {head, low};
            for (std::size_t i = 0; i < energies.size(); ++i) sums[i] += energies[i];
        }
        return sums;
    }

    // What is outside the sound is silence.
    void load(std::span<const float> channel, std::size_t begin, std::size_t count, float* lanes) const {
        const std::size_t end = channel.size() + warmUp_;
        const std::size_t from = begin >= warmUp_ ? 0 : std::min(count, warmUp_ - begin);
        const std::size_t to = std::max(from, begin >= end ? 0 : std::min(count, end - begin));
        for (std::size_t i = 0; i < from; ++i) lanes[kStretches * i] = 0;
        for (std::size_t i = from; i < to; ++i) lanes[kStretches * i] = channel[begin + i - warmUp_];
        for (std::size_t i = to; i < count; ++i) lanes[kStretches * i] = 0;
    }

    double rate_;
    std::size_t length_, warmUp_;
    std::size_t stepsOfStretch_;
    std::vector<double> energies_;
};

// The mean of the energies of the blocks that are louder than the gate.
double gatedMean(const std::vector<double>& blocks, double gate) {
    double sum = 0;
    std::size_t count = 0;
    for (const double energy : blocks) {
        if (loudnessOf(energy) < gate) continue;
        sum += energy;
        ++count;
    }
    return count == 0 ? 0 : sum / static_cast<double>(count);
}

}  // namespace

std::optional<double> integratedLoudness(std::span<const float> left, std::span<const float> right,
                                         double sampleRate) {
    if (sampleRate < kLowestRate || left.empty()) return std::nullopt;
    KWeightedSteps steps(sampleRate, left.size());
    steps.add(left);
    if (!right.empty()) steps.add(right);

    const auto& energies = steps.energies();
    const std::size_t wholeSteps = left.size() / steps.length();
    const std::size_t count = wholeSteps < kStepsOfBlock ? 1 : wholeSteps - kStepsOfBlock + 1;
    std::vector<double> blocks(count);
    for (std::size_t block = 0; block < count; ++block) {
        for (std::size_t i = block; i < std::min(energies.size(), block + kStepsOfBlock); ++i)
            blocks[block] += energies[i];
        blocks[block] /= static_cast<double>(kStepsOfBlock * steps.length());
    }
    const double mean = gatedMean(blocks, kAbsoluteGate);
    if (mean <= 0) return std::nullopt;
    return loudnessOf(gatedMean(blocks, std::max(kAbsoluteGate, loudnessOf(mean) + kRelativeGate)));
}

}  // namespace qvct

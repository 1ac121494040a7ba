#include "listening/character/Attack.h"

#include "listening/character/Emphasis.h"

#include <algorithm>
#include <cmath>
#include <numbers>
#include <vector>

namespace qvct {
namespace {

constexpr double kLowestRate = 2000;
constexpr double kBlockSeconds = 0.001;
constexpr double kReleaseSeconds = 0.03;  // longer than a period of what can be heard
constexpr double kBurstSeconds = 0.02;
constexpr double kSteepest = 0.5;  // of a block, by which the envelope rises by its half
constexpr float kSilence = 1e-6F;
constexpr double kLowestHertz = 20;  // that can be heard; a short sound may have none at all

// One block of samples, filtered.
struct Block {
    float peak;
    float energy;       // of the filtered samples
    float differences;  // energy of their differences
};

// Every block but an incomplete last one of a sound that has others.
std::vector<Block> blocksOf(std::span<const float> samples, float mean, std::size_t length, float feedback) {
    std::vector<Block> blocks;
    blocks.reserve(samples.size() / length);
    const Lanes offset(mean * (1 - feedback));
    for (std::size_t at = 2; at + length <= samples.size(); at += length) {
        Lanes peak(0), energy(0), differences(0);
        for (std::size_t i = at; i < at + length; i += 4) {
            const Lanes filtered = emphasized(&samples[i], feedback) - offset;
            const Lanes difference = filtered + offset - emphasized(&samples[i - 1], feedback);
            peak = larger(peak, larger(filtered, -filtered));
            energy += filtered * filtered;
            differences += difference * difference;
        }
        Block block{0, 0, 0};
        for (int lane = 0; lane < 4; ++lane) {
            block.peak = std::max(block.peak, peak.v[lane]);
            block.energy += energy.v[lane];
            block.differences += differences.v[lane];
        }
        blocks.push_back(block);
    }
    return blocks;
}

// The peaks, falling slowly, so that a low tone has no attack in each of its periods.
std::vector<float> envelopeOf(const std::vector<Block>& blocks, float kept) {
    std::vector<float> envelope;
    envelope.reserve(blocks.size());
    float level = 0;
    for (const Block& block : blocks) envelope.push_back(level = std::max(block.peak, level * kept));
    return envelope;
}

struct Rise {
    float height;
    std::size_t end;
};

// The largest rise within so many blocks; before the sound there is silence.
Rise largestRise(const std::vector<float>& envelope, std::size_t blocks) {
    Rise largest{0, 0};
    for (std::size_t i = 0; i < envelope.size(); ++i) {
        const float rise = envelope[i] - (i < blocks ? 0 : envelope[i - blocks]);
        if (rise > largest.height) largest = {rise, i};
    }
    return largest;
}

struct Onset {
    double blocks;
    std::size_t end;
};

// The shortest time in which the envelope rises by half of its largest value, between the lengths that are
// tried: each a quarter longer than the one before. The longest finds the largest value itself.
Onset shortestRise(const std::vector<float>& envelope) {
    const float half = *std::max_element(envelope.begin(), envelope.end()) / 2;
    double blocksBefore = 0, before = 0;
    for (std::size_t blocks = 1;; blocks += std::max<std::size_t>(1, blocks / 4)) {
        const Rise rise = largestRise(envelope, blocks);
        if (rise.height >= half) {
            const double part = (double{half} - before) / (double{rise.height} - before);
            return {std::lerp(blocksBefore, static_cast<double>(blocks), part), rise.end};
        }
        blocksBefore = static_cast<double>(blocks);
        before = rise.height;
    }
}

}  // namespace

double Attack::hardness() const {
    return std::log2(hertz / 1000) - std::log2(milliseconds / 10);
}

std::optional<Attack> steepestAttack(std::span<const float> samples, float mean, double sampleRate) {
    if (sampleRate < kLowestRate) return std::nullopt;
    const auto length =
        static_cast<std::size_t>(std::max(1.0, std::round(sampleRate * kBlockSeconds / 4))) * 4;
    const double blockSeconds = static_cast<double>(length) / sampleRate;
    const std::vector<Block> blocks = blocksOf(samples, mean, length, emphasisFeedback(sampleRate));
    const std::vector<float> envelope =
        envelopeOf(blocks, static_cast<float>(std::exp(-blockSeconds / kReleaseSeconds)));
    if (envelope.empty() || *std::max_element(envelope.begin(), envelope.end()) < kSilence)
        return std::nullopt;

    const Onset onset = shortestRise(envelope);
    const auto burst = static_cast<std::size_t>(kBurstSeconds / blockSeconds);
    double energy = 0, differences = 0;
    for (std::size_t i = onset.end; i < std::min(blocks.size(), onset.end + burst); ++i) {
        energy += blocks[i].energy;
        differences += blocks[i].differences;
    }
    // The difference of a sine from one sample to the next is 2 sin(w / 2) times as large as the sine.
    const double angle = 2 * std::asin(std::min(1.0, std::sqrt(differences / energy) / 2));
    return Attack{std::max(kSteepest, onset.blocks) * blockSeconds * 1000,
                  std::max(kLowestHertz, angle * sampleRate / (2 * std::numbers::pi))};
}

}  // namespace qvct

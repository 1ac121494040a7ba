#include "listening/instrument/NetworkLayer.h"

#include <algorithm>

namespace qvct {
namespace {

constexpr float kStray = 4;  // standard deviations that an input may be off

}  // namespace

std::vector<float> Standardisation::of(std::span<const float> features) const {
    std::vector<float> inputs(means.size());
    for (std::size_t i = 0; i < inputs.size(); ++i)
        inputs[i] = std::clamp((features[i] - means[i]) * scales[i], -kStray, kStray);
    return inputs;
}

std::vector<float> NetworkLayer::of(std::span<const float> values) const {
    std::vector<float> sums = biases;
    for (std::size_t i = 0; i < inputs; ++i) {
        const float value = values[i];
        if (value == 0) continue;  // as half of the rectified ones are
        const float* const its = &weights[i * outputs];
        for (std::size_t o = 0; o < outputs; ++o) sums[o] += value * its[o];
    }
    return sums;
}

void rectify(std::vector<float>& values) {
    for (float& value : values) value = std::max(value, 0.0F);
}

}  // namespace qvct

#pragma once

#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// What the first layer of a network is given: how far each feature lies from its mean, in standard
/// deviations, at most 4 of them.
struct Standardisation {
    std::vector<float> means, scales;

    /// REQUIRES: as many features as there are means.
    std::vector<float> of(std::span<const float> features) const;
};

/// A layer of a network.
struct NetworkLayer {
    std::size_t inputs = 0, outputs = 0;
    std::vector<float> weights;  ///< By input, then output.
    std::vector<float> biases;

    /// The biases and the sums of each value times its weights. REQUIRES: `inputs` values.
    std::vector<float> of(std::span<const float> values) const;
};

/// Makes 0 of what is below it.
void rectify(std::vector<float>& values);

}  // namespace qvct

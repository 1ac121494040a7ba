#pragma once

#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// Every `factor`-th sample of a sound after a triangular low pass, which is the running mean taken twice:
/// what is folded down lies at least 26 dB lower, less only close to the new limit.
///
/// Overwrites `result`; its size is that of the sound divided by the factor. REQUIRES: factor >= 1.
void decimate(std::span<const float> sound, std::size_t factor, std::vector<float>& result);

}  // namespace qvct

#pragma once

#include <vector>

namespace qvct {

/// How strong each cell of one bar is in its metre: 1 on the downbeat, less on each finer subdivision.
///
/// A cell is an eighth of a beat of a quarter-note metre. Empty for a numerator other than 2, 3, 4, 6, 9, 12.
std::vector<float> metricWeightsOfBar(int numerator, int denominator);

}  // namespace qvct

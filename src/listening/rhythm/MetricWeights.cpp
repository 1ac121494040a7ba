#include "listening/rhythm/MetricWeights.h"

#include <array>
#include <cmath>
#include <cstddef>
#include <initializer_list>

namespace qvct {
namespace {

float decay(int power) {
    return static_cast<float>(std::pow(static_cast<double>(0.7F), power));
}

// Halves the bar again and again; the cells in the middle of the parts are a step weaker each time.
std::vector<float> binaryBar(int numerator, int denominator) {
    const int cells = (denominator == 4 ? 8 : 16) * numerator;
    const int levels = numerator == 2 && denominator == 4 ? 4 : 5;
    std::vector<float> bar(static_cast<std::size_t>(cells));
    bar[0] = 1;
    for (int level = 0; level < levels; ++level) {
        for (int j = 0; j < 1 << level; ++j) {
            bar[static_cast<std::size_t>((2 * j + 1) * cells / (2 << level))] = decay(level + 1);
        }
    }
    return bar;
}

// Each cell takes the weight of the first of `steps` that divides its number: 0.7, 0.49 and so on.
std::vector<float> steppedBar(std::size_t cells, std::initializer_list<std::size_t> steps) {
    std::vector<float> bar(cells);
    bar[0] = 1;
    for (std::size_t cell = 1; cell < cells; ++cell) {
        int power = 1;
        for (const std::size_t step : steps) {
            if (cell % step == 0) break;
            ++power;
        }
        bar[cell] = decay(power);
    }
    return bar;
}

}  // namespace

std::vector<float> metricWeightsOfBar(int numerator, int denominator) {
    switch (numerator) {
        case 2:
        case 4:
            return binaryBar(numerator, denominator);
        case 3:
            return steppedBar(24, {8, 4, 2});
        case 6:
            return steppedBar(24, {12, 4, 2});
        case 9:
            return steppedBar(36, {12, 4, 2});
        case 12:
            return steppedBar(48, {24, 12, 4, 2});
        default:
            return {};
    }
}

}  // namespace qvct

#include "listening/tempo/OnsetSpectrum.h"

#include "platform/base/Lanes.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>

namespace qvct {
namespace {

constexpr std::size_t kLanes = 4;

// Four neighbouring bins of e^(i w t), and the factor that leads to the next four.
struct Rotation {
    Lanes real, imaginary;
    Lanes stepReal, stepImaginary;

    explicit Rotation(double radiansPerBin) {
        for (std::size_t i = 0; i < kLanes; ++i) {
            real.v[i] = static_cast<float>(std::cos(radiansPerBin * static_cast<double>(i)));
            imaginary.v[i] = static_cast<float>(std::sin(radiansPerBin * static_cast<double>(i)));
        }
        stepReal = static_cast<float>(std::cos(radiansPerBin * kLanes));
        stepImaginary = static_cast<float>(std::sin(radiansPerBin * kLanes));
    }
    void step() {
        const Lanes before = real;
        real = real * stepReal - imaginary * stepImaginary;
        imaginary = before * stepImaginary + imaginary * stepReal;
    }
};

}  // namespace

OnsetSpectrum::OnsetSpectrum(std::span<const Stroke> strokes, double seconds)
    : hertzPerBin_(1 / (std::clamp(seconds, 0.01, kMostSeconds) * kOversampling)) {
    const auto bins = static_cast<std::size_t>(kHighestHertz / hertzPerBin_) + 2;
    struct Sums {
        Lanes real, imaginary, accents;
    };
    std::vector<Sums> sums((bins + kLanes - 1) / kLanes);
    for (const Stroke& stroke : strokes) {
        Rotation rotation(2 * std::numbers::pi * hertzPerBin_ * stroke.seconds);
        const Lanes accent(static_cast<float>(stroke.accent));
        for (Sums& sum : sums) {
            sum.real += rotation.real;
            sum.imaginary += rotation.imaginary;
            sum.accents += accent * rotation.real;
            rotation.step();
        }
    }
    const float scale = strokes.empty() ? 0 : 1 / static_cast<float>(strokes.size());
    for (const Sums& sum : sums) {
        const Lanes magnitude = squareRoot(sum.real * sum.real + sum.imaginary * sum.imaginary);
        for (std::size_t i = 0; i < kLanes; ++i) {
            regularity_.push_back(magnitude.v[i] * scale);
            accents_.push_back(sum.accents.v[i] * scale);
        }
    }
}

double OnsetSpectrum::between(const std::vector<float>& values, double hertz) const {
    const double bin = hertz / hertzPerBin_;
    const auto low = static_cast<std::size_t>(bin);
    if (hertz > kHighestHertz || low + 1 >= values.size()) return 0;
    const double part = bin - static_cast<double>(low);
    return (1 - part) * static_cast<double>(values[low]) + part * static_cast<double>(values[low + 1]);
}

}  // namespace qvct

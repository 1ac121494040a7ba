#include "listening/tempo/OnsetSpectrum.h"

#include <algorithm>
#include <cmath>
#include <complex>
#include <numbers>

namespace qvct {

OnsetSpectrum::OnsetSpectrum(std::span<const double> times, double seconds)
    : hertzPerBin_(1 / (std::clamp(seconds, 0.01, kMostSeconds) * kOversampling)) {
    std::vector<std::complex<float>> sums(static_cast<std::size_t>(kHighestHertz / hertzPerBin_) + 2);
    for (const double time : times) {
        const std::complex<double> step = std::polar(1.0, 2 * std::numbers::pi * hertzPerBin_ * time);
        std::complex<double> value = 1;
        for (std::complex<float>& sum : sums) {
            sum += std::complex<float>(value);
            value = {value.real() * step.real() - value.imag() * step.imag(),
                     value.real() * step.imag() + value.imag() * step.real()};
        }
    }
    const float scale = times.empty() ? 0 : 1 / static_cast<float>(times.size());
    magnitudes_.reserve(sums.size());
    for (const std::complex<float>& sum : sums) magnitudes_.push_back(std::abs(sum) * scale);
}

double OnsetSpectrum::at(double hertz) const {
    const double bin = hertz / hertzPerBin_;
    const auto low = static_cast<std::size_t>(bin);
    if (low + 1 >= magnitudes_.size()) return 0;
    const double part = bin - static_cast<double>(low);
    return (1 - part) * static_cast<double>(magnitudes_[low]) +
           part * static_cast<double>(magnitudes_[low + 1]);
}

}  // namespace qvct

#include "listening/sound/FourSpectra.h"

#include <algorithm>
#include <cmath>
#include <complex>
#include <numbers>

#include <kissfft.hh>

namespace qvct {
namespace {

constexpr std::size_t kSmallest = 16;

}  // namespace

struct FourSpectra::Transform {
    explicit Transform(std::size_t size)
        : plan(size / 2, false), input(size), spectrum(size / 2), powers(size / 2) {}

    kissfft<Lanes> plan;
    std::vector<Lanes> input;
    std::vector<std::complex<Lanes>> spectrum;
    std::vector<Lanes> powers;
};

FourSpectra::FourSpectra(std::size_t size) : window_(size), transform_(std::make_unique<Transform>(size)) {
    const auto count = static_cast<double>(size);
    for (std::size_t i = 0; i < size; ++i) {
        const double phase = 2 * std::numbers::pi * (static_cast<double>(i) + 0.5) / count;
        window_[i] = static_cast<float>((1 - std::cos(phase)) * 2 / count);
    }
}

FourSpectra::~FourSpectra() = default;

std::size_t FourSpectra::sizeFor(double seconds, double sampleRate) {
    auto half = std::max(kSmallest, static_cast<std::size_t>(std::lround(sampleRate * seconds))) / 2;
    for (;; ++half) {
        std::size_t rest = half;
        for (const std::size_t prime : {2U, 3U, 5U}) {
            while (rest % prime == 0) rest /= prime;
        }
        if (rest == 1) return 2 * half;
    }
}

std::span<const Lanes> FourSpectra::powers(const std::array<const float*, 4>& frames, std::size_t length) {
    auto& [plan, input, spectrum, powers] = *transform_;
    for (std::size_t i = 0; i < length; ++i) {
        const Lanes::Vector four = {frames[0][i], frames[1][i], frames[2][i], frames[3][i]};
        input[i] = Lanes(four) * window_[length == size() ? i : (2 * i + 1) * size() / (2 * length)];
    }
    std::fill(input.begin() + static_cast<std::ptrdiff_t>(length), input.end(), Lanes(0));
    plan.transform_real(input.data(), spectrum.data());
    spectrum[0].imag(Lanes(0));  // where the transform keeps half the rate
    for (std::size_t i = 0; i < spectrum.size(); ++i) {
        powers[i] = spectrum[i].real() * spectrum[i].real() + spectrum[i].imag() * spectrum[i].imag();
    }
    return powers;
}

}  // namespace qvct

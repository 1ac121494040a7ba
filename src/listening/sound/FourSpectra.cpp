#include "listening/sound/FourSpectra.h"

#include <algorithm>
#include <complex>

namespace qvct {
namespace {

constexpr std::size_t kSmallest = 16;

}  // namespace

FourSpectra::FourSpectra(std::size_t size)
    : transforms_(size), window_(FourTransforms::window(size)), powers_(size / 2) {}

std::size_t FourSpectra::sizeFor(double seconds, double sampleRate) {
    return FourTransforms::sizeFor(seconds, sampleRate, kSmallest);
}

std::span<const Lanes> FourSpectra::powers(const std::array<const float*, 4>& frames) {
    transforms_.load(frames, window_);
    return powersOfInput();
}

std::span<const Lanes> FourSpectra::powers(const std::array<const float*, 4>& frames, std::size_t length) {
    if (length == size()) return powers(frames);
    const std::span<Lanes> input = transforms_.input();
    for (std::size_t i = 0; i < length; ++i) {
        const Lanes::Vector four = {frames[0][i], frames[1][i], frames[2][i], frames[3][i]};
        input[i] = Lanes(four) * window_[(2 * i + 1) * size() / (2 * length)];
    }
    std::fill(input.begin() + static_cast<std::ptrdiff_t>(length), input.end(), Lanes(0));
    return powersOfInput();
}

std::span<const Lanes> FourSpectra::powersOfInput() {
    const std::span<const std::complex<Lanes>> bins = transforms_.transform();
    powers_[0] = bins[0].real() * bins[0].real();  // whose imaginary part belongs to half the rate
    for (std::size_t i = 1; i < bins.size(); ++i)
        powers_[i] = bins[i].real() * bins[i].real() + bins[i].imag() * bins[i].imag();
    return powers_;
}

}  // namespace qvct

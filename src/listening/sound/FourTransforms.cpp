#include "listening/sound/FourTransforms.h"

#include <algorithm>
#include <cmath>
#include <numbers>

#include <kissfft.hh>

namespace qvct {

struct FourTransforms::Buffers {
    explicit Buffers(std::size_t size) : plan(size / 2, false), input(size), bins(size / 2) {}

    kissfft<Lanes> plan;
    std::vector<Lanes> input;
    std::vector<std::complex<Lanes>> bins;
};

FourTransforms::FourTransforms(std::size_t size) : buffers_(std::make_unique<Buffers>(size)) {}

FourTransforms::~FourTransforms() = default;

std::size_t FourTransforms::sizeFor(double seconds, double sampleRate, std::size_t smallest) {
    auto half = std::max(smallest, static_cast<std::size_t>(std::lround(sampleRate * seconds))) / 2;
    for (;; ++half) {
        std::size_t rest = half;
        for (const std::size_t prime : {2U, 3U, 5U}) {
            while (rest % prime == 0) rest /= prime;
        }
        if (rest == 1) return 2 * half;
    }
}

std::vector<float> FourTransforms::window(std::size_t size) {
    std::vector<float> window(size);
    const auto count = static_cast<double>(size);
    for (std::size_t i = 0; i < size; ++i) {
        const double phase = 2 * std::numbers::pi * (static_cast<double>(i) + 0.5) / count;
        window[i] = static_cast<float>((1 - std::cos(phase)) * 2 / count);
    }
    return window;
}

std::size_t FourTransforms::size() const {
    return buffers_->input.size();
}

std::span<Lanes> FourTransforms::input() {
    return buffers_->input;
}

void FourTransforms::load(const std::array<const float*, 4>& frames, std::span<const float> window) {
    const std::span<Lanes> input = buffers_->input;
    std::size_t i = 0;
    for (; i + 4 <= input.size(); i += 4) {
        std::array<Lanes, 4> rows;
        for (std::size_t k = 0; k < 4; ++k) rows[k] = lanesAt(frames[k] + i) * lanesAt(&window[i]);
        transpose(rows);
        std::copy(rows.begin(), rows.end(), &input[i]);
    }
    for (; i < input.size(); ++i) {
        const Lanes::Vector four = {frames[0][i], frames[1][i], frames[2][i], frames[3][i]};
        input[i] = Lanes(four) * window[i];
    }
}

std::span<const std::complex<Lanes>> FourTransforms::transform() {
    buffers_->plan.transform_real(buffers_->input.data(), buffers_->bins.data());
    return buffers_->bins;
}

}  // namespace qvct

#include "demo/synthesis/Synthesis.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace qvct::demo {

double hertzOfKey(double midiKey) {
    return 440 * std::exp2((midiKey - 69) / 12);
}

double decayed(double time, double seconds) {
    return std::exp(-time / seconds);
}

std::size_t framesIn(double seconds, int rate) {
    return static_cast<std::size_t>(std::llround(seconds * rate));
}

double Noise::next() {
    state_ ^= state_ << 13;
    state_ ^= state_ >> 17;
    state_ ^= state_ << 5;
    return std::ldexp(static_cast<double>(state_), -31) - 1;
}

double Oscillator::advance(double hertz) {
    increment_ = hertz / rate_;
    const double phase = phase_;
    phase_ += increment_;
    phase_ -= std::floor(phase_);
    return phase;
}

double Oscillator::roundedStep(double phase, double increment) {
    if (phase < increment) {
        const double x = phase / increment;
        return 2 * x - x * x - 1;
    }
    if (phase > 1 - increment) {
        const double x = (phase - 1) / increment;
        return x * x + 2 * x + 1;
    }
    return 0;
}

double Oscillator::saw(double hertz) {
    const double phase = advance(hertz);
    return 2 * phase - 1 - roundedStep(phase, increment_);
}

double Oscillator::square(double hertz) {
    const double phase = advance(hertz);
    const double shifted = phase < 0.5 ? phase + 0.5 : phase - 0.5;
    return (phase < 0.5 ? 1 : -1) + roundedStep(phase, increment_) - roundedStep(shifted, increment_);
}

void Filter::tune(double hertz, double quality) {
    coefficient_ = std::tan(std::numbers::pi * std::clamp(hertz, 10.0, 0.45 * rate_) / rate_);
    damping_ = 1 / quality;
}

void Filter::feed(double sample) {
    high_ = (sample - (damping_ + coefficient_) * state1_ - state2_) /
            (1 + coefficient_ * (coefficient_ + damping_));
    band_ = coefficient_ * high_ + state1_;
    state1_ = coefficient_ * high_ + band_;
    low_ = coefficient_ * band_ + state2_;
    state2_ = coefficient_ * band_ + low_;
}

void passBand(Signal& signal, int rate, double lowCut, double highCut) {
    Filter highPass(rate);
    Filter lowPass(rate);
    highPass.tune(lowCut, 0.7);
    lowPass.tune(highCut, 0.7);
    for (double& sample : signal) {
        highPass.feed(sample);
        lowPass.feed(highPass.high());
        sample = lowPass.low();
    }
}

void drive(Signal& signal, double amount) {
    if (amount <= 1) return;
    for (double& sample : signal) sample = std::tanh(amount * sample) / std::tanh(amount);
}

void fadeOut(Signal& signal, int rate, double seconds) {
    const std::size_t length = std::min(signal.size(), framesIn(seconds, rate));
    for (std::size_t i = 0; i < length; ++i) {
        signal[signal.size() - 1 - i] *= static_cast<double>(i) / static_cast<double>(length);
    }
}

}  // namespace qvct::demo

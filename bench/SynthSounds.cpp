#include "SynthSounds.h"

#include <algorithm>
#include <cmath>
#include <complex>
#include <numbers>
#include <random>

namespace qvct::bench {
namespace {

constexpr double kTau = 2 * std::numbers::pi;

struct Cymbal {
    unsigned seed;
    double lowest, highest;  // Hz
    double tail;             // seconds in which the lowest mode falls by 60 dB; higher ones fall faster
    double swell;            // seconds in which the wash builds up
    double loudest;
};

// A plate has so many modes that random ones stand for them.
Sound struck(const Cymbal& cymbal, unsigned stroke) {
    constexpr int kModes = 300;
    constexpr double kSeconds = 4;
    constexpr double kStickSeconds = 0.002;
    std::mt19937 modes(cymbal.seed), strokes(cymbal.seed + 100 * stroke);
    std::uniform_real_distribution<double> share(0, 1);
    std::normal_distribution<double> normal;
    std::vector<double> wave(static_cast<std::size_t>(kSeconds * kRate));
    for (int mode = 0; mode < kModes; ++mode) {
        const double height = std::sqrt(share(modes));  // more modes above
        const double hertz = cymbal.lowest * std::pow(cymbal.highest / cymbal.lowest, height);
        const double tail = cymbal.tail * std::pow(cymbal.lowest / hertz, 0.3);
        const double direct = 0.3 + 0.7 * share(strokes);  // what sounds at once
        const double gain = normal(strokes) * (1 - 0.6 * height);
        std::complex<double> now = std::polar(gain, kTau * share(strokes));
        const auto turn = std::polar(std::pow(10, -3 / (tail * kRate)), kTau * hertz / kRate);
        double missing = 1 - direct;
        const double building = std::exp(-1 / (cymbal.swell * kRate));
        for (double& sample : wave) {
            sample += now.imag() * (1 - missing);
            now *= turn;
            missing *= building;
        }
    }
    for (std::size_t i = 0; i < static_cast<std::size_t>(4 * kStickSeconds * kRate); ++i)
        wave[i] += 20 * normal(strokes) * std::exp(-double(i) / (kStickSeconds * kRate));
    double loudest = 0;
    for (const double sample : wave) loudest = std::max(loudest, std::abs(sample));
    Sound sound;
    for (std::size_t i = 0; i < wave.size(); ++i) {
        const double fade = std::min(1.0, double(wave.size() - i) / (0.5 * kRate));
        sound.samples.push_back(static_cast<float>(wave[i] * fade * cymbal.loudest / loudest));
    }
    return sound;
}

}  // namespace

Sound ride(unsigned stroke) {
    return struck({7, 300, 17000, 6, 0.03, 0.25}, stroke);
}

Sound crash(unsigned stroke) {
    return struck({8, 250, 16000, 4, 0.02, 0.7}, stroke);
}

Sound bassNote(double hertz) {
    Sound note;
    for (std::size_t i = 0; i < static_cast<std::size_t>(0.4 * kRate); ++i) {
        const double t = double(i) / kRate;
        const double envelope = std::min(1.0, t / 0.004) * std::exp(-4 * t) * std::min(1.0, (0.4 - t) / 0.05);
        note.samples.push_back(static_cast<float>(
            envelope * (std::sin(kTau * hertz * t) + 0.3 * std::sin(kTau * 2 * hertz * t))));
    }
    return note;
}

void addPad(std::vector<float>& samples) {
    constexpr double kChord[] = {220, 277.2, 329.6, 440};
    for (std::size_t i = 0; i < samples.size(); ++i) {
        const double t = double(i) / kRate;
        double sum = 0;
        for (const double hertz : kChord) {
            for (int partial = 1; partial <= 5; ++partial) {
                sum +=
                    std::sin(kTau * hertz * partial * t + 0.5 * partial * std::sin(kTau * 5 * t)) / partial;
            }
        }
        samples[i] += static_cast<float>(0.01 * (1 - std::cos(kTau * t / 2)) * sum);
    }
}

}  // namespace qvct::bench

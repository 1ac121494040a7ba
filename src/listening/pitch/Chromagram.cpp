#include "listening/pitch/Chromagram.h"

#include "listening/pitch/Decimation.h"

#include <algorithm>
#include <cmath>
#include <complex>
#include <numbers>

namespace qvct {
namespace {

constexpr double kMostSeconds = 30;
constexpr double kReducedRate = 5512.5;
constexpr double kLowestHertz = 40, kHighestHertz = 2000;
constexpr double kFirstTreble = 53.5;  // MIDI number of 180 Hz
constexpr double kRangeDb = 40;
constexpr std::size_t kPeaks = 30;  // of one frame

double pitchOf(double hertz) {
    return 69 + 12 * std::log2(hertz / 440);
}

void normalize(std::array<double, 12>& notes) {
    double sum = 0;
    for (const double note : notes) sum += note;
    if (sum <= 0) return;
    for (double& note : notes) note /= sum;
}

}  // namespace

void Chromagram::findTones(double rate) {
    tones_.clear();
    const std::size_t size = samples_.size();
    const std::size_t length = std::min(size, kSize);
    if (length == 0) return;
    const std::size_t frames = 4 * std::max<std::size_t>(1, size / (2 * kSize));
    const double hertzPerBin = rate / double{kSize};
    powers_.resize(kSize / 2);
    for (std::size_t frame = 0; frame < frames; frame += 4) {
        std::array<const float*, 4> starts{};
        for (std::size_t k = 0; k < 4; ++k)
            starts[k] = &samples_[(frame + k) * (size - length) / (frames - 1)];
        const std::span<const Lanes> powers = spectra_.powers(starts, length);
        for (int k = 0; k < 4; ++k) {
            for (std::size_t i = 0; i < powers.size(); ++i) powers_[i] = powers[i].v[k];
            findPeaks(powers_, hertzPerBin, kLowestHertz, kHighestHertz, kRangeDb, kPeaks, peaks_);
            for (const SpectralPeak& peak : peaks_)
                tones_.push_back({pitchOf(peak.hertz), std::sqrt(std::sqrt(peak.power))});
        }
    }
}

std::optional<Chroma> Chromagram::of(std::span<const float> mono, double sampleRate) {
    const auto most = static_cast<std::size_t>(std::ceil(kMostSeconds * sampleRate));
    const auto factor = static_cast<std::size_t>(std::max(1L, std::lround(sampleRate / kReducedRate)));
    decimate(mono.first(std::min(mono.size(), most)), factor, samples_);
    findTones(sampleRate / static_cast<double>(factor));

    std::complex<double> sum;
    double squares = 0;
    for (const Tone& tone : tones_) {
        sum += std::polar(tone.level, 2 * std::numbers::pi * tone.pitch);
        squares += tone.level * tone.level;
    }
    if (!(squares > 0)) return std::nullopt;
    const double offset = std::arg(sum) / (2 * std::numbers::pi);

    Chroma chroma;
    chroma.tuning = 100 * offset;
    chroma.tuned = std::abs(sum) / std::sqrt(squares);
    for (const Tone& tone : tones_) {
        const long note = std::lround(tone.pitch - offset);
        (tone.pitch < kFirstTreble ? chroma.bass : chroma.treble)[static_cast<std::size_t>(note % 12)] +=
            tone.level;
    }
    normalize(chroma.bass);
    normalize(chroma.treble);
    return chroma;
}

}  // namespace qvct

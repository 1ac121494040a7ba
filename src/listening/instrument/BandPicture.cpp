#include "listening/instrument/BandPicture.h"

#include <algorithm>
#include <cmath>
#include <utility>

namespace qvct {

BandPicture::BandPicture(double sampleRate, double frameSeconds, std::size_t overlap,
                         std::vector<double> edges)
    : rate_(sampleRate),
      spectra_(FourSpectra::sizeFor(frameSeconds, sampleRate)),
      hop_(std::max<std::size_t>(1, spectra_.size() / overlap)),
      edges_(std::move(edges)) {
    const auto binOf = [this](double hertz) {
        return std::min(spectra_.bins(), static_cast<std::size_t>(std::lround(hertz / binWidth())));
    };
    for (std::size_t i = 0; i + 1 < edges_.size(); ++i) {
        const std::size_t first = std::max<std::size_t>(1, binOf(edges_[i]));
        const std::size_t end = std::max(binOf(edges_[i + 1]), std::min(first + 1, spectra_.bins()));
        bands_.push_back({std::min(first, end), end});
    }
}

void BandPicture::measure(std::span<const float> padded) {
    const std::size_t frames = (padded.size() - lead() - trail()) / hop_ + 1;
    energies_.assign(frames * bands(), 0);
    for (auto& mean : means_) mean.assign(spectra_.bins(), 0);
    for (std::size_t first = 0; first < frames; first += 4) {
        const float* start = padded.data() + first * hop_;
        addFrames(spectra_.powers({start, start + hop_, start + 2 * hop_, start + 3 * hop_}), first,
                  std::min<std::size_t>(4, frames - first));
    }
    for (std::size_t part = 0; part < kParts.size(); ++part) {
        const double share = 1 / std::max(1.0, (kParts[part].end - kParts[part].from) * framesPerSecond());
        for (float& power : means_[part]) power *= static_cast<float>(share);
    }
}

void BandPicture::addFrames(std::span<const Lanes> powers, std::size_t first, std::size_t count) {
    for (std::size_t b = 0; b < bands_.size(); ++b) {
        Lanes sum(0);
        for (std::size_t bin = bands_[b].firstBin; bin < bands_[b].endBin; ++bin) sum += powers[bin];
        for (std::size_t i = 0; i < count; ++i) energies_[(first + i) * bands() + b] = sum.v[i];
    }
    for (std::size_t part = 0; part < kParts.size(); ++part) {
        Lanes weights(0);
        for (std::size_t i = 0; i < count; ++i) {
            const double at = static_cast<double>(first + i) / framesPerSecond();
            weights.v[i] = at >= kParts[part].from && at < kParts[part].end ? 1.0F : 0.0F;
        }
        if (weights.v[0] + weights.v[1] + weights.v[2] + weights.v[3] == 0) continue;
        for (std::size_t bin = 0; bin < powers.size(); ++bin) {
            const Lanes part4 = powers[bin] * weights;
            means_[part][bin] += part4.v[0] + part4.v[1] + part4.v[2] + part4.v[3];
        }
    }
}

}  // namespace qvct

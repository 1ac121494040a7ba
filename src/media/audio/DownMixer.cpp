#include "media/audio/DownMixer.h"

#include "media/audio/BoundedSample.h"

#include <algorithm>
#include <cmath>

namespace qvct {
namespace {

constexpr double kRate = 44100;

}  // namespace

DownMixer::DownMixer(double sampleRate, int channels)
    : factor_(std::max<std::size_t>(1, static_cast<std::size_t>(std::lround(sampleRate / kRate)))),
      gains_(static_cast<std::size_t>(channels)) {
    const float whole = 1 / static_cast<float>(gains_.size() * factor_);
    for (std::size_t c = 0; c < gains_.size(); ++c) gains_[c] = whole * (c % 2 == 0 ? 1.25F : 0.75F);
    if (gains_.size() == 1) gains_[0] = whole;
}

float DownMixer::mixedFrame(const float* frame) const {
    float sum = 0;
    for (std::size_t c = 0; c < gains_.size(); ++c) sum += frame[c] * gains_[c];
    return sum;
}

void DownMixer::mix(std::span<const float> frames, std::vector<float>& mixed) {
    const std::size_t width = gains_.size();
    const float* frame = frames.data();
    std::size_t left = frames.size() / width;
    if (factor_ == 1 && width == 2) {  // CD audio, which most loops are
        const float a = gains_[0];
        const float b = gains_[1];
        const std::size_t from = mixed.size();
        mixed.resize(from + left);
        float* out = mixed.data() + from;
        for (std::size_t i = 0; i < left; ++i) {
            out[i] =
                boundedSample(frame[2 * i] * a + frame[2 * i + 1] * b);  // in the order of the general case
        }
        return;
    }
    for (; left > 0; --left, frame += width) {
        run_ += mixedFrame(frame);
        if (++runLength_ < factor_) continue;
        mixed.push_back(boundedSample(run_));
        run_ = 0;
        runLength_ = 0;
    }
}

}  // namespace qvct

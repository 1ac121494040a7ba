#include "listening/sound/SoundExcerpt.h"

#include "media/audio/AudioDecoder.h"
#include "media/audio/BoundedSample.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <utility>

namespace qvct {
namespace {

constexpr float kSilence = 1e-4F;  // -80 dB of full scale: what dithering and idle converters leave
constexpr double kReducedRate = 48'000;
constexpr std::size_t kBlock = 8192;

std::size_t reductionOf(double rate) {
    if (rate <= SoundExcerpt::kHighestRate) return 1;
    return std::max<std::size_t>(2, static_cast<std::size_t>(std::lround(rate / kReducedRate)));
}

// The inner sums are short enough for single precision.
double energyOf(std::span<const float> samples) {
    constexpr std::size_t kRun = 1024;
    double sum = 0;
    for (std::size_t at = 0; at < samples.size(); at += kRun) {
        const auto run = samples.subspan(at, std::min(kRun, samples.size() - at));
        std::array<float, 8> sums{};
        for (std::size_t i = 0; i + sums.size() <= run.size(); i += sums.size()) {
            for (std::size_t k = 0; k < sums.size(); ++k) sums[k] += run[i + k] * run[i + k];
        }
        for (std::size_t i = run.size() / sums.size() * sums.size(); i < run.size(); ++i)
            sums[0] += run[i] * run[i];
        for (const float part : sums) sum += part;
    }
    return sum;
}

}  // namespace

SoundExcerpt::SoundExcerpt(double sampleRate, int channels, double mostSeconds)
    : channels_(static_cast<std::size_t>(channels)),
      factor_(reductionOf(sampleRate)),
      rate_(sampleRate / static_cast<double>(factor_)),
      mostSeconds_(mostSeconds),
      most_(static_cast<std::size_t>(std::ceil(mostSeconds * rate_))),
      mostSkipped_(static_cast<std::int64_t>(kMostSilence * sampleRate)) {}

void SoundExcerpt::restart(double sampleRate, int channels) {
    SoundExcerpt next(sampleRate, channels, mostSeconds_);
    for (const auto member : {&SoundExcerpt::left_, &SoundExcerpt::right_, &SoundExcerpt::mono_}) {
        (this->*member).clear();
        (next.*member).swap(this->*member);
    }
    *this = std::move(next);
}

SoundExcerpt SoundExcerpt::of(AudioDecoder& decoder, double mostSeconds) {
    SoundExcerpt excerpt(decoder.sampleRate(), decoder.channels(), mostSeconds);
    std::vector<float> block(std::max(kBlock / excerpt.channels_, std::size_t{1}) * excerpt.channels_);
    std::size_t frames = 0;
    do {
        frames = decoder.read(block);
    } while (frames > 0 && excerpt.process(std::span(block).first(frames * excerpt.channels_)));
    excerpt.finish();
    return excerpt;
}

SoundExcerpt::Frame SoundExcerpt::frameAt(const float* samples) const {
    if (channels_ == 1) return {boundedSample(samples[0]), boundedSample(samples[0])};
    std::array<float, 2> sums{};
    for (std::size_t c = 0; c < channels_; ++c) sums[c % 2] += boundedSample(samples[c]);
    const std::size_t ofRight = channels_ / 2;
    const std::size_t ofLeft = channels_ - ofRight;
    return {sums[0] / static_cast<float>(ofLeft), sums[1] / static_cast<float>(ofRight)};
}

std::size_t SoundExcerpt::silentFrames(std::span<const float> frames) const {
    const auto loud = std::find_if(frames.begin(), frames.end(),
                                   [](float sample) { return std::abs(boundedSample(sample)) > kSilence; });
    return static_cast<std::size_t>(loud - frames.begin()) / channels_;
}

bool SoundExcerpt::process(std::span<const float> frames) {
    if (!began_) {
        const std::size_t silent = silentFrames(frames);
        skipped_ += static_cast<std::int64_t>(silent);
        frames = frames.subspan(silent * channels_);
        began_ = !frames.empty();
        cut_ = skipped_ >= mostSkipped_;
    }
    const std::size_t wanted = cut_ ? 0 : (most_ - left_.size()) * factor_ - runLength_;
    if (frames.size() / channels_ > wanted) cut_ = true;
    keep(frames.first(std::min(frames.size(), wanted * channels_)));
    return !cut_;
}

void SoundExcerpt::keep(std::span<const float> frames) {
    if (factor_ > 1 || channels_ > 2) return keepMixed(frames);
    const std::size_t before = left_.size();
    const std::size_t count = frames.size() / channels_;
    left_.resize(before + count);
    float* left = left_.data() + before;
    if (channels_ == 1) {
        for (std::size_t i = 0; i < count; ++i) left[i] = boundedSample(frames[i]);
        return;
    }
    right_.resize(before + count);
    float* right = right_.data() + before;
    for (std::size_t i = 0; i < count; ++i) {
        left[i] = boundedSample(frames[2 * i]);
        right[i] = boundedSample(frames[2 * i + 1]);
    }
}

void SoundExcerpt::keepMixed(std::span<const float> frames) {
    const auto length = static_cast<float>(factor_);
    for (std::size_t at = 0; at < frames.size(); at += channels_) {
        const Frame frame = frameAt(frames.data() + at);
        run_.left += frame.left;
        run_.right += frame.right;
        if (++runLength_ < factor_) continue;
        left_.push_back(run_.left / length);
        if (channels_ > 1) right_.push_back(run_.right / length);
        run_ = {0, 0};
        runLength_ = 0;
    }
}

void SoundExcerpt::finish() {
    stereo_ = left_ != right_ && !right_.empty();
    if (!stereo_) {
        right_.clear();
        return;
    }
    mono_.resize(left_.size());
    for (std::size_t i = 0; i < mono_.size(); ++i) mono_[i] = (left_[i] + right_[i]) / 2;
    const double left = energyOf(left_), right = energyOf(right_);
    if (energyOf(mono_) < (left + right) / 32) mono_ = left >= right ? left_ : right_;
}

}  // namespace qvct

#include "listening/onsets/OnsetDetector.h"

#include "listening/onsets/OnsetPicker.h"
#include "listening/onsets/SpectralFlux.h"
#include "media/audio/AudioDecoder.h"
#include "media/audio/DownMixer.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <utility>

namespace qvct {
namespace {

constexpr double kReach = 0.006;      // seconds by which an onset may be moved
constexpr double kLikely = 0.010;     // seconds at which the weight of a rise would reach 0
constexpr double kStep = 0.0005;      // seconds of one sum of energy
constexpr std::size_t kSide = 3;      // sums before and after a rise
constexpr double kGround = 0.02;      // differences below this share of the mean energy do not count
constexpr double kBeside = 0.010;     // seconds before and after an onset that are compared
constexpr double kLoss = 0.78;        // share of the energy that remains, at least, at an onset
constexpr double kGain = 2;           // factor by which it grows, at least, in a window that the end cuts
constexpr double kFirst = 0.015;      // seconds of which the loudness is measured
constexpr double kLoudness = 0.3;     // power of the amplitude with which it grows
constexpr double kFlam = 0.025;       // seconds within which strokes are one
constexpr double kSilence = 0.001;    // less than this share of the energy to come is silence
constexpr std::size_t kBlock = 4096;  // frames

}  // namespace

/// Keeps the last samples of the mixed signal, feeds windows of them to the flux and moves the peaks.
class OnsetDetector::Analyser {
  public:
    Analyser(double sampleRate, int channels)
        : mixer_(sampleRate, channels),
          rate_(sampleRate / static_cast<double>(mixer_.factor())),
          flux_(rate_),
          picker_(rate_ / static_cast<double>(flux_.hop())),
          step_(std::max<std::size_t>(1, static_cast<std::size_t>(rate_ * kStep))),
          reach_(static_cast<std::size_t>(rate_ * kReach) / step_),
          beside_(static_cast<std::size_t>(rate_ * kBeside)),
          flam_(static_cast<std::int64_t>(sampleRate * kFlam)),
          first_(std::max<std::size_t>(1, static_cast<std::size_t>(rate_ * kFirst))),
          kept_((picker_.delay() + 2 * SpectralFlux::kTogether) * flux_.hop() + flux_.windowSize() +
                2 * (reach_ + kSide + 1) * step_ + beside_ + first_),
          nextFrame_(kept_ + flux_.hop()),
          origin_(-static_cast<std::int64_t>(kept_)) {}

    void process(std::span<const float> frames) {
        const std::size_t block = kBlock * mixer_.channels();
        for (std::size_t at = 0; at < frames.size(); at += block) {
            const auto part = frames.subspan(at, std::min(block, frames.size() - at));
            length_ += static_cast<std::int64_t>(part.size() / mixer_.channels());
            mixed_.clear();
            mixer_.mix(part, mixed_);
            append();
        }
    }

    std::vector<Onset> finish() {
        // The signal goes on backwards until its last frame is judged, so that an end within a sound is no
        // onset.
        mixed_.assign(samples_.rbegin(), samples_.rend());
        append();
        return std::move(onsets_);
    }

  private:
    void append() {
        if (mixed_.empty()) return;
        // The first sample is repeated before the start, so that a constant offset of the signal is no onset.
        if (samples_.empty()) samples_.assign(kept_, mixed_.front());
        samples_.insert(samples_.end(), mixed_.begin(), mixed_.end());
        const std::size_t together = SpectralFlux::kTogether * flux_.hop();
        for (; nextFrame_ + together - flux_.hop() <= samples_.size(); nextFrame_ += together) {
            for (const float rise : flux_.next(&samples_[nextFrame_ - flux_.windowSize()])) {
                if (const auto frame = picker_.next(rise)) add(*frame);
            }
        }
        const std::size_t gone = samples_.size() - kept_;
        samples_.erase(samples_.begin(), samples_.begin() + static_cast<std::ptrdiff_t>(gone));
        nextFrame_ -= gone;
        origin_ += static_cast<std::int64_t>(gone);
    }

    void add(std::int64_t frame) {
        const auto half = static_cast<std::int64_t>(flux_.windowSize() / 2);
        const std::int64_t middle = (frame + 1) * static_cast<std::int64_t>(flux_.hop()) - half;
        const std::int64_t attack = attackNear(pastSilence(middle));
        const auto factor = static_cast<std::int64_t>(mixer_.factor());
        const bool cut = (middle + half) * factor > length_;
        if (middle * factor >= length_ || !bringsEnergy(attack, cut)) return;
        const std::int64_t onset = std::max<std::int64_t>(0, attack * factor);
        const std::int64_t apart = onsets_.empty() ? onset + 1 + flam_ : onset - onsets_.back().frame;
        if (onset < length_ && apart > flam_) onsets_.push_back({onset, loudnessAt(attack)});
    }

    struct Energy {
        double signal = 0, slope = 0;
    };

    Energy energyOf(std::size_t from, std::size_t end) const {
        Energy energy;
        for (std::size_t i = from; i < end; ++i) {
            const double sample = static_cast<double>(samples_[i]);
            const double slope = sample - static_cast<double>(samples_[i - 1]);
            energy.signal += sample * sample;
            energy.slope += slope * slope;
        }
        return energy;
    }

    /// Whether the signal or its slope, which weighs high tones more, keeps its energy: a sound that is cut
    /// off scatters over the spectrum like an onset, but leaves less than was there. In a window that the end
    /// of the signal cuts both have to grow.
    bool bringsEnergy(std::int64_t attack, bool cut) const {
        const auto at = static_cast<std::size_t>(attack - origin_);
        const Energy before = energyOf(at - beside_, at);
        const Energy after = energyOf(at, at + beside_);
        if (cut) return after.signal >= kGain * before.signal && after.slope >= kGain * before.slope;
        return after.signal >= kLoss * before.signal || after.slope >= kLoss * before.slope;
    }

    /// Signal and slope count alike, as a hi-hat has little energy beside a kick that sounds as loud; the
    /// power was found by comparing with the velocities that drummers played.
    float loudnessAt(std::int64_t attack) const {
        const auto at = static_cast<std::size_t>(attack - origin_);
        const Energy energy = energyOf(at, at + first_);
        const double power = std::sqrt(energy.signal * energy.slope) / static_cast<double>(first_);
        return static_cast<float>(std::pow(power, kLoudness / 2));
    }

    /// A sound out of silence shows in the spectrum as soon as the window touches it, when its attack may be
    /// out of reach. In that case a position closer to the attack; otherwise the position itself.
    std::int64_t pastSilence(std::int64_t middle) const {
        const std::size_t reach = reach_ * step_;
        for (int i = 0; i < 2; ++i) {
            const auto at = static_cast<std::size_t>(middle - origin_);
            const double here = energyOf(at - reach, at + reach).slope;
            if (here >= kSilence * energyOf(at + reach, at + 3 * reach).slope) break;
            middle += static_cast<std::int64_t>(reach);
        }
        return middle;
    }

    /// Where the energy of the slope of the signal, which weighs high tones more, rises by the largest
    /// factor.
    std::int64_t attackNear(std::int64_t middle) {
        const std::size_t first = static_cast<std::size_t>(middle - origin_) - (reach_ + kSide) * step_;
        const std::size_t steps = 2 * (reach_ + kSide);
        energies_.assign(steps + 1, 0);  // running sums
        for (std::size_t k = 0; k < steps; ++k) {
            const double energy = energyOf(first + k * step_, first + (k + 1) * step_).slope;
            energies_[k + 1] = energies_[k] + energy;
        }
        const double ground =
            kGround * energies_[steps] * static_cast<double>(kSide) / static_cast<double>(steps);
        double best = 0;
        std::int64_t attack = middle;
        for (std::size_t k = kSide; ground > 0 && k + kSide <= steps; ++k) {
            const double before = energies_[k] - energies_[k - kSide];
            const double after = energies_[k + kSide] - energies_[k];
            const std::int64_t at = origin_ + static_cast<std::int64_t>(first + k * step_);
            const double likely = 1 - static_cast<double>(std::abs(at - middle)) / (kLikely * rate_);
            const double rise = std::log((after + ground) / (before + ground)) * likely;
            if (rise > best) best = rise, attack = at;
        }
        return attack;
    }

    DownMixer mixer_;
    double rate_;  // of the mixed signal
    SpectralFlux flux_;
    OnsetPicker picker_;
    std::size_t step_, reach_;  // samples of one sum; sums by which an onset may be moved
    std::size_t beside_;        // samples on each side that are compared
    std::int64_t flam_;         // frames that onsets are apart, at least
    std::size_t first_;         // samples of which the loudness is measured
    std::size_t kept_;          // samples that stay for the next window and for moving peaks
    std::size_t nextFrame_;     // end of the next window in samples_
    std::int64_t origin_;       // position of samples_[0] in the mixed signal
    std::int64_t length_ = 0;   // frames
    std::vector<float> samples_, mixed_;
    std::vector<double> energies_;
    std::vector<Onset> onsets_;
};

std::vector<std::int64_t> framesOf(const std::vector<Onset>& onsets) {
    std::vector<std::int64_t> frames;
    frames.reserve(onsets.size());
    for (const Onset& onset : onsets) frames.push_back(onset.frame);
    return frames;
}

OnsetDetector::OnsetDetector(double sampleRate, int channels)
    : analyser_(std::make_unique<Analyser>(sampleRate, channels)) {}

OnsetDetector::~OnsetDetector() = default;

void OnsetDetector::process(std::span<const float> samples) {
    analyser_->process(samples);
}

std::vector<std::int64_t> OnsetDetector::finish() {
    return framesOf(finishWithLoudness());
}

std::vector<Onset> OnsetDetector::finishWithLoudness() {
    return analyser_->finish();
}

std::vector<std::int64_t> OnsetDetector::detect(AudioDecoder& decoder) {
    return framesOf(detectWithLoudness(decoder));
}

std::vector<Onset> OnsetDetector::detectWithLoudness(AudioDecoder& decoder) {
    const auto channels = static_cast<std::size_t>(decoder.channels());
    OnsetDetector detector(decoder.sampleRate(), decoder.channels());
    std::vector<float> block(kBlock * channels);
    while (const std::size_t frames = decoder.read(block)) {
        detector.process(std::span(block).first(frames * channels));
    }
    return detector.finishWithLoudness();
}

}  // namespace qvct

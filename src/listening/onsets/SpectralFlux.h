#pragma once

#include "platform/base/Lanes.h"

#include <array>
#include <cstddef>
#include <memory>
#include <vector>

namespace qvct {

/// How much the spectrum of a signal rises from one moment to the next: a novelty curve that peaks at onsets.
///
/// The magnitudes of short windows are gathered in bands of equal musical width and put on a logarithmic
/// scale, relative to the loudest band of the last seconds and, as much, to the recent peak of the band
/// itself: a hi-hat beside a kick counts, too. Each band is compared with the loudest of itself and its
/// neighbours two frames before, so that a wavering pitch is no onset, or with what they were before that,
/// which falls by 50 octaves a second, so that a tail that flickers is none either. The mean of the rises is
/// the curve; where those above 7 kHz alone rise more than the whole does, their mean counts with a weight.
/// After S. Boeck, G. Widmer, "Maximum filter vibrato suppression for onset detection", DAFx 2013, and
/// D. Stowell, M. Plumbley, "Adaptive whitening for improved real-time audio onset detection", ICMC 2007.
///
/// @cost  One real FFT of 23 ms a frame, four frames at once.
class SpectralFlux {
  public:
    /// REQUIRES: sampleRate >= 1.
    explicit SpectralFlux(double sampleRate);
    ~SpectralFlux();

    std::size_t windowSize() const { return window_.size(); }
    /// Samples from one frame to the next: 5 ms.
    std::size_t hop() const { return hop_; }

    /// Frames that are measured together.
    static constexpr std::size_t kTogether = 4;

    /// The rise at each of the next kTogether frames, in octaves of magnitude. `samples` begin with the first
    /// frame; each further frame begins a hop later. REQUIRES: windowSize() + (kTogether - 1) * hop()
    /// samples, all finite.
    std::array<float, kTogether> next(const float* samples);

  private:
    struct Transform;
    struct Band {
        std::size_t firstBin, firstWeight, count;
    };

    void makeBands(double sampleRate);
    void transform(const float* samples);
    void measureBands();
    void scaleBands(Lanes loudest);
    void holdLevels();

    std::size_t hop_;
    double framesPerSecond_;
    std::vector<float> window_;
    std::vector<Band> bands_;
    std::vector<float> weights_;
    std::size_t firstHigh_ = 0;  // bands from here on are above 7 kHz
    float loudest_;
    std::vector<float> peaks_;  // by band
    std::unique_ptr<Transform> transform_;
};

}  // namespace qvct

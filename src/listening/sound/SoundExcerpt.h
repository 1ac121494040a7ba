#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

namespace qvct {

class AudioDecoder;

/// The beginning of a sound, as analyses hear it: two channels and their mix, without the silence before the
/// first sound, every sample finite and within 16 times full scale.
///
/// Rates above 64 kHz are brought down to about 48 kHz by averaging runs of frames; lower ones stay as they
/// are. Of more than two channels the first, third and so on are the left one. Memory holds what is kept,
/// whatever the length of the sound. One excerpt is filled from one thread.
class SoundExcerpt {
  public:
    /// The highest rate of an excerpt, in Hz.
    static constexpr double kHighestRate = 64'000;
    /// Silence that is passed over before a sound begins, in seconds.
    static constexpr double kMostSilence = 10;

    /// Keeps at most `mostSeconds`. REQUIRES: sampleRate >= 1, channels >= 1, 0 < mostSeconds <= 600.
    SoundExcerpt(double sampleRate, int channels, double mostSeconds);

    /// Begins another sound, in the memory of the one before.
    void restart(double sampleRate, int channels);

    /// What the rest of a file begins with; no more of it is decoded than is kept.
    static SoundExcerpt of(AudioDecoder& decoder, double mostSeconds);

    /// Takes the next frames, interleaved: any number of whole frames. False as soon as it wants no more.
    bool process(std::span<const float> frames);
    /// Ends the sound: the mix can be asked for from now on.
    void finish();

    /// Samples a second of each channel: 1 Hz to kHighestRate.
    double sampleRate() const { return rate_; }
    double seconds() const { return static_cast<double>(left_.size()) / rate_; }
    /// Frames of the file before the first sound.
    std::int64_t begin() const { return skipped_; }
    /// Whether the sound went on after what is kept.
    bool isCut() const { return cut_; }
    /// Whether the two channels differ anywhere.
    bool isStereo() const { return stereo_; }

    std::span<const float> left() const { return left_; }
    std::span<const float> right() const { return right_.empty() ? left_ : right_; }
    /// The mean of both channels, or the louder one where they cancel each other.
    std::span<const float> mono() const { return mono_.empty() ? left_ : mono_; }

  private:
    struct Frame {
        float left, right;
    };

    Frame frameAt(const float* samples) const;
    std::size_t silentFrames(std::span<const float> frames) const;
    void keep(std::span<const float> frames);
    void keepMixed(std::span<const float> frames);

    std::size_t channels_;
    std::size_t factor_;  // frames that become one
    double rate_;
    double mostSeconds_;
    std::size_t most_;
    std::int64_t mostSkipped_;
    std::int64_t skipped_ = 0;
    Frame run_{0, 0};  // sums of an incomplete run
    std::size_t runLength_ = 0;
    bool began_ = false, cut_ = false, stereo_ = false;
    std::vector<float> left_, right_, mono_;
};

}  // namespace qvct

#pragma once

#include "listening/pitch/Chromagram.h"

#include <optional>
#include <span>

namespace qvct {

/// The key that a loop is in.
struct LoopKey {
    enum class Mode { kMajor, kMinor };

    int tonic = 0;  ///< 0 for C to 11 for B.
    Mode mode = Mode::kMajor;
    double confidence = 0;  ///< The probability among the 24 keys, 1/24 to 1.
    double tuning = 0;      ///< Cents by which the loop is tuned above A = 440 Hz: -50 to 50.
};

/// Finds the key of loops: of the 24 keys the one whose profile agrees best with the chroma of bass and
/// treble
/// (`Chromagram`).
///
/// At most the first 30 s are looked at. One serves any number of sounds of any rates, from one thread.
class LoopKeyDetector {
  public:
    /// Nothing for silence, and for noise and drums, whose peaks agree with no tuning.
    ///
    /// @param mono  Finite samples within 16 times full scale, any number of them.
    /// @param sampleRate  In Hz, 1 or more.
    std::optional<LoopKey> keyOf(std::span<const float> mono, double sampleRate);

  private:
    Chromagram chromagram_;
};

}  // namespace qvct

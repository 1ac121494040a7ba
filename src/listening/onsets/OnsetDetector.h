#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

namespace qvct {

class AudioDecoder;

/// Where a sound begins, and how loud.
struct Onset {
    std::int64_t frame = 0;
    float loudness = 0;  ///< Of its first 15 ms: grows with the power 0.3 of the amplitude; at least 0.

    friend bool operator==(const Onset&, const Onset&) = default;
};

/// Where they begin.
std::vector<std::int64_t> framesOf(const std::vector<Onset>& onsets);

/// Finds where sounds begin, in audio of any rate and channel count.
///
/// The channels are mixed and brought to about 44 kHz; peaks of the spectral flux (`SpectralFlux`) that stand
/// out (`OnsetPicker`) are onsets, each moved to the steepest rise of the energy nearby. The end of a signal
/// is none, wherever it is cut.
///
/// Streaming: besides the positions found, memory holds about a second of audio, whatever the length. Samples
/// that are not finite count as silence; louder ones than 16 times full scale are clipped to that. One
/// detector serves one signal, from one thread.
class OnsetDetector {
  public:
    /// REQUIRES: sampleRate >= 1, channels >= 1.
    OnsetDetector(double sampleRate, int channels);
    ~OnsetDetector();

    /// Takes the next frames, interleaved: any number of whole frames.
    void process(std::span<const float> samples);
    /// Ends the signal and answers its onsets: frame positions, strictly ascending, less than the signal's
    /// length.
    std::vector<std::int64_t> finish();
    /// Ends the signal and answers the same onsets, with their loudness.
    std::vector<Onset> finishWithLoudness();

    /// The onsets of the rest of a file.
    static std::vector<std::int64_t> detect(AudioDecoder& decoder);
    /// The same, with their loudness.
    static std::vector<Onset> detectWithLoudness(AudioDecoder& decoder);

  private:
    class Analyser;
    std::unique_ptr<Analyser> analyser_;
};

}  // namespace qvct

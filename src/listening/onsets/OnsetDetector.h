#pragma once

#include <cstdint>
#include <memory>
#include <span>
#include <vector>

namespace qvct {

class AudioDecoder;

/// Finds where sounds begin, in audio of any rate and channel count.
///
/// The channels are mixed and brought to about 22 kHz; peaks of the spectral flux (`SpectralFlux`) that stand
/// out (`OnsetPicker`) are onsets, each moved to the steepest rise of the energy nearby.
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

    /// The onsets of the rest of a file.
    static std::vector<std::int64_t> detect(AudioDecoder& decoder);

  private:
    class Analyser;
    std::unique_ptr<Analyser> analyser_;
};

}  // namespace qvct

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
/// out
/// (`OnsetPicker`) are onsets, each moved to the steepest rise of the energy nearby.
///
/// Streaming: the memory is that of a second of audio, whatever the length, besides the positions found.
/// Samples that are not finite count as silence, those beyond 16 times full scale as that. One detector
/// serves one signal, from one thread.
class OnsetDetector {
  public:
    /// REQUIRES: sampleRate >= 1, channels >= 1.
    OnsetDetector(double sampleRate, int channels);
    ~OnsetDetector();

    /// The next frames, interleaved; blocks of any number of whole frames.
    void process(std::span<const float> samples);
    /// Ends the signal. The onsets as frame positions, strictly ascending, less than the signal's length.
    std::vector<std::int64_t> finish();

    /// The onsets of the rest of a file.
    static std::vector<std::int64_t> detect(AudioDecoder& decoder);

  private:
    class Analyser;
    std::unique_ptr<Analyser> analyser_;
};

}  // namespace qvct

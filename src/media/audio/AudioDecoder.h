#pragma once

#include "platform/base/Error.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>

namespace qvct {

class RandomAccessReader;

/// Decodes an audio file block by block: every container, coding, rate, depth and channel count that
/// libsndfile knows. Memory does not depend on the file's length.
///
/// Samples are in [-1, 1] for integer files; float files give what they hold, which may be beyond that,
/// infinite or not a number. One decoder is used from one thread at a time.
class AudioDecoder {
  public:
    static constexpr int kMostChannels = 256;

    /// Null, and an error that names the path, when the file is unreadable or no known audio.
    static std::unique_ptr<AudioDecoder> open(const std::string& path, Error* error = nullptr);
    /// Decodes a file that is open already; messages call it `name`.
    static std::unique_ptr<AudioDecoder> open(std::shared_ptr<const RandomAccessReader> file,
                                              std::string_view name, Error* error = nullptr);
    ~AudioDecoder();

    /// Frames a second, at least 1.
    int sampleRate() const;
    /// 1 to kMostChannels.
    int channels() const;
    /// Length in frames as the header states it; a damaged file may give fewer.
    std::int64_t frames() const;

    /// Decodes the next frames, interleaved, as many as fit into `samples`, and answers how many there were:
    /// 0 at the end, or where the file cannot be decoded any further.
    std::size_t read(std::span<float> samples);

  private:
    struct State;

    explicit AudioDecoder(std::unique_ptr<State> state);

    std::unique_ptr<State> state_;
};

}  // namespace qvct

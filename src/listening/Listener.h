#pragma once

#include "listening/HeardSound.h"

#include <cstddef>
#include <memory>
#include <span>

namespace qvct {

class AudioDecoder;
class InstrumentModel;
class SoundExcerpt;

/// Listens to sounds, one after the other: what plays, how it sounds, which note, key and tempo it has.
///
/// Of a long sound the first 30 s count, and no more is decoded. Keeps the tables of the last sample rate;
/// one listener serves one thread.
/// @cost  Below 1 ms for a sound of half a second; a thousandth of its length for a loop.
class Listener {
  public:
    static constexpr double kMostSeconds = 30;

    /// Without a model no instrument is told.
    explicit Listener(std::shared_ptr<const InstrumentModel> model);
    ~Listener();

    /// What can be heard in the rest of a file.
    HeardSound listen(AudioDecoder& decoder);
    /// The same of interleaved samples, whatever they are. REQUIRES: sampleRate >= 1, channels >= 1.
    HeardSound listen(std::span<const float> samples, double sampleRate, int channels);

    /// What was listened to last. REQUIRES: something was.
    const SoundExcerpt& excerpt() const;

  private:
    struct Analysers;

    HeardSound judge();

    std::unique_ptr<Analysers> its_;
};

}  // namespace qvct

#pragma once

#include "listening/HeardSound.h"

#include <cstddef>
#include <memory>
#include <span>

namespace qvct {

class AudioDecoder;
class InstrumentModel;
class LikenessModel;
class SoundExcerpt;

/// What a listener judges by. Without a model it says nothing of what that tells.
struct ListeningModels {
    std::shared_ptr<const InstrumentModel> instrument;
    std::shared_ptr<const LikenessModel> likeness;
};

/// Listens to sounds, one after the other: what plays, how it sounds, which note, key and tempo it has, and
/// what it is like.
///
/// Of a long sound the first 30 s count, and no more is decoded. Keeps the tables of the last sample rate;
/// one listener serves one thread.
/// @cost  Below 1 ms for a sound of half a second; a thousandth of its length for a loop.
class Listener {
  public:
    static constexpr double kMostSeconds = 30;

    explicit Listener(ListeningModels models);
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

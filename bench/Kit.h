#pragma once

#include <array>
#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace qvct::bench {

inline constexpr int kRate = 44100;

/// Mono samples at kRate. People would mark the frame `attack` as the beginning.
struct Sound {
    std::vector<float> samples;
    std::size_t attack = 0;
};

/// The file, empty where it cannot be read. The attack is the first sample of a share of the loudest one.
Sound loadSound(const std::string& path, float share);

/// One stroke: which sound plays it, and how loud.
struct Stroke {
    const Sound* sound = nullptr;
    float gain = 0;
};

/// The sounds of a drum kit.
class Kit {
  public:
    /// One-shots of a drum machine: gain (velocity/127)^1.5. Nothing when a kick, a snare or a hi-hat is
    /// missing.
    static std::optional<Kit> machine(const std::string& folder);
    /// An acoustic kit, recorded at several loudnesses and several times, as one microphone hears it, with
    /// cymbals computed for it. `takes` are the last digits of the files that it uses.
    static std::optional<Kit> acoustic(const std::string& folder, const std::string& microphone,
                                       const std::string& takes);

    /// The stroke for a note of the General MIDI percussion map; `count` changes between recordings of it.
    Stroke strokeFor(int pitch, int velocity, std::size_t count) const;
    /// Whether a stroke of the first pitch ends the sound of the second, as a hi-hat that closes does.
    bool chokes(int pitch, int sounding) const;

  private:
    enum Part {
        kKick,
        kSnare,
        kRim,
        kClosedHat,
        kPedalHat,
        kOpenHat,
        kLowTom,
        kMiddleTom,
        kHighTom,
        kCrash,
        kRide,
        kPartCount
    };
    struct Layer {
        std::vector<Sound> takes;  ///< Of one loudness.
    };

    static Part partFor(int pitch);
    bool plays(Part part) const { return !parts_[part].empty(); }

    std::array<std::vector<Layer>, kPartCount> parts_;  // layers from soft to loud
    bool acoustic_ = false;
};

}  // namespace qvct::bench

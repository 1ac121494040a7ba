#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace qvct::demo {

enum class Mode { none, minor, major };

/// What makes a piece of audio a loop.
struct LoopFacts {
    double tempo = 120;  ///< Quarter notes a minute.
    int beats = 4;       ///< Quarter notes from the first to the last frame.
    int meterTop = 4;
    int meterBottom = 4;
};

/// A note that was played, in quarter notes from the start of the sound.
struct Note {
    double start = 0;
    double length = 1;
    int key = 60;  ///< MIDI note number.
    int velocity = 96;
};

struct Marker {
    std::uint32_t frame = 0;
    std::string name;
};

/// Audio with the facts about it that open file formats can carry.
struct Sound {
    std::vector<float> samples = {};  ///< Interleaved, in [-1, 1]; louder is clipped when written.
    int channels = 1;
    int rate = 44100;                  ///< Frames a second.
    int bits = 16;                     ///< A sample on disk: 16, 24 or 32, integer.
    std::string name = {};             ///< A title; empty for none.
    std::optional<int> rootNote = {};  ///< MIDI note number.
    Mode mode = Mode::none;            ///< Of the key whose tonic is `rootNote`.
    std::optional<LoopFacts> loop = {};
    std::vector<Marker> markers = {};
    std::vector<Note> notes = {};

    std::uint32_t frames() const {
        return static_cast<std::uint32_t>(samples.size() / static_cast<std::size_t>(channels));
    }
};

}  // namespace qvct::demo

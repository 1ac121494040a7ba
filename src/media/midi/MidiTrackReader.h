#pragma once

#include "platform/base/Error.h"

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <vector>

namespace qvct {

/// What one track chunk holds, with times in ticks.
struct MidiTrackEvents {
    struct Note {
        std::uint64_t start = 0, end = 0;
        std::uint8_t channel = 0, pitch = 0, velocity = 0, releaseVelocity = 0;
    };
    struct Tempo {
        std::uint64_t tick = 0;
        std::uint32_t microsecondsPerQuarter = 0;
    };
    struct Meter {
        std::uint64_t tick = 0;
        int numerator = 0, denominator = 0;
    };

    std::vector<Note> notes;  ///< In the order of their note-ons.
    std::vector<Tempo> tempos;
    std::vector<Meter> meters;
    std::uint64_t end = 0;
    bool hasChannelEvent = false;
    Error problem;  ///< Why reading stopped before the track's end; not set when it did not.
};

/// Reads the events of track chunks, one after the other.
///
/// A cursor that never leaves the chunk. Reading stops at the end-of-track event, at the chunk's end, or at
/// the first byte that makes no sense; what was read until then is kept.
class MidiTrackReader {
  public:
    MidiTrackReader();

    /// The events of a track chunk's contents, which begin at byte `offset` of the file.
    MidiTrackEvents read(std::span<const std::uint8_t> chunk, std::size_t offset);

  private:
    static constexpr std::uint32_t kNone = 0xFFFFFFFF;
    // The notes of one channel and pitch that are still open, oldest first: places in the track's notes.
    struct OpenNotes {
        std::uint32_t oldest = kNone, newest = kNone;
    };

    bool readEvent();
    bool readMeta();
    bool readChannelEvent(std::uint8_t status);
    void noteOn(std::uint8_t channel, std::uint8_t pitch, std::uint8_t velocity);
    void noteOff(std::uint8_t channel, std::uint8_t pitch, std::uint8_t velocity);
    void closeOpenNotes();
    void keepTempoOrMeter(std::uint8_t type, std::span<const std::uint8_t> data);

    bool readByte(std::uint8_t& byte);
    bool readLength(std::uint32_t& value);
    bool readBytes(std::uint32_t count, std::span<const std::uint8_t>& bytes);
    bool skipBytes(std::uint32_t count);
    bool stop(const char* reason);

    std::span<const std::uint8_t> chunk_;
    std::size_t offset_ = 0;  // of the chunk in the file
    std::size_t position_ = 0;
    std::uint64_t tick_ = 0;
    std::uint8_t runningStatus_ = 0;
    bool ended_ = false;
    MidiTrackEvents events_;
    std::vector<OpenNotes> open_;          // by channel and pitch
    std::vector<std::uint32_t> nextOpen_;  // by note: the next one of its channel and pitch
};

}  // namespace qvct

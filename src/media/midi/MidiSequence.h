#pragma once

#include "platform/base/Error.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// One note of a MIDI track. Times are in beats (quarter notes) from the start of the file.
struct MidiNote {
    double start = 0;
    float duration = 0;
    std::uint8_t channel = 0;  ///< 0 to 15.
    std::uint8_t pitch = 0;
    std::uint8_t velocity = 0;
    std::uint8_t releaseVelocity = 0;

    double end() const { return start + static_cast<double>(duration); }
};

struct MidiTrack {
    std::vector<MidiNote> notes;  ///< In the order of their starts, then of the file.
    double length = 0;            ///< Beats to the track's end.
};

struct TempoChange {
    double beat = 0;
    double bpm = 0;  ///< Quarter notes a minute.
};

struct MeterChange {
    double beat = 0;
    int numerator = 0;
    int denominator = 0;
};

/// The notes, tempo and meter of a standard MIDI file (formats 0, 1 and 2).
///
/// In a format 1 file a first track that holds no channel event is the tempo track and not among the tracks.
/// A note-off, or a note-on of velocity 0, ends the oldest note of its channel and pitch that is still open;
/// notes open at the track's end end there. A file whose time runs in frames a second is put into beats by
/// its own tempo events (120 a minute before the first). Running status survives meta and system-exclusive
/// events, since there are files that rely on it.
///
/// What is damaged is read as far as it goes; `problems` says what was left out and at which byte, not of
/// which file.
class MidiSequence {
  public:
    /// Largest file that is read: 16 MB.
    static constexpr std::uint64_t kLargestFile = 16ULL << 20;

    /// "mid" and "midi", in capitals too.
    static bool supportsFileExtension(std::string_view extension);

    /// Nothing, and an error, when the bytes do not begin with a usable header or are too many.
    ///
    /// @cost  O(bytes) time; a note takes about fifty bytes, and has at least three in the file.
    static std::optional<MidiSequence> parse(std::span<const std::uint8_t> bytes, Error* error = nullptr);
    /// The file at a path; the error names it.
    static std::optional<MidiSequence> read(const std::string& path, Error* error = nullptr);

    /// 0, 1 or 2.
    int format() const { return format_; }
    const std::vector<MidiTrack>& tracks() const { return tracks_; }
    /// Ascending by beat; empty when the file does not say.
    const std::vector<TempoChange>& tempos() const { return tempos_; }
    /// Ascending by beat; empty when the file does not say.
    const std::vector<MeterChange>& meters() const { return meters_; }
    /// Beats to the end of the longest track, the tempo track included.
    double length() const { return length_; }
    /// Where the last note of all tracks ends, in beats.
    double endOfNotes() const;
    /// One line for each damaged place, at most a few dozen.
    const std::vector<Error>& problems() const { return problems_; }

  private:
    friend class MidiSequenceBuilder;

    int format_ = 0;
    std::vector<MidiTrack> tracks_;
    std::vector<TempoChange> tempos_;
    std::vector<MeterChange> meters_;
    double length_ = 0;
    std::vector<Error> problems_;
};

}  // namespace qvct

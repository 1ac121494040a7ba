#include "media/midi/MidiSequence.h"

#include "media/midi/MidiTrackReader.h"
#include "platform/base/bytes/ByteOrder.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <string_view>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::size_t kMostTracks = 65535;  // The header's count has 16 bits.
constexpr std::size_t kMostProblems = 32;
constexpr std::size_t kChunkHeader = 8;
constexpr std::size_t kHeaderLength = 6;
constexpr double kDefaultBpm = 120;

std::uint32_t bigEndian(std::span<const std::uint8_t> bytes) {
    return static_cast<std::uint32_t>(numberOf(bytes, ByteOrder::big));
}

bool hasName(std::span<const std::uint8_t> bytes, std::string_view name) {
    return bytes.size() >= name.size() && std::memcmp(bytes.data(), name.data(), name.size()) == 0;
}

double bpmOf(const MidiTrackEvents::Tempo& tempo) {
    return 60e6 / tempo.microsecondsPerQuarter;
}

/// The header's division as a rate: ticks a quarter note, or ticks a second for SMPTE time.
struct Division {
    double ticksPerQuarter = 0;
    double ticksPerSecond = 0;

    bool isUsable() const { return ticksPerQuarter > 0 || ticksPerSecond > 0; }
};

Division divisionOf(std::uint32_t word) {
    if (word < 0x8000) return {double(word), 0};
    const auto framesPerSecond = static_cast<int>(256 - (word >> 8));
    // "29" is the television rate with dropped frame numbers.
    const double rate = framesPerSecond == 29 ? 30000.0 / 1001 : double(framesPerSecond);
    return {0, rate * (word & 0xFF)};
}

/// Ticks to beats. SMPTE ticks measure seconds, which the tempo events convert to beats; the tempo events
/// must be in ascending order.
class BeatClock {
  public:
    BeatClock(Division division, const std::vector<MidiTrackEvents::Tempo>& tempos) : division_(division) {
        if (division.ticksPerQuarter > 0) return;
        segments_.push_back({0, 0, kDefaultBpm / 60 / division.ticksPerSecond});
        for (const auto& tempo : tempos) {
            segments_.push_back(
                {tempo.tick, beatAt(tempo.tick), bpmOf(tempo) / 60 / division.ticksPerSecond});
        }
    }

    double beatAt(std::uint64_t tick) const {
        if (division_.ticksPerQuarter > 0) return static_cast<double>(tick) / division_.ticksPerQuarter;
        const auto after =
            std::upper_bound(segments_.begin(), segments_.end(), tick,
                             [](std::uint64_t time, const Segment& s) { return time < s.tick; });
        const Segment& segment = *std::prev(after);
        return segment.beat + static_cast<double>(tick - segment.tick) * segment.beatsPerTick;
    }

    double beatsBetween(std::uint64_t from, std::uint64_t to) const {
        if (division_.ticksPerQuarter > 0) return static_cast<double>(to - from) / division_.ticksPerQuarter;
        return beatAt(to) - beatAt(from);
    }

  private:
    struct Segment {
        std::uint64_t tick;
        double beat, beatsPerTick;
    };
    Division division_;
    std::vector<Segment> segments_;
};

template <typename Event>
std::vector<Event> mergedByTick(const std::vector<MidiTrackEvents>& tracks,
                                std::vector<Event> MidiTrackEvents::*member) {
    std::vector<Event> all;
    for (const auto& track : tracks) {
        all.insert(all.end(), (track.*member).begin(), (track.*member).end());
    }
    std::stable_sort(all.begin(), all.end(), [](const auto& a, const auto& b) { return a.tick < b.tick; });
    return all;
}

}  // namespace

/// Reads the chunks, then puts their events into beats.
class MidiSequenceBuilder {
  public:
    explicit MidiSequenceBuilder(std::span<const std::uint8_t> bytes) : bytes_(bytes) {}

    bool readHeader(Error* error) {
        if (!hasName(bytes_, "MThd") || bytes_.size() < kChunkHeader + kHeaderLength) {
            return fail(error, kErrorMalformed, "no standard MIDI file header", {.offset = 0});
        }
        const std::uint32_t length = bigEndian(bytes_.subspan(4, 4));
        const std::uint32_t format = bigEndian(bytes_.subspan(8, 2));
        announcedTracks_ = bigEndian(bytes_.subspan(10, 2));
        division_ = divisionOf(bigEndian(bytes_.subspan(12, 2)));
        if (length < kHeaderLength) {
            return fail(error, kErrorMalformed, fmt::format("a header of {} bytes, not 6", length),
                        {.offset = 4});
        }
        if (format > 2) {
            return fail(error, kErrorMalformed, fmt::format("unknown MIDI file format {}", format),
                        {.offset = 8});
        }
        if (!division_.isUsable()) {
            return fail(error, kErrorMalformed, "a division of 0, so that time has no unit", {.offset = 12});
        }
        sequence_.format_ = static_cast<int>(format);
        position_ = kChunkHeader + std::min<std::size_t>(length, bytes_.size() - kChunkHeader);
        return true;
    }

    void readTracks() {
        MidiTrackReader reader;
        while (bytes_.size() - position_ >= kChunkHeader && tracks_.size() < kMostTracks) {
            const auto header = bytes_.subspan(position_, kChunkHeader);
            const std::size_t announced = bigEndian(header.subspan(4));
            position_ += kChunkHeader;
            const std::size_t length = std::min(announced, bytes_.size() - position_);
            if (length < announced) {
                note(errorOf(kErrorMalformed,
                             fmt::format("a chunk claims {} bytes, but only {} follow", announced, length),
                             {.offset = position_ - 4}));
            }
            if (hasName(header, "MTrk")) {
                tracks_.push_back(reader.read(bytes_.subspan(position_, length), position_));
                if (tracks_.back().problem.isSet()) note(tracks_.back().problem);
            }
            position_ += length;
        }
        if (tracks_.size() != announcedTracks_) {
            note(errorOf(kErrorMalformed,
                         fmt::format("{} tracks announced, {} found", announcedTracks_, tracks_.size()),
                         {.offset = 10}));
        }
    }

    MidiSequence finish() {
        const auto tempos = mergedByTick(tracks_, &MidiTrackEvents::tempos);
        const BeatClock clock(division_, tempos);
        for (const auto& tempo : tempos) {
            sequence_.tempos_.push_back({clock.beatAt(tempo.tick), bpmOf(tempo)});
        }
        for (const auto& meter : mergedByTick(tracks_, &MidiTrackEvents::meters)) {
            sequence_.meters_.push_back({clock.beatAt(meter.tick), meter.numerator, meter.denominator});
        }
        for (MidiTrackEvents& track : tracks_) {
            sequence_.length_ = std::max(sequence_.length_, clock.beatAt(track.end));
            const bool isFirst = &track == tracks_.data();
            if (isFirst && sequence_.format_ == 1 && !track.hasChannelEvent) continue;  // the tempo track
            sequence_.tracks_.push_back(inBeats(std::exchange(track, {}), clock));
        }
        return std::move(sequence_);
    }

  private:
    static MidiTrack inBeats(const MidiTrackEvents& events, const BeatClock& clock) {
        MidiTrack track;
        track.length = clock.beatAt(events.end);
        track.notes.reserve(events.notes.size());
        for (const auto& note : events.notes) {
            track.notes.push_back({clock.beatAt(note.start),
                                   static_cast<float>(clock.beatsBetween(note.start, note.end)), note.channel,
                                   note.pitch, note.velocity, note.releaseVelocity});
        }
        return track;
    }

    void note(Error problem) {
        if (sequence_.problems_.size() < kMostProblems) sequence_.problems_.push_back(std::move(problem));
    }

    std::span<const std::uint8_t> bytes_;
    std::size_t position_ = 0;
    std::size_t announcedTracks_ = 0;
    Division division_;
    std::vector<MidiTrackEvents> tracks_;
    MidiSequence sequence_;
};

bool MidiSequence::supportsFileExtension(std::string_view extension) {
    const std::string lowercased = lowercase(extension);
    return lowercased == "mid" || lowercased == "midi";
}

std::optional<MidiSequence> MidiSequence::parse(std::span<const std::uint8_t> bytes, Error* error) {
    if (bytes.size() > kLargestFile) {
        fail(error, kErrorTooLarge,
             fmt::format("a MIDI file of {} bytes, over {}", bytes.size(), kLargestFile));
        return std::nullopt;
    }
    MidiSequenceBuilder builder(bytes);
    if (!builder.readHeader(error)) return std::nullopt;
    builder.readTracks();
    return builder.finish();
}

std::optional<MidiSequence> MidiSequence::read(const std::string& path, Error* error) {
    const auto bytes = readFile(path, error, kLargestFile);
    if (!bytes) return std::nullopt;
    auto sequence = parse(*bytes, error);
    if (!sequence) failIn(path, error);
    return sequence;
}

double MidiSequence::endOfNotes() const {
    double end = 0;
    for (const MidiTrack& track : tracks_) {
        for (const MidiNote& note : track.notes) end = std::max(end, note.end());
    }
    return end;
}

}  // namespace qvct

#include "demo/files/MidiFile.h"

#include "demo/files/ByteWriter.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <tuple>

namespace qvct::demo {
namespace {

constexpr int kTicksPerQuarter = 480;
constexpr std::uint8_t kNoteOn = 0x90;
constexpr std::uint8_t kNoteOff = 0x80;

struct Event {
    std::uint32_t tick;
    std::uint8_t status;
    std::uint8_t key;
    std::uint8_t velocity;
};

std::vector<Event> eventsOf(const std::vector<Note>& notes) {
    std::vector<Event> events;
    const auto add = [&](double beats, std::uint8_t status, const Note& note) {
        events.push_back({static_cast<std::uint32_t>(std::lround(beats * kTicksPerQuarter)), status,
                          static_cast<std::uint8_t>(note.key), static_cast<std::uint8_t>(note.velocity)});
    };
    for (const Note& note : notes) {
        add(note.start, kNoteOn, note);
        add(note.start + note.length, kNoteOff, note);
    }
    // A note that ends where the same one starts again ends first.
    std::stable_sort(events.begin(), events.end(), [](const Event& a, const Event& b) {
        return std::tie(a.tick, a.status) < std::tie(b.tick, b.status);
    });
    return events;
}

/// Seven bits a byte, the highest first; all but the last have their top bit set.
void putVariableLength(ByteWriter& track, std::uint32_t value) {
    for (int shift = 21; shift > 0; shift -= 7) {
        if (value >> shift != 0) track.bytes((value >> shift & 0x7F) | 0x80, 1);
    }
    track.bytes(value & 0x7F, 1);
}

void putTempoAndMeter(ByteWriter& track, const LoopFacts& facts) {
    const auto microseconds = static_cast<std::uint64_t>(std::llround(60'000'000 / facts.tempo));
    track.bytes(0, 1).bytes(0xFF5103, 3).bytes(microseconds, 3);
    const int power = std::countr_zero(static_cast<unsigned>(facts.meterBottom));
    track.bytes(0, 1).bytes(0xFF5804, 3).bytes(static_cast<std::uint64_t>(facts.meterTop), 1);
    track.bytes(static_cast<std::uint64_t>(power), 1).bytes(0x1808, 2);
}

}  // namespace

std::string midiBytes(const std::vector<Note>& notes, const std::optional<LoopFacts>& facts) {
    ByteWriter track(std::endian::big);
    if (facts) putTempoAndMeter(track, *facts);
    std::uint32_t last = 0;
    for (const Event& event : eventsOf(notes)) {
        putVariableLength(track, event.tick - last);
        track.number(event.status).number(event.key).number(event.velocity);
        last = event.tick;
    }
    track.bytes(0, 1).bytes(0xFF2F00, 3);  // end of track

    ByteWriter file(std::endian::big);
    file.text("MThd").number(std::uint32_t{6}).number(std::uint16_t{0}).number(std::uint16_t{1});
    file.number(std::uint16_t{kTicksPerQuarter});
    file.text("MTrk").number(static_cast<std::uint32_t>(track.data().size())).text(track.data());
    return file.data();
}

}  // namespace qvct::demo

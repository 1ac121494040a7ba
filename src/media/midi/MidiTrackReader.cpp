#include "media/midi/MidiTrackReader.h"

#include "platform/base/bytes/ByteOrder.h"

#include <utility>

namespace qvct {
namespace {

constexpr std::uint8_t kMeta = 0xFF;
constexpr std::uint8_t kEndOfTrack = 0x2F;
constexpr std::uint8_t kTempo = 0x51;
constexpr std::uint8_t kMeter = 0x58;
constexpr int kLargestDenominatorPower = 16;

std::size_t openSlot(std::uint8_t channel, std::uint8_t pitch) {
    return static_cast<std::size_t>(channel) << 7 | pitch;
}

}  // namespace

MidiTrackReader::MidiTrackReader() : open_(16U << 7) {}

MidiTrackEvents MidiTrackReader::read(std::span<const std::uint8_t> chunk, std::size_t offset) {
    chunk_ = chunk;
    offset_ = offset;
    position_ = 0;
    tick_ = 0;
    runningStatus_ = 0;
    ended_ = false;
    events_ = {};
    nextOpen_.clear();

    while (!ended_ && position_ < chunk_.size()) {
        std::uint32_t delta = 0;
        if (!readLength(delta)) break;
        tick_ += delta;
        if (!readEvent()) break;
    }
    if (!ended_ && !events_.problem.isSet()) stop("the track has no end event");
    events_.end = tick_;
    closeOpenNotes();
    return std::move(events_);
}

bool MidiTrackReader::readEvent() {
    std::uint8_t status = 0;
    if (!readByte(status)) return false;
    if (status < 0x80) {
        if (runningStatus_ == 0) return stop("a data byte without a status before it");
        --position_;
        return readChannelEvent(runningStatus_);
    }
    if (status < 0xF0) {
        runningStatus_ = status;
        return readChannelEvent(status);
    }
    std::uint32_t length = 0;
    switch (status) {
        case kMeta:
            return readMeta();
        case 0xF0:
        case 0xF7:
            return readLength(length) && skipBytes(length);
        // System messages do not belong in a file; any that occur are skipped with their data.
        case 0xF2:
            return skipBytes(2);
        case 0xF1:
        case 0xF3:
            return skipBytes(1);
        default:
            return true;
    }
}

bool MidiTrackReader::readMeta() {
    std::uint8_t type = 0;
    std::uint32_t length = 0;
    std::span<const std::uint8_t> data;
    if (!readByte(type) || !readLength(length) || !readBytes(length, data)) return false;
    if (type == kEndOfTrack) {
        ended_ = true;
    } else {
        keepTempoOrMeter(type, data);
    }
    return true;
}

void MidiTrackReader::keepTempoOrMeter(std::uint8_t type, std::span<const std::uint8_t> data) {
    if (type == kTempo && data.size() >= 3) {
        const auto microseconds = static_cast<std::uint32_t>(numberOf(data.first(3), ByteOrder::big));
        if (microseconds > 0) events_.tempos.push_back({tick_, microseconds});
    } else if (type == kMeter && data.size() >= 2 && data[0] > 0 && data[1] <= kLargestDenominatorPower) {
        events_.meters.push_back({tick_, data[0], 1 << data[1]});
    }
}

bool MidiTrackReader::readChannelEvent(std::uint8_t status) {
    const auto kind = static_cast<std::uint8_t>(status & 0xF0);
    const auto channel = static_cast<std::uint8_t>(status & 0x0F);
    std::uint8_t first = 0;
    std::uint8_t second = 0;
    if (!readByte(first)) return false;
    const bool hasSecond = kind != 0xC0 && kind != 0xD0;
    if (hasSecond && !readByte(second)) return false;
    if (first > 0x7F || second > 0x7F) return stop("a status byte where a data byte belongs");

    events_.hasChannelEvent = true;
    if (kind == 0x90 && second > 0) {
        noteOn(channel, first, second);
    } else if (kind == 0x80 || kind == 0x90) {
        noteOff(channel, first, second);
    }
    return true;
}

void MidiTrackReader::noteOn(std::uint8_t channel, std::uint8_t pitch, std::uint8_t velocity) {
    const auto note = static_cast<std::uint32_t>(events_.notes.size());
    events_.notes.push_back({tick_, tick_, channel, pitch, velocity, 0});
    nextOpen_.push_back(kNone);
    OpenNotes& open = open_[openSlot(channel, pitch)];
    if (open.oldest == kNone) {
        open.oldest = note;
    } else {
        nextOpen_[open.newest] = note;
    }
    open.newest = note;
}

void MidiTrackReader::noteOff(std::uint8_t channel, std::uint8_t pitch, std::uint8_t velocity) {
    OpenNotes& open = open_[openSlot(channel, pitch)];
    if (open.oldest == kNone) return;
    MidiTrackEvents::Note& note = events_.notes[open.oldest];
    note.end = tick_;
    note.releaseVelocity = velocity;
    open.oldest = nextOpen_[open.oldest];
}

void MidiTrackReader::closeOpenNotes() {
    // Loops over the notes, not over all slots, so that a file of many small tracks costs time in proportion
    // to its size.
    for (const MidiTrackEvents::Note& note : events_.notes) {
        OpenNotes& open = open_[openSlot(note.channel, note.pitch)];
        for (; open.oldest != kNone; open.oldest = nextOpen_[open.oldest]) {
            events_.notes[open.oldest].end = tick_;
        }
        open.newest = kNone;
    }
}

bool MidiTrackReader::readByte(std::uint8_t& byte) {
    if (position_ >= chunk_.size()) return stop("the track ends within an event");
    byte = chunk_[position_++];
    return true;
}

bool MidiTrackReader::readLength(std::uint32_t& value) {
    value = 0;
    for (int i = 0; i < 4; ++i) {
        std::uint8_t byte = 0;
        if (!readByte(byte)) return false;
        value = value << 7 | (byte & 0x7FU);
        if (byte < 0x80) return true;
    }
    return stop("a variable-length number of more than four bytes");
}

bool MidiTrackReader::readBytes(std::uint32_t count, std::span<const std::uint8_t>& bytes) {
    if (count > chunk_.size() - position_) return stop("an event that is longer than the rest of the track");
    bytes = chunk_.subspan(position_, count);
    position_ += count;
    return true;
}

bool MidiTrackReader::skipBytes(std::uint32_t count) {
    std::span<const std::uint8_t> ignored;
    return readBytes(count, ignored);
}

bool MidiTrackReader::stop(const char* reason) {
    return fail(&events_.problem, kErrorMalformed, reason, {.offset = offset_ + position_});
}

}  // namespace qvct

#pragma once

#include <bit>
#include <cstdint>
#include <string>
#include <vector>

/// Small audio files, built byte by byte so that a test can break any of them.
namespace qvct::test {

inline std::string little(std::uint64_t value, std::size_t width) {
    std::string bytes;
    for (std::size_t i = 0; i < width; ++i) bytes += static_cast<char>(value >> (8 * i) & 0xFFU);
    return bytes;
}

inline std::string big(std::uint64_t value, std::size_t width) {
    const std::string bytes = little(value, width);
    return {bytes.rbegin(), bytes.rend()};
}

/// Bytes that never repeat soon, so that a lost or moved one shows.
inline std::string noise(std::size_t count) {
    std::string bytes;
    std::uint32_t state = 12345;
    for (std::size_t i = 0; i < count; ++i) {
        state = state * 1664525U + 1013904223U;
        bytes += static_cast<char>(state >> 24U);
    }
    return bytes;
}

/// WAV in one of its byte orders.
struct Wav {
    std::string magic = "RIFF";

    std::string number(std::uint64_t value, std::size_t width) const {
        return magic == "RIFX" ? big(value, width) : little(value, width);
    }
    std::string chunk(const std::string& id, const std::string& contents) const {
        const std::string pad(contents.size() % 2, '\0');
        return id + number(contents.size(), 4) + contents + pad;
    }
    std::string format(unsigned channels = 2, std::uint32_t rate = 44100, unsigned bits = 16) const {
        const unsigned frame = channels * ((bits + 7) / 8);
        return chunk("fmt ", number(1, 2) + number(channels, 2) + number(rate, 4) + number(rate * frame, 4) +
                                 number(frame, 2) + number(bits, 2));
    }
    std::string data(std::size_t bytes = 4000) const { return chunk("data", noise(bytes)); }
    /// `flags` 0 is a loop, 1 a one-shot, 2 says that the root note is set.
    std::string acid(unsigned flags, unsigned root, unsigned beats, float tempo) const {
        return chunk("acid", number(flags, 4) + number(root, 2) + number(0x8000, 2) + number(0, 4) +
                                 number(beats, 4) + number(4, 2) + number(3, 2) +
                                 number(std::bit_cast<std::uint32_t>(tempo), 4));
    }
    std::string cues(const std::vector<unsigned>& frames) const {
        std::string points;
        for (const unsigned frame : frames) points += noise(8) + "data" + number(0, 8) + number(frame, 4);
        return chunk("cue ", number(frames.size(), 4) + points);
    }
    std::string file(const std::string& chunks) const {
        return magic + number(4 + chunks.size(), 4) + "WAVE" + chunks;
    }
    /// RF64 or BW64: the sizes of the form and of `data` stand in `ds64`, those of other chunks in its table.
    std::string longFile(const std::string& chunksBefore, std::size_t dataSize,
                         const std::string& chunksBehind = {}, const std::string& table = {}) const {
        const std::string data =
            "data" + little(0xFFFFFFFF, 4) + noise(dataSize) + std::string(dataSize % 2, '\0');
        const std::string rest = chunksBefore + data + chunksBehind;
        const std::string sizes =
            chunk("ds64", little(4 + 36 + table.size() + rest.size(), 8) + little(dataSize, 8) +
                              little(dataSize / 4, 8) + little(table.size() / 12, 4) + table);
        return magic + little(0xFFFFFFFF, 4) + "WAVE" + sizes + rest;
    }
};

struct Aiff {
    static std::string chunk(const std::string& id, const std::string& contents) {
        return id + big(contents.size(), 4) + contents + std::string(contents.size() % 2, '\0');
    }
    /// The 80-bit float of a whole rate.
    static std::string rate(std::uint64_t value) {
        const auto shift = static_cast<unsigned>(std::countl_zero(value));
        return big(16383 + 63 - shift, 2) + big(value << shift, 8);
    }
    static std::string common(unsigned channels = 2, std::uint32_t frames = 1000, unsigned bits = 16,
                              const std::string& sampleRate = rate(44100), const std::string& coding = {}) {
        return chunk("COMM", big(channels, 2) + big(frames, 4) + big(bits, 2) + sampleRate + coding);
    }
    static std::string sound(std::size_t bytes = 4000) { return chunk("SSND", big(0, 8) + noise(bytes)); }
    static std::string file(const std::string& chunks, const std::string& form = "AIFF") {
        return "FORM" + big(4 + chunks.size(), 4) + form + chunks;
    }
};

struct Caf {
    static std::string chunk(const std::string& id, const std::string& contents) {
        return chunk(id, contents, static_cast<std::int64_t>(contents.size()));
    }
    static std::string chunk(const std::string& id, const std::string& contents, std::int64_t size) {
        return id + big(static_cast<std::uint64_t>(size), 8) + contents;
    }
    static std::string description(double rate = 44100, unsigned channels = 2, unsigned framesPerPacket = 1) {
        return chunk("desc", big(std::bit_cast<std::uint64_t>(rate), 8) + "lpcm" + big(0, 4) + big(4, 4) +
                                 big(framesPerPacket, 4) + big(channels, 4) + big(16, 4));
    }
    static std::string data(std::size_t bytes = 4000) { return chunk("data", big(0, 4) + noise(bytes)); }
    static std::string openData(std::size_t bytes = 4000) {
        return chunk("data", big(0, 4) + noise(bytes), -1);
    }
    static std::string file(const std::string& chunks) { return "caff" + big(1, 2) + big(0, 2) + chunks; }
};

/// The smallest standard MIDI file: one empty track.
inline std::string emptyMidi() {
    return "MThd" + big(6, 4) + big(0, 2) + big(1, 2) + big(96, 2) + "MTrk" + big(4, 4) + big(0x00FF2F00, 4);
}

}  // namespace qvct::test

#include "demo/files/AudioFiles.h"
#include "demo/files/ByteWriter.h"
#include "demo/files/MidiFile.h"
#include "demo/files/Samples.h"

#include <array>
#include <charconv>
#include <utility>

namespace qvct::demo {
namespace {

ByteWriter big() {
    return ByteWriter(std::endian::big);
}

void putChunk(ByteWriter& file, std::string_view id, const std::string& body) {
    file.text(id).number(static_cast<std::uint64_t>(body.size())).text(body);
}

std::string descriptionBody(const Sound& sound) {
    return big()
        .number(static_cast<double>(sound.rate))
        .text("lpcm")
        .number(std::uint32_t{0})  // integer, big endian
        .number(static_cast<std::uint32_t>(sound.channels * sound.bits / 8))
        .number(std::uint32_t{1})  // frames in a packet
        .number(static_cast<std::uint32_t>(sound.channels))
        .number(static_cast<std::uint32_t>(sound.bits))
        .data();
}

std::string shortest(double value) {
    std::array<char, 32> text{};
    const auto result = std::to_chars(text.data(), text.data() + text.size(), value);
    return {text.data(), result.ptr};
}

/// "C", "F#m"
std::string keySignature(int rootNote, Mode mode) {
    static constexpr std::array<const char*, 12> names = {"C",  "C#", "D",  "D#", "E",  "F",
                                                          "F#", "G",  "G#", "A",  "A#", "B"};
    return std::string(names.at(static_cast<std::size_t>(rootNote % 12))) + (mode == Mode::minor ? "m" : "");
}

std::vector<std::pair<std::string, std::string>> information(const Sound& sound) {
    std::vector<std::pair<std::string, std::string>> entries;
    if (!sound.name.empty()) entries.emplace_back("title", sound.name);
    if (sound.rootNote && sound.mode != Mode::none) {
        entries.emplace_back("key signature", keySignature(*sound.rootNote, sound.mode));
    }
    if (sound.loop) {
        entries.emplace_back("tempo", shortest(sound.loop->tempo));
        entries.emplace_back("time signature", std::to_string(sound.loop->meterTop) + "/" +
                                                   std::to_string(sound.loop->meterBottom));
    }
    return entries;
}

std::string informationBody(const std::vector<std::pair<std::string, std::string>>& entries) {
    ByteWriter body = big();
    body.number(static_cast<std::uint32_t>(entries.size()));
    for (const auto& [key, value] : entries) body.zeroTerminated(key).zeroTerminated(value);
    return body.data();
}

std::string instrumentBody(int rootNote) {
    ByteWriter body = big();
    body.number(static_cast<float>(rootNote));
    body.number(std::uint8_t{0}).number(std::uint8_t{127});               // lowest and highest note
    body.number(std::uint8_t{1}).number(std::uint8_t{127});               // lowest and highest velocity
    body.number(0.0F);                                                    // gain in decibels
    body.bytes(0xFFFFFFFF, 4).bytes(0xFFFFFFFF, 4).bytes(0xFFFFFFFF, 4);  // no regions
    body.number(std::uint32_t{0});
    return body.data();
}

/// Markers point by number to their names, which lie in the strings chunk.
std::string markerBody(const std::vector<Marker>& markers) {
    ByteWriter body = big();
    body.number(std::uint32_t{0}).number(static_cast<std::uint32_t>(markers.size()));
    std::uint32_t identifier = 0;
    for (const Marker& marker : markers) {
        body.number(std::uint32_t{0});  // type: generic
        body.number(static_cast<double>(marker.frame)).number(++identifier);
        body.bytes(0xFFFFFFFFFFFFFFFF, 8);  // no SMPTE time
        body.number(std::uint32_t{0});      // all channels
    }
    return body.data();
}

std::string stringsBody(const std::vector<Marker>& markers) {
    ByteWriter table = big();
    ByteWriter texts = big();
    table.number(static_cast<std::uint32_t>(markers.size()));
    std::uint32_t identifier = 0;
    for (const Marker& marker : markers) {
        table.number(++identifier).number(static_cast<std::uint64_t>(texts.data().size()));
        texts.zeroTerminated(marker.name);
    }
    return table.text(texts.data()).data();
}

}  // namespace

std::string cafBytes(const Sound& sound) {
    ByteWriter samples = big();
    samples.number(std::uint32_t{0});  // edit count
    putSamples(samples, sound);

    ByteWriter file = big();
    file.text("caff").number(std::uint16_t{1}).number(std::uint16_t{0});  // version, flags
    putChunk(file, "desc", descriptionBody(sound));
    const auto entries = information(sound);
    if (!entries.empty()) putChunk(file, "info", informationBody(entries));
    if (sound.rootNote) putChunk(file, "inst", instrumentBody(*sound.rootNote));
    if (!sound.markers.empty()) {
        putChunk(file, "mark", markerBody(sound.markers));
        putChunk(file, "strg", stringsBody(sound.markers));
    }
    if (!sound.notes.empty()) putChunk(file, "midi", midiBytes(sound.notes, sound.loop));
    putChunk(file, "data", samples.data());
    return file.data();
}

}  // namespace qvct::demo

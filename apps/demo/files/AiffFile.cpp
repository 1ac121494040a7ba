#include "demo/files/AudioFiles.h"
#include "demo/files/ByteWriter.h"
#include "demo/files/MidiFile.h"
#include "demo/files/Samples.h"

namespace qvct::demo {
namespace {

constexpr int kMiddleC = 60;

ByteWriter big() {
    return ByteWriter(std::endian::big);
}

void putChunk(ByteWriter& file, std::string_view id, const std::string& body) {
    file.text(id).number(static_cast<std::uint32_t>(body.size())).text(body);
    if (body.size() % 2 != 0) file.number(std::uint8_t{0});
}

/// A positive whole number as an 80-bit extended float: biased exponent, then the mantissa with its leading
/// one.
void putExtended(ByteWriter& writer, std::uint32_t value) {
    const int shift = std::countl_zero(std::uint64_t{value});
    writer.number(static_cast<std::uint16_t>(16383 + 63 - shift)).number(std::uint64_t{value} << shift);
}

std::string commonBody(const Sound& sound) {
    ByteWriter body = big();
    body.number(static_cast<std::uint16_t>(sound.channels))
        .number(sound.frames())
        .number(static_cast<std::uint16_t>(sound.bits));
    putExtended(body, static_cast<std::uint32_t>(sound.rate));
    return body.data();
}

/// The loop's first frame and the one after its last come before the sound's own markers.
std::vector<Marker> allMarkers(const Sound& sound) {
    std::vector<Marker> markers;
    if (sound.loop) markers = {{0, "beg loop"}, {sound.frames(), "end loop"}};
    markers.insert(markers.end(), sound.markers.begin(), sound.markers.end());
    return markers;
}

std::string markerBody(const std::vector<Marker>& markers) {
    ByteWriter body = big();
    body.number(static_cast<std::uint16_t>(markers.size()));
    std::uint16_t identifier = 0;
    for (const Marker& marker : markers) {
        const std::string name = marker.name.substr(0, 255);
        body.number(++identifier).number(marker.frame).number(static_cast<std::uint8_t>(name.size()));
        body.text(name);
        if (name.size() % 2 == 0) body.number(std::uint8_t{0});  // count and text fill whole words
    }
    return body.data();
}

std::string instrumentBody(const Sound& sound) {
    ByteWriter body = big();
    body.number(static_cast<std::uint8_t>(sound.rootNote.value_or(kMiddleC)));
    body.number(std::uint8_t{0});                            // detune
    body.number(std::uint8_t{0}).number(std::uint8_t{127});  // lowest and highest note
    body.number(std::uint8_t{1}).number(std::uint8_t{127});  // lowest and highest velocity
    body.number(std::uint16_t{0});                           // gain
    const std::uint16_t loops = sound.loop ? 1 : 0;          // forward, from marker 1 to marker 2
    body.number(loops).number(loops).number(static_cast<std::uint16_t>(2 * loops));
    body.zeros(6);  // no release loop
    return body.data();
}

}  // namespace

std::string aiffBytes(const Sound& sound) {
    ByteWriter samples = big();
    samples.zeros(8);  // offset, block size
    putSamples(samples, sound);

    ByteWriter chunks = big();
    chunks.text("AIFF");
    putChunk(chunks, "COMM", commonBody(sound));
    if (!sound.name.empty()) putChunk(chunks, "NAME", sound.name);
    const std::vector<Marker> markers = allMarkers(sound);
    if (!markers.empty()) putChunk(chunks, "MARK", markerBody(markers));
    if (sound.loop || sound.rootNote) putChunk(chunks, "INST", instrumentBody(sound));
    if (!sound.notes.empty()) putChunk(chunks, "MIDI", midiBytes(sound.notes, sound.loop));
    putChunk(chunks, "SSND", samples.data());

    ByteWriter file = big();
    putChunk(file, "FORM", chunks.data());
    return file.data();
}

}  // namespace qvct::demo

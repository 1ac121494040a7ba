#include "demo/files/AudioFiles.h"
#include "demo/files/ByteWriter.h"
#include "demo/files/Samples.h"

namespace qvct::demo {
namespace {

constexpr std::uint32_t kAcidOneShot = 1;
constexpr std::uint32_t kAcidRootNoteSet = 2;
constexpr std::uint32_t kAcidStretch = 4;
constexpr int kMiddleC = 60;

ByteWriter little() {
    return ByteWriter(std::endian::little);
}

void putChunk(ByteWriter& file, std::string_view id, const std::string& body) {
    file.text(id).number(static_cast<std::uint32_t>(body.size())).text(body);
    if (body.size() % 2 != 0) file.number(std::uint8_t{0});
}

std::string formatBody(const Sound& sound) {
    const int frameBytes = sound.channels * sound.bits / 8;
    return little()
        .number(std::uint16_t{1})  // integer PCM
        .number(static_cast<std::uint16_t>(sound.channels))
        .number(static_cast<std::uint32_t>(sound.rate))
        .number(static_cast<std::uint32_t>(sound.rate * frameBytes))
        .number(static_cast<std::uint16_t>(frameBytes))
        .number(static_cast<std::uint16_t>(sound.bits))
        .data();
}

std::string acidBody(const Sound& sound) {
    const LoopFacts facts = sound.loop.value_or(LoopFacts{.beats = 0});
    const std::uint32_t flags =
        (sound.loop ? kAcidStretch : kAcidOneShot) | (sound.rootNote ? kAcidRootNoteSet : 0);
    return little()
        .number(flags)
        .number(static_cast<std::uint16_t>(sound.rootNote.value_or(kMiddleC)))
        .number(std::uint16_t{0x8000})  // always so in the files of others
        .number(0.0F)
        .number(static_cast<std::uint32_t>(facts.beats))
        .number(static_cast<std::uint16_t>(facts.meterBottom))
        .number(static_cast<std::uint16_t>(facts.meterTop))
        .number(static_cast<float>(facts.tempo))
        .data();
}

std::string samplerBody(const Sound& sound) {
    ByteWriter body = little();
    body.number(std::uint32_t{0}).number(std::uint32_t{0});  // manufacturer, product
    body.number(static_cast<std::uint32_t>(1'000'000'000 / sound.rate));
    body.number(static_cast<std::uint32_t>(sound.rootNote.value_or(kMiddleC)));
    body.zeros(12);  // pitch fraction, SMPTE format and offset
    body.number(std::uint32_t{sound.loop ? 1U : 0U}).number(std::uint32_t{0});
    if (sound.loop) {
        body.zeros(8);  // identifier; type: forward
        body.number(std::uint32_t{0}).number(sound.frames() - 1);
        body.zeros(8);  // fraction; play count: without end
    }
    return body.data();
}

std::string cueBody(const Sound& sound) {
    ByteWriter body = little();
    body.number(static_cast<std::uint32_t>(sound.markers.size()));
    std::uint32_t identifier = 0;
    for (const Marker& marker : sound.markers) {
        body.number(++identifier).number(marker.frame).text("data").zeros(8).number(marker.frame);
    }
    return body.data();
}

std::string labelsBody(const Sound& sound) {
    ByteWriter list = little();
    list.text("adtl");
    std::uint32_t identifier = 0;
    for (const Marker& marker : sound.markers) {
        putChunk(list, "labl", little().number(++identifier).zeroTerminated(marker.name).data());
    }
    return list.data();
}

std::string titleBody(const Sound& sound) {
    ByteWriter list = little();
    list.text("INFO");
    putChunk(list, "INAM", little().zeroTerminated(sound.name).data());
    return list.data();
}

}  // namespace

std::string wavBytes(const Sound& sound) {
    ByteWriter samples = little();
    putSamples(samples, sound);

    ByteWriter chunks = little();
    chunks.text("WAVE");
    putChunk(chunks, "fmt ", formatBody(sound));
    if (sound.loop || sound.rootNote) putChunk(chunks, "acid", acidBody(sound));
    if (sound.rootNote) putChunk(chunks, "smpl", samplerBody(sound));
    putChunk(chunks, "data", samples.data());
    if (!sound.markers.empty()) {
        putChunk(chunks, "cue ", cueBody(sound));
        putChunk(chunks, "LIST", labelsBody(sound));
    }
    if (!sound.name.empty()) putChunk(chunks, "LIST", titleBody(sound));

    ByteWriter file = little();
    putChunk(file, "RIFF", chunks.data());
    return file.data();
}

}  // namespace qvct::demo

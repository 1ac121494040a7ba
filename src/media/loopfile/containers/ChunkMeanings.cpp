#include "media/loopfile/containers/ChunkMeanings.h"

#include "media/loopfile/containers/Container.h"
#include "media/loopfile/containers/MusicValues.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/Text.h"

#include <fmt/format.h>

namespace qvct {
namespace {

struct Meaning {
    std::uint32_t id;
    const char* text;
};

constexpr Meaning kMeanings[] = {
    {fourCC("fmt "), "format of the audio"},
    {fourCC("COMM"), "format of the audio"},
    {fourCC("desc"), "format of the audio"},
    {fourCC("data"), "audio"},
    {fourCC("SSND"), "audio"},
    {fourCC("fact"), "number of frames"},
    {fourCC("ds64"), "sizes that need 64 bits"},
    {fourCC("acid"), "loop: tempo, beats, meter, root note"},
    {fourCC("smpl"), "sampler: root note and loops"},
    {fourCC("inst"), "instrument: root note and ranges"},
    {fourCC("INST"), "instrument: root note and ranges"},
    {fourCC("cue "), "cue points"},
    {fourCC("MARK"), "markers"},
    {fourCC("mark"), "markers"},
    {fourCC("regn"), "regions"},
    {fourCC("strg"), "texts that other chunks refer to"},
    {fourCC("LIST"), "list"},
    {fourCC("INFO"), "texts about the file"},
    {fourCC("adtl"), "texts about the cue points"},
    {fourCC("info"), "texts about the file"},
    {fourCC("bext"), "broadcast description"},
    {fourCC("iXML"), "description of the recording, in XML"},
    {fourCC("_PMX"), "description in XML"},
    {fourCC("axml"), "description in XML"},
    {fourCC("chna"), "channels and their tracks"},
    {fourCC("id3 "), "ID3 tag"},
    {fourCC("ID3 "), "ID3 tag"},
    {fourCC("JUNK"), "filler"},
    {fourCC("junk"), "filler"},
    {fourCC("PAD "), "filler"},
    {fourCC("FLLR"), "filler"},
    {fourCC("free"), "filler"},
    {fourCC("PEAK"), "loudest samples"},
    {fourCC("peak"), "loudest samples"},
    {fourCC("ovvw"), "overview of the waveform"},
    {fourCC("chan"), "layout of the channels"},
    {fourCC("pakt"), "sizes of the packets"},
    {fourCC("kuki"), "set-up of the decoder"},
    {fourCC("edct"), "comments on edits"},
    {fourCC("midi"), "standard MIDI file"},
    {fourCC("MIDI"), "MIDI data"},
    {fourCC("FVER"), "version of the format"},
    {fourCC("NAME"), "name"},
    {fourCC("AUTH"), "author"},
    {fourCC("(c) "), "copyright"},
    {fourCC("ANNO"), "annotation"},
    {fourCC("COMT"), "comments"},
    {fourCC("APPL"), "data of an application"},
    {fourCC("uuid"), "data of an application"},
    {fourCC("INAM"), "title"},
    {fourCC("IART"), "artist"},
    {fourCC("IGNR"), "genre"},
    {fourCC("ICMT"), "comment"},
    {fourCC("IKEY"), "keywords"},
    {fourCC("ICRD"), "date"},
    {fourCC("ISFT"), "software"},
    {fourCC("ICOP"), "copyright"},
    {fourCC("labl"), "name of a cue point"},
    {fourCC("note"), "note on a cue point"},
    {fourCC("ltxt"), "length of a cue point"},
};

std::string meaningOf(std::uint32_t id) {
    for (const Meaning& meaning : kMeanings) {
        if (meaning.id == id) return meaning.text;
    }
    return {};
}

std::string quoted(BoundedCursor contents, std::uint64_t skipped) {
    contents.skip(std::min(skipped, contents.remaining()));
    constexpr std::uint64_t kShown = 80;
    return fmt::format(" \"{}\"",
                       printable(textOfField(contents.text(std::min(contents.remaining(), kShown)))));
}

std::string formatText(const Container& container) {
    LCAudioFacts facts;
    Error error;
    if (!container.readFacts(facts, &error)) return ": " + error.message();
    return fmt::format(": {} Hz, {} channels, {} bits, {} frames", facts.sampleRate, facts.channelCount,
                       facts.bitsPerSample, facts.frameCount);
}

std::string musicText(const Container& container) {
    LCAudioFacts facts;
    if (!container.readFacts(facts, nullptr)) return {};
    return fmt::format(": {}, {} beats, {} beats a minute, meter {}/{}, root note {}",
                       facts.isLoop ? "a loop" : "no loop", facts.beatCount, facts.bpm, facts.signatureTop,
                       facts.signatureBottom, facts.midiRootNote);
}

std::string recordText(const Container& container) {
    const auto bytes = container.recordBytes();
    const auto record = bytes ? parsePropertyList(*bytes) : std::nullopt;
    const PropertyList::Dictionary* dictionary = record ? record->dictionary() : nullptr;
    if (dictionary == nullptr) return "our record, unreadable";
    std::vector<std::string> keys;
    for (const auto& entry : *dictionary) keys.push_back(printable(entry.key));
    return "our record: " + join(keys, ", ");
}

std::string describe(const Container& container, const Chunk& chunk) {
    if (chunk.role == Chunk::Role::record) return recordText(container);
    BoundedCursor contents = container.cursor(chunk);
    std::string meaning = meaningOf(chunk.id);
    switch (chunk.id) {
        case fourCC("fmt "):
        case fourCC("COMM"):
        case fourCC("desc"):
            return meaning + formatText(container);
        case fourCC("acid"):
            return meaning + musicText(container);
        case fourCC("cue "):
            return fmt::format("{} {}", contents.u32(), meaning);
        case fourCC("MARK"):
            return fmt::format("{} {}", contents.u16(), meaning);
        case fourCC("mark"):
            contents.skip(4);
            return fmt::format("{} {}", contents.u32(), meaning);
        case fourCC("NAME"):
        case fourCC("AUTH"):
        case fourCC("(c) "):
        case fourCC("ANNO"):
            return meaning + quoted(contents, 0);
        case fourCC("LIST"):
            return meaning + ": " + meaningOf(contents.fourCC());
        case fourCC("APPL"):
            return meaning + quoted(contents.part(std::min<std::uint64_t>(4, contents.remaining())), 0);
        default:
            return meaning;
    }
}

/// The texts of a `LIST`.
std::vector<LCChunk> childrenOf(const Container& container, const Chunk& list) {
    std::vector<LCChunk> children;
    BoundedCursor contents = container.cursor(list);
    const bool areLabels = contents.fourCC() == fourCC("adtl");
    while (contents.remaining() >= 8 && children.size() < Container::kMostChunks) {
        LCChunk child;
        child.offset = contents.position();
        const std::uint32_t id = contents.fourCC();
        const std::uint64_t size = contents.u32();
        child.id = textOfCode(id);
        child.size = std::min(size, contents.remaining());
        if (child.size < size) child.fault = "claims more bytes than there are";
        const BoundedCursor text = contents.part(child.size);
        contents.skip(std::min<std::uint64_t>(size & 1U, contents.remaining()));
        child.meaning = meaningOf(id) + (id == fourCC("ltxt") ? "" : quoted(text, areLabels ? 4 : 0));
        children.push_back(std::move(child));
    }
    return children;
}

}  // namespace

std::vector<LCChunk> describeChunks(const Container& container) {
    LCChunk whole;
    BoundedCursor magic(container.window(), ByteOrder::big, 0, 4);
    whole.id = container.isRecordAlone() ? "" : textOfCode(magic.fourCC());
    whole.size = container.window().size();
    whole.meaning = container.formatName();
    whole.fault = container.fault().message();
    for (const Chunk& chunk : container.chunks()) {
        LCChunk shown;
        shown.id = textOfCode(chunk.id);
        shown.offset = chunk.offset;
        shown.size = chunk.signature + chunk.size;
        shown.meaning = describe(container, chunk);
        if (chunk.fault != nullptr) shown.fault = chunk.fault;
        if (chunk.id == fourCC("LIST")) {
            shown.children = childrenOf(container, chunk);
        }
        whole.children.push_back(std::move(shown));
    }
    const std::uint64_t end = container.chunks().empty() ? whole.size : container.chunks().back().end;
    if (end < whole.size) {
        LCChunk rest;
        rest.offset = end;
        rest.size = whole.size - end;
        rest.meaning = "bytes behind the last chunk";
        whole.children.push_back(std::move(rest));
    }
    return {std::move(whole)};
}

}  // namespace qvct

// Reads, rewrites and reads again whatever the fuzzer makes of a loop file. Beyond not crashing:
//   - an error has a message, a result has none;
//   - a rewrite keeps every byte that is not the record's, and the record comes back;
//   - a second rewrite is accepted, and without a record the file is as if it had never had one.
// Built once per container; the input is turned to that container, so that no time goes into others.
#include "media/loopfile/LCFileParser.h"
#include "media/loopfile/LCFileWriter.h"
#include "media/loopfile/LCFingerprint.h"
#include "media/loopfile/containers/Container.h"
#include "platform/data/PropertyListFile.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace {

using namespace qvct;
using Bytes = std::vector<std::uint8_t>;

void require(bool holds, const char* what) {
    if (holds) return;
    std::fprintf(stderr, "does not hold: %s\n", what);
    std::abort();
}

/// The file that the pieces describe, or nothing when it is refused.
std::optional<Bytes> rewritten(const Bytes& old, const std::string& record) {
    const MemoryReader reader(old);
    ReadWindow window(reader);
    Error error;
    const auto container = Container::open(window, QVCT_FUZZ_NAME, &error);
    const auto pieces = container ? container->rewritten(record, &error) : std::nullopt;
    require(pieces.has_value() == !error.isSet(), "a refusal has a reason");
    if (!pieces) return std::nullopt;
    Bytes result;
    for (const FilePiece& piece : *pieces) {
        require(piece.offset <= old.size() && piece.length <= old.size() - piece.offset,
                "pieces lie in the file");
        const auto begin = old.begin() + static_cast<std::ptrdiff_t>(piece.offset);
        result.insert(result.end(), begin, begin + static_cast<std::ptrdiff_t>(piece.length));
        result.insert(result.end(), piece.bytes.begin(), piece.bytes.end());
    }
    return result;
}

std::shared_ptr<LCFileData> parse(const Bytes& bytes) {
    const auto parser = LCFileParser::fileParserForBytes(bytes, QVCT_FUZZ_NAME);
    Error error;
    const auto data = parser->enhancedFileData(&error);
    require((data != nullptr) == !error.isSet(), "an error has a message");
    parser->chunks();
    if (!data) return nullptr;
    require(data->bpm() >= 0 && data->lengthInSeconds() >= 0, "numbers are in range");
    require(data->midiRootNote() >= -1 || data->record().value("MidiRootNote") != nullptr,
            "root note is in range");
    return parser->fileData();
}

void checkRewrite(const Bytes& bytes, const LCFileData& before) {
    LCFileData changed = before;
    changed.setTaggingDictionary({{"Genres", PropertyList::Array{"Ambient"}}});
    const std::string record = serializePropertyList(changed.record(), PropertyListFormat::binary);
    if (record.empty()) return;  // a text with a NUL character cannot be stored
    const auto tagged = rewritten(bytes, record);
    if (!tagged) return;
    const auto after = parse(*tagged);
    require(after != nullptr, "what was written can be read");
    require(after->record() == changed.record(), "the record comes back");
    require(after->frameCount() == before.frameCount(), "the audio stays");
    require(after->transientMarkers() == changed.transientMarkers(), "the markers stay");
    require(after->tavioLoopType() == changed.tavioLoopType(), "the loop type stays");
    const auto old = fingerprintOfReader(MemoryReader(bytes), QVCT_FUZZ_NAME);
    const auto now = fingerprintOfReader(MemoryReader(*tagged), QVCT_FUZZ_NAME);
    require(old && now && old->differences(*now).empty(), "everything but the record stays");

    const auto bare = rewritten(bytes, {});
    const auto bareAgain = rewritten(*tagged, {});
    require(bare && bareAgain && *bare == *bareAgain, "without its record the file is as before");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 4) return -1;
    const bool isOtherWav = std::memcmp(data, "RIFX", 4) == 0 || std::memcmp(data, "RF64", 4) == 0;
    const bool keepsMagic = std::strcmp(QVCT_FUZZ_MAGIC, "RIFF") == 0 && isOtherWav;
    Bytes bytes(data, data + size);
    if (!keepsMagic) std::memcpy(bytes.data(), QVCT_FUZZ_MAGIC, 4);
    const auto parsed = parse(bytes);
    if (parsed) checkRewrite(bytes, *parsed);
    return 0;
}

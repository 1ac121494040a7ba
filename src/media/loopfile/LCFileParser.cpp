#include "media/loopfile/LCFileParser.h"

#include "media/loopfile/RecordKeys.h"
#include "media/loopfile/containers/ChunkMeanings.h"
#include "media/loopfile/containers/Container.h"
#include "media/loopfile/containers/MusicValues.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/Text.h"

#include <cmath>
#include <optional>

namespace qvct {
namespace {

std::optional<PropertyList::Dictionary> readRecord(const Container& container) {
    const auto bytes = container.recordBytes();
    if (!bytes || bytes->empty()) return std::nullopt;
    auto value = parsePropertyList(*bytes);
    PropertyList::Dictionary* dictionary = value ? value->dictionary() : nullptr;
    return dictionary == nullptr ? std::nullopt : std::optional(std::move(*dictionary));
}

unsigned kindsOf(const Container& container, const LCFileData& data) {
    if (container.isRecordAlone()) return kLCLoopRecord;
    const bool recordIsOfLoop =
        data.record().value(QVContentKeyTavioLoopType) != nullptr && data.tavioLoopType() >= 0;
    const unsigned kinds =
        (recordIsOfLoop ? kLCLoopRecord : 0U) | (data.facts().isLoop ? kLCForeignLoop : 0U);
    return kinds != 0 ? kinds : kLCPlainAudio;
}

std::shared_ptr<LCFileData> read(ReadWindow& window, std::string_view name, unsigned allowed, Error* error) {
    const auto container = Container::open(window, name, error);
    LCAudioFacts facts;
    if (!container || !container->readFacts(facts, error)) return nullptr;
    if (const Chunk* sound = container->find(Chunk::Role::audio)) {
        facts.audioOffset = sound->contents;
        facts.audioSize = sound->size;
    }
    auto record = readRecord(*container);
    if (container->isRecordAlone() && !record) {
        fail(error, kErrorMalformed, "holds no record that can be read", {.offset = 0});
        return nullptr;
    }
    auto data = std::make_shared<LCFileData>(std::move(facts), std::move(record));
    if ((kindsOf(*container, *data) & allowed) == 0) {
        fail(error, kErrorInvalidArgument,
             data->hasLoopTypeChunks() ? "is a loop, which is not asked for"
                                       : "is no loop, and only loops are asked for");
        return nullptr;
    }
    return data;
}

std::set<std::string> wordsOfName(const std::string& path) {
    const URL url = URL::fileURLWithPath(path);
    std::set<std::string> words;
    const std::string spaced = replaceNonAlphanumerics(url.lastPathComponentWithoutExtension(), "#", " ");
    for (const std::string& word : split(spaced, " ")) {
        if (!word.empty()) words.insert(word);
    }
    return words;
}

/// Tempo counts quarter notes, beats are notes of the meter's lower number.
void derive(LCAudioFacts& facts, const LCFileData& data) {
    if (facts.sampleRate > 0) {
        facts.lengthInSeconds = static_cast<float>(static_cast<double>(facts.frameCount) / facts.sampleRate);
    }
    const double minutes =
        double{facts.lengthInSeconds > 0 ? facts.lengthInSeconds : data.lengthInSeconds()} / 60;
    if (minutes <= 0) return;
    const double beatsPerQuarter = data.signatureBottom() > 0 ? data.signatureBottom() / 4.0 : 1;
    if (data.bpm() == 0 && data.beatCount() > 0) {
        const double bpm = data.beatCount() / minutes / beatsPerQuarter;
        if (bpm <= kFastestTempo) facts.bpm = static_cast<float>(bpm);
    }
    if (data.beatCount() == 0 && data.bpm() > 0) {
        const double beats = double{data.bpm()} * minutes * beatsPerQuarter;
        constexpr double kTolerance = 0.02;  // a loop is cut to the frame, its tempo often to 2 decimals
        const bool isWhole = std::abs(beats - std::round(beats)) <= kTolerance;
        if (beats > 0.5 && beats < double{kMostBeats} && isWhole)
            facts.beatCount = static_cast<int>(std::lround(beats));
    }
}

}  // namespace

std::shared_ptr<LCFileParser> LCFileParser::fileParserForURL(const URL& url) {
    return fileParserForURL(url, false, kLCAllAudio);
}

std::shared_ptr<LCFileParser> LCFileParser::fileParserForURL(const URL& url,
                                                             bool allowKeywordExtractionFromPath,
                                                             unsigned allowedFileTypes) {
    auto parser = fileParserForReader(nullptr, url.path(), allowedFileTypes);
    parser->extractsKeywords_ = allowKeywordExtractionFromPath;
    return parser;
}

std::shared_ptr<LCFileParser> LCFileParser::fileParserForBytes(std::span<const std::uint8_t> bytes,
                                                               std::string_view name,
                                                               unsigned allowedFileTypes) {
    return fileParserForReader(std::make_shared<MemoryReader>(bytes), name, allowedFileTypes);
}

std::shared_ptr<LCFileParser> LCFileParser::fileParserForReader(
    std::shared_ptr<const RandomAccessReader> reader, std::string_view name, unsigned allowedFileTypes) {
    std::shared_ptr<LCFileParser> parser(new LCFileParser());
    parser->reader_ = std::move(reader);
    parser->name_ = name;
    parser->allowedFileTypes_ = allowedFileTypes;
    return parser;
}

std::shared_ptr<const RandomAccessReader> LCFileParser::open(Error* error) const {
    return reader_ ? reader_ : FileReader::open(name_, error);
}

std::shared_ptr<LCFileData> LCFileParser::fileData(Error* error) const {
    const auto reader = open(error);
    if (!reader) return nullptr;
    ReadWindow window(*reader);
    auto data = read(window, name_, allowedFileTypes_, error);
    if (data) {
        data->setOpenFile(reader);
    } else {
        failIn(name_, error);
    }
    return data;
}

std::shared_ptr<LCFileData> LCFileParser::enhancedFileData(Error* error) const {
    const auto data = fileData(error);
    if (!data) return nullptr;
    LCAudioFacts facts = data->facts();
    derive(facts, *data);
    if (extractsKeywords_ && data->descriptors().empty()) facts.descriptors = wordsOfName(name_);
    return data->withFacts(std::move(facts));
}

std::vector<LCChunk> LCFileParser::chunks(Error* error) const {
    const auto reader = open(error);
    if (!reader) return {};
    ReadWindow window(*reader);
    const auto container = Container::open(window, name_, error);
    if (container) return describeChunks(*container);
    failIn(name_, error);
    return {};
}

}  // namespace qvct

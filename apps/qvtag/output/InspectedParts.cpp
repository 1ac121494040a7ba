#include "output/InspectedParts.h"

#include "formats/QVContentEditorFileUtilities.h"
#include "formats/QVContentTaggingTypes.h"
#include "formats/bundle/TGRTBundleMetaDataReader.h"
#include "formats/preset/PresetText.h"
#include "formats/settings/TGRTBinaryFileMetaDataReader.h"
#include "formats/settings/TGRTCstSxvPstMetaDataReader.h"
#include "formats/settings/TGRTSettingsHeaderReader.h"
#include "media/loopfile/LCFileParser.h"
#include "media/midi/MidiSequence.h"
#include "output/PropertyListOutput.h"
#include "platform/base/bytes/ByteOrder.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/FileAccess.h"
#include "platform/files/reading/RandomAccessReader.h"
#include "platform/text/Text.h"

#include <array>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

using Parts = std::vector<InspectedPart>;

/// Most entries of a property list that are shown: until it is printed, each takes a kilobyte of memory.
constexpr std::size_t kMostEntries = 10'000;

/// Shows `left` entries at most, and counts them down.
InspectedPart entryPart(std::string id, const PropertyList& value, std::size_t& left) {
    InspectedPart part{std::move(id), {}, {}, textOfPropertyList(value), {}, {}};
    std::size_t count = 0;
    const auto add = [&](std::string key, const PropertyList& entry) {
        ++count;
        if (left == 0) return;
        --left;
        part.children.push_back(entryPart(std::move(key), entry, left));
    };
    if (const auto* dictionary = value.dictionary()) {
        for (const auto& entry : *dictionary) add(entry.key, entry.value);
    }
    if (const auto* array = value.array()) {
        for (const PropertyList& item : *array) add(fmt::format("[{}]", count), item);
    }
    const std::size_t hidden = count - part.children.size();
    if (hidden > 0)
        part.children.push_back({"...", {}, {}, fmt::format("{} more that are not shown", hidden), {}, {}});
    return part;
}

InspectedPart entryPart(std::string id, const PropertyList& value) {
    std::size_t left = kMostEntries;
    return entryPart(std::move(id), value, left);
}

InspectedPart chunkPart(const LCChunk& chunk) {
    InspectedPart part{chunk.id, chunk.offset, chunk.size, chunk.meaning, chunk.fault, {}};
    for (const LCChunk& child : chunk.children) part.children.push_back(chunkPart(child));
    return part;
}

Parts audioParts(const URL& url, Error* error) {
    Parts parts;
    const auto file = FileReader::open(url.path(), error);
    if (!file) return parts;
    const auto parser = LCFileParser::fileParserForReader(file, url.path());
    for (const LCChunk& chunk : parser->chunks(error)) parts.push_back(chunkPart(chunk));
    const auto fileData = parser->fileData();
    if (fileData && !fileData->record().empty())
        parts.push_back(entryPart("record", PropertyList(fileData->record())));
    return parts;
}

/// A property list in a file of its own.
void addStoredList(const URL& list, Parts& parts) {
    if (!fileExists(list.path())) return;
    Error error;
    const auto value = readPropertyListFile(list.path(), &error);
    InspectedPart part = value ? entryPart(list.lastPathComponent(), *value)
                               : InspectedPart{list.lastPathComponent(), {}, {}, {}, error.message(), {}};
    part.meaning = value ? "record, " + part.meaning : "record";
    parts.push_back(std::move(part));
}

void addCompanions(const URL& url, Parts& parts) {
    const std::array<std::pair<const char*, std::optional<URL>>, 2> companions = {
        {{"XML description", QVContentEditorFileUtilities::intermediateCacheURLForURL(url)},
         {"recorded preview", QVContentEditorFileUtilities::prelistenURLForURL(url)}}};
    for (const auto& [meaning, companion] : companions) {
        if (companion && *companion != url)
            parts.push_back({companion->lastPathComponent(), {}, {}, meaning, {}, {}});
    }
}

Parts settingsParts(const URL& url, Error* error) {
    constexpr std::size_t length = TGRTSettingsHeaderReader::kHeaderLength;
    Parts parts;
    const auto info = TGRTSettingsHeaderReader::settingInfoForURL(url, error);
    if (!info) return parts;
    const auto code = [](std::uint32_t value) {
        return fmt::format("\"{}\" 0x{:08X}", printable(fourCharacters(value)), value);
    };
    InspectedPart header{"header", 0, length, "which plug-in the settings are of", {}, {}};
    header.children = {
        {"sub ID", 7, 1, fmt::format("{}", static_cast<std::int32_t>(info->plugInSubID())), {}, {}},
        {"manufacturer", 12, 4, code(info->manuID()), {}, {}},
        {"product", 16, 4, code(info->productID()), {}, {}},
        {"plug-in", 20, 4, code(info->plugInID()), {}, {}}};
    parts.push_back(std::move(header));
    addStoredList(TGRTCstSxvPstMetaDataReader::sideCarURLForURL(url), parts);
    addCompanions(url, parts);
    return parts;
}

template <typename Reader>
Parts bundleParts(const URL& url, Error* error) {
    Parts parts;
    if (!isDirectory(url.path())) {
        fail(error, kErrorUnreadable, "is no bundle", {url.path()});
        return parts;
    }
    const auto reader = Reader::initWithTaxonomy(TGRTTaxonomy::init());
    addStoredList(url.URLByAppendingPathComponent(reader->plistPathComponent()), parts);
    addCompanions(url, parts);
    return parts;
}

Parts presetParts(const URL& url, Error* error) {
    Parts parts;
    const auto bytes = readFile(url.path(), error);
    if (!bytes) return parts;
    const auto preset = PresetText::parse(std::string(bytes->begin(), bytes->end()), error);
    if (!preset) {
        failIn(url.path(), error);
        return parts;
    }
    for (const PresetText::Section& section : preset->sections()) {
        InspectedPart part{"<" + section.name + ">",
                           section.offset,
                           section.size,
                           "section, " + counted(section.items.size(), "item"),
                           section.isClosed ? "" : "does not end",
                           {}};
        for (const auto& [key, value] : section.items) part.children.push_back({key, {}, {}, value, {}, {}});
        parts.push_back(std::move(part));
    }
    addCompanions(url, parts);
    return parts;
}

Parts dataParts(const URL& url, Error* error) {
    Parts parts;
    const auto bytes = readFile(url.path(), error);
    if (!bytes) return parts;
    const auto found = findEmbeddedPropertyList(*bytes, error);
    if (!found) {
        failIn(url.path(), error);
        return parts;
    }
    InspectedPart part = entryPart("bplist00", found->value);
    part.offset = found->offset;
    part.size = found->length;
    part.meaning = "embedded property list, " + part.meaning;
    parts.push_back(std::move(part));
    return parts;
}

Parts midiParts(const URL& url, Error* error) {
    const auto sequence = MidiSequence::read(url.path(), error);
    if (!sequence) return {};
    InspectedPart file{"MIDI", {}, {}, fmt::format("standard MIDI file, format {}", sequence->format()),
                       {},     {}};
    for (const MidiTrack& track : sequence->tracks()) {
        file.children.push_back({fmt::format("track {}", file.children.size() + 1),
                                 {},
                                 {},
                                 fmt::format("{} notes, {:g} beats", track.notes.size(), track.length),
                                 {},
                                 {}});
    }
    for (const Error& problem : sequence->problems())
        file.children.push_back({"", {}, {}, "", problem.message(), {}});
    return {std::move(file)};
}

}  // namespace

std::vector<InspectedPart> partsOfItem(const URL& url, Error* error) {
    switch (QVContentTaggingTypes::fallBackFileTypeForURL(url)) {
        case kFileTypePatch:
            return bundleParts<TGRTBundleMetaDataReader>(url, error);
        case kFileTypeProject:
            return bundleParts<TGRTOstraProjectMetaDataReader>(url, error);
        case kFileTypeSynthPreset:
            return presetParts(url, error);
        case kFileTypeSamplerSettings:
        case kFileTypePlugInSettings:
        case kFileTypeChannelStrip:
            return settingsParts(url, error);
        default:
            if (TGRTBinaryFileMetaDataReader::supportsFileExtension(url.pathExtension()))
                return dataParts(url, error);
            return MidiSequence::supportsFileExtension(url.pathExtension()) ? midiParts(url, error)
                                                                            : audioParts(url, error);
    }
}

}  // namespace qvct::tool

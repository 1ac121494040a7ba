#include "formats/settings/TGRTBinaryFileMetaDataReader.h"

#include "formats/ItemFile.h"
#include "formats/settings/CFBinaryPlistFindTrailer.h"
#include "platform/base/Log.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/FileAccess.h"
#include "platform/processes/ProcessArguments.h"

#include <algorithm>
#include <array>

namespace qvct {

std::optional<EmbeddedPropertyList> findEmbeddedPropertyList(std::span<const std::uint8_t> bytes,
                                                             Error* error) {
    constexpr std::string_view magic = "bplist00";
    const auto start = std::search(bytes.begin(), bytes.end(), magic.begin(), magic.end());
    if (start == bytes.end()) {
        fail(error, kErrorNoPropertyList, "no embedded property list");
        return std::nullopt;
    }
    EmbeddedPropertyList found{static_cast<std::uint64_t>(start - bytes.begin()), 0, false};
    const auto rest = bytes.subspan(found.offset);
    std::uint64_t trailer = 0;
    if (!CFBinaryPlistFindTrailer(rest.data(), rest.size(), &trailer)) {
        fail(error, kErrorNoPropertyList, "has no end",
             {.part = "embedded property list", .offset = found.offset});
        return std::nullopt;
    }
    found.length = trailer + kBinaryPlistTrailerLength;
    Error reason;
    auto value = parsePropertyList(rest.first(found.length), &reason);
    if (!value) {
        fail(error, kErrorNoPropertyList, reason.reason,
             {.part = "embedded " + reason.part, .offset = found.offset + reason.offset.value_or(0)});
        return std::nullopt;
    }
    found.value = std::move(*value);
    return found;
}

bool TGRTBinaryFileMetaDataReader::supportsFileExtension(std::string_view extension) {
    constexpr std::array<std::string_view, 1> extensions = {"data"};
    return isExtensionIn(extension, extensions);
}

std::shared_ptr<TGRTMetaData> TGRTBinaryFileMetaDataReader::readMetaDataFromURL(const URL& url,
                                                                                std::uint64_t options,
                                                                                Error* error) const {
    ItemFile file(url);
    return readMetaDataFromFile(file, options, error);
}

std::shared_ptr<TGRTMetaData> TGRTBinaryFileMetaDataReader::readMetaDataFromFile(ItemFile& file,
                                                                                 std::uint64_t /*options*/,
                                                                                 Error* error) const {
    const auto extracted = _extractDictionaryFromFile(file, error);
    const PropertyList::Dictionary dictionary = extracted.value_or(PropertyList::Dictionary{});
    auto record = TGRTMetaData::init();
    record->setTaggings(TGRTMetaData::taggingsFromDictionary(dictionary, *taxonomy()));
    record->setRejectedLabels(TGRTMetaData::rejectedLabelsFromDictionary(dictionary));
    if (dictionary.value(QVContentTaggingTypeKeyName) != nullptr)
        record->setFileType(dictionary.integerValue(QVContentTaggingTypeKeyName).value_or(kFileTypeNone));
    if (const auto* name = dictionary.string(QVContentTaggingDisplayKeyName)) record->setDisplayName(*name);
    if (dictionary.value(QVContentInfoKey) != nullptr) {
        record->setContentInfo(TGRTMetaData::contentInfoFromDictionary(dictionary));
    }
    return record;
}

std::optional<PropertyList::Dictionary> TGRTBinaryFileMetaDataReader::_extractDictionaryFromURL(
    const URL& url, Error* error) const {
    ItemFile file(url);
    return _extractDictionaryFromFile(file, error);
}

std::optional<PropertyList::Dictionary> TGRTBinaryFileMetaDataReader::_extractDictionaryFromFile(
    ItemFile& file, Error* error) const {
    const URL& url = file.url();
    Error reason;
    std::optional<EmbeddedPropertyList> found;
    if (const auto bytes = file.bytes(kLargestWholeFile, &reason))
        found = findEmbeddedPropertyList(*bytes, &reason);
    if (found && found->value.dictionary() != nullptr) return std::move(*found->value.dictionary());
    if (found)
        fail(&reason, kErrorNoPropertyList, "is no dictionary",
             {.part = "embedded property list", .offset = found->offset});

    reason.code = kErrorNoPropertyList;
    failIn(url.path(), &reason);
    if (!processHasArgument("-XCTest")) log("Indexing " + reason.message());
    if (error != nullptr) *error = std::move(reason);
    return std::nullopt;
}

}  // namespace qvct

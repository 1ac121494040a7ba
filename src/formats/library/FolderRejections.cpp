#include "formats/library/FolderRejections.h"

#include "formats/StoredRecord.h"
#include "metadata/StoredParts.h"
#include "platform/base/Log.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/FileAccess.h"
#include "platform/files/Paths.h"
#include "taxonomy/TaggingTypes.h"

#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

/// A thousand times what a person says of a folder.
constexpr std::uint64_t kLargestFolderRecord = 1ULL << 20U;

std::optional<PropertyList> readFolderRecord(const std::string& path, Error* error) {
    const auto bytes = readFile(path, error, kLargestFolderRecord);
    auto value = bytes ? parsePropertyList(*bytes, error) : std::nullopt;
    if (bytes && !value) failIn(path, error);
    return value;
}

}  // namespace

std::string folderRecordPath(std::string_view folder) {
    return pathIn(folder, kFolderRecordName);
}

std::optional<std::set<std::string>> rejectedLabelsOfFolder(std::string_view folder, Error* error) {
    const std::string path = folderRecordPath(folder);
    if (!fileExists(path)) return std::set<std::string>{};
    const auto record = readFolderRecord(path, error);
    if (!record) return std::nullopt;
    const PropertyList::Dictionary* dictionary = record->dictionary();
    const PropertyList* labels =
        dictionary == nullptr ? nullptr : dictionary->value(QVContentTaggingRejectedKeyName);
    if (dictionary != nullptr && (labels == nullptr || labels->array() != nullptr))
        return rejectedLabels(labels);
    const std::string reason =
        dictionary == nullptr ? "is no dictionary"
                              : fmt::format("\"{}\" is no array of labels", QVContentTaggingRejectedKeyName);
    fail(error, kErrorMalformed, reason, {path});
    return std::nullopt;
}

bool setRejectedLabelsOfFolder(const std::set<std::string>& labels, std::string_view folder, Error* error,
                               const ContentWriteOptions& options) {
    if (!rejectedLabelsOfFolder(folder, error)) return false;
    const std::string path = folderRecordPath(folder);
    const auto change = [&labels](PropertyList::Dictionary& stored) { storeRejections(stored, labels); };
    return changeStoredDictionary(URL::fileURLWithPath(path), path, change, error, options);
}

std::shared_ptr<const FolderRejections::Labels> FolderRejections::ofFolder(std::string_view folder) {
    const auto known = known_.find(folder);
    if (known != known_.end()) return known->second;
    constexpr std::size_t enough = 100'000;  // folders to remember
    if (known_.size() >= enough) known_.clear();
    Error error;
    auto labels = rejectedLabelsOfFolder(folder, &error);
    if (!labels) log(error.message() + "; what it rejects does not count");
    auto& kept = known_[std::string(folder)];
    if (labels && !labels->empty()) kept = std::make_shared<const Labels>(std::move(*labels));
    return kept;
}

}  // namespace qvct

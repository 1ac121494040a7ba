#include "formats/StoredRecord.h"

#include "metadata/StoredParts.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/EditLock.h"
#include "platform/files/FileAccess.h"
#include "platform/files/replacement/FileReplacement.h"
#include "taxonomy/TaggingTypes.h"

#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

std::optional<PropertyList::Dictionary> parseStoredDictionary(const std::string& bytes, Error* error) {
    if (bytes.empty()) return PropertyList::Dictionary{};
    Error reason;
    auto value = parsePropertyList(bytes, &reason, PropertyListUse::rewriting);
    if (value && value->dictionary() != nullptr) return std::move(*value->dictionary());
    const std::string why = value ? "no dictionary" : reason.reason;
    fail(error, kErrorMalformed,
         fmt::format("not overwritten: its present contents cannot be read ({})", why), std::move(reason));
    return std::nullopt;
}

}  // namespace

bool changeStoredFile(
    const URL& item, const std::string& path,
    const std::function<std::optional<std::string>(const std::string& stored, Error* error)>& change,
    Error* error, const ContentWriteOptions& options) {
    const auto turn = EditLock::acquire(item.path(), error);
    if (!turn) return false;
    const FileStamp stamp = FileStamp::ofFile(path);
    const bool isThere = stamp != FileStamp{};
    std::string stored;
    FileReplacementOptions how;
    how.keepsTimes = options.keepsTimes;
    how.isDryRun = options.isDryRun;
    how.makesFolders = path.starts_with(item.path() + "/");  // they are the item's own
    how.expected = options.expected.value_or(stamp);
    if (isThere) {
        const auto bytes = readFile(path, error);
        if (!bytes) return false;
        stored.assign(bytes->begin(), bytes->end());
    }
    auto changed = change(stored, error);
    if (!changed) return failIn(path, error);
    if (isThere && *changed == stored) return true;
    const FilePiece whole{.bytes = std::move(*changed)};
    return replaceFileByPieces(path, {&whole, 1}, how, error);
}

bool changeStoredDictionary(const URL& item, const std::string& path,
                            const std::function<void(PropertyList::Dictionary&)>& change, Error* error,
                            const ContentWriteOptions& options) {
    const auto changeBytes = [&change](const std::string& stored,
                                       Error* reason) -> std::optional<std::string> {
        auto dictionary = parseStoredDictionary(stored, reason);
        if (!dictionary) return std::nullopt;
        change(*dictionary);
        const bool isBinary = stored.starts_with("bplist");
        std::string bytes = serializePropertyList(
            std::move(*dictionary), isBinary ? PropertyListFormat::binary : PropertyListFormat::xml, reason);
        if (bytes.empty()) return std::nullopt;
        return bytes;
    };
    return changeStoredFile(item, path, changeBytes, error, options);
}

bool changeStoredContentInfo(const URL& item, const std::string& path,
                             const std::shared_ptr<const TGRTContentInfo>& contentInfo, Error* error,
                             const ContentWriteOptions& options) {
    const auto change = [&contentInfo](PropertyList::Dictionary& stored) {
        const PropertyList* value = std::as_const(stored).value(QVContentInfoKey);
        stored.set(QVContentInfoKey,
                   storedContentInfo(value, contentInfo ? *contentInfo : *TGRTContentInfo::init()));
    };
    return changeStoredDictionary(item, path, change, error, options);
}

bool failForMissingRecord(const std::string& path, Error* error) {
    return fail(error, kErrorInvalidArgument, "there is no record to write", {path});
}

}  // namespace qvct

#pragma once

#include "formats/ContentWriters.h"
#include "platform/base/Error.h"
#include "platform/data/PropertyList.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>

namespace qvct {

// How records that lie in files of their own, or in text, are changed: read, changed in memory, replaced
// whole. A file that somebody else changes meanwhile is an error and stays as it is; nothing is written when
// nothing changes.

// Each holds the item's turn (`EditLock`) from the read to the write.

/// `change` turns the old bytes (none for a file that is not there) into the new ones, or fills the error.
bool changeStoredFile(
    const URL& item, const std::string& path,
    const std::function<std::optional<std::string>(const std::string& stored, Error* error)>& change,
    Error* error, const ContentWriteOptions& options);

/// The same for a property list. Entries that `change` leaves alone stay, in their order. A new file, or one
/// that was text in any form, is written as XML; a binary one stays binary. A file that cannot be read as a
/// dictionary is never written over.
bool changeStoredDictionary(const URL& item, const std::string& path,
                            const std::function<void(PropertyList::Dictionary&)>& change, Error* error,
                            const ContentWriteOptions& options);

/// The same for its content info; null counts as an empty one.
bool changeStoredContentInfo(const URL& item, const std::string& path,
                             const std::shared_ptr<const TGRTContentInfo>& contentInfo, Error* error,
                             const ContentWriteOptions& options);

/// Fails because the caller handed in no record; names the path.
bool failForMissingRecord(const std::string& path, Error* error);

}  // namespace qvct

#pragma once

#include "metadata/TGRTContentInfo.h"
#include "metadata/TGRTMetaData.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/base/ObjectSet.h"
#include "platform/files/FileStamp.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTagging.h"

#include <memory>
#include <optional>

namespace qvct {

/// How a record is written.
struct ContentWriteOptions {
    bool keepsTimes = false;  ///< The rewritten file keeps its times of access and change.
    /// Audio files: the new file is compared with the old one before it takes its place, and abandoned when
    /// more than our record differs.
    bool verifies = false;
    /// All checks of a write are made, but nothing is written; the result says whether it would be.
    bool isDryRun = false;
    /// The state that the file with the record (`recordURL`) had when the caller decided what to write. If it
    /// has changed since, the write fails and what another program saved stays. Without it, the state at the
    /// beginning of the call counts.
    std::optional<FileStamp> expected = std::nullopt;
};

// The writers of an item's parts. Each returns whether the file now holds what was to be written; if not, the
// error gives path and reason. Files are replaced whole (see `replaceFileByPieces`), so that on failure the
// old one stands untouched. What cannot be read is never written over. Writers have no state.

/// Writes an item's taggings and leaves the rest of its record alone.
class QVCT_API TGRTTaggingsWriter {
  public:
    virtual ~TGRTTaggingsWriter() = default;
    /// Replaces the stored taggings. The stored UUID is removed: the content is to be identified anew.
    virtual bool writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url, Error* error = nullptr,
                               const ContentWriteOptions& options = {}) const = 0;
};

/// Writes an item's content info and leaves the rest of its record alone.
class QVCT_API TGRTContentInfoWriter {
  public:
    virtual ~TGRTContentInfoWriter() = default;
    /// Replaces the stored content info; null counts as an empty one.
    virtual bool writeContentInfo(const std::shared_ptr<const TGRTContentInfo>& contentInfo, const URL& url,
                                  Error* error = nullptr, const ContentWriteOptions& options = {}) const = 0;
};

/// Writes an item's whole record.
class QVCT_API TGRTMetaDataWriter {
  public:
    virtual ~TGRTMetaDataWriter() = default;
    /// Stores the record. Bundles, settings and presets give a record without file type that of their kind.
    virtual bool writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url,
                               Error* error = nullptr, const ContentWriteOptions& options = {}) const = 0;
};

}  // namespace qvct

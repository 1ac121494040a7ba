#pragma once

#include "formats/ContentWriters.h"
#include "formats/TGRTMetaDataReader.h"
#include "platform/base/Export.h"
#include "platform/text/Url.h"

#include <memory>
#include <optional>

namespace qvct {

/// What a host can do with an item; a bit set.
enum ItemActions : unsigned {
    kItemLoadableOnTrack = 1,
    kItemLoadableInPlugIn = 2,
    kItemCanPrelisten = 4,
    kItemInsertableOnTrack = 8
};

/// Decides whether what lies at a URL is content of its kind, and hands out the reader and writers for it;
/// null for anything else.
class QVCT_API TGRTContentNodeTypeValidator {
  public:
    virtual ~TGRTContentNodeTypeValidator() = default;

    /// Whether what lies at the URL is content of this kind. Looks at the disk.
    virtual bool isValidContentTypeAtFileURL(const URL& url) const = 0;
    /// ItemActions.
    virtual unsigned itemActionsForFileURL(const URL& url) const = 0;
    /// The audio file to play for the item.
    virtual std::optional<URL> prelistenURLForFileURL(const URL& url) const = 0;

    /// @{
    /// A new reader or writer for the item, or null for what is not content of this kind.
    virtual std::shared_ptr<TGRTMetaDataReader> metaDataReaderForFileURL(const URL& url) const = 0;
    virtual std::shared_ptr<TGRTTaggingsReader> taggingReaderForFileURL(const URL& url) const = 0;
    virtual std::shared_ptr<TGRTTaggingsWriter> taggingWriterForFileURL(const URL& url) const = 0;
    virtual std::shared_ptr<TGRTContentInfoWriter> contentInfoWriterForFileURL(const URL& url) const = 0;
    virtual std::shared_ptr<TGRTMetaDataWriter> metaDataWriterForFileURL(const URL& url) const = 0;
    /// @}
};

}  // namespace qvct

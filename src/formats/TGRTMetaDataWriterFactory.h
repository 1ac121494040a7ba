#pragma once

#include "formats/ContentWriters.h"
#include "platform/base/Export.h"
#include "platform/text/Url.h"

#include <memory>

namespace qvct {

/// Picks the writer for a URL as its file node does; null where there is none.
class QVCT_API TGRTMetaDataWriterFactory {
  public:
    /// @{
    /// The writer of that part of what lies at the URL.
    static std::shared_ptr<TGRTTaggingsWriter> taggingWriterForURL(const URL& url);
    static std::shared_ptr<TGRTContentInfoWriter> contentInfoWriterForURL(const URL& url);
    static std::shared_ptr<TGRTMetaDataWriter> metaDataWriterForURL(const URL& url);
    /// @}
};

}  // namespace qvct

#pragma once

#include "formats/TGRTBaseMetaDataReader.h"
#include "platform/base/Export.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>

namespace qvct {

/// Picks the reader for a URL by its extension alone, whatever its case. The file is not opened.
class QVCT_API TGRTMetaDataReaderFactory {
  public:
    /// Null for an extension that no content has, and without a taxonomy.
    static std::shared_ptr<TGRTBaseMetaDataReader> metaDataReaderForURL(
        const URL& url, const std::shared_ptr<TGRTTaxonomy>& taxonomy);
    /// With the shared writable default taxonomy.
    static std::shared_ptr<TGRTBaseMetaDataReader> metaDataReaderForURL(const URL& url);
};

}  // namespace qvct

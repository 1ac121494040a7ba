#pragma once

#include "formats/ContentWriters.h"

namespace qvct {

/// Writes all parts of a preset's record into its text; whatever else stands there comes out byte for byte.
/// The line of old codes stays, too. A preset that is not there, is not UTF-8 or has a section that does not
/// end is refused.
class TGRTVorthalPresetMetaDataWriter : public TGRTTaggingsWriter,
                                        public TGRTContentInfoWriter,
                                        public TGRTMetaDataWriter {
  public:
    bool writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url, Error* error = nullptr,
                       const ContentWriteOptions& options = {}) const override;
    bool writeContentInfo(const std::shared_ptr<const TGRTContentInfo>& contentInfo, const URL& url,
                          Error* error = nullptr, const ContentWriteOptions& options = {}) const override;
    /// Where the record has no content info or sub type, the stored one stays.
    bool writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url, Error* error = nullptr,
                       const ContentWriteOptions& options = {}) const override;
};

}  // namespace qvct

#pragma once

#include "formats/ContentWriters.h"

namespace qvct {

// Writers of settings files. The URL is the settings file, which is not touched; what is written is the
// property list beside it. Its entries that a writer does not write stay. No folder is made.

/// Also stores the file type of the extension; never a sub type.
class TGRTCstSxvPstTaggingWriter : public TGRTTaggingsWriter {
  public:
    bool writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url, Error* error = nullptr,
                       const ContentWriteOptions& options = {}) const override;
};

class TGRTCstSxvPstContentInfoWriter : public TGRTContentInfoWriter {
  public:
    bool writeContentInfo(const std::shared_ptr<const TGRTContentInfo>& contentInfo, const URL& url,
                          Error* error = nullptr, const ContentWriteOptions& options = {}) const override;
};

class TGRTCstSxvPstMetaDataWriter : public TGRTMetaDataWriter {
  public:
    bool writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url, Error* error = nullptr,
                       const ContentWriteOptions& options = {}) const override;
};

}  // namespace qvct

#pragma once

#include "formats/ContentWriters.h"

namespace qvct {

// Writers of loops and audio files. Only the record is touched (see `LCFileWriter`).
//
// A loop writer differs from its base in `isLoopType` alone: it keeps the file's loop type. The base clears
// it on purpose, since it is used only for files that are no loops.

class TGRTAudioFileTaggingWriter : public TGRTTaggingsWriter {
  public:
    virtual bool isLoopType() const { return false; }
    bool writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url, Error* error = nullptr,
                       const ContentWriteOptions& options = {}) const override;
};

class TGRTAudioFileContentInfoWriter : public TGRTContentInfoWriter {
  public:
    virtual bool isLoopType() const { return false; }
    bool writeContentInfo(const std::shared_ptr<const TGRTContentInfo>& contentInfo, const URL& url,
                          Error* error = nullptr, const ContentWriteOptions& options = {}) const override;
};

/// Writes taggings, content info, display name and rejected labels. Key values, file type and UUID are not
/// written: what the file says about the music stays.
class TGRTAudioFileMetaDataWriter : public TGRTMetaDataWriter {
  public:
    virtual bool isLoopType() const { return false; }
    bool writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url, Error* error = nullptr,
                       const ContentWriteOptions& options = {}) const override;
};

class TGRTTavioLoopTaggingWriter : public TGRTAudioFileTaggingWriter {
  public:
    bool isLoopType() const override { return true; }
};

class TGRTTavioLoopContentInfoWriter : public TGRTAudioFileContentInfoWriter {
  public:
    bool isLoopType() const override { return true; }
};

class TGRTTavioLoopMetaDataWriter : public TGRTAudioFileMetaDataWriter {
  public:
    bool isLoopType() const override { return true; }
};

}  // namespace qvct

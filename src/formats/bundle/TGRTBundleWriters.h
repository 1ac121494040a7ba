#pragma once

#include "formats/ContentWriters.h"
#include "formats/bundle/BundleRecord.h"

#include <cstdint>
#include <string>

namespace qvct {

// Writers of patch and project bundles. The URL is the bundle; what is written is the property list inside
// it. Folders on the way to it are made.

/// Keeps the entries of the property list that it does not write.
class TGRTBundleTaggingWriter : public TGRTTaggingsWriter {
  public:
    virtual std::string plistPathComponent() const { return std::string(QVContentTaggingTagsPlistName); }
    virtual std::int64_t defaultFileType() const { return kFileTypeNone; }
    /// See `TGRTBundleMetaDataReader`.
    std::int64_t subTypeFromTaggings(const ObjectSet<TGRTTagging>& taggings) const;

    /// Also stores the writer's file type and the sub type that the taggings imply, or none.
    bool writeTaggings(const ObjectSet<TGRTTagging>& taggings, const URL& url, Error* error = nullptr,
                       const ContentWriteOptions& options = {}) const override;
};

/// Keeps the entries of the property list that it does not write.
class TGRTBundleContentInfoWriter : public TGRTContentInfoWriter {
  public:
    virtual std::string plistPathComponent() const { return std::string(QVContentTaggingTagsPlistName); }
    bool writeContentInfo(const std::shared_ptr<const TGRTContentInfo>& contentInfo, const URL& url,
                          Error* error = nullptr, const ContentWriteOptions& options = {}) const override;
};

/// Replaces the record in the property list. Other entries are removed, unless their key was in the list that
/// the record was read from.
class TGRTBundleMetaDataWriter : public TGRTMetaDataWriter {
  public:
    virtual std::string plistPathComponent() const { return std::string(QVContentTaggingTagsPlistName); }
    virtual std::int64_t defaultFileType() const { return kFileTypeNone; }
    bool writeMetaData(const std::shared_ptr<TGRTMetaData>& metaData, const URL& url, Error* error = nullptr,
                       const ContentWriteOptions& options = {}) const override;
};

class TGRTPatchTaggingWriter : public TGRTBundleTaggingWriter {
  public:
    std::int64_t defaultFileType() const override { return kFileTypePatch; }
};

class TGRTPatchContentInfoWriter : public TGRTBundleContentInfoWriter {};

class TGRTPatchMetaDataWriter : public TGRTBundleMetaDataWriter {
  public:
    std::int64_t defaultFileType() const override { return kFileTypePatch; }
};

class TGRTOstraProjectTaggingWriter : public TGRTBundleTaggingWriter {
  public:
    std::string plistPathComponent() const override { return projectPlistPathComponent(); }
    std::int64_t defaultFileType() const override { return kFileTypeProject; }
};

class TGRTOstraProjectContentInfoWriter : public TGRTBundleContentInfoWriter {
  public:
    std::string plistPathComponent() const override { return projectPlistPathComponent(); }
};

class TGRTOstraProjectMetaDataWriter : public TGRTBundleMetaDataWriter {
  public:
    std::string plistPathComponent() const override { return projectPlistPathComponent(); }
    std::int64_t defaultFileType() const override { return kFileTypeProject; }
};

}  // namespace qvct

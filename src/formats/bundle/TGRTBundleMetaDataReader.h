#pragma once

#include "formats/TGRTBaseMetaDataReader.h"

#include <memory>
#include <string>
#include <string_view>
#include <utility>

namespace qvct {

/// Reads the property list inside a bundle that holds its record.
class TGRTBundleMetaDataReader : public TGRTBaseMetaDataReader {
  public:
    static std::shared_ptr<TGRTBundleMetaDataReader> initWithTaxonomy(
        std::shared_ptr<TGRTTaxonomy> taxonomy) {
        return std::shared_ptr<TGRTBundleMetaDataReader>(new TGRTBundleMetaDataReader(std::move(taxonomy)));
    }
    /// None: a bundle of no kind has no extension.
    static bool supportsFileExtension(std::string_view /*extension*/) { return false; }

    /// A stored file type is kept, none becomes `defaultFileType`.
    std::shared_ptr<TGRTMetaData> readMetaDataFromURL(const URL& url, std::uint64_t options,
                                                      Error* error = nullptr) const override;
    /// Where the property list lies in the bundle.
    virtual std::string plistPathComponent() const { return std::string(QVContentTaggingTagsPlistName); }
    URL recordURLForURL(const URL& url) const override {
        return url.URLByAppendingPathComponent(plistPathComponent());
    }
    std::int64_t defaultFileType() const override { return kFileTypePatch; }

    /// The sub type that tags of the content type imply: of patches 1 instrument, 2 audio, 3 auxiliary,
    /// 4 output; of projects 1 demo song, 2 grid of live loops, 3 remix session; else 0. The numbers overlap:
    /// the file type tells them apart.
    static std::int64_t subTypeFromTaggings(const ObjectSet<TGRTTagging>& taggings);

  protected:
    using TGRTBaseMetaDataReader::TGRTBaseMetaDataReader;
};

class TGRTOstraProjectMetaDataReader : public TGRTBundleMetaDataReader {
  public:
    static std::shared_ptr<TGRTOstraProjectMetaDataReader> initWithTaxonomy(
        std::shared_ptr<TGRTTaxonomy> taxonomy) {
        return std::shared_ptr<TGRTOstraProjectMetaDataReader>(
            new TGRTOstraProjectMetaDataReader(std::move(taxonomy)));
    }
    static bool supportsFileExtension(std::string_view extension);

    std::string plistPathComponent() const override;
    std::int64_t defaultFileType() const override { return kFileTypeProject; }

  protected:
    using TGRTBundleMetaDataReader::TGRTBundleMetaDataReader;
};

}  // namespace qvct

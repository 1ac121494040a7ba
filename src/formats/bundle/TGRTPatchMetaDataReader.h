#pragma once

#include "formats/bundle/TGRTBundleMetaDataReader.h"

#include <memory>
#include <string_view>
#include <utility>

namespace qvct {

/// Reads the record of a patch bundle. A patch is a patch, whatever file type it stores; a sub type that it
/// does not store follows from its tags.
class TGRTPatchMetaDataReader : public TGRTBundleMetaDataReader {
  public:
    static std::shared_ptr<TGRTPatchMetaDataReader> initWithTaxonomy(std::shared_ptr<TGRTTaxonomy> taxonomy) {
        return std::shared_ptr<TGRTPatchMetaDataReader>(new TGRTPatchMetaDataReader(std::move(taxonomy)));
    }
    static bool supportsFileExtension(std::string_view extension);

    /// With kReadUntaggedPatch never null, not even for what is no bundle.
    std::shared_ptr<TGRTMetaData> readMetaDataFromURL(const URL& url, std::uint64_t options,
                                                      Error* error = nullptr) const override;

    /// As `subTypeFromTaggings`, without those of projects.
    static std::int64_t patchSubTypeFromTaggings(const ObjectSet<TGRTTagging>& taggings);
    /// A tagging without level of category "Plugins" for each plug-in that the patch's XML description names
    /// and does not bypass. The tags join the shared writable default taxonomy. None when there is no
    /// description or it cannot be read.
    static ObjectSet<TGRTTagging> pluginTaggingsForURL(const URL& url);

  protected:
    using TGRTBundleMetaDataReader::TGRTBundleMetaDataReader;
};

}  // namespace qvct

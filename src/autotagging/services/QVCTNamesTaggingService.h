#pragma once

#include "autotagging/names/NameReader.h"
#include "autotagging/services/QVCTAutoTaggingService.h"

#include <memory>

namespace qvct {

/// Tags from the name of an item and of the folders that it lies in, read as people write them:
/// "BD0010", "Kick_01", "VEH_Deep_House_Synth_Loop_124_Am".
///
/// Use from one thread at a time. Malformed bytes separate words.
class QVCTNamesTaggingService : public QVCTAutoTaggingService {
  public:
    /// With the built-in habits and weights, or those that a resource folder has.
    static std::shared_ptr<QVCTNamesTaggingService> init();
    static std::shared_ptr<QVCTNamesTaggingService> initWithReader(NameReader reader);

    TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                           const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                           const std::shared_ptr<TGRTMetaData>& metaData,
                                           const std::shared_ptr<LCFileData>& fileData,
                                           std::uint64_t options) override;
    std::vector<TagClaim> claims(const TaggedItem& item, std::uint64_t options) override;
    std::string_view name() const override { return "names"; }

  private:
    explicit QVCTNamesTaggingService(NameReader reader) : reader_(std::move(reader)) {}

    NameReader reader_;
};

}  // namespace qvct

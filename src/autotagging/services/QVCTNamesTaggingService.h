#pragma once

#include "autotagging/names/NameReader.h"
#include "autotagging/services/QVCTAutoTaggingService.h"

#include <memory>
#include <optional>

namespace qvct {

/// Tags from the name of an item and of the folders that it lies in, read as people write them:
/// "BD0010", "Kick_01", "VEH_Deep_House_Synth_Loop_124_Am".
///
/// Habits and weights are read on first use: the built-in ones, or those that a resource folder has.
/// Use from one thread at a time. Malformed bytes separate words.
class QVCTNamesTaggingService : public QVCTAutoTaggingService {
  public:
    TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                           const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                           const std::shared_ptr<TGRTMetaData>& metaData,
                                           const std::shared_ptr<LCFileData>& fileData,
                                           std::uint64_t options) override;
    std::vector<TagClaim> claims(const TaggedItem& item, std::uint64_t options) override;
    std::string_view name() const override { return "names"; }

  private:
    NameReader& reader();

    std::optional<NameReader> reader_;  // since most aggregators are never asked for names
};

}  // namespace qvct

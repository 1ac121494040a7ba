#pragma once

#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "autotagging/services/QVCTAutoTaggingService.h"

#include <memory>
#include <optional>

namespace qvct {

/// Tags from the name of an item and of the folders that it lies in.
///
/// Use from one thread at a time. A path that is not UTF-8 has no tags.
class QVCTFilenameKeywordExtractorTaggingService : public QVCTAutoTaggingService {
  public:
    static std::shared_ptr<QVCTFilenameKeywordExtractorTaggingService> init();
    /// Without a mapping the default one. Labels are those of the default taxonomy.
    static std::shared_ptr<QVCTFilenameKeywordExtractorTaggingService> initWithKeywordMapping(
        std::optional<PropertyList::Dictionary> mapping);

    TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                           const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                           const std::shared_ptr<TGRTMetaData>& metaData,
                                           const std::shared_ptr<LCFileData>& fileData,
                                           std::uint64_t options) override;
    std::vector<TagClaim> claims(const TaggedItem& item, std::uint64_t options) override;
    std::string_view name() const override { return "keywords"; }

    const std::shared_ptr<QVCTKeywordExtractor>& keywordExtractor() const { return keywordExtractor_; }

  private:
    explicit QVCTFilenameKeywordExtractorTaggingService(std::shared_ptr<QVCTKeywordExtractor> extractor)
        : keywordExtractor_(std::move(extractor)) {}

    std::shared_ptr<QVCTKeywordExtractor> keywordExtractor_;
};

}  // namespace qvct

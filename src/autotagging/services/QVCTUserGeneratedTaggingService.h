#pragma once

#include "autotagging/services/QVCTAutoTaggingService.h"

#include <memory>
#include <string>
#include <unordered_set>

namespace qvct {

/// Tags an item as the user's own work when it lies outside the content packs.
///
/// An item belongs to a pack when its record names one, or when it lies in a folder that has a pack's
/// identifier or display name. Immutable: safe from every thread.
class QVCTUserGeneratedTaggingService : public QVCTAutoTaggingService {
  public:
    QVCTUserGeneratedTaggingService();

    TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                           const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                           const std::shared_ptr<TGRTMetaData>& metaData,
                                           const std::shared_ptr<LCFileData>& fileData,
                                           std::uint64_t options) override;
    std::string_view name() const override { return "user"; }

  private:
    bool liesInPackFolder(const URL& url) const;

    /// Identifiers and display names, in lower case.
    std::unordered_set<std::string> packFolderNames_;
};

}  // namespace qvct

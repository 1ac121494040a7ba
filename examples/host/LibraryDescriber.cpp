#include "LibraryDescriber.h"

#include <qvcontenttagging/autotagging/QVTaggingAggregator.h>
#include <qvcontenttagging/formats/TGRTMetaDataReader.h>
#include <qvcontenttagging/indexing/TGRTIndexableContentObject.h>

using namespace qvct;
using namespace qvct::contentdb;

namespace {

IndexedTagging indexed(const TGRTTagging& tagging, Provenance provenance) {
    IndexedTagging result;
    result.label = tagging.label();
    result.category = tagging.category();
    result.provenance = provenance;
    if (tagging.level()) result.level = static_cast<float>(tagging.level()->weight());
    for (auto above = tagging.tag()->parent(); above; above = above->parent())
        result.ancestors.push_back(above->label());
    return result;
}

class LibraryDescriber : public ItemDescriber {
  public:
    std::optional<IndexedItem> describe(const std::string& path, Error* error) override {
        const URL url = URL::fileURLWithPath(path);
        // The fourth door: everything that the item's own record says, flat.
        const auto object = TGRTIndexableContentObject::indexableContentObjectForURL(
            url, std::uint64_t{kReadMappedTaggings} | kIndexWithoutRecord, error);
        if (!object) return std::nullopt;

        IndexedItem item;
        item.name =
            object->displayName().empty() ? url.lastPathComponentWithoutExtension() : object->displayName();
        item.fileType = object->fileType();
        item.previewAvailable = object->previewAvailable();
        for (const auto& tagging : object->taggingDatas())
            item.taggings.push_back(indexed(*tagging, Provenance::stored));
        // The third door: tags that follow from the name and the folders.
        for (const auto& tagging :
             aggregator_->taggingsWithContentsOfURL(url, *taxonomy_, QVCTAutoTaggingOptionFilenameKeywords)) {
            if (!object->taggingDatas().contains(*tagging))
                item.taggings.push_back(indexed(*tagging, Provenance::automatic));
        }
        return item;
    }

  private:
    std::shared_ptr<TGRTTaxonomy> taxonomy_ = TGRTTaxonomy::defaultTaxonomy();
    std::shared_ptr<QVTaggingAggregator> aggregator_ = QVTaggingAggregator::defaultTaggingAggregator();
};

}  // namespace

std::unique_ptr<ItemDescriber> makeLibraryDescriber() {
    return std::make_unique<LibraryDescriber>();
}

#pragma once

#include "autotagging/QVTaggingAggregator.h"
#include "contentdb/IndexedItem.h"
#include "platform/QVContentTaggingTypes.h"
#include "platform/Text.h"

#include <string>

#include <fcntl.h>
#include <unistd.h>

namespace qvct::test {

/// Describes an item by what costs least: the tags and the tempo of its name, and the first bytes of the
/// file.
class KeywordDescriber : public contentdb::ItemDescriber {
  public:
    std::optional<contentdb::IndexedItem> describe(const std::string& path, Error* /*error*/) override {
        const URL url = URL::fileURLWithPath(path);
        contentdb::IndexedItem item;
        item.name = url.lastPathComponentWithoutExtension();
        item.fileType = QVContentTaggingTypes::fallBackFileTypeForURL(url);
        item.payloadHash = header(path);
        for (const auto& tagging :
             aggregator_->taggingsWithContentsOfURL(url, *taxonomy_, QVCTAutoTaggingOptionFilenameKeywords)) {
            contentdb::IndexedTagging its;
            its.label = tagging->label();
            its.category = tagging->category();
            for (auto above = tagging->tag()->parent(); above; above = above->parent())
                its.ancestors.push_back(above->label());
            if (tagging->level()) its.level = tagging->level()->weight();
            its.provenance = contentdb::Provenance::automatic;
            its.service = "keywords";
            item.taggings.push_back(std::move(its));
        }
        if (const std::size_t tempo = item.name.find("bpm"); tempo != std::string::npos)
            item.values.push_back(
                {"Tempo", leadingNumber(item.name.substr(item.name.rfind('_', tempo) + 1))});
        return item;
    }

  private:
    static std::string header(const std::string& path) {
        const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
        char bytes[64];
        const ssize_t count = file < 0 ? 0 : ::read(file, bytes, sizeof bytes);
        if (file >= 0) ::close(file);
        return {bytes, static_cast<std::size_t>(count < 0 ? 0 : count)};
    }

    std::shared_ptr<TGRTTaxonomy> taxonomy_ = TGRTTaxonomy::defaultTaxonomy();
    std::shared_ptr<QVTaggingAggregator> aggregator_ = QVTaggingAggregator::defaultTaggingAggregator();
};

}  // namespace qvct::test

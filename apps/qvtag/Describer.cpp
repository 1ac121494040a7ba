#include "Describer.h"

#include "autotagging/QVTaggingAggregator.h"
#include "platform/QVContentTaggingTypes.h"
#include "platform/Text.h"

#include <fmt/format.h>

namespace qvct::tool {
namespace {

using namespace contentdb;

constexpr std::string_view kKeywords = "keywords";

class KeywordDescriber : public ItemDescriber {
  public:
    std::optional<IndexedItem> describe(const std::string& path, Error* /*error*/) override {
        const URL url = URL::fileURLWithPath(path);
        IndexedItem item;
        item.name = url.lastPathComponentWithoutExtension();
        item.fileType = QVContentTaggingTypes::fallBackFileTypeForURL(url);
        if (!isValidUtf8(path)) return item;
        for (const auto& tagging :
             aggregator_->taggingsWithContentsOfURL(url, *taxonomy_, QVCTAutoTaggingOptionFilenameKeywords)) {
            IndexedTagging its{tagging->label(),      tagging->category(),   {}, {},
                               Provenance::automatic, std::string(kKeywords)};
            for (auto above = tagging->tag()->parent(); above; above = above->parent())
                its.ancestors.push_back(above->label());
            if (tagging->level()) its.level = tagging->level()->weight();
            item.taggings.push_back(std::move(its));
        }
        return item;
    }

  private:
    std::shared_ptr<TGRTTaxonomy> taxonomy_ = TGRTTaxonomy::defaultTaxonomy();
    std::shared_ptr<QVTaggingAggregator> aggregator_ = QVTaggingAggregator::defaultTaggingAggregator();
};

}  // namespace

DescriberFactory describerFactory(const std::vector<std::string>& services, ToolContext& context) {
    for (const std::string& service : services) {
        if (service == kKeywords) continue;
        context.usageFailed(fmt::format("no service \"{}\"; there are: {}", printable(service), kKeywords));
        return {};
    }
    return [] { return std::make_unique<KeywordDescriber>(); };
}

}  // namespace qvct::tool

#include "formats/library/TGRTPackage.h"

#include "formats/TGRTFileNode.h"
#include "resources/PackDisplayNames.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <unordered_map>
#include <unordered_set>

#include <fmt/format.h>

namespace qvct {
namespace {

std::string displayNameOf(const std::string& identifier, const TGRTPackage::Names& names) {
    const auto hit = std::find_if(names.begin(), names.end(),
                                  [&identifier](const auto& row) { return row.first == identifier; });
    return hit == names.end() ? identifier : hit->second;
}

}  // namespace

std::shared_ptr<TGRTPackage> TGRTPackage::packageWithIdentifier(std::string identifier) {
    return packageWithIdentifier(std::move(identifier), packDisplayNames());
}

std::shared_ptr<TGRTPackage> TGRTPackage::packageWithIdentifier(std::string identifier, const Names& names) {
    std::string name = displayNameOf(identifier, names);
    return std::shared_ptr<TGRTPackage>(new TGRTPackage(std::move(identifier), std::move(name)));
}

std::vector<std::string> TGRTPackage::identifiersForMetaData(const TGRTMetaData& metaData) {
    std::vector<std::string> identifiers;
    std::unordered_set<std::string> seen;
    for (const auto& tagging : metaData.taggings()) {
        if (tagging->category() != QVCategorySoundpackIdentifier) continue;
        if (seen.insert(tagging->label()).second) identifiers.push_back(tagging->label());
    }
    return identifiers;
}

std::vector<std::shared_ptr<TGRTPackage>> TGRTPackage::packagesForItems(const std::vector<URL>& items) {
    std::vector<std::shared_ptr<TGRTPackage>> packages;
    std::unordered_map<std::string, std::size_t> places;
    const Names names = packDisplayNames();
    for (const URL& item : items) {
        const auto record = TGRTFileNode::nodeWithFileURL(item)->readMetaDataWithOptions(0);
        if (!record) continue;
        for (const std::string& identifier : identifiersForMetaData(*record)) {
            const auto [place, isNew] = places.try_emplace(identifier, packages.size());
            if (isNew) packages.push_back(packageWithIdentifier(identifier, names));
            packages[place->second]->addItem(item);
        }
    }
    return packages;
}

bool TGRTPackage::isEqual(const Object& other) const {
    const auto* package = dynamic_cast<const TGRTPackage*>(&other);
    return package != nullptr && package->identifier_ == identifier_;
}

std::string TGRTPackage::description() const {
    return fmt::format("<TGRTPackage {}> identifier: {} displayName: {} items: {}",
                       static_cast<const void*>(this), identifier_, displayName_, items_.size());
}

}  // namespace qvct

#include "metadata/TGRTContentInfo.h"

#include "taxonomy/TaggingTypes.h"

#include <fmt/format.h>

namespace qvct {

std::shared_ptr<TGRTContentInfo> TGRTContentInfo::init() {
    std::shared_ptr<TGRTContentInfo> info(new TGRTContentInfo);
    info->setup();
    return info;
}

std::shared_ptr<TGRTContentInfo> TGRTContentInfo::initWithDictionary(const PropertyList* dictionary) {
    auto info = init();
    if (dictionary == nullptr || dictionary->dictionary() == nullptr) return info;
    if (const auto* dependencies = dictionary->dictionary()->array(QVContentInfoDependenciesKey)) {
        std::vector<std::string> paths;
        for (const PropertyList& path : *dependencies) {
            if (path.string() != nullptr) paths.push_back(*path.string());
        }
        info->updateDependencyPaths(paths);
    }
    if (const auto* infos = dictionary->dictionary()->array(QVContentInfoApplicationInfosKey)) {
        info->setupApplicationInfosFromArray(*infos);
    }
    return info;
}

std::shared_ptr<TGRTContentInfo> TGRTContentInfo::copy() const {
    const PropertyList stored = dictionary();
    return initWithDictionary(&stored);
}

void TGRTContentInfo::updateDependencyPaths(const std::vector<std::string>& paths) {
    for (const std::string& path : paths) {
        assetDependencyItems_.insert(TGRTDependencyItem::dependencyItemWithPath(path));
    }
}

void TGRTContentInfo::setupApplicationInfosFromArray(const PropertyList::Array& array) {
    applicationInfos_ = {};
    for (const PropertyList& item : array) {
        if (item.dictionary() == nullptr) continue;
        auto info = TGRTApplicationInfo::initWithDictionary(*item.dictionary());
        if (info->appIdentifier()) applicationInfos_.insert(std::move(info));
    }
}

std::set<std::string> TGRTContentInfo::assetDependencyPaths() const {
    std::set<std::string> paths;
    for (const auto& item : assetDependencyItems_) paths.insert(item->path());
    return paths;
}

std::set<std::string> TGRTContentInfo::assetDependencyIdentifiers() const {
    std::set<std::string> identifiers;
    for (const auto& item : assetDependencyItems_) identifiers.insert(item->UUID());
    return identifiers;
}

PropertyList::Dictionary TGRTContentInfo::dictionary() const {
    PropertyList::Dictionary result;
    const auto paths = assetDependencyPaths();
    if (!paths.empty()) {
        result.set(QVContentInfoDependenciesKey, PropertyList::Array(paths.begin(), paths.end()));
    }
    PropertyList::Array infos;
    for (const auto& info : applicationInfos_) {
        if (auto stored = info->dictionary()) infos.emplace_back(std::move(*stored));
    }
    if (!infos.empty()) result.set(QVContentInfoApplicationInfosKey, std::move(infos));
    return result;
}

std::string TGRTContentInfo::description() const {
    return fmt::format("<TGRTContentInfo {}> assetDependencyItems: {} applicationInfos: {}",
                       static_cast<const void*>(this), assetDependencyItems_.description(),
                       applicationInfos_.description());
}

}  // namespace qvct

#include "metadata/TGRTDependencyItem.h"

#include "metadata/QVCTUUIDGenerator.h"

#include <utility>

#include <fmt/format.h>

namespace qvct {

TGRTDependencyItem::TGRTDependencyItem(std::string identifier, std::string path)
    : identifier_(std::move(identifier)), path_(std::move(path)), hash_(stringHash(identifier_)) {}

std::shared_ptr<TGRTDependencyItem> TGRTDependencyItem::dependencyItemWithPath(std::string path) {
    std::string identifier = QVCTUUIDGenerator::automaticUUIDForAbsolutePath(path);
    return std::shared_ptr<TGRTDependencyItem>(
        new TGRTDependencyItem(std::move(identifier), std::move(path)));
}

bool TGRTDependencyItem::isEqual(const Object& other) const {
    const auto* item = dynamic_cast<const TGRTDependencyItem*>(&other);
    return item != nullptr && !path_.empty() && item->identifier_ == identifier_;
}

std::string TGRTDependencyItem::description() const {
    return fmt::format("<TGRTDependencyItem {}> UUID: {} path: {}", static_cast<const void*>(this),
                       identifier_, path_);
}

}  // namespace qvct

#include "platform/PropertyListBuilder.h"

#include <utility>

namespace qvct {

bool PropertyListBuilder::isNewKey(Open& open) {
    constexpr std::size_t largestLookedThrough = 16;
    const PropertyList::Dictionary& entries = *open.container.dictionary();
    if (entries.size() <= largestLookedThrough) return entries.value(open.key) == nullptr;
    if (open.seen.empty()) {
        for (const auto& entry : entries) open.seen.insert(entry.key);
    }
    return open.seen.insert(open.key).second;
}

void PropertyListBuilder::add(PropertyList value) {
    if (open_.empty()) {
        root_ = std::move(value);
    } else if (PropertyList::Array* items = open_.back().container.array()) {
        items->push_back(std::move(value));
    } else if (isNewKey(open_.back())) {
        open_.back().container.dictionary()->append(std::move(open_.back().key), std::move(value));
    }
}

void PropertyListBuilder::close() {
    PropertyList container = std::move(open_.back().container);
    open_.pop_back();
    const PropertyList::Dictionary* entries = container.dictionary();
    const PropertyList* value =
        entries != nullptr && entries->size() == 1 ? entries->value(kUidKey) : nullptr;
    const std::int64_t* uid = value == nullptr ? nullptr : value->signedInteger();
    if (uid != nullptr && *uid >= 0) {
        add(PropertyList::Uid{static_cast<std::uint64_t>(*uid)});
    } else {
        add(std::move(container));
    }
}

}  // namespace qvct

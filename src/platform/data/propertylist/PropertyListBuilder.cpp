#include "platform/data/propertylist/PropertyListBuilder.h"

#include <algorithm>
#include <numeric>
#include <utility>

namespace qvct {

namespace {

/// The places of the entries, equal keys next to each other and in their order.
std::vector<std::size_t> placesByKey(const PropertyList::Dictionary& entries) {
    std::vector<std::size_t> places(entries.size());
    std::iota(places.begin(), places.end(), std::size_t{0});
    std::sort(places.begin(), places.end(), [first = entries.begin()](std::size_t a, std::size_t b) {
        const int order = first[a].key.compare(first[b].key);
        return order != 0 ? order < 0 : a < b;
    });
    return places;
}

bool isSmallWithoutRepeats(const PropertyList::Dictionary& entries) {
    constexpr std::size_t largest = 16;  // up to here comparing all with each other is faster than sorting
    if (entries.size() > largest) return false;
    return std::none_of(entries.begin(), entries.end(),
                        [&](const auto& entry) { return entries.value(entry.key) != &entry.value; });
}

void keepLastValues(PropertyList::Dictionary& entries) {
    if (isSmallWithoutRepeats(entries)) return;
    const PropertyList::Entry* const first = entries.begin();
    const std::vector<std::size_t> places = placesByKey(entries);
    std::vector<const PropertyList*> values(places.size());  // the last one of each key, at its first place
    std::size_t count = 0;
    for (std::size_t i = 0; i < places.size(); ++count) {
        const std::size_t start = i;
        while (i < places.size() && first[places[i]].key == first[places[start]].key) ++i;
        values[places[start]] = &first[places[i - 1]].value;
    }
    if (count == entries.size()) return;
    PropertyList::Dictionary kept;
    kept.reserve(count);
    for (std::size_t i = 0; i < values.size(); ++i) {
        if (values[i] != nullptr) kept.append(first[i].key, *values[i]);
    }
    entries = std::move(kept);
}

}  // namespace

void PropertyListBuilder::add(PropertyList value) {
    if (open_.empty()) {
        root_ = std::move(value);
    } else if (PropertyList::Array* items = open_.back().container.array()) {
        items->push_back(std::move(value));
    } else {
        open_.back().container.dictionary()->append(std::move(open_.back().key), std::move(value));
    }
}

bool PropertyListBuilder::isNext(const PropertyListPath& path) const {
    return std::equal(path.begin(), path.end(), open_.begin(), open_.end(),
                      [](const auto& step, const Open& open) {
                          const PropertyList::Array* items = open.container.array();
                          const auto* key = std::get_if<std::string>(&step);
                          return items == nullptr ? key != nullptr && *key == open.key
                                                  : key == nullptr && std::get<1>(step) == items->size();
                      });
}

void PropertyListBuilder::close() {
    PropertyList container = std::move(open_.back().container);
    open_.pop_back();
    PropertyList::Dictionary* entries = container.dictionary();
    if (entries != nullptr) keepLastValues(*entries);
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

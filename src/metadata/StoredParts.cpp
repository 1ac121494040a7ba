#include "metadata/StoredParts.h"

#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

namespace qvct {
namespace {

using Array = PropertyList::Array;
using Dictionary = PropertyList::Dictionary;

std::unordered_map<std::string_view, const PropertyList*> valuesByKey(const Dictionary& dictionary) {
    std::unordered_map<std::string_view, const PropertyList*> values;
    values.reserve(dictionary.size());
    for (const auto& [key, value] : dictionary) values.emplace(key, &value);
    return values;
}

/// What is stored, changed in what differs between `before`, as which it was understood, and `after`.
Dictionary changed(const Dictionary& stored, const Dictionary& before, const Dictionary& after) {
    const auto old = valuesByKey(before);
    const auto wanted = valuesByKey(after);
    std::unordered_set<std::string_view> present;
    Dictionary result;
    result.reserve(stored.size() + after.size());
    for (const auto& [key, value] : stored) {
        const auto was = old.find(key);
        const auto is = wanted.find(key);
        present.insert(key);
        if (is == wanted.end()) {
            if (was == old.end()) result.append(key, value);
            continue;
        }
        const bool stays = was != old.end() && *was->second == *is->second;
        result.append(key, stays ? value : *is->second);
    }
    for (const auto& [key, value] : after) {
        if (!present.contains(key)) result.append(key, value);
    }
    return result;
}

PropertyList changed(const PropertyList& stored, const PropertyList& before, const PropertyList& after) {
    if (before == after) return stored;
    const bool areDictionaries = stored.dictionary() && before.dictionary() && after.dictionary();
    return areDictionaries ? changed(*stored.dictionary(), *before.dictionary(), *after.dictionary()) : after;
}

/// How the elements of a stored array are turned into items and back.
template <typename Item>
struct Elements {
    /// Null for what is no item.
    std::function<std::shared_ptr<Item>(const PropertyList& element)> read;
    /// Nothing for an item that cannot be stored.
    std::function<std::optional<PropertyList>(const std::shared_ptr<Item>&)> write;
    /// What identifies an item even when the rest of it changes.
    std::function<std::string(const Item&)> name;
};

/// An array on its way from what is stored to what is held.
template <typename Item>
class ArrayChange {
  public:
    ArrayChange(const Array& stored, const ObjectSet<Item>& after, const Elements<Item>& elements)
        : stored_(stored), after_(after), elements_(elements) {
        for (const PropertyList& element : stored) before_.push_back(elements.read(element));
    }

    Array result() {
        findPlaces();
        Array result;
        for (const auto& item : after_) {
            const auto places = takePlacesOf(*item);
            for (const std::size_t place : places) result.push_back(changedAt(place, item));
            auto added = places.empty() ? elements_.write(item) : std::nullopt;
            isChanged_ = isChanged_ || added;
            if (added) result.push_back(std::move(*added));
        }
        if (!isChanged_) return stored_;
        for (std::size_t i = 0; i < stored_.size(); ++i) {
            if (!before_[i]) result.push_back(stored_[i]);
        }
        return result;
    }

  private:
    void findPlaces() {
        for (std::size_t i = stored_.size(); i-- > 0;) {
            if (!before_[i]) continue;
            if (const Item* staying = after_.find(*before_[i])) {
                staying_[staying].push_back(i);
            } else {
                isChanged_ = true;
                leaving_[elements_.name(*before_[i])].push_back(i);
            }
        }
    }

    /// All places of the item; if there are none, the place of an item with its name that is no longer held.
    std::vector<std::size_t> takePlacesOf(const Item& item) {
        auto& places = staying_[&item];
        auto& others = leaving_[elements_.name(item)];
        std::reverse(places.begin(), places.end());
        if (places.empty() && !others.empty()) {
            places.push_back(others.back());
            others.pop_back();
        }
        return places;
    }

    PropertyList changedAt(std::size_t place, const std::shared_ptr<Item>& item) {
        const auto before = elements_.write(before_[place]);
        const auto after = elements_.write(item);
        if (before == after) return stored_[place];
        isChanged_ = true;
        return before && after ? changed(stored_[place], *before, *after) : stored_[place];
    }

    const Array& stored_;
    const ObjectSet<Item>& after_;
    const Elements<Item>& elements_;
    std::vector<std::shared_ptr<Item>> before_;  // of each element
    bool isChanged_ = false;
    // Places in the array, the last first.
    std::unordered_map<const Item*, std::vector<std::size_t>> staying_;
    std::unordered_map<std::string, std::vector<std::size_t>> leaving_;
};

template <typename Item>
PropertyList storedArray(const PropertyList* stored, const ObjectSet<Item>& after,
                         const Elements<Item>& elements) {
    static const Array nothing;
    const Array* array = stored == nullptr ? nullptr : stored->array();
    if (array == nullptr && stored != nullptr && after.empty()) return *stored;
    return ArrayChange<Item>(array == nullptr ? nothing : *array, after, elements).result();
}

Elements<TGRTTagging> tagsOf(const std::string& category, TGRTTaxonomy& scratch) {
    return {[&category, &scratch](const PropertyList& element) {
                const PropertyList alone = Dictionary{{category, Array{element}}};
                const auto taggings = TGRTTagging::taggingsWithTaggingDictionary(&alone, scratch);
                return taggings.empty() ? nullptr : *taggings.begin();
            },
            [](const std::shared_ptr<TGRTTagging>& tagging) -> std::optional<PropertyList> {
                return TGRTTagging::taggingDictionaryForTaggings(ObjectSet<TGRTTagging>{tagging})
                    .begin()
                    ->value.array()
                    ->front();
            },
            [](const TGRTTagging& tagging) { return tagging.label(); }};
}

Elements<TGRTApplicationInfo> applicationInfos() {
    return {[](const PropertyList& element) {
                const auto info = element.dictionary() == nullptr
                                      ? nullptr
                                      : TGRTApplicationInfo::initWithDictionary(*element.dictionary());
                return info && info->appIdentifier() ? info : nullptr;
            },
            [](const std::shared_ptr<TGRTApplicationInfo>& info) -> std::optional<PropertyList> {
                auto dictionary = info->dictionary();
                return dictionary ? std::optional<PropertyList>(std::move(*dictionary)) : std::nullopt;
            },
            [](const TGRTApplicationInfo& info) { return info.appIdentifier().value_or(""); }};
}

Elements<TGRTDependencyItem> dependencies() {
    return {[](const PropertyList& element) {
                return element.string() == nullptr
                           ? nullptr
                           : TGRTDependencyItem::dependencyItemWithPath(*element.string());
            },
            [](const std::shared_ptr<TGRTDependencyItem>& item) -> std::optional<PropertyList> {
                return item->path();
            },
            [](const TGRTDependencyItem& item) { return item.path(); }};
}

template <typename Item, typename Key>
ObjectSet<Item> sorted(const ObjectSet<Item>& items, Key key) {
    std::vector<std::shared_ptr<Item>> ordered(items.begin(), items.end());
    std::stable_sort(ordered.begin(), ordered.end(),
                     [&key](const auto& a, const auto& b) { return key(*a) < key(*b); });
    ObjectSet<Item> result;
    for (auto& item : ordered) result.insert(std::move(item));
    return result;
}

bool isEmptyArray(const PropertyList& value) {
    return value.array() != nullptr && value.array()->empty();
}

/// Appends the value under the key. An empty array is left out, unless one was stored there before.
void append(Dictionary& result, const std::string& key, const PropertyList* stored, PropertyList value) {
    const bool wasEmpty = stored != nullptr && isEmptyArray(*stored);
    if (!isEmptyArray(value) || wasEmpty) result.append(key, std::move(value));
}

}  // namespace

PropertyList storedTaggings(const PropertyList* stored, const ObjectSet<TGRTTagging>& taggings) {
    const Dictionary* categories = stored == nullptr ? nullptr : stored->dictionary();
    if (categories == nullptr) {
        const bool stays = stored != nullptr && taggings.empty();
        return stays ? *stored : PropertyList(TGRTTagging::taggingDictionaryForTaggings(taggings));
    }
    std::map<std::string, ObjectSet<TGRTTagging>> after;
    for (const auto& tagging : sorted(taggings, [](const auto& t) { return t.label(); }))
        after[tagging->category()].insert(tagging);
    const auto scratch = TGRTTaxonomy::init();
    Dictionary result;
    result.reserve(categories->size() + after.size());
    for (const auto& [category, entries] : *categories) {
        const auto held = after.extract(category);
        append(result, category, &entries,
               storedArray(&entries, held ? held.mapped() : ObjectSet<TGRTTagging>{},
                           tagsOf(category, *scratch)));
    }
    for (const auto& [category, held] : after)
        append(result, category, nullptr, storedArray(nullptr, held, tagsOf(category, *scratch)));
    return result;
}

PropertyList storedContentInfo(const PropertyList* stored, const TGRTContentInfo& contentInfo) {
    const Dictionary after = contentInfo.dictionary();
    const Dictionary* before = stored == nullptr ? nullptr : stored->dictionary();
    if (before == nullptr) return stored != nullptr && after.empty() ? *stored : PropertyList(after);
    const auto paths =
        sorted(contentInfo.assetDependencyItems(), [](const auto& item) { return item.path(); });
    Dictionary result;
    for (const auto& [key, value] : *before) {
        if (key == QVContentInfoDependenciesKey) {
            append(result, key, &value, storedArray(&value, paths, dependencies()));
        } else if (key == QVContentInfoApplicationInfosKey) {
            append(result, key, &value,
                   storedArray(&value, contentInfo.applicationInfos(), applicationInfos()));
        } else {
            result.append(key, value);
        }
    }
    for (const auto& [key, value] : after) {
        if (before->value(key) == nullptr) result.append(key, value);
    }
    return result;
}

PropertyList storedKeyValues(const PropertyList* stored, const ObjectSet<TGRTKeyValue>& keyValues) {
    const Dictionary after = TGRTKeyValue::keyValueDictionaryForKeyValues(keyValues);
    if (stored == nullptr) return after;
    if (stored->dictionary() == nullptr) return after.empty() ? *stored : PropertyList(after);
    const auto before =
        TGRTKeyValue::keyValueDictionaryForKeyValues(TGRTKeyValue::keyValuesWithDictionary(stored));
    return changed(*stored->dictionary(), before, after);
}

std::optional<PropertyList> storedRejections(const PropertyList* stored,
                                             const std::set<std::string>& labels) {
    if (rejectedLabels(stored) == labels)
        return stored == nullptr ? std::nullopt : std::optional<PropertyList>(*stored);
    Array result(labels.begin(), labels.end());
    if (stored != nullptr && stored->array() != nullptr) {
        for (const PropertyList& element : *stored->array())
            if (element.string() == nullptr) result.push_back(element);
    }
    return result.empty() ? std::nullopt : std::optional<PropertyList>(std::move(result));
}

std::set<std::string> rejectedLabels(const PropertyList* stored) {
    std::set<std::string> labels;
    if (stored == nullptr || stored->array() == nullptr) return labels;
    for (const PropertyList& element : *stored->array())
        if (element.string() != nullptr) labels.insert(*element.string());
    return labels;
}

void storeRejections(Dictionary& stored, const std::set<std::string>& labels) {
    auto rejected = storedRejections(std::as_const(stored).value(QVContentTaggingRejectedKeyName), labels);
    if (rejected) {
        stored.set(QVContentTaggingRejectedKeyName, *std::move(rejected));
    } else {
        stored.remove(QVContentTaggingRejectedKeyName);
    }
}

}  // namespace qvct

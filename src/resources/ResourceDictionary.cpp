#include "resources/ResourceDictionary.h"

#include "platform/data/PropertyListFile.h"

#include <fmt/format.h>

namespace qvct {

std::optional<PropertyList::Dictionary> readResourceDictionary(std::string_view name, const std::string& path,
                                                               Error* error) {
    constexpr std::string_view kRules = "DefaultRules";
    auto dictionary = readDictionaryFile(path, error);
    const std::string_view key = name == kRules ? name : name.ends_with("Taxonomy") ? "categories" : "";
    if (!dictionary || key.empty()) return dictionary;
    const bool hasEntries =
        name == kRules ? dictionary->array(key) != nullptr : dictionary->dictionary(key) != nullptr;
    if (hasEntries) return dictionary;
    fail(error, kErrorMalformed,
         fmt::format("{} \"{}\"",
                     dictionary->value(key) == nullptr ? "there is no key" : "there are no entries under",
                     key),
         {path});
    return std::nullopt;
}

}  // namespace qvct

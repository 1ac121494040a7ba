#include "taxonomy/TaxonomyLocalization.h"

#include "platform/data/UserDefaults.h"
#include "platform/text/Text.h"
#include "resources/PackDisplayNames.h"
#include "taxonomy/labels/QVTagIdentifierUtility.h"

#include <algorithm>
#include <array>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::array<std::pair<const char*, const char*>, 12> kKeyNames = {{{"C", "Key: C"},
                                                                            {"CSharp", "Key: C#"},
                                                                            {"D", "Key: D"},
                                                                            {"DSharp", "Key: D#"},
                                                                            {"E", "Key: E"},
                                                                            {"F", "Key: F"},
                                                                            {"FSharp", "Key: F#"},
                                                                            {"G", "Key: G"},
                                                                            {"GSharp", "Key: G#"},
                                                                            {"A", "Key: A"},
                                                                            {"ASharp", "Key: A#"},
                                                                            {"B", "Key: B"}}};

constexpr std::array<std::pair<const char*, const char*>, 3> kAdjustments = {
    {{"Generative Instrument Loop", "Drummer Loop"}, {"Non-rhythmic", "Non-Rhythmic"}, {" KeyType", ""}}};

void replaceIfPresent(Localization& strings, const std::string& key, std::string_view value) {
    if (const auto entry = strings.find(key); entry != strings.end()) entry->second = value;
}

std::string shown(const std::string& text, bool reversed) {
    return reversed ? reversedString(text) : text;
}

void addTag(Localization& strings, const TGRTTag& tag, bool reversed) {
    const std::string& label = tag.label();
    strings[label] = shown(label, reversed);
    for (std::size_t i = 0; i < tag.valueStepLabels().size(); ++i) {
        strings[fmt::format("{}_{}", label, i)] = shown(tag.valueStepLabels()[i], reversed);
    }
    if (tag.valueType() != kTagValueBipolar) return;
    // The poles have keys of their own, whether they came as steps or not; their names are never reversed.
    const std::vector<std::string> poles = split(label, " / ");
    strings[QVTagIdentifierUtility::localizationKeyForJingJangTagLabel(label, true)] = poles[0];
    strings[QVTagIdentifierUtility::localizationKeyForJingJangTagLabel(label, false)] =
        poles.size() > 1 ? poles[1] : poles[0];
}

/// A string as a strings table quotes it.
std::string quoted(std::string text) {
    // The backslash first, since escaping the others adds backslashes.
    constexpr std::array<std::pair<const char*, const char*>, 4> escapes = {
        {{"\\", "\\\\"}, {"\"", "\\\""}, {"\n", "\\n"}, {"\r", "\\r"}}};
    for (const auto& [plain, escaped] : escapes) text = replaceAll(text, plain, escaped);
    return '"' + text + '"';
}

}  // namespace

Localization localizationOf(const TGRTTaxonomy& taxonomy) {
    const bool reversed = UserDefaults::boolForKey("fakeLocalization");
    Localization strings;
    auto tags = taxonomy.allTags();
    std::stable_sort(tags.begin(), tags.end(),
                     [](const auto& a, const auto& b) { return a->label() < b->label(); });
    for (const auto& tag : tags) addTag(strings, *tag, reversed);
    for (const auto& category : taxonomy.categories()) {
        strings[category->identifier()] = shown(category->identifier(), reversed);
    }
    for (const auto& [identifier, name] : packDisplayNames()) replaceIfPresent(strings, identifier, name);
    for (const auto& [key, name] : kKeyNames) replaceIfPresent(strings, key, name);
    for (auto& [key, value] : strings) {
        for (const auto& [from, to] : kAdjustments) value = replaceAll(value, from, to);
    }
    return strings;
}

std::string stringsTableOf(const Localization& strings) {
    std::string table;
    for (const auto& [key, value] : strings) table += fmt::format("{} = {};\n\n", quoted(key), quoted(value));
    return table;
}

}  // namespace qvct

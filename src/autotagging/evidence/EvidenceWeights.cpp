#include "autotagging/evidence/EvidenceWeights.h"

#include "platform/data/PropertyListFile.h"
#include "platform/data/propertylist/PropertyListPlace.h"
#include "resources/QVCTCompiledResources.h"

#include <algorithm>
#include <utility>

namespace qvct {
namespace {

using Dictionary = PropertyList::Dictionary;

/// A dictionary, and the keys that lead to it.
struct Section {
    const Dictionary* entries;
    PropertyListPath path;

    PropertyListPath pathOf(std::string key) const {
        PropertyListPath result = path;
        result.push_back(std::move(key));
        return result;
    }
};

/// Reads numbers and labels, and keeps the first fault and its place.
class Reader {
  public:
    double number(const PropertyList* value, PropertyListPath path) {
        const auto number = value == nullptr ? std::nullopt : value->numberValue();
        const bool isWeight = number && *number >= 0 && *number <= 1;
        if (!isWeight) fault("is no number from 0 to 1", std::move(path));
        return isWeight ? *number : 0;
    }
    double number(const Section& section, const std::string& key) {
        return number(section.entries->value(key), section.pathOf(key));
    }
    static Section section(const Section& above, const std::string& key) {
        static const Dictionary empty;
        const Dictionary* found = above.entries->dictionary(key);
        return {found == nullptr ? &empty : found, above.pathOf(key)};
    }
    std::vector<std::string> labels(const PropertyList& value, PropertyListPath path) {
        std::vector<std::string> labels;
        const PropertyList::Array* list = value.array();
        for (const PropertyList& label : list == nullptr ? PropertyList::Array() : *list) {
            if (label.string() != nullptr) labels.push_back(*label.string());
        }
        if (list == nullptr || labels.size() < 2 || labels.size() != list->size())
            fault("is no list of two labels or more", std::move(path));
        return labels;
    }
    void fault(std::string reason, PropertyListPath path) {
        if (error_.isSet()) return;
        failAtValue(&error_, kErrorMalformed, std::move(reason), path);
        place_ = std::move(path);
    }
    const Error& error() const { return error_; }
    const PropertyListPath& place() const { return place_; }

  private:
    Error error_;
    PropertyListPath place_;
};

EvidenceWeights weightsIn(const Dictionary& dictionary, Reader& read) {
    const Section root{&dictionary, {}};
    EvidenceWeights weights;
    const Section strengths = Reader::section(root, "Strengths");
    weights.word = read.number(strengths, "word");
    weights.abbreviation = read.number(strengths, "abbreviation");
    weights.likeness = read.number(strengths, "likeness");
    weights.hint = read.number(strengths, "hint");
    weights.figure = read.number(strengths, "figure");
    weights.key = read.number(strengths, "key");
    const Section services = Reader::section(root, "Services");
    for (const auto& [name, value] : *services.entries)
        weights.services[name] = read.number(&value, services.pathOf(name));
    const PropertyList::Array none;
    const auto listOf = [&](std::string_view key) -> const PropertyList::Array& {
        const PropertyList::Array* list = dictionary.array(key);
        return list == nullptr ? none : *list;
    };
    for (const PropertyList& value : listOf("Distances"))
        weights.distances.push_back(read.number(&value, {"Distances", weights.distances.size()}));
    if (weights.distances.empty()) read.fault("there are none", {"Distances"});
    for (const PropertyList& group : listOf("Together"))
        weights.together.push_back(read.labels(group, {"Together", weights.together.size()}));
    weights.headWord = read.number(root, "HeadWord");
    weights.support = read.number(root, "Support");
    weights.contradiction = read.number(root, "Contradiction");
    weights.threshold = read.number(root, "Threshold");
    return weights;
}

std::optional<EvidenceWeights> weightsInFile(const std::string& path, Error* error) {
    const auto dictionary = readDictionaryFile(path, error);
    if (!dictionary) return std::nullopt;
    Reader read;
    EvidenceWeights weights = weightsIn(*dictionary, read);
    if (!read.error().isSet()) return weights;
    if (error != nullptr) *error = read.error();
    failInFile(path, read.place(), error);
    return std::nullopt;
}

}  // namespace

std::optional<EvidenceWeights> EvidenceWeights::weightsWithDictionary(const Dictionary& dictionary,
                                                                      Error* error) {
    Reader read;
    EvidenceWeights weights = weightsIn(dictionary, read);
    if (!read.error().isSet()) return weights;
    if (error != nullptr) *error = read.error();
    return std::nullopt;
}

ResourceFile EvidenceWeights::file() {
    return {"EvidenceWeights", "plist",
            [](const std::string& path, Error* error) { return weightsInFile(path, error).has_value(); }};
}

EvidenceWeights EvidenceWeights::defaultWeights() {
    const auto read = [](const std::string& path) { return weightsInFile(path, nullptr); };
    const auto builtIn = [] {
        return weightsWithDictionary(QVCTCompiledResources::EvidenceWeightsPlist().value_or(Dictionary{}));
    };
    return replacedOrBuiltIn(file(), read, builtIn).value_or(EvidenceWeights{});
}

double EvidenceWeights::ofService(std::string_view name) const {
    const auto found = services.find(name);
    return found == services.end() ? 1 : found->second;
}

bool EvidenceWeights::goTogether(const std::string& a, const std::string& b) const {
    return std::any_of(together.begin(), together.end(), [&](const auto& group) {
        const auto has = [&group](const std::string& label) {
            return std::find(group.begin(), group.end(), label) != group.end();
        };
        return has(a) && has(b);
    });
}

double EvidenceWeights::ofDistance(int distance) const {
    return distances[std::min(static_cast<std::size_t>(distance), distances.size() - 1)];
}

}  // namespace qvct

#include "autotagging/evidence/EvidenceWeights.h"

#include "platform/base/Log.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/Text.h"
#include "resources/QVCTCompiledResources.h"
#include "resources/ReplacementFile.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct {
namespace {

using Dictionary = PropertyList::Dictionary;

/// Reads numbers, and keeps the first fault.
class Reader {
  public:
    explicit Reader(Error* error) : error_(error) {}

    double number(const PropertyList* value, const std::string& entry) {
        const std::string* text = value == nullptr ? nullptr : value->string();
        const auto number = value == nullptr  ? std::nullopt
                            : text != nullptr ? std::optional(leadingNumber(*text))
                                              : value->doubleValue();
        const bool isWeight = number && *number >= 0 && *number <= 1;
        if (!isWeight && isSound_)
            isSound_ = fail(error_, kErrorMalformed, "is no number from 0 to 1", {.part = entry});
        return isWeight ? *number : 0;
    }
    double number(const Dictionary& dictionary, const std::string& key) {
        return number(dictionary.value(key), key);
    }
    const Dictionary& dictionary(const Dictionary& dictionary, const std::string& key) {
        static const Dictionary empty;
        const Dictionary* found = dictionary.dictionary(key);
        return found == nullptr ? empty : *found;
    }
    std::vector<std::string> texts(const PropertyList& value, const std::string& entry) {
        std::vector<std::string> texts;
        const PropertyList::Array* list = value.array();
        for (const PropertyList& text : list == nullptr ? PropertyList::Array() : *list) {
            if (text.string() != nullptr) texts.push_back(*text.string());
        }
        if (texts.size() < 2) fault(entry, "is no list of lists of labels");
        return texts;
    }
    void fault(const std::string& entry, std::string reason) {
        if (isSound_) isSound_ = fail(error_, kErrorMalformed, std::move(reason), {.part = entry});
    }
    bool isSound() const { return isSound_; }

  private:
    Error* error_;
    bool isSound_ = true;
};

}  // namespace

std::optional<EvidenceWeights> EvidenceWeights::weightsWithDictionary(const Dictionary& dictionary,
                                                                      Error* error) {
    Reader read(error);
    EvidenceWeights weights;
    const Dictionary& strengths = read.dictionary(dictionary, "Strengths");
    weights.word = read.number(strengths, "word");
    weights.abbreviation = read.number(strengths, "abbreviation");
    weights.likeness = read.number(strengths, "likeness");
    weights.hint = read.number(strengths, "hint");
    weights.figure = read.number(strengths, "figure");
    weights.key = read.number(strengths, "key");
    for (const auto& [name, value] : read.dictionary(dictionary, "Services"))
        weights.services[name] = read.number(&value, name);
    if (const PropertyList::Array* distances = dictionary.array("Distances"))
        for (const PropertyList& value : *distances)
            weights.distances.push_back(read.number(&value, "Distances"));
    if (weights.distances.empty()) read.fault("Distances", "there are none");
    if (const PropertyList::Array* groups = dictionary.array("Together")) {
        for (const PropertyList& group : *groups) weights.together.push_back(read.texts(group, "Together"));
    }
    weights.headWord = read.number(dictionary, "HeadWord");
    weights.support = read.number(dictionary, "Support");
    weights.contradiction = read.number(dictionary, "Contradiction");
    weights.threshold = read.number(dictionary, "Threshold");
    return read.isSound() ? std::optional(std::move(weights)) : std::nullopt;
}

EvidenceWeights EvidenceWeights::defaultWeights() {
    const auto read = [](const std::string& path) -> std::optional<EvidenceWeights> {
        Error error;
        const auto dictionary = readDictionaryFile(path, &error);
        auto weights = dictionary ? weightsWithDictionary(*dictionary, &error) : std::nullopt;
        if (weights) return weights;
        failIn(path, &error);
        log(fmt::format("{} (using the built-in weights)", error.message()));
        return std::nullopt;
    };
    const auto builtIn = [] {
        return weightsWithDictionary(QVCTCompiledResources::EvidenceWeightsPlist().value_or(Dictionary{}));
    };
    return replacedOrBuiltIn({"EvidenceWeights", "plist"}, read, builtIn).value_or(EvidenceWeights{});
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

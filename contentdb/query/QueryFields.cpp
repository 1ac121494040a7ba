#include "contentdb/query/QueryFields.h"

#include "contentdb/terms/Terms.h"
#include "contentdb/terms/Words.h"
#include "formats/QVContentTaggingTypes.h"
#include "platform/text/Text.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <utility>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

struct Name {
    std::string_view word;
    Field::Kind kind;
    std::string_view of;
};

constexpr auto kNames = std::to_array<Name>({{"name", Field::Kind::name, ""},
                                             {"path", Field::Kind::path, ""},
                                             {"type", Field::Kind::type, ""},
                                             {"pack", Field::Kind::pack, ""},
                                             {"tag", Field::Kind::tag, ""},
                                             {"key", Field::Kind::key, ""},
                                             {"level", Field::Kind::level, ""},
                                             {"bpm", Field::Kind::number, "tempo"},
                                             {"tempo", Field::Kind::number, "tempo"},
                                             {"beats", Field::Kind::number, "beatcount"},
                                             {"beatcount", Field::Kind::number, "beatcount"},
                                             {"seconds", Field::Kind::number, "lengthinseconds"},
                                             {"length", Field::Kind::number, "lengthinseconds"},
                                             {"root", Field::Kind::number, "midirootnote"},
                                             {"size", Field::Kind::number, "size"},
                                             {"rate", Field::Kind::number, "samplerate"},
                                             {"bits", Field::Kind::number, "bitdepth"},
                                             {"channels", Field::Kind::number, "channelcount"},
                                             {"top", Field::Kind::number, "signaturetop"},
                                             {"bottom", Field::Kind::number, "signaturebottom"},
                                             {"note", Field::Kind::number, "note"},
                                             {"cents", Field::Kind::number, "cents"},
                                             {"loudness", Field::Kind::number, "loudness"},
                                             {"peak", Field::Kind::number, "truepeak"},
                                             {"brightness", Field::Kind::number, "brightness"},
                                             {"warmth", Field::Kind::number, "warmth"},
                                             {"hardness", Field::Kind::number, "hardness"},
                                             {"roughness", Field::Kind::number, "roughness"},
                                             {"noisiness", Field::Kind::number, "noisiness"},
                                             {"height", Field::Kind::number, "height"},
                                             {"width", Field::Kind::number, "width"},
                                             {"complexity", Field::Kind::number, "complexity"}});

/// The categories whose name is the word or its plural; if there are none, those whose name begins with it.
std::vector<std::string> categoriesNamed(const std::string& bare, const Vocabulary& vocabulary) {
    constexpr std::size_t shortest = 3;
    std::vector<std::string> same;
    std::vector<std::string> beginning;
    for (const std::string& category : vocabulary.categories) {
        const std::string name = bareName(category);
        if (name == bare || name == bare + "s") same.push_back(folded(category));
        if (bare.size() >= shortest && name.starts_with(bare)) beginning.push_back(folded(category));
    }
    std::vector<std::string>& result = same.empty() ? beginning : same;
    std::sort(result.begin(), result.end());
    result.erase(std::unique(result.begin(), result.end()), result.end());
    return result;
}

/// A note of any octave, and what stands behind it.
struct Pitch {
    int step;  // semitones above C: -1 to 12
    std::string rest;
};

std::optional<Pitch> pitchAtBeginning(std::string_view text) {
    constexpr std::array<int, 7> steps = {9, 11, 0, 2, 4, 5, 7};  // A to G
    if (text.empty()) return std::nullopt;
    const char letter = static_cast<char>(text[0] & ~0x20);
    if (letter < 'A' || letter > 'G') return std::nullopt;
    Pitch pitch{steps[static_cast<std::size_t>(letter - 'A')], folded(trimBlanks(text.substr(1)))};
    const auto skip = [&pitch](std::string_view beginning) {
        if (!pitch.rest.starts_with(beginning)) return false;
        pitch.rest.erase(0, beginning.size());
        return true;
    };
    if (skip("#") || skip("sharp") || skip("\xe2\x99\xaf")) {
        ++pitch.step;
    } else if (skip("b") || skip("flat") || skip("\xe2\x99\xad")) {
        --pitch.step;
    }
    return pitch;
}

}  // namespace

std::optional<Field> fieldNamed(std::string_view word, const Vocabulary& vocabulary, std::string& reason) {
    const std::string bare = bareName(word);
    const auto* const known =
        std::find_if(kNames.begin(), kNames.end(), [&bare](const Name& name) { return name.word == bare; });
    if (known != kNames.end()) return Field{known->kind, std::string(known->of)};
    const std::vector<std::string> categories =
        bare.empty() ? std::vector<std::string>() : categoriesNamed(bare, vocabulary);
    if (categories.size() == 1) return Field{Field::Kind::tag, categories[0]};
    if (categories.size() > 1) {
        reason = fmt::format("\"{}\" begins more than one category: {}", word, fmt::join(categories, ", "));
        return std::nullopt;
    }
    for (const std::string& number : vocabulary.numbers) {
        if (bareName(number) == bare) return Field{Field::Kind::number, bare};
    }
    reason =
        fmt::format("there is no field \"{}\"; put quotes around the whole to search for it as text", word);
    return std::nullopt;
}

std::vector<std::string> keyLabels(std::string_view text) {
    const auto pitch = pitchAtBeginning(text);
    if (!pitch) return {};
    std::vector<std::string> labels = {
        std::string(QVTagsOfKeys[static_cast<std::size_t>(pitch->step + 12) % QVTagsOfKeys.size()])};
    const std::string rest = bareName(pitch->rest);
    if (rest == "m" || rest == "min" || rest == "minor") {
        labels.emplace_back(QVTagMinorKeyType);
    } else if (rest == "maj" || rest == "major") {
        labels.emplace_back(QVTagMajorKeyType);
    } else if (!rest.empty()) {
        return {};
    }
    return labels;
}

std::optional<double> noteNamed(std::string_view text) {
    const auto pitch = pitchAtBeginning(text);
    if (!pitch) return std::nullopt;
    int octave = 0;
    const char* const last = pitch->rest.data() + pitch->rest.size();
    const auto [stop, fault] = std::from_chars(pitch->rest.data(), last, octave);
    if (fault != std::errc() || stop != last || octave < -1 || octave > 9) return std::nullopt;
    return pitch->step + 12 * (octave + 1);
}

bool isOfNotes(std::string_view field) {
    return field == "note" || field == "midirootnote";
}

std::set<std::string> keyTerms() {
    std::set<std::string> terms;
    for (const std::string_view label : QVTagsOfKeys)
        terms.insert(tagTerm(label, QVCategoryLoopSpecificsIdentifier));
    return terms;
}

std::optional<std::int64_t> typeNamed(std::string_view word) {
    const std::string bare = bareName(word);
    for (std::int64_t type = kFileTypeNone; type <= kFileTypeProject; ++type) {
        if (bareName(QVContentTaggingTypes::nameForFileType(type)) == bare) return type;
    }
    return std::nullopt;
}

bool isNumeric(const Field& field) {
    return field.kind == Field::Kind::number || field.kind == Field::Kind::level;
}

std::vector<double> numbersInField(const IndexedItem& item, const Field& field) {
    const std::string name = field.kind == Field::Kind::level ? levelField(field.of) : field.of;
    std::vector<double> numbers;
    for (const auto& [itsField, value] : numbersOf(item)) {
        if (itsField == name) numbers.push_back(value);
    }
    return numbers;
}

std::vector<std::string> textsInField(const IndexedItem& item, const Field& field) {
    std::vector<std::string> texts;
    switch (field.kind) {
        case Field::Kind::name:
            if (item.title.empty()) return {item.name};
            return {item.name, item.title};
        case Field::Kind::path:
            return {item.path};
        case Field::Kind::type:
            return {std::string(QVContentTaggingTypes::nameForFileType(item.fileType))};
        case Field::Kind::pack:
            return item.packs;
        case Field::Kind::level:
        case Field::Kind::number:
            for (const double number : numbersInField(item, field))
                texts.push_back(fmt::format("{}", number));
            return texts;
        case Field::Kind::key:
            for (const IndexedTagging& tagging : item.taggings) {
                const bool isKey =
                    tagging.category == QVCategoryLoopSpecificsIdentifier &&
                    std::find(QVTagsOfKeys.begin(), QVTagsOfKeys.end(), tagging.label) != QVTagsOfKeys.end();
                if (isKey) texts.push_back(tagging.label);
            }
            return texts;
        case Field::Kind::tag:
            for (const IndexedTagging& tagging : item.taggings) {
                if (!field.of.empty() && folded(tagging.category) != field.of) continue;
                texts.push_back(tagging.label);
                texts.insert(texts.end(), tagging.ancestors.begin(), tagging.ancestors.end());
            }
            return texts;
    }
    return texts;
}

}  // namespace qvct::contentdb

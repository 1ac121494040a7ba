#include "autotagging/names/NamingHabits.h"

#include "autotagging/names/NamePieces.h"
#include "autotagging/names/NamingHabitsReader.h"
#include "platform/data/PropertyListFile.h"
#include "resources/QVCTCompiledResources.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>

namespace qvct {
namespace {

using Dictionary = PropertyList::Dictionary;

/// A phrase that is written as one piece.
NamingHabits::Word packed(NamingHabits::Word phrase) {
    phrase.pieces = 1;
    return phrase;
}

Dictionary builtInHabits() {
    return QVCTCompiledResources::NamingHabitsPlist().value_or(Dictionary{});
}

/// Those of a file, alone or added to the built-in ones; null, and an error with the line, when it has a
/// fault.
std::shared_ptr<const NamingHabits> habitsInFile(const std::string& path, Error* error) {
    auto own = readDictionaryFile(path, error);
    if (!own) return nullptr;
    std::vector<Dictionary> dictionaries;
    if (own->boolValue("Adds")) dictionaries.push_back(builtInHabits());
    dictionaries.push_back(*std::move(own));
    PropertyListPath place;
    auto habits =
        NamingHabits::initWithDictionaries(dictionaries, *TGRTTaxonomy::defaultTaxonomy(), error, &place);
    if (!habits) failInFile(path, place, error);
    return habits;
}

}  // namespace

std::span<const NamingHabits::Word> NamingHabits::wordsOfPrefix(std::string_view code) const {
    const auto found = prefixes_.find(code);
    if (found == prefixes_.end()) return {};
    return found->second;
}

const NamingHabits::Entry* NamingHabits::find(std::string_view text) const {
    const auto found = entries_.find(text);
    return found == entries_.end() ? nullptr : &found->second;
}

const NamingHabits::Word* NamingHabits::findWord(std::string_view text) const {
    constexpr std::size_t shortestWithPlural = 3;
    const Entry* entry = find(text);
    const bool isFound = entry != nullptr && entry->word.pieces > 0;
    if (isFound || text.size() <= shortestWithPlural || (!text.ends_with('s') && !text.ends_with('z')))
        return isFound ? &entry->word : nullptr;
    const Entry* singular = find(text.substr(0, text.size() - 1));
    if ((singular == nullptr || singular->word.pieces == 0) && text.ends_with("es"))
        singular = find(text.substr(0, text.size() - 2));
    return singular == nullptr || singular->word.pieces == 0 ? nullptr : &singular->word;
}

NameRole NamingHabits::roleOf(std::string_view folded) const {
    const Word* word = findWord(folded);
    return word == nullptr ? NameRole::none : word->role;
}

std::optional<int> NamingHabits::noteOf(std::string_view folded) const {
    const auto found = notes_.find(folded);
    return found == notes_.end() ? std::nullopt : std::optional(found->second);
}

NamingHabits::Word NamingHabits::wordAt(std::span<const NamePiece> pieces, std::string& buffer) const {
    const Entry* first = find(pieces.front().folded);
    const std::size_t longest = std::min<std::size_t>(first == nullptr ? 1 : first->longest, pieces.size());
    const auto phraseOf = [&](std::size_t count) -> std::string_view {
        if (count == 1) return pieces.front().folded;
        buffer = pieces.front().folded;
        for (const NamePiece& piece : pieces.subspan(1, count - 1)) buffer.append(" ").append(piece.folded);
        return buffer;
    };
    for (std::size_t count = longest; count > 0; --count) {
        const Word* found = findWord(phraseOf(count));
        if (found == nullptr) continue;
        Word word = *found;
        word.pieces = static_cast<std::uint8_t>(count);
        return word;
    }
    return {};
}

std::pair<NamingHabits::Word, NamingHabits::Word> NamingHabits::packedWords(std::string_view folded) const {
    constexpr std::size_t shortest = 3, longest = 24;
    const auto plain = [this](std::string_view text) -> const Word* {
        const Word* word = findWord(text);
        const bool isPlain = word != nullptr && word->pieces == 1 &&
                             (word->strength == NameStrength::word || word->strength == NameStrength::figure);
        return isPlain ? word : nullptr;
    };
    if (folded.size() < 2 * shortest || folded.size() > longest) return {};
    std::string phrase(folded);
    for (std::size_t at = shortest; at + shortest <= folded.size(); ++at) {
        phrase.assign(folded).insert(at, 1, ' ');
        const Word* together = findWord(phrase);
        if (together != nullptr) return {packed(*together), {}};
        const Word* first = plain(folded.substr(0, at));
        const Word* second = first == nullptr ? nullptr : plain(folded.substr(at));
        if (second != nullptr) return {*first, *second};
    }
    return {};
}

bool NamingHabits::isInstrument(const Word& word) const {
    return word.pieces == 1 && word.strength == NameStrength::word && word.meaning != Word::kNoMeaning &&
           meanings_[word.meaning].category == QVCategorySourceIdentifier;
}

NamingHabits::Word NamingHabits::nearWord(const NamePiece& piece) const {
    const std::string* known = near_.wordFor(piece.folded);
    // "FMbass" is split before the M.
    if (known == nullptr) known = near_.wordAtEndOf(piece.folded, piece.isJoined ? 1 : 2);
    if (known == nullptr) return {};
    Word word = find(*known)->word;
    word.strength = NameStrength::likeness;
    return word;
}

const NamedMeaning* NamingHabits::meaningOf(std::string_view text) const {
    NamePieces reader;
    std::string buffer;
    const auto pieces = reader.read(text);
    if (pieces.empty()) return nullptr;
    Word word = wordAt(pieces, buffer);
    if (word.pieces == 0 && pieces.size() == 1) word = packedWords(pieces.front().folded).first;
    const bool isMeant = word.pieces == pieces.size() && word.meaning != Word::kNoMeaning &&
                         word.strength != NameStrength::hint;
    return isMeant ? &meanings_[word.meaning] : nullptr;
}

std::shared_ptr<const NamingHabits> NamingHabits::initWithDictionaries(
    std::span<const PropertyList::Dictionary> dictionaries, const TGRTTaxonomy& taxonomy, Error* error,
    PropertyListPath* place) {
    return readNamingHabits(dictionaries, taxonomy, error, place);
}

ResourceFile NamingHabits::file() {
    return {"NamingHabits", "plist",
            [](const std::string& path, Error* error) { return habitsInFile(path, error) != nullptr; }};
}

std::shared_ptr<const NamingHabits> NamingHabits::defaultHabits() {
    const auto path = replacementFile(file());
    if (auto habits = path ? habitsInFile(*path, nullptr) : nullptr) return habits;
    const Dictionary own[] = {builtInHabits()};
    return initWithDictionaries(own, *TGRTTaxonomy::defaultTaxonomy());
}

}  // namespace qvct

#include "autotagging/names/NamingHabitsReader.h"

#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "autotagging/names/NamePieces.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/labels/TagNormalization.h"

#include <algorithm>
#include <array>
#include <map>
#include <set>

#include <fmt/format.h>

namespace qvct {
namespace {

using Dictionary = PropertyList::Dictionary;

constexpr std::array<std::pair<std::string_view, NameStrength>, 4> kStrengths = {
    {{"words", NameStrength::word},
     {"short", NameStrength::abbreviation},
     {"figures", NameStrength::figure},
     {"hints", NameStrength::hint}}};

/// A word that may mean more says nothing.
constexpr std::size_t kMostHints = 8;

/// Where the words of each role stand in the dictionary.
struct RoleList {
    std::string_view part;
    std::string_view key;  // empty: the part is the list itself
    NameRole role;
};
constexpr std::array<RoleList, 17> kRoleLists = {{{"Kinds", "Loop", NameRole::loop},
                                                  {"Kinds", "One Shot", NameRole::oneShot},
                                                  {"Modes", "Major", NameRole::major},
                                                  {"Modes", "Minor", NameRole::minor},
                                                  {"Modes", "Other", NameRole::scale},
                                                  {"Accidentals", "sharp", NameRole::sharp},
                                                  {"Accidentals", "flat", NameRole::flat},
                                                  {"Tempo", "", NameRole::tempo},
                                                  {"Counts", "", NameRole::count},
                                                  {"Layers", "", NameRole::layer},
                                                  {"Units", "", NameRole::unit},
                                                  {"Lengths", "Bars", NameRole::bars},
                                                  {"Lengths", "Beats", NameRole::beats},
                                                  {"Silent", "", NameRole::silent},
                                                  {"Packs", "", NameRole::pack},
                                                  {"Keys", "", NameRole::key},
                                                  {"Variants", "", NameRole::variant}}};

}  // namespace

/// Builds habits from dictionaries, entry by entry, up to the first fault.
class NamingHabitsReader {
  public:
    explicit NamingHabitsReader(const TGRTTaxonomy& taxonomy)
        : taxonomy_(taxonomy), habits_(std::make_shared<NamingHabits>()) {}

    bool add(const Dictionary& dictionary, Error* error) {
        ++source_;
        addNames(dictionary.array("Pitched"), pitched_);
        addNames(dictionary.array("Figurative"), figurative_);
        addNames(dictionary.array("Transposing"), transposing_);
        addNames(dictionary.array("Categories"), categories_);
        addNames(dictionary.array("Presets"), habits_->presets_);
        return areParts(dictionary, error) && addFolders(dictionary, error) &&
               addCombinations(dictionary, error) && addNotes(dictionary, error) &&
               addRoles(dictionary, error) && addMeanings(dictionary, error) &&
               addPrograms(dictionary, error) && addPrefixes(dictionary, error);
    }
    /// Where the fault is.
    const PropertyListPath& place() const { return place_; }

    /// The labels of the taxonomy, and the words of the keyword mapping, say themselves unless an entry says
    /// something else.
    void addOwnWords(const Dictionary& keywords) {
        for (const auto& [keyword, value] : keywords) {
            if (keyword.starts_with("regex:")) continue;
            const std::string* one = value.string();
            if (one != nullptr) addOwnWord(keyword, *one);
        }
        for (const auto& tag : taxonomy_.allTags()) addOwnWord(tag->label(), tag->label());
    }

    std::shared_ptr<const NamingHabits> finish() && {
        for (NamedMeaning& meaning : habits_->meanings_) {
            meaning.isPitched = belongsTo(pitched_, meaning.label);
            meaning.isTransposing = belongsTo(transposing_, meaning.label);
            meaning.isFigurative = belongsTo(figurative_, meaning.label);
            meaning.root = taxonomy_.findTagForLabel(meaning.label)->rootTag()->label();
            const auto found = inFolders_.find(meaning.label);
            meaning.inFolders = found == inFolders_.end() ? meaning.label : found->second;
            const auto combined = combinations_.find(meaning.label);
            if (combined != combinations_.end()) meaning.combinations = combined->second;
        }
        addNearWords();
        return std::move(habits_);
    }

  private:
    using Word = NamingHabits::Word;
    using Names = std::set<std::string>;

    template <typename Set>
    static void addNames(const PropertyList::Array* list, Set& names) {
        if (list == nullptr) return;
        for (const PropertyList& name : *list)
            if (name.string() != nullptr) names.insert(*name.string());
    }

    /// A label stands for each pair of those in its two lists.
    bool addCombinations(const Dictionary& dictionary, Error* error) {
        const Dictionary* combined = dictionary.dictionary("Combined");
        if (combined == nullptr) return true;
        return std::all_of(combined->begin(), combined->end(), [&](const auto& entry) {
            const PropertyList::Array* lists = entry.value.array();
            if (lists == nullptr || lists->size() != 2 || !isListOfTexts((*lists)[0]) ||
                !isListOfTexts((*lists)[1]))
                return refuse(error, "is no pair of lists of labels", {"Combined", entry.key});
            Names parts, others;
            addNames((*lists)[0].array(), parts);
            addNames((*lists)[1].array(), others);
            if (!taxonomy_.findTagForLabel(entry.key)) return true;
            for (const std::string& part : parts)
                for (const std::string& other : others) combinations_[part].push_back({other, entry.key});
            return true;
        });
    }

    bool refuse(Error* error, std::string reason, PropertyListPath path) {
        place_ = std::move(path);
        return failAtValue(error, kErrorMalformed, std::move(reason), place_);
    }

    /// Whether dictionaries stand where dictionaries must, and lists where lists must.
    bool areParts(const Dictionary& dictionary, Error* error) {
        for (const char* part : {"Meanings", "Kinds", "Modes", "Notes", "Accidentals", "InFolders",
                                 "Combined", "Programs", "Prefixes"}) {
            if (dictionary.value(part) != nullptr && dictionary.dictionary(part) == nullptr)
                return refuse(error, "is no dictionary", {part});
        }
        for (const char* part : {"Pitched", "Figurative", "Transposing", "Categories", "Presets"}) {
            const PropertyList* list = dictionary.value(part);
            if (list != nullptr && !isListOfTexts(*list)) return refuse(error, "is no list of texts", {part});
        }
        return true;
    }

    static bool isListOfTexts(const PropertyList& value) {
        const PropertyList::Array* list = value.array();
        return list != nullptr && std::all_of(list->begin(), list->end(),
                                              [](const auto& text) { return text.string() != nullptr; });
    }

    bool addFolders(const Dictionary& dictionary, Error* error) {
        const Dictionary* labels = dictionary.dictionary("InFolders");
        if (labels == nullptr) return true;
        for (const auto& [label, value] : *labels) {
            if (value.string() == nullptr) return refuse(error, "is no label", {"InFolders", label});
            inFolders_[label] = *value.string();
        }
        return std::all_of(labels->begin(), labels->end(), [&](const auto& entry) {
            return !leadsBack(entry.key) ||
                   refuse(error, "leads back to itself by what stands for it", {"InFolders", entry.key});
        });
    }

    bool leadsBack(const std::string& label) const {
        auto found = inFolders_.find(label);
        for (std::size_t step = 0; step < inFolders_.size() && found != inFolders_.end(); ++step) {
            if (found->second == label) return true;
            found = inFolders_.find(found->second);
        }
        return false;
    }

    bool addNotes(const Dictionary& dictionary, Error* error) {
        const Dictionary* notes = dictionary.dictionary("Notes");
        if (notes == nullptr) return true;
        return std::all_of(notes->begin(), notes->end(), [&](const auto& entry) {
            const double note = entry.value.numberValue().value_or(-1);
            if (!(note >= 0 && note <= 11))
                return refuse(error, "is no note from 0 to 11", {"Notes", entry.key});
            habits_->notes_[entry.key] = static_cast<int>(note);
            return true;
        });
    }

    bool addRoles(const Dictionary& dictionary, Error* error) {
        for (const auto& [part, key, role] : kRoleLists) {
            const Dictionary* lists = key.empty() ? &dictionary : dictionary.dictionary(part);
            const PropertyList* words = lists == nullptr ? nullptr : lists->value(key.empty() ? part : key);
            PropertyListPath path = {std::string(part)};
            if (!key.empty()) path.emplace_back(std::string(key));
            if (words != nullptr && !addAll(*words, {.role = role}, path, error)) return false;
        }
        return true;
    }

    bool addMeanings(const Dictionary& dictionary, Error* error) {
        const Dictionary* meanings = dictionary.dictionary("Meanings");
        if (meanings == nullptr) return true;
        return std::all_of(meanings->begin(), meanings->end(), [&](const auto& entry) {
            const Dictionary* lists = entry.value.dictionary();
            if (lists == nullptr) return refuse(error, "has no lists of words", {"Meanings", entry.key});
            const auto meaning = numberOf(entry.key);
            return !meaning || addMeaning(*meaning, *lists, entry.key, error);
        });
    }

    /// Of the labels of a part that are known, each with its list.
    template <typename Add>
    bool addLists(const Dictionary& dictionary, std::string_view part, Error* error, Add add) {
        const Dictionary* lists = dictionary.dictionary(part);
        if (lists == nullptr) return true;
        return std::all_of(lists->begin(), lists->end(), [&](const auto& entry) {
            if (!isListOfTexts(entry.value))
                return refuse(error, "is no list of texts", {std::string(part), entry.key});
            const auto meaning = numberOf(entry.key);
            return !meaning || add(entry.value, *meaning, entry.key);
        });
    }

    bool addPrograms(const Dictionary& dictionary, Error* error) {
        return addLists(dictionary, "Programs", error,
                        [&](const PropertyList& names, std::uint32_t meaning, const std::string& label) {
                            return addAll(names, {.meaning = meaning}, {"Programs", label}, error);
                        });
    }

    /// The first label of a code is what it says; others go with it.
    bool addPrefixes(const Dictionary& dictionary, Error* error) {
        const auto add = [&](const PropertyList& codes, std::uint32_t meaning, const std::string&) {
            for (const PropertyList& code : *codes.array()) {
                std::vector<Word>& words = habits_->prefixes_[*code.string()];
                words.push_back(
                    {.meaning = meaning,
                     .strength = words.empty() ? NameStrength::word : NameStrength::abbreviation});
            }
            return true;
        };
        return addLists(dictionary, "Prefixes", error, add);
    }

    bool addMeaning(std::uint32_t meaning, const Dictionary& lists, const std::string& entry, Error* error) {
        return std::all_of(kStrengths.begin(), kStrengths.end(), [&](const auto& strength) {
            const PropertyList* words = lists.value(strength.first);
            return words == nullptr || addAll(*words, {.meaning = meaning, .strength = strength.second},
                                              {"Meanings", entry, std::string(strength.first)}, error);
        });
    }

    /// Of the meaning that a label with or without level has; nothing when no tag has it.
    std::optional<std::uint32_t> numberOf(const std::string& text) {
        NamedMeaning meaning;
        meaning.label = labelFromString(text, &meaning.level);
        const auto tag = taxonomy_.findTagForLabel(meaning.label);
        if (!tag) return std::nullopt;
        meaning.category = tag->categoryIdentifier();
        habits_->meanings_.push_back(std::move(meaning));
        return static_cast<std::uint32_t>(habits_->meanings_.size() - 1);
    }

    bool addAll(const PropertyList& words, Word word, const PropertyListPath& path, Error* error) {
        if (!isListOfTexts(words)) return refuse(error, "is no list of texts", path);
        const PropertyList::Array& texts = *words.array();
        for (std::size_t i = 0; i < texts.size(); ++i) {
            const std::string fault = addWord(*texts[i].string(), word);
            if (fault.empty()) continue;
            PropertyListPath place = path;
            place.emplace_back(i);
            return refuse(error, fmt::format("\"{}\" {}", *texts[i].string(), fault), std::move(place));
        }
        return true;
    }

    /// What is wrong with the word; nothing when it was added.
    std::string addWord(const std::string& text, Word word) {
        NamingHabits::Entry* place = placeFor(text, word.pieces);
        if (place == nullptr) return "is no word or phrase";
        if (place->source == source_ && saysTheSame(place->word, word)) return {};
        // An instrument's string is one of several, too.
        const bool isVariant = place->source == source_ && place->word.role == NameRole::variant &&
                               place->word.meaning == Word::kNoMeaning;
        if (isVariant && word.meaning != Word::kNoMeaning) {
            word.role = NameRole::variant;
            place->word = word;
            return {};
        }
        if (place->source == source_ && place->word.strength == NameStrength::hint) {
            std::swap(place->word, word);
            std::swap(place->word.other, word.other);
        }
        if (place->source == source_ && word.strength == NameStrength::hint) {
            if (addHint(*place, word)) return {};
            return fmt::format("hints at more than {} things", kMostHints);
        }
        if (place->source == source_) {
            return place->word.meaning == Word::kNoMeaning
                       ? "stands in another entry as well"
                       : fmt::format("stands in another entry as well, for {}",
                                     habits_->meaning(place->word.meaning).label);
        }
        place->word = word;
        place->source = source_;
        return {};
    }

    bool saysTheSame(const Word& a, const Word& b) const {
        if (a.strength != b.strength || a.strength == NameStrength::hint || a.role != b.role) return false;
        if (a.meaning == b.meaning) return true;
        if (a.meaning == Word::kNoMeaning || b.meaning == Word::kNoMeaning) return false;
        const NamedMeaning& its = habits_->meanings_[a.meaning];
        const NamedMeaning& other = habits_->meanings_[b.meaning];
        return its.label == other.label && its.level == other.level;
    }

    /// A word may hint at several things besides what it says.
    bool addHint(NamingHabits::Entry& place, Word word) {
        std::uint32_t* last = &place.word.other;
        std::size_t count = 1;
        for (; *last != Word::kNoMeaning; ++count) last = &habits_->others_[*last].other;
        if (count >= kMostHints) return false;
        *last = static_cast<std::uint32_t>(habits_->others_.size());
        word.other = Word::kNoMeaning;
        habits_->others_.push_back(word);
        return true;
    }

    void addOwnWord(const std::string& text, const std::string& label) {
        Word word;
        NamingHabits::Entry* place = placeFor(text, word.pieces);
        if (place == nullptr || place->word.pieces > 0) return;
        const auto tag = taxonomy_.findTagForLabel(labelFromString(label));
        if (!tag || !categories_.contains(tag->categoryIdentifier())) return;
        if (const auto meaning = numberOf(label)) {
            word.meaning = *meaning;
            place->word = word;
        }
    }

    /// Where a word or phrase belongs, which is told by its pieces, whatever stands between them; null when
    /// it has none or too many.
    NamingHabits::Entry* placeFor(const std::string& text, std::uint8_t& count) {
        const auto pieces = pieces_.read(text);
        if (pieces.empty() || pieces.size() > NamingHabits::kMostPiecesOfPhrase) return nullptr;
        count = static_cast<std::uint8_t>(pieces.size());
        std::string phrase(pieces.front().folded);
        std::uint8_t& longest = habits_->entries_[phrase].longest;
        longest = std::max(longest, count);
        for (const NamePiece& piece : pieces.subspan(1)) phrase.append(" ").append(piece.folded);
        return &habits_->entries_[phrase];
    }

    /// In an order of their own, for that of a hash table is none.
    void addNearWords() {
        std::map<std::string_view, std::string_view> labels;
        for (const auto& [text, entry] : habits_->entries_)
            if (habits_->isInstrument(entry.word)) labels[text] = habits_->meaning(entry.word.meaning).label;
        for (const auto& [text, label] : labels) habits_->near_.add(text, label);
    }

    bool belongsTo(const Names& labels, const std::string& label) const {
        for (auto tag = taxonomy_.findTagForLabel(label); tag; tag = tag->parent())
            if (labels.contains(tag->label())) return true;
        return false;
    }

    const TGRTTaxonomy& taxonomy_;
    std::shared_ptr<NamingHabits> habits_;
    NamePieces pieces_;
    Names pitched_;
    Names figurative_;
    Names transposing_;
    Names categories_;
    std::map<std::string, std::string> inFolders_;
    std::map<std::string, std::vector<NamedMeaning::Combination>> combinations_;
    std::uint8_t source_ = 0;
    PropertyListPath place_;
};

std::shared_ptr<const NamingHabits> readNamingHabits(std::span<const PropertyList::Dictionary> dictionaries,
                                                     const TGRTTaxonomy& taxonomy, Error* error,
                                                     PropertyListPath* place) {
    NamingHabitsReader reader(taxonomy);
    for (const PropertyList::Dictionary& dictionary : dictionaries) {
        if (reader.add(dictionary, error)) continue;
        if (place != nullptr) *place = reader.place();
        return nullptr;
    }
    reader.addOwnWords(QVCTKeywordExtractor::defaultKeywordMapping());
    return std::move(reader).finish();
}

}  // namespace qvct

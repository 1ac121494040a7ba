#pragma once

#include "autotagging/names/NearWords.h"
#include "platform/base/Error.h"
#include "platform/data/PropertyList.h"
#include "platform/data/propertylist/PropertyListPlace.h"
#include "resources/ReplacementFile.h"

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace qvct {

class TGRTTaxonomy;
struct NamePiece;

/// How plainly a word says what it says.
enum class NameStrength : std::uint8_t { word, abbreviation, likeness, figure, hint };

/// A tag that a word or phrase of a name stands for.
struct NamedMeaning {
    /// What it is if another thing is said as well: a bass that is a synth is a synth bass.
    struct Combination {
        std::string with;
        std::string label;
    };

    std::string label;
    std::optional<double> level;
    std::string category;
    std::string root;            ///< The outermost of its parents, or itself.
    bool isPitched = false;      ///< Something that plays notes.
    bool isTransposing = false;  ///< An instrument that may be called by its own key ("Clarinet in Bb").
    bool isFigurative = false;   ///< Its words often only describe something else.
    std::string inFolders;       ///< The label that stands for it in a folder's name.
    std::vector<Combination> combinations;
};

/// What else a word of a name may be.
enum class NameRole : std::uint8_t {
    none,
    loop,
    oneShot,
    major,
    minor,
    scale,
    sharp,
    flat,
    tempo,
    count,
    layer,
    unit,
    bars,
    beats,
    silent,
    pack,
    key,
    variant
};

/// How people name sounds: which words, abbreviations and phrases stand for which tags, and which words say
/// what the numbers and letters beside them are. Read from property lists; see docs/formats/naming-habits.md.
///
/// Immutable, so it may be shared by threads.
class NamingHabits {
  public:
    static constexpr std::size_t kMostPiecesOfPhrase = 5;

    /// What a run of pieces says.
    struct Word {
        static constexpr std::uint32_t kNoMeaning = ~std::uint32_t{0};

        std::uint32_t meaning = kNoMeaning;  ///< For `meaning`.
        std::uint32_t other = kNoMeaning;    ///< For `other`: what it may mean as well.
        NameStrength strength = NameStrength::word;
        NameRole role = NameRole::none;
        std::uint8_t pieces = 0;  ///< That it takes.
    };

    /// For the default taxonomy: the built-in habits, those of the file that replaces them, or both together
    /// when that file says so.
    /// @cost  Some milliseconds.
    static std::shared_ptr<const NamingHabits> defaultHabits();
    /// That file. It is broken, with an error that names the line and the entry, when `initWithDictionaries`
    /// has a fault to find.
    static ResourceFile file();
    /// From dictionaries, of which a later one may give words of an earlier one another meaning. Null, with
    /// an error that names the entry and `place` set to its path, when an entry contradicts another of its
    /// own dictionary, leads back to itself, or is not what it should be. Labels that the taxonomy does not
    /// know are passed over.
    static std::shared_ptr<const NamingHabits> initWithDictionaries(
        std::span<const PropertyList::Dictionary> dictionaries, const TGRTTaxonomy& taxonomy,
        Error* error = nullptr, PropertyListPath* place = nullptr);

    const NamedMeaning& meaning(std::uint32_t index) const { return meanings_[index]; }
    const Word& other(std::uint32_t index) const { return others_[index]; }
    /// What a prefix stands for, the likeliest first; see NamePrefix. Empty when it stands for nothing.
    std::span<const Word> wordsOfPrefix(std::string_view code) const;
    /// Whether files with that extension hold what a synthesizer plays; in small letters.
    bool isOfPreset(std::string_view extension) const { return presets_.contains(extension); }
    /// Of a folded word.
    NameRole roleOf(std::string_view folded) const;
    /// The semitones above C of a note that is called by a syllable: "re".
    std::optional<int> noteOf(std::string_view folded) const;
    /// The longest word or phrase that begins with the first piece; one without pieces when none does.
    /// Plurals are found, too.
    Word wordAt(std::span<const NamePiece> pieces, std::string& buffer) const;
    /// The two words that a piece is packed together from ("snareroll"), or the one phrase ("deephouse"); the
    /// first has no pieces when it is neither.
    std::pair<Word, Word> packedWords(std::string_view folded) const;
    /// The instrument that a piece which is no word itself may stand for: a word that is shortened or
    /// misspelled ("harmnica"), or the one that it ends with ("hoarseorgan"). Without pieces when none.
    Word nearWord(const NamePiece& piece) const;

    /// What a whole text says plainly or by an abbreviation: Kick for "bd" and "bass drum". Null when it says
    /// nothing.
    const NamedMeaning* meaningOf(std::string_view text) const;

  private:
    struct Hash {
        using is_transparent = void;
        std::size_t operator()(std::string_view text) const { return std::hash<std::string_view>()(text); }
    };
    struct Entry {
        Word word;
        std::uint8_t longest = 1;  // phrase that begins with it, in pieces
        std::uint8_t source = 0;   // number of the dictionary that it comes from
    };
    using Entries = std::unordered_map<std::string, Entry, Hash, std::equal_to<>>;
    using Prefixes = std::unordered_map<std::string, std::vector<Word>, Hash, std::equal_to<>>;

    const Entry* find(std::string_view text) const;
    /// Plurals included.
    const Word* findWord(std::string_view text) const;
    /// A single word that says plainly that something is an instrument.
    bool isInstrument(const Word& word) const;

    std::vector<NamedMeaning> meanings_;
    std::vector<Word> others_;
    std::map<std::string, int, std::less<>> notes_;
    Entries entries_;
    Prefixes prefixes_;
    std::set<std::string, std::less<>> presets_;
    NearWords near_;

    friend class NamingHabitsReader;
};

}  // namespace qvct

#pragma once

#include "autotagging/evidence/SoundKind.h"
#include "autotagging/names/KeyChoice.h"
#include "autotagging/names/NamePieces.h"
#include "autotagging/names/NamedKey.h"
#include "autotagging/names/NamingHabits.h"
#include "autotagging/names/TempoChoice.h"

#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace qvct {

/// What one name says: the words that have a meaning, and what its numbers and letters are, as far as what
/// stands beside them tells.
class NameScan {
  public:
    /// A word or phrase that stands for a tag.
    struct Meant {
        NamingHabits::Word word;
        std::uint32_t offset;  ///< In the name, in bytes.
        std::uint32_t end;
        bool isOfPrefix = false;
    };
    /// Whose name it is: only an item's begins with the code of a category.
    enum class Owner : std::uint8_t { item, folder };

    /// `buffer` is for its own use.
    NameScan(const NamingHabits& habits, std::string_view name, std::span<const NamePiece> pieces,
             Owner owner, std::string& buffer);

    std::string_view name() const { return name_; }
    const std::vector<Meant>& meant() const { return meant_; }
    /// What the code says that the name begins with; it comes first in `meant`.
    std::span<const NamingHabits::Word> prefix() const { return prefix_; }
    /// Where phrases stand whose words do not mean what they say elsewhere: offset and end.
    const std::vector<std::pair<std::uint32_t, std::uint32_t>>& silences() const { return silences_; }
    /// A "Hit Loop" is a loop.
    SoundKind kind() const {
        return saysLoop_ ? SoundKind::loop : saysOneShot_ ? SoundKind::oneShot : SoundKind::unsaid;
    }
    /// It is called by its maker: a volume, a collection.
    bool isOfPack() const { return isOfPack_; }
    /// Words of three letters and more that mean nothing.
    int unknownWords() const { return unknownWords_; }
    /// How long it is: "4 bars".
    std::optional<int> bars() const { return bars_; }
    std::optional<int> beats() const { return beats_; }
    /// Nothing when the name says none, or several.
    /// `kind`: what the names around it say.
    std::optional<double> tempo(SoundKind kind = SoundKind::unsaid) const;
    /// The numbers that might be one if more spoke for it.
    std::vector<double> possibleTempos() const;
    /// The number that a folder is called by, if it stands in the name as well: "80/drm80_hat".
    std::optional<double> tempoWith(const NameScan& folder) const;
    bool mayHaveKey() const { return !keys_.empty(); }
    /// `tempo`: of what has the name.
    std::optional<NamedKey> key(std::optional<double> tempo) const;

  private:
    std::size_t readPrefix();
    std::size_t readAt(std::size_t at);
    std::size_t readWord(std::size_t at, const NamingHabits::Word& word);
    void noteKindInside(const NamePiece& piece);
    void noteKind(NameRole role);
    void addMeant(const NamingHabits::Word& word, std::uint32_t offset, std::uint32_t end);
    void addWordsIn(const NamingHabits::Word& phrase, std::span<const NamePiece> pieces);
    void noteUnit(std::size_t at, NameRole role);
    bool isOfMaker(std::uint32_t offset) const;
    std::size_t readKey(std::size_t at, const NamedKey& key);
    bool isVariantAt(std::size_t at, const NamedKey& key) const;
    bool beginsWithMode(std::span<const NamePiece> pieces) const;
    std::size_t readNumber(std::size_t at);
    std::size_t readPacked(std::size_t at);
    bool isLoop() const { return saysLoop_ || bars_ || beats_; }
    bool isTempoWord(std::size_t at) const;
    bool isMinorKey(std::size_t at) const;
    bool isSharpNote(std::size_t at) const;
    bool saysPassage() const;
    bool saysPitched() const;

    const NamingHabits& habits_;
    std::string_view name_;
    std::span<const NamePiece> pieces_;
    Owner owner_;
    std::string& buffer_;
    std::vector<Meant> meant_;
    std::vector<std::pair<std::uint32_t, std::uint32_t>> silences_;
    std::vector<ScannedKey> keys_;
    std::vector<ScannedTempo> tempos_;
    std::span<const NamingHabits::Word> prefix_;
    std::pair<std::uint32_t, std::uint32_t> makers_ = {0, 0};  // who they are is no sound
    std::optional<int> bars_, beats_;
    int unknownWords_ = 0;
    std::size_t behindNumber_ = 0;      // the piece behind the last one that was read
    std::size_t behindTempo_ = 0;       // the same of the last number with "bpm" behind it
    NameRole before_ = NameRole::none;  // of the word before the piece at hand
    bool saysLoop_ = false, saysOneShot_ = false, isOfPack_ = false, hasNote_ = false, isLayer_ = false;
    bool beginsWithNote_ = false;
};

}  // namespace qvct

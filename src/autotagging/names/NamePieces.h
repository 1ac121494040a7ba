#pragma once

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// A piece of a name, as people read it: a word, a number, a sharp or a flat sign.
struct NamePiece {
    enum class Kind : std::uint8_t { word, number, sharp, flat };

    std::string_view text;     ///< As it stands in the name.
    std::string_view folded;   ///< The same without case and diacritics.
    std::uint32_t offset = 0;  ///< Of its first byte in the name.
    Kind kind = Kind::word;
    bool isJoined = false;  ///< Nothing stands between it and the piece before.
    bool isInBrackets = false;

    bool isWord() const { return kind == Kind::word; }
    bool isLetter() const { return isWord() && text.size() == 1; }
    bool isNumber() const { return kind == Kind::number; }
    std::uint32_t end() const { return offset + static_cast<std::uint32_t>(text.size()); }
};

/// Splits a name where people see a boundary: at everything that is no letter and no digit, between letters
/// and digits, and where a small letter is followed by a capital one ("HHClosed01" is "HH", "Closed", "01",
/// and "BDs" is one piece).
///
/// An apostrophe between letters is no boundary; malformed bytes are boundaries. An object reads many names
/// without allocating anew.
/// @cost  O(bytes). What stands behind `kMostPieces` pieces is not read.
class NamePieces {
  public:
    static constexpr std::size_t kMostPieces = 64;

    /// The pieces of the name, valid until the next call and as long as `name` is.
    std::span<const NamePiece> read(std::string_view name);

  private:
    enum class Class : std::uint8_t {
        small,
        capital,
        caseless,
        digit,
        mark,
        sharp,
        flat,
        open,
        close,
        apostrophe,
        other
    };
    struct Character {
        std::uint32_t offset;
        Class kind;
    };

    static Class classOf(std::int32_t character);
    static bool isLetter(Class kind);
    void classify(std::string_view name);
    std::size_t endOfRun(std::size_t begin, Class kind) const;
    std::size_t endOfWord(std::size_t begin) const;
    void add(std::string_view name, std::size_t begin, std::size_t end, NamePiece::Kind kind,
             bool isInBrackets);
    void fold();

    std::vector<Character> characters_;  // and one behind the end
    std::vector<NamePiece> pieces_;
    std::string folded_;
    std::vector<std::size_t> ends_;  // of the pieces in it
};

/// The number that pieces begin with: up to three digits, and with the piece behind them "87.5". `name` is
/// what they were read from. REQUIRES: a piece.
std::optional<double> numberAt(std::span<const NamePiece> pieces, std::string_view name);

}  // namespace qvct

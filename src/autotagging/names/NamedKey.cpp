#include "autotagging/names/NamedKey.h"

#include "autotagging/names/NamePieces.h"
#include "autotagging/names/NamingHabits.h"

#include <array>
#include <string>
#include <string_view>

namespace qvct {
namespace {

using Pieces = std::span<const NamePiece>;

/// Of A to G, above C.
constexpr std::array<int, 7> kSemitones = {9, 11, 0, 2, 4, 5, 7};

bool consume(std::string_view& text, std::string_view start) {
    if (!text.starts_with(start)) return false;
    text.remove_prefix(start.size());
    return true;
}

bool isJoinedWord(Pieces pieces, std::size_t at) {
    return at < pieces.size() && pieces[at].isWord() && pieces[at].isJoined;
}

std::optional<NamedKey> camelotKeyAt(Pieces pieces) {
    if (!isJoinedWord(pieces, 1) || (pieces.size() > 2 && pieces[2].isJoined)) return std::nullopt;
    const std::string_view digits = pieces[0].text, letter = pieces[1].text;
    if (digits.size() > 2 || (letter != "A" && letter != "B")) return std::nullopt;
    int hour = 0;
    for (const char digit : digits) hour = hour * 10 + (digit - '0');
    if (hour < 1 || hour > 12) return std::nullopt;
    // Each hour is a fifth above the one before.
    const bool isMinor = letter == "A";
    NamedKey key;
    key.tonic = ((isMinor ? 8 : 11) + 7 * (hour - 1)) % 12;
    key.mode = isMinor ? NamedKey::Mode::minor : NamedKey::Mode::major;
    key.isCamelot = true;
    key.pieces = 2;
    return key;
}

/// Reads the parts of a key one by one.
class KeyParser {
  public:
    KeyParser(Pieces pieces, const NamingHabits& habits) : pieces_(pieces), habits_(habits) {}

    std::optional<NamedKey> parse() {
        std::string_view rest = pieces_[0].folded;
        if (const auto note = habits_.noteOf(rest)) return parseSolfege(*note);
        if (rest.front() < 'a' || rest.front() > 'g') return std::nullopt;
        // "AM" is in the morning, "DBM" somebody.
        if (pieces_[0].text.size() <= 3 && pieces_[0].text.ends_with('M')) return std::nullopt;
        key_.tonic = kSemitones[static_cast<std::size_t>(rest.front() - 'a')];
        key_.pieces = 1;
        rest.remove_prefix(1);
        if (consume(rest, "sharp")) shift(1);
        if (!key_.hasAccidental && (consume(rest, "flat") || consume(rest, "b"))) shift(-1);
        // "Csm" and "Cshm", where a name must do without "#".
        for (const std::string_view sign : {"sh", "s"}) {
            if (!rest.starts_with(sign) || !isMode(rest.substr(sign.size()))) continue;
            consume(rest, sign);
            shift(1);
        }
        if (rest == "s" && isOctaveAt(key_.pieces)) {
            consume(rest, "s");
            shift(1);
        }
        if (!rest.empty() && !takeMode(rest)) return std::nullopt;
        if (key_.mode == NamedKey::Mode::unsaid && !key_.isSpelledOut) takeFollowing();
        if (key_.mode != NamedKey::Mode::unsaid) takeFigure();
        return key_;
    }

  private:
    /// "Re menor", "sol# mayor", "Fa#": without its mode or a sign the word means too much else.
    std::optional<NamedKey> parseSolfege(int note) {
        key_.tonic = note;
        key_.pieces = 1;
        takeFollowing();
        const bool isKey = key_.isSpelledOut || (key_.hasAccidental && !key_.hasOctave);
        return isKey ? std::optional(key_) : std::nullopt;
    }

    bool isMode(std::string_view word) const {
        const NameRole role = habits_.roleOf(word);
        return word == "m" || role == NameRole::minor || role == NameRole::major;
    }

    void shift(int semitones) {
        key_.tonic = (key_.tonic + semitones + 12) % 12;
        key_.hasAccidental = true;
    }

    bool takeMode(std::string_view word) {
        if (word == "m" || word == "mi") {
            key_.mode = NamedKey::Mode::minor;
            return true;
        }
        return takeMode(habits_.roleOf(word));
    }

    bool takeMode(NameRole role) {
        if (role == NameRole::major) key_.mode = NamedKey::Mode::major;
        if (role == NameRole::minor) key_.mode = NamedKey::Mode::minor;
        key_.isSpelledOut = role == NameRole::major || role == NameRole::minor || role == NameRole::scale;
        return key_.isSpelledOut;
    }

    /// The pieces behind the letter: "#", "3", "flat", "minor", "harmonic minor".
    void takeFollowing() {
        takeSign();
        if (isOctaveAt(key_.pieces)) {
            key_.hasOctave = true;
            ++key_.pieces;
            return;
        }
        if (!key_.hasAccidental && has(key_.pieces) && next().isWord()) {
            const NameRole role = habits_.roleOf(next().folded);
            if (role == NameRole::sharp || role == NameRole::flat) {
                shift(role == NameRole::sharp ? 1 : -1);
                ++key_.pieces;
            }
        }
        if (!has(key_.pieces) || !next().isWord()) return;
        if (next().folded == "m") {
            if (next().isJoined && next().text == "m" && takeMode("m")) ++key_.pieces;
            return;
        }
        std::string buffer;
        const NamingHabits::Word word = habits_.wordAt(pieces_.subspan(key_.pieces), buffer);
        if (word.pieces > 0 && takeMode(word.role)) key_.pieces += word.pieces;
    }

    /// Of a chord: "Cm9".
    void takeFigure() {
        if (!has(key_.pieces) || !next().isJoined) return;
        for (const std::string_view figure : {"6", "7", "9", "11", "13"})
            if (next().text == figure) {
                ++key_.pieces;
                return;
            }
    }

    void takeSign() {
        if (!has(key_.pieces) || key_.hasAccidental || !next().isJoined) return;
        const bool isSharp = next().kind == NamePiece::Kind::sharp;
        if (!isSharp && next().kind != NamePiece::Kind::flat) return;
        shift(isSharp ? 1 : -1);
        ++key_.pieces;
    }

    /// "C#3", "Fs1"
    bool isOctaveAt(std::size_t at) const {
        return has(at) && pieces_[at].isJoined && pieces_[at].isNumber() && pieces_[at].text.size() == 1;
    }
    bool has(std::size_t at) const { return at < pieces_.size(); }
    const NamePiece& next() const { return pieces_[key_.pieces]; }

    Pieces pieces_;
    const NamingHabits& habits_;
    NamedKey key_;
};

}  // namespace

std::optional<NamedKey> namedKeyAt(std::span<const NamePiece> pieces, const NamingHabits& habits) {
    const NamePiece& first = pieces.front();
    std::optional<NamedKey> key;
    if (first.isNumber()) key = camelotKeyAt(pieces);
    if (first.isWord() && !first.folded.empty()) key = KeyParser(pieces, habits).parse();
    if (!key) return std::nullopt;
    key->offset = first.offset;
    key->end = pieces[key->pieces - 1].end();
    return key;
}

}  // namespace qvct

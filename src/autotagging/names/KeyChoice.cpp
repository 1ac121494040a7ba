#include "autotagging/names/KeyChoice.h"

#include <algorithm>
#include <cmath>

namespace qvct {
namespace {

class KeyChoice {
  public:
    KeyChoice(std::span<const ScannedKey> keys, const KeyContext& context) : keys_(keys), its_(context) {}

    std::optional<NamedKey> key() const {
        std::optional<NamedKey> chosen;
        for (const ScannedKey& key : keys_) {
            if (!canStand(key) || isInProgression(key)) continue;
            if (chosen && (chosen->tonic != key.key.tonic || chosen->mode != key.key.mode))
                return std::nullopt;
            chosen = key.key;
        }
        return chosen;
    }

  private:
    /// "Am F C G" are chords that follow each other.
    bool isInProgression(const ScannedKey& key) const {
        constexpr int fewest = 3;
        int count = 0;
        std::size_t end = 0;
        bool isAmong = false;
        for (const ScannedKey& other : keys_) {
            if (other.piece != end) {
                if (isAmong) break;
                count = 0;
            }
            ++count;
            end = other.piece + other.key.pieces;
            isAmong = isAmong || other.piece == key.piece;
        }
        return isAmong && count >= fewest;
    }

    /// A key stands where music is meant: beside a tempo, in what is called a loop, behind an instrument,
    /// alone in brackets or at the end; one layer of an instrument plays a note. "A Day", "Take C", "3 AM"
    /// and "Plan B" are none.
    bool canStand(const ScannedKey& key) const {
        const bool isLetter = key.key.mode == NamedKey::Mode::unsaid && !key.key.hasAccidental;
        if (its_.hasNote && (isLetter || !its_.beginsWithNote)) return false;
        if (key.isVariant || areInitials(key)) return false;
        if (key.isAnnounced) return true;
        const bool isOfMusic = its_.isLoop || its_.tempo.has_value();
        if (its_.isLayer && !isOfMusic) return false;
        const NamePiece& first = its_.pieces[key.piece];
        const std::size_t behind = key.piece + key.key.pieces;
        const bool isCapital = first.text.front() >= 'A' && first.text.front() <= 'G';
        const bool isLast = behind == its_.pieces.size();
        const bool isBehindBlank = key.piece > 0 && its_.name[first.offset - 1] == ' ';
        const bool isSetApart = first.isInBrackets ||
                                (isLast && key.piece > 0 && (!isBehindBlank || its_.hasMeaning)) ||
                                (key.piece == 0 && its_.hasPitched);
        if (key.key.isCamelot) return its_.hasNumber || first.isInBrackets;
        const bool isSyllable = its_.habits.noteOf(first.folded).has_value();
        if (key.key.isSpelledOut) return isCapital || isOfMusic || isSyllable || isSetApart;
        const bool isFolder = its_.isFolder && key.piece == 0 && isLast;
        if (key.key.mode != NamedKey::Mode::unsaid)
            return isOfMusic ||
                   (isCapital && (isSetApart || key.isBehindPitched || isFolder || isBetweenMarks(key)));
        const bool hasSign = key.key.pieces > 1 && !its_.pieces[key.piece + 1].isWord();
        const bool isSpelled = first.text.size() > 2;  // "csharp"
        if (key.key.hasAccidental)
            return isOfMusic || isSpelled || (isCapital && (isSetApart || hasSign || key.isBehindPitched));
        if (key.piece == 0) return isCapital && its_.hasPitched && isBesideTempo(key);
        if (first.isInBrackets && isLast && its_.hasPitched && its_.tempo) return isCapital;
        return (isCapital || isBesideTempo(key)) && canLetterStand(key);
    }

    /// "DB_128_Pad": who writes a name in small letters writes "Db" for the key.
    bool areInitials(const ScannedKey& key) const {
        const std::string_view text = its_.pieces[key.piece].text;
        return text.size() == 2 && text[1] == 'B' && key.key.pieces == 1 && hasLetterOf('a', 'z');
    }

    bool hasLetterOf(char first, char last) const {
        return std::any_of(its_.name.begin(), its_.name.end(),
                           [=](char letter) { return letter >= first && letter <= last; });
    }

    /// "Vox_Dm_02", but not "Who_Am_I".
    bool isBetweenMarks(const ScannedKey& key) const {
        const std::size_t behind = key.piece + key.key.pieces;
        if (key.piece == 0 || behind >= its_.pieces.size()) return false;
        const bool isVerb = its_.pieces[key.piece].folded == "am" && !its_.hasPitched;
        if (isVerb && its_.pieces[behind].isWord()) return false;
        const auto isMark = [this](std::uint32_t at) { return its_.name[at] == '_' || its_.name[at] == '-'; };
        return isMark(its_.pieces[key.piece].offset - 1) && isMark(its_.pieces[behind - 1].end());
    }

    /// "G-House", and the article in "Like A Synth" and "ALongTime".
    bool beginsWord(const ScannedKey& key) const {
        const std::size_t behind = key.piece + key.key.pieces;
        if (behind >= its_.pieces.size() || !its_.pieces[behind].isWord()) return false;
        const NamePiece& letter = its_.pieces[key.piece];
        if (its_.pieces[behind].isJoined) return true;
        if (letter.end() + 1 != its_.pieces[behind].offset) return false;
        const char mark = its_.name[letter.end()];
        const char markBefore = letter.offset > 0 ? its_.name[letter.offset - 1] : '\0';
        return (mark == '-' && markBefore != '-') || (mark == ' ' && markBefore == ' ' && letter.text == "A");
    }

    /// "Loop 01 A", "D50", "A_B": which of several, or a part of a number.
    bool numbers(const ScannedKey& key) const {
        const NamePiece& before = its_.pieces[key.piece - 1];
        const std::size_t behind = key.piece + key.key.pieces;
        const NamePiece* next = behind < its_.pieces.size() ? &its_.pieces[behind] : nullptr;
        const auto isLoneLetter = [](const NamePiece& piece) {
            return piece.isLetter() && piece.folded >= "a" && piece.folded <= "g";
        };
        const auto isTempo = [&](const NamePiece& piece) {
            const auto number = numberAt({&piece, 1}, its_.name);
            return number && its_.tempo && *number == std::floor(*its_.tempo);
        };
        if (isLoneLetter(before) || (next != nullptr && isLoneLetter(*next))) return true;
        // "80_D_125bpm"; the first ones rather tell which of several.
        const NamePiece& letter = its_.pieces[key.piece];
        const bool isBeforeTempo =
            next != nullptr && isTempo(*next) && !letter.isJoined && letter.folded > "b";
        if (before.isNumber() && !isTempo(before) && !isBeforeTempo) return true;
        return next != nullptr && next->isNumber() && next->isJoined && !isTempo(*next);
    }

    /// "bass_loop_120_g" and "choir e 140bpm", but not "how_to_be_a_120".
    bool isBesideTempo(const ScannedKey& key) const {
        const auto bpm = its_.tempo;
        const bool isOfMusic = its_.isLoop || key.isBehindPitched;
        if (!bpm || !isOfMusic || its_.pieces[key.piece].folded == "a") return false;
        const auto isTempo = [&](std::size_t at) {
            const auto number =
                at < its_.pieces.size() ? numberAt(its_.pieces.subspan(at, 1), its_.name) : std::nullopt;
            return number && *number == std::floor(*bpm);
        };
        return (key.piece > 0 && isTempo(key.piece - 1)) || isTempo(key.piece + key.key.pieces);
    }

    /// "Loop_A" and "Plan B" are variants of something; drums have no key.
    bool canLetterStand(const ScannedKey& key) const {
        const NamePiece& before = its_.pieces[key.piece - 1];
        if (its_.habits.roleOf(before.folded) == NameRole::loop || beginsWord(key) || numbers(key))
            return false;
        const bool isOfPitched = its_.hasPitched;
        const bool isLast = key.piece + key.key.pieces == its_.pieces.size();
        if (isOfPitched && (its_.isLoop || its_.tempo || (key.isBehindPitched && isLast))) return true;
        if (its_.hasMeaning && !isOfPitched) return false;
        if (its_.tempo) return true;
        const bool isSpaced =
            before.end() + 1 == its_.pieces[key.piece].offset && its_.name[before.end()] == ' ';
        return isLast && isOfPitched && !isSpaced;
    }

    std::span<const ScannedKey> keys_;
    const KeyContext& its_;
};

}  // namespace

std::optional<NamedKey> chosenKey(std::span<const ScannedKey> keys, const KeyContext& context) {
    return KeyChoice(keys, context).key();
}

}  // namespace qvct

#include "autotagging/names/NearWords.h"

#include <algorithm>
#include <bit>

namespace qvct {
namespace {

constexpr std::size_t kShortestWord = 5, kShortestPiece = 4, kLongest = 24;
constexpr std::size_t kEnding = 4;
constexpr int kTooFar = 3;

bool isLatin(std::string_view text) {
    return std::all_of(text.begin(), text.end(), [](char letter) { return letter >= 'a' && letter <= 'z'; });
}

bool isVowel(char letter) {
    return std::string_view("aeiouy").find(letter) != std::string_view::npos;
}

std::uint32_t lettersOf(std::string_view text) {
    std::uint32_t letters = 0;
    for (const char letter : text) letters |= std::uint32_t{1} << static_cast<unsigned>(letter - 'a');
    return letters;
}

/// How many consonants a word loses when nothing but letters are left out, else more than it can have. One of
/// two equal letters is no loss.
std::size_t consonantsLeftOut(std::string_view piece, std::string_view word) {
    std::size_t lost = 0, at = 0;
    for (std::size_t i = 0; i < word.size(); ++i) {
        if (at < piece.size() && piece[at] == word[i]) {
            ++at;
        } else if (!isVowel(word[i]) && (i == 0 || word[i] != word[i - 1])) {
            ++lost;
        }
    }
    return at == piece.size() ? lost : kLongest + 1;
}

/// Whether one letter is too many, another one, or two changed places; the ends are as they should be.
bool differsByALetter(std::string_view piece, std::string_view word) {
    if (piece.back() != word.back()) return false;
    const auto [a, b] = std::mismatch(piece.begin(), piece.end(), word.begin(), word.end());
    const std::string_view rest(a, piece.end()), wanted(b, word.end());
    if (piece.size() == word.size() + 1) return rest.substr(1) == wanted;
    if (piece.size() != word.size() || rest.empty()) return false;
    const bool isSwapped = rest.size() > 1 && rest[0] == wanted[1] && rest[1] == wanted[0];
    return rest.substr(1) == wanted.substr(1) || (isSwapped && rest.substr(2) == wanted.substr(2));
}

/// One of several is meant as well: "string".
std::string_view inTheSingular(std::string_view word, std::string_view piece) {
    const bool isPlural = word.ends_with('s') && !word.ends_with("ss") && !piece.ends_with('s');
    return isPlural ? word.substr(0, word.size() - 1) : word;
}

/// 0 is nearest. A short piece has all consonants of its word, which few words of other meanings share.
int farness(std::string_view piece, std::string_view word) {
    constexpr std::size_t shortestWithError = 7, shortestWithLoss = 6;
    const bool isMost = 2 * piece.size() >= word.size();
    const std::size_t lost = isMost ? consonantsLeftOut(piece, word) : kLongest + 1;
    const bool hasVowel = std::any_of(piece.begin() + 1, piece.end(), isVowel);
    if (lost == 0 && (piece.size() > kShortestPiece || !hasVowel)) return 0;
    const bool isLongStart = piece.size() > kShortestPiece || 3 * piece.size() >= 2 * word.size();
    if (isMost && isLongStart && word.starts_with(piece)) return 1;
    if (lost == 1 && piece.size() >= shortestWithLoss) return 2;
    if (piece.size() >= shortestWithError && differsByALetter(piece, word)) return 2;
    return kTooFar;
}

}  // namespace

void NearWords::add(std::string_view word, std::string_view label) {
    if (word.size() < kEnding || word.size() > kLongest || !isLatin(word)) return;
    endings_[std::string(word.substr(word.size() - kEnding))].emplace_back(word);
    if (word.size() < kShortestWord) return;
    words_[static_cast<std::size_t>(word.front() - 'a')].push_back(
        {std::string(word), std::string(label), lettersOf(word)});
}

const std::string* NearWords::wordFor(std::string_view folded) const {
    if (folded.size() < kShortestPiece || folded.size() > kLongest || !isLatin(folded)) return nullptr;
    int nearest = kTooFar;
    const Known* found = nullptr;
    bool isUnclear = false;
    const std::uint32_t letters = lettersOf(folded);
    for (const Known& known : words_[static_cast<std::size_t>(folded.front() - 'a')]) {
        if (std::popcount(letters & ~known.letters) > 1 || known.word.size() + 1 < folded.size()) continue;
        const int far = farness(folded, inTheSingular(known.word, folded));
        if (far > nearest || far == kTooFar) continue;
        isUnclear = far == nearest && (isUnclear || found->label != known.label);
        if (far < nearest) found = &known;
        nearest = far;
    }
    return isUnclear || found == nullptr ? nullptr : &found->word;
}

const std::string* NearWords::wordAtEndOf(std::string_view folded, std::size_t lettersBefore) const {
    if (folded.size() > kLongest) return nullptr;
    const std::string* found = ending(folded, lettersBefore);
    if (found != nullptr || !folded.ends_with('s')) return found;
    return ending(folded.substr(0, folded.size() - 1), lettersBefore);
}

const std::string* NearWords::ending(std::string_view folded, std::size_t lettersBefore) const {
    if (folded.size() < kEnding + lettersBefore) return nullptr;
    const auto found = endings_.find(std::string(folded.substr(folded.size() - kEnding)));
    if (found == endings_.end()) return nullptr;
    const std::string* longest = nullptr;
    for (const std::string& word : found->second) {
        const bool isAtEnd = word.size() + lettersBefore <= folded.size() && folded.ends_with(word);
        if (isAtEnd && (longest == nullptr || word.size() > longest->size())) longest = &word;
    }
    return longest;
}

}  // namespace qvct

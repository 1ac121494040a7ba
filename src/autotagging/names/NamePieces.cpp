#include "autotagging/names/NamePieces.h"

#include "platform/base/bytes/Utf8.h"
#include "platform/text/Text.h"

#include <charconv>

#include <unicode/uchar.h>

namespace qvct {

NamePieces::Class NamePieces::classOf(std::int32_t character) {
    constexpr std::int32_t sharpSign = 0x266F, flatSign = 0x266D, rightQuote = 0x2019;
    if (character >= 'a' && character <= 'z') return Class::small;
    if (character >= 'A' && character <= 'Z') return Class::capital;
    if (character >= '0' && character <= '9') return Class::digit;
    if (character == '#' || character == sharpSign) return Class::sharp;
    if (character == flatSign) return Class::flat;
    if (character == '(' || character == '[' || character == '{') return Class::open;
    if (character == ')' || character == ']' || character == '}') return Class::close;
    if (character == '\'' || character == rightQuote) return Class::apostrophe;
    if (character < 0x80) return Class::other;
    if (u_getCombiningClass(character) != 0) return Class::mark;
    if (u_isUUppercase(character)) return Class::capital;
    if (u_isULowercase(character)) return Class::small;
    return u_isalpha(character) ? Class::caseless : Class::other;
}

bool NamePieces::isLetter(Class kind) {
    return kind == Class::small || kind == Class::capital || kind == Class::caseless;
}

void NamePieces::classify(std::string_view name) {
    constexpr std::size_t longest = std::size_t{1} << 16U;
    characters_.clear();
    const auto size = static_cast<std::int32_t>(std::min(name.size(), longest));
    for (std::int32_t i = 0; i < size;) {
        const auto offset = static_cast<std::uint32_t>(i);
        characters_.push_back({offset, classOf(nextCharacter(name, i, size))});
    }
    characters_.push_back({static_cast<std::uint32_t>(size), Class::other});
    // Between letters an apostrophe belongs to the word, as an accent does.
    for (std::size_t i = 0; i + 1 < characters_.size(); ++i) {
        const bool isInside = i > 0 && isLetter(characters_[i - 1].kind) && isLetter(characters_[i + 1].kind);
        if (characters_[i].kind == Class::apostrophe)
            characters_[i].kind = isInside ? Class::mark : Class::other;
    }
}

/// Behind the characters of that class, and what combines with them.
std::size_t NamePieces::endOfRun(std::size_t begin, Class kind) const {
    std::size_t end = begin;
    while (characters_[end].kind == kind || (end > begin && characters_[end].kind == Class::mark)) ++end;
    return end;
}

std::size_t NamePieces::endOfWord(std::size_t begin) const {
    const Class first = characters_[begin].kind;
    const std::size_t end = endOfRun(begin, first);
    if (first != Class::capital || characters_[end].kind != Class::small) return end;
    const std::size_t endOfSmall = endOfRun(end, Class::small);
    if (end - begin == 1) return endOfSmall;
    const bool isPlural = endOfSmall - end == 1 && !isLetter(characters_[endOfSmall].kind);
    return isPlural ? endOfSmall : end - 1;
}

void NamePieces::add(std::string_view name, std::size_t begin, std::size_t end, NamePiece::Kind kind,
                     bool isInBrackets) {
    const std::uint32_t offset = characters_[begin].offset;
    const bool isJoined = !pieces_.empty() && pieces_.back().end() == offset;
    pieces_.push_back(
        {name.substr(offset, characters_[end].offset - offset), {}, offset, kind, isJoined, isInBrackets});
}

/// All pieces into one text, which is not moved while they are pointed into it.
void NamePieces::fold() {
    folded_.clear();
    std::vector<std::size_t>& ends = ends_;
    ends.clear();
    for (const NamePiece& piece : pieces_) {
        if (isAscii(piece.text)) {
            for (const char c : piece.text)
                if (c != '\'') folded_ += c >= 'A' && c <= 'Z' ? static_cast<char>(c | 0x20) : c;
        } else {
            folded_ += foldedWithoutDiacritics(piece.text);
        }
        ends.push_back(folded_.size());
    }
    std::size_t begin = 0;
    for (std::size_t i = 0; i < pieces_.size(); ++i) {
        pieces_[i].folded = std::string_view(folded_).substr(begin, ends[i] - begin);
        begin = ends[i];
    }
}

std::span<const NamePiece> NamePieces::read(std::string_view name) {
    pieces_.clear();
    classify(name);
    bool isInBrackets = false;
    for (std::size_t at = 0; at + 1 < characters_.size() && pieces_.size() < kMostPieces;) {
        const Class kind = characters_[at].kind;
        std::size_t end = at + 1;
        if (isLetter(kind)) {
            end = endOfWord(at);
            add(name, at, end, NamePiece::Kind::word, isInBrackets);
        } else if (kind == Class::digit) {
            end = endOfRun(at, kind);
            add(name, at, end, NamePiece::Kind::number, isInBrackets);
        } else if (kind == Class::sharp || kind == Class::flat) {
            add(name, at, end, kind == Class::sharp ? NamePiece::Kind::sharp : NamePiece::Kind::flat,
                isInBrackets);
        } else if (kind == Class::open || kind == Class::close) {
            isInBrackets = kind == Class::open;
        }
        at = end;
    }
    fold();
    return pieces_;
}

std::optional<double> numberAt(std::span<const NamePiece> pieces, std::string_view name) {
    int whole = 0;
    const NamePiece& first = pieces.front();
    const char* end = first.text.data() + first.text.size();
    if (first.text.size() > 3 || std::from_chars(first.text.data(), end, whole).ptr != end)
        return std::nullopt;
    const bool hasTenths = pieces.size() > 1 && pieces[1].isNumber() && pieces[1].offset == first.end() + 1 &&
                           (name[first.end()] == '.' || name[first.end()] == ',') &&
                           pieces[1].text.size() == 1;
    return whole + (hasTenths ? (pieces[1].text.front() - '0') / 10.0 : 0.0);
}

}  // namespace qvct

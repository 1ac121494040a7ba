#include "autotagging/keywords/KeywordExpression.h"

#include "platform/text/Text.h"

#include <algorithm>
#include <array>

namespace qvct {
namespace {

constexpr std::string_view kExpressionPrefix = "regex:";
constexpr std::string_view kMetaCharacters = "\\.[]{}()*+?^$|";
constexpr std::string_view kQuantifiers = "*+?{";

std::string_view withoutLastCharacter(std::string_view text) {
    const auto continues = [](char c) { return (static_cast<unsigned char>(c) & 0xC0U) == 0x80; };
    while (!text.empty() && continues(text.back())) text.remove_suffix(1);
    if (!text.empty()) text.remove_suffix(1);
    return text;
}

/// UTF-8 of the characters whose full case folding holds an ASCII letter (Unicode's CaseFolding.txt).
constexpr std::array<std::string_view, 19> kFoldIntoAscii = {
    "\xC3\x9F",      // sharp s: ss
    "\xC4\xB0",      // I with dot above: i and a dot
    "\xC5\x89",      // n preceded by apostrophe
    "\xC5\xBF",      // long s
    "\xC7\xB0",      // j with caron
    "\xE1\xBA\x96",  // h with line below
    "\xE1\xBA\x97",  // t with diaeresis
    "\xE1\xBA\x98",  // w with ring above
    "\xE1\xBA\x99",  // y with ring above
    "\xE1\xBA\x9A",  // a with right half ring
    "\xE1\xBA\x9E",  // capital sharp s
    "\xE2\x84\xAA",  // Kelvin sign
    "\xEF\xAC\x80",  // ff
    "\xEF\xAC\x81",  // fi
    "\xEF\xAC\x82",  // fl
    "\xEF\xAC\x83",  // ffi
    "\xEF\xAC\x84",  // ffl
    "\xEF\xAC\x85",  // long s t
    "\xEF\xAC\x86"   // st
};

bool opensAFoldingCharacter(char lead) {
    constexpr std::string_view leads = "\xC3\xC4\xC5\xC7\xE1\xE2\xEF";
    return leads.find(lead) != std::string_view::npos;
}

}  // namespace

std::string expressionForKeyword(std::string_view keyword) {
    if (keyword.starts_with(kExpressionPrefix)) return std::string(keyword.substr(kExpressionPrefix.size()));
    return "\\b" + std::string(keyword) + "\\b";
}

bool isPlainKeyword(std::string_view keyword) {
    return !keyword.empty() && !keyword.starts_with(kExpressionPrefix) && isAscii(keyword) &&
           keyword.find_first_of(kMetaCharacters) == std::string_view::npos;
}

std::string_view requiredLiteral(std::string_view keyword) {
    if (keyword.starts_with(kExpressionPrefix) || keyword.find('|') != std::string_view::npos) return {};
    const std::size_t meta = keyword.find_first_of(kMetaCharacters);
    if (meta == std::string_view::npos) return keyword;
    std::string_view literal = keyword.substr(0, meta);
    // A quantifier makes the character before it optional.
    const bool isQuantified = kQuantifiers.find(keyword[meta]) != std::string_view::npos;
    return isQuantified ? withoutLastCharacter(literal) : literal;
}

bool foldsApartFromAscii(std::string_view text) {
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (static_cast<unsigned char>(text[i]) < 0x80 || !opensAFoldingCharacter(text[i])) continue;
        const std::string_view rest = text.substr(i);
        if (std::any_of(kFoldIntoAscii.begin(), kFoldIntoAscii.end(),
                        [rest](std::string_view character) { return rest.starts_with(character); })) {
            return false;
        }
    }
    return true;
}

}  // namespace qvct

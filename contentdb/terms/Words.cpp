#include "contentdb/terms/Words.h"

#include "platform/text/Text.h"

#include <utility>

#include <unicode/uchar.h>
#include <unicode/unorm2.h>
#include <unicode/utf16.h>

namespace qvct::contentdb {
namespace {

std::u16string normalized(const UNormalizer2* form, const std::u16string& text) {
    UErrorCode status = U_ZERO_ERROR;
    std::u16string result(text.size() * 2 + 16, u'\0');
    const auto size = [&] { return static_cast<std::int32_t>(result.size()); };
    const auto length = static_cast<std::int32_t>(text.size());
    std::int32_t needed = unorm2_normalize(form, text.data(), length, result.data(), size(), &status);
    if (status == U_BUFFER_OVERFLOW_ERROR) {
        status = U_ZERO_ERROR;
        result.resize(static_cast<std::size_t>(needed));
        needed = unorm2_normalize(form, text.data(), length, result.data(), size(), &status);
    }
    if (U_FAILURE(status) != 0) return text;
    result.resize(static_cast<std::size_t>(needed));
    return result;
}

/// Case folded and decomposed, marks dropped.
std::u16string foldedWide(std::string_view text) {
    static const auto* const fold = [] {
        UErrorCode status = U_ZERO_ERROR;
        return unorm2_getNFKCCasefoldInstance(&status);
    }();
    static const auto* const decompose = [] {
        UErrorCode status = U_ZERO_ERROR;
        return unorm2_getNFDInstance(&status);
    }();
    const std::u16string wide = normalized(decompose, normalized(fold, utf16FromUtf8(text)));
    std::u16string result;
    for (std::size_t at = 0; at < wide.size();) {
        const std::size_t start = at;
        UChar32 character = 0;
        U16_NEXT(wide.data(), at, wide.size(), character);
        if (u_charType(character) != U_NON_SPACING_MARK) result.append(wide, start, at - start);
    }
    return result;
}

constexpr char lowered(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

bool isWordCharacter(char c) {
    return (c >= '0' && c <= '9') || (lowered(c) >= 'a' && lowered(c) <= 'z');
}

std::vector<std::string> asciiWords(std::string_view text) {
    std::vector<std::string> words;
    for (std::size_t at = 0; at < text.size();) {
        std::string word;
        for (; at < text.size() && isWordCharacter(text[at]); ++at) word += lowered(text[at]);
        if (!word.empty()) words.push_back(std::move(word));
        while (at < text.size() && !isWordCharacter(text[at])) ++at;
    }
    return words;
}

}  // namespace

std::string folded(std::string_view text) {
    std::string result = isAscii(text) ? std::string(text) : utf8FromUtf16(foldedWide(text));
    // A zero byte separates the parts of index terms.
    for (char& c : result) c = c == '\0' ? ' ' : lowered(c);
    return result;
}

std::vector<std::string> wordsOf(std::string_view text) {
    if (isAscii(text)) return asciiWords(text);
    const std::u16string wide = foldedWide(text);
    std::vector<std::string> words;
    std::u16string word;
    for (std::size_t at = 0; at < wide.size();) {
        const std::size_t start = at;
        UChar32 character = 0;
        U16_NEXT(wide.data(), at, wide.size(), character);
        if (u_isalnum(character) != 0) {
            word.append(wide, start, at - start);
        } else if (!word.empty()) {
            words.push_back(utf8FromUtf16(std::exchange(word, {})));
        }
    }
    if (!word.empty()) words.push_back(utf8FromUtf16(word));
    return words;
}

std::string_view wordPrefix(std::string_view word, std::size_t characters) {
    constexpr auto isContinuation = [](char c) { return (static_cast<unsigned char>(c) & 0xC0U) == 0x80U; };
    std::size_t end = 0;
    for (; characters > 0 && end < word.size(); --characters) {
        for (++end; end < word.size() && isContinuation(word[end]);) ++end;
    }
    return word.substr(0, end);
}

std::string bareName(std::string_view text) {
    std::string name;
    for (const std::string& word : wordsOf(text)) name += word;
    return name;
}

}  // namespace qvct::contentdb

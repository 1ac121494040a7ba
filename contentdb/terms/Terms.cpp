#include "contentdb/terms/Terms.h"

#include "contentdb/terms/Words.h"
#include "platform/base/bytes/ByteOrder.h"

#include <algorithm>
#include <bit>
#include <cmath>

namespace qvct::contentdb {
namespace {

constexpr unsigned kFineShift = 44;    // sign, exponent and 8 bits of the mantissa stay
constexpr unsigned kCoarseShift = 48;  // 4 bits of the mantissa stay
constexpr std::uint64_t kSign = std::uint64_t{1} << 63U;

/// Bits that sort as the numbers do.
std::uint64_t orderedBits(double value) {
    const auto bits = std::bit_cast<std::uint64_t>(value == 0 ? 0.0 : value);  // one zero
    return (bits & kSign) != 0 ? ~bits : bits | kSign;
}

double numberOfBits(std::uint64_t bits) {
    return std::bit_cast<double>((bits & kSign) != 0 ? bits & ~kSign : ~bits);
}

NumberGroup group(TermKind kind, std::string_view field, std::uint64_t code) {
    const unsigned shift = kind == TermKind::fineNumber ? kFineShift : kCoarseShift;
    // The lowest bit of a fine code tells the first number of the group from the others.
    const bool isFine = kind == TermKind::fineNumber;
    const std::uint64_t start = (isFine ? code >> 1U : code) << shift;
    const std::uint64_t end = start + ((std::uint64_t{1} << shift) - 1);
    const bool isFirstNumber = isFine && (code & 1U) == 0;
    std::string name = term(kind, field) + '\0' + bytesOf(code, 4, ByteOrder::big);
    return {std::move(name), numberOfBits(isFine && !isFirstNumber ? start + 1 : start),
            numberOfBits(isFirstNumber ? start : end)};
}

void addWords(const IndexedItem& item, std::vector<std::string>& terms) {
    for (const std::string_view text : textsOf(item)) {
        for (const std::string& word : wordsOf(text)) {
            terms.push_back(term(TermKind::word, word));
            std::size_t length = 0;
            for (std::size_t characters = 1; characters <= kLongestPrefixTerm; ++characters) {
                const std::string_view prefix = wordPrefix(word, characters);
                if (prefix.size() == length) break;
                length = prefix.size();
                terms.push_back(term(TermKind::prefix, prefix));
            }
        }
    }
}

/// Of a tag with two poles, "Bright / Dark", the one that its level is nearer to.
std::string_view saidBy(const IndexedTagging& tagging) {
    constexpr std::string_view kSlash = " / ";
    constexpr float kMiddle = 0.5F;
    const std::string_view label = tagging.label;
    const std::size_t slash = label.find(kSlash);
    if (slash == std::string_view::npos || !tagging.level) return label;
    return *tagging.level < kMiddle ? label.substr(0, slash) : label.substr(slash + kSlash.size());
}

}  // namespace

std::string term(TermKind kind, std::string_view value) {
    std::string result(1, static_cast<char>(kind));
    result += value;
    return result;
}

std::string tagTerm(std::string_view label, std::string_view category) {
    return term(TermKind::tag, folded(label)) + '\0' + folded(category);
}

std::string typeTerm(std::int64_t fileType) {
    return term(TermKind::type, std::to_string(fileType));
}

NumberGroup fineGroup(std::string_view field, double value) {
    const std::uint64_t bits = orderedBits(value);
    const bool isFirst = (bits & ((std::uint64_t{1} << kFineShift) - 1)) == 0;
    return group(TermKind::fineNumber, field, bits >> kFineShift << 1U | (isFirst ? 0U : 1U));
}

NumberGroup coarseGroup(std::string_view field, double value) {
    return group(TermKind::coarseNumber, field, orderedBits(value) >> kCoarseShift);
}

NumberGroup numberGroupOfTerm(std::string_view term) {
    const std::uint64_t code = numberOf(term.substr(term.size() - 4), ByteOrder::big);
    return group(static_cast<TermKind>(term[0]), term.substr(1, term.size() - 6), code);
}

std::vector<std::pair<std::string, double>> numbersOf(const IndexedItem& item) {
    std::vector<std::pair<std::string, double>> numbers = {{"size", static_cast<double>(item.stamp.size)}};
    for (const IndexedValue& value : item.values) {
        const auto* number = std::get_if<double>(&value.value);
        if (number != nullptr && std::isfinite(*number)) numbers.emplace_back(bareName(value.key), *number);
    }
    for (const IndexedTagging& tagging : item.taggings) {
        if (!tagging.level || !std::isfinite(*tagging.level)) continue;
        // A weight is kept in single precision; here it becomes the number that a person would write.
        constexpr double steps = 1e6;
        numbers.emplace_back(levelField(tagging.label), std::round(*tagging.level * steps) / steps);
    }
    return numbers;
}

std::string levelField(std::string_view label) {
    return "level/" + folded(label);
}

std::vector<std::string_view> textsOf(const IndexedItem& item) {
    std::vector<std::string_view> texts = {item.name, item.title, item.path};
    for (const IndexedTagging& tagging : item.taggings) {
        texts.push_back(saidBy(tagging));
        for (const std::string& ancestor : tagging.ancestors) texts.emplace_back(ancestor);
    }
    return texts;
}

std::vector<std::string> termsOf(const IndexedItem& item) {
    if (!item.failure.empty()) return {};
    std::vector<std::string> terms = {term(TermKind::everything), typeTerm(item.fileType)};
    addWords(item, terms);
    for (const IndexedTagging& tagging : item.taggings) {
        terms.push_back(tagTerm(tagging.label, tagging.category));
        for (const std::string& ancestor : tagging.ancestors)
            terms.push_back(tagTerm(ancestor, tagging.category));
    }
    for (const std::string& pack : item.packs) terms.push_back(term(TermKind::pack, folded(pack)));
    for (const auto& [field, value] : numbersOf(item)) {
        terms.push_back(fineGroup(field, value).term);
        terms.push_back(coarseGroup(field, value).term);
    }
    std::sort(terms.begin(), terms.end());
    terms.erase(std::unique(terms.begin(), terms.end()), terms.end());
    return terms;
}

}  // namespace qvct::contentdb

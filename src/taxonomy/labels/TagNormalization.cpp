#include "taxonomy/labels/TagNormalization.h"

#include "platform/text/RegularExpression.h"
#include "platform/text/Text.h"

#include <algorithm>

namespace qvct {
namespace {

using Case = RegularExpression::Case;

/// Nearly all labels are. For them it is decided here what the expressions match: the first expression that
/// is compiled takes more than a millisecond, and few programs need one.
bool isPrintableAscii(std::string_view text) {
    return std::all_of(text.begin(), text.end(), [](char c) { return c >= ' ' && c <= '~'; });
}

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}

std::size_t leadingDigits(std::string_view text) {
    return static_cast<std::size_t>(std::find_if_not(text.begin(), text.end(), isDigit) - text.begin());
}

std::size_t trailingDigits(std::string_view text) {
    return static_cast<std::size_t>(std::find_if_not(text.rbegin(), text.rend(), isDigit) - text.rbegin());
}

/// What an expression matches in a text.
struct Match {
    std::vector<std::string> groups;  // the whole first
    std::string before, behind;
};

/// Searching changes the expression's state, so each thread has its own.
std::optional<Match> firstMatch(RegularExpression& expression, std::string_view text) {
    const std::u16string wide = utf16FromUtf8(text);
    const auto part = [&wide](std::size_t start, std::size_t end) {
        return utf8FromUtf16(std::u16string_view(wide).substr(start, end - start));
    };
    const auto ranges = expression.firstMatch(wide);
    if (ranges.empty()) return std::nullopt;
    Match match{{}, part(0, ranges[0].start), part(ranges[0].end, wide.size())};
    for (const auto& range : ranges) match.groups.push_back(part(range.start, range.end));
    return match;
}

/// What stands behind "12^" at the beginning.
std::optional<std::string> behindSortingPrefix(std::string_view text) {
    if (text.find('^') == std::string_view::npos) return std::nullopt;
    if (isPrintableAscii(text)) {
        const std::size_t digits = leadingDigits(text);
        if (digits == 0 || !text.substr(digits).starts_with('^')) return std::nullopt;
        return std::string(text.substr(digits + 1));
    }
    thread_local RegularExpression expression = *RegularExpression::compile("^\\d+\\^", Case::sensitive);
    auto match = firstMatch(expression, text);
    return match ? std::optional(std::move(match->behind)) : std::nullopt;
}

/// What stands before "$4" at the end.
std::optional<std::string> beforeStepCount(std::string_view text) {
    if (text.find('$') == std::string_view::npos) return std::nullopt;
    if (isPrintableAscii(text)) {
        const std::size_t digits = trailingDigits(text);
        const std::string_view rest = text.substr(0, text.size() - digits);
        if (digits == 0 || !rest.ends_with('$')) return std::nullopt;
        return std::string(rest.substr(0, rest.size() - 1));
    }
    thread_local RegularExpression expression = *RegularExpression::compile("\\$\\d+$", Case::sensitive);
    auto match = firstMatch(expression, text);
    return match ? std::optional(std::move(match->before)) : std::nullopt;
}

/// The number at the end.
std::optional<std::string> trailingNumber(std::string_view text) {
    if (isPrintableAscii(text)) {
        const std::size_t digits = trailingDigits(text);
        return digits == 0 ? std::nullopt : std::optional(std::string(text.substr(text.size() - digits)));
    }
    thread_local RegularExpression expression = *RegularExpression::compile("\\d+$", Case::sensitive);
    auto match = firstMatch(expression, text);
    return match ? std::optional(std::move(match->groups[0])) : std::nullopt;
}

/// "label" and "0.5" of "label (0.5)".
std::optional<std::pair<std::string, std::string>> labelAndLevel(std::string_view text) {
    const std::size_t opening = text.rfind('(');
    if (opening == std::string_view::npos) return std::nullopt;
    if (isPrintableAscii(text)) {
        const std::string_view label = text.substr(0, opening), level = text.substr(opening + 1);
        const auto isOfNumber = [](char c) { return isDigit(c) || c == '.'; };
        const bool isLevel = level.size() > 1 && level.ends_with(')') &&
                             std::all_of(level.begin(), level.end() - 1, isOfNumber);
        if (!isLevel || label.size() < 2 || label.front() == ' ') return std::nullopt;
        return std::pair(std::string(label), std::string(level.substr(0, level.size() - 1)));
    }
    thread_local RegularExpression expression =
        *RegularExpression::compile("^(\\S.+)\\(([\\d.]+)\\)$", Case::insensitive);
    auto match = firstMatch(expression, text);
    if (!match) return std::nullopt;
    return std::pair(std::move(match->groups[1]), std::move(match->groups[2]));
}

/// Where "\[[\W*\w*]*\]" (or the same with braces) matches: from the first opening to the last closing one.
std::optional<std::string_view> list(std::string_view text, char opening, char closing) {
    const std::size_t start = text.find(opening);
    const std::size_t end = text.rfind(closing);
    if (start == std::string_view::npos || end == std::string_view::npos || end < start) return std::nullopt;
    return text.substr(start, end - start + 1);
}

std::optional<std::string_view> bracketList(std::string_view text) {
    return list(text, '[', ']');
}
std::optional<std::string_view> braceList(std::string_view text) {
    return list(text, '{', '}');
}

}  // namespace

std::string normalizedTagString(std::string_view raw) {
    std::string label(raw);
    for (const std::string_view marker : {"-+", "%", "!"}) {
        if (label.find(marker) != std::string::npos) label = replaceAll(label, marker, "");
    }
    if (auto behind = behindSortingPrefix(label)) label = *std::move(behind);
    if (auto before = beforeStepCount(label)) label = *std::move(before);
    for (const auto& find : {bracketList, braceList}) {
        if (const auto match = find(label))
            label.resize(static_cast<std::size_t>(match->data() - label.data()));
    }
    return label;
}

TagValueType tagValueType(std::string_view raw) {
    if (raw.ends_with("-+")) return kTagValueBipolar;
    if (raw.ends_with('%')) return kTagValuePercentage;
    if (raw.ends_with('!')) return kTagValueFlag;
    if (beforeStepCount(raw)) return kTagValueStepped;
    if (bracketList(raw)) return kTagValueStepped;
    if (braceList(raw)) return kTagValueBipolar;
    return kTagValuePlain;
}

std::int64_t numberOfTagValueSteps(std::string_view raw) {
    if (tagValueType(raw) == kTagValueStepped) {
        if (const auto digits = trailingNumber(raw)) {
            constexpr double largest = 1e15;
            return static_cast<std::int64_t>(std::min(leadingNumber(*digits), largest));
        }
    }
    const auto labels = tagStepLabels(raw);
    return labels ? static_cast<std::int64_t>(labels->size()) : 0;
}

std::optional<std::vector<std::string>> tagStepLabels(std::string_view raw) {
    auto names = bracketList(raw);
    if (!names) names = braceList(raw);
    if (names) return split(trimPunctuation(*names), ",");
    if (raw.ends_with("-+")) return split(normalizedTagString(raw), " / ");
    return std::nullopt;
}

std::string labelFromString(std::string_view text, std::optional<double>* level) {
    if (level != nullptr) level->reset();
    const std::string_view trimmed = trimBlanks(text);
    const auto parts = labelAndLevel(trimmed);
    if (!parts) return std::string(trimmed);
    if (level != nullptr) *level = leadingNumber(parts->second);
    return std::string(trimBlanks(parts->first));
}

}  // namespace qvct

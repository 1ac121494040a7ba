#include "taxonomy/TagNormalization.h"

#include "platform/text/RegularExpression.h"
#include "platform/text/Text.h"

#include <algorithm>

namespace qvct {
namespace {

using Case = RegularExpression::Case;

/// An expression that is run only on texts that contain its characteristic character, since most labels have
/// no markers.
class MarkerExpression {
  public:
    MarkerExpression(const char* pattern, char tellingCharacter, Case caseMode = Case::sensitive)
        : expression_(*RegularExpression::compile(pattern, caseMode)), tellingCharacter_(tellingCharacter) {}

    /// The matched groups, the whole first; empty when there is no match.
    std::vector<std::string> match(std::string_view text, std::string* before = nullptr,
                                   std::string* behind = nullptr) {
        std::vector<std::string> groups;
        if (text.find(tellingCharacter_) == std::string_view::npos) return groups;
        const std::u16string wide = utf16FromUtf8(text);
        const auto part = [&wide](std::size_t start, std::size_t end) {
            return utf8FromUtf16(std::u16string_view(wide).substr(start, end - start));
        };
        const auto ranges = expression_.firstMatch(wide);
        for (const auto& range : ranges) groups.push_back(part(range.start, range.end));
        if (!ranges.empty() && before != nullptr) *before = part(0, ranges[0].start);
        if (!ranges.empty() && behind != nullptr) *behind = part(ranges[0].end, wide.size());
        return groups;
    }

  private:
    RegularExpression expression_;
    char tellingCharacter_;
};

// Searching changes an expression's state, so each thread has its own.
MarkerExpression& sortingPrefix() {
    thread_local MarkerExpression expression("^\\d+\\^", '^');
    return expression;
}

MarkerExpression& stepCount() {
    thread_local MarkerExpression expression("\\$\\d+$", '$');
    return expression;
}

MarkerExpression& labelWithLevel() {
    thread_local MarkerExpression expression("^(\\S.+)\\(([\\d.]+)\\)$", '(', Case::insensitive);
    return expression;
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
    if (std::string behind; !sortingPrefix().match(label, nullptr, &behind).empty()) label = behind;
    if (std::string before; !stepCount().match(label, &before).empty()) label = before;
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
    if (!stepCount().match(raw).empty()) return kTagValueStepped;
    if (bracketList(raw)) return kTagValueStepped;
    if (braceList(raw)) return kTagValueBipolar;
    return kTagValuePlain;
}

std::int64_t numberOfTagValueSteps(std::string_view raw) {
    if (tagValueType(raw) == kTagValueStepped) {
        thread_local RegularExpression trailingNumber = *RegularExpression::compile("\\d+$", Case::sensitive);
        const std::u16string wide = utf16FromUtf8(raw);
        if (const auto match = trailingNumber.firstMatch(wide); !match.empty()) {
            const std::u16string digits = wide.substr(match[0].start, match[0].end - match[0].start);
            constexpr double largest = 1e15;
            return static_cast<std::int64_t>(std::min(leadingNumber(utf8FromUtf16(digits)), largest));
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
    const std::vector<std::string> groups = labelWithLevel().match(trimmed);
    if (groups.empty()) return std::string(trimmed);
    if (level != nullptr) *level = leadingNumber(groups[2]);
    return std::string(trimBlanks(groups[1]));
}

}  // namespace qvct

#include "autotagging/scripts/RegularExpressionGuard.h"

#include <algorithm>
#include <array>
#include <memory>
#include <utility>

#include <unicode/uregex.h>

namespace qvct {
namespace {

using Deadline = std::chrono::steady_clock::time_point;

/// A number of steps that an engine takes in a few hundredths of a second.
constexpr double kHarmlessSteps = 1e7;
/// Bytes that ICU may use for backtracking.
constexpr int32_t kBacktrackingStack = 64 << 20;

struct Closer {
    void operator()(URegularExpression* expression) const { uregex_close(expression); }
};

/// The form of a pattern, as far as it decides how the number of steps grows with the text's length.
struct Choices {
    int count = 0;           // of quantifiers and alternatives
    bool areNested = false;  // a quantifier applies to a group
};

Choices choicesOf(std::u16string_view pattern) {
    Choices choices;
    bool isInClass = false;
    for (std::size_t i = 0; i < pattern.size(); ++i) {
        const char16_t c = pattern[i];
        if (c == u'\\') {
            ++i;
        } else if (isInClass) {
            isInClass = c != u']';
        } else if (c == u'[') {
            isInClass = true;
        } else if (c == u'*' || c == u'+' || c == u'{' || c == u'|' ||
                   (c == u'?' && (i == 0 || pattern[i - 1] != u'('))) {
            ++choices.count;
            choices.areNested |= c != u'|' && i > 0 && pattern[i - 1] == u')';
        }
    }
    return choices;
}

bool isHarmless(std::u16string_view pattern, std::size_t textLength) {
    const Choices choices = choicesOf(pattern);
    if (choices.areNested) return false;
    double steps = static_cast<double>(pattern.size());
    const double length = static_cast<double>(std::max<std::size_t>(textLength, 2));
    for (int i = 0; i <= choices.count && steps <= kHarmlessSteps; ++i) steps *= length;
    return steps <= kHarmlessSteps;
}

/// Writes one pattern in ICU's notation.
class Translation {
  public:
    Translation(std::u16string_view pattern, bool isMultiline) : rest_(pattern), isMultiline_(isMultiline) {}

    std::u16string run() {
        while (!rest_.empty()) {
            const char16_t c = take();
            if (c == u'\\') {
                escape();
            } else if (isInClass_) {
                inClass(c);
            } else if (c == u'[') {
                openClass();
            } else if (c == u'$' && !isMultiline_) {
                out_ += u"\\z";
            } else {
                out_ += c;
            }
        }
        return std::move(out_);
    }

  private:
    char16_t take() {
        const char16_t c = rest_.front();
        rest_.remove_prefix(1);
        return c;
    }

    bool take(std::u16string_view token) {
        if (!rest_.starts_with(token)) return false;
        rest_.remove_prefix(token.size());
        return true;
    }

    void openClass() {
        if (take(u"^]")) {
            out_ += u"[\\s\\S]";
        } else if (take(u"]")) {
            out_ += u"(?!)";
        } else {
            isInClass_ = true;
            out_ += u'[';
        }
    }

    void inClass(char16_t c) {
        if (c == u'[' || c == u'&') out_ += u'\\';
        out_ += c;
        isInClass_ = c != u']';
    }

    /// Spelled out, since ICU's own classes contain more than ASCII.
    void escape() {
        if (rest_.empty()) return;
        const char16_t c = take();
        constexpr std::array<std::pair<char16_t, std::u16string_view>, 6> fixed = {{{u'd', u"[0-9]"},
                                                                                    {u'D', u"[^0-9]"},
                                                                                    {u'w', u"[A-Za-z0-9_]"},
                                                                                    {u'W', u"[^A-Za-z0-9_]"},
                                                                                    {u'v', u"\\x0B"},
                                                                                    {u'0', u"\\x00"}}};
        const auto* known =
            std::find_if(fixed.begin(), fixed.end(), [c](const auto& entry) { return entry.first == c; });
        if (known != fixed.end()) {
            out_ += known->second;
        } else if (c == u'b') {
            out_ += isInClass_ ? u"\\x08" : u"\\b";
        } else if (c == u'u') {
            out_ += take(u"{") ? u"\\x{" : u"\\u";
        } else {
            out_ += {u'\\', c};
        }
    }

    std::u16string_view rest_;
    bool isMultiline_;
    bool isInClass_ = false;
    std::u16string out_;
};

UBool isInTime(const void* deadline, int32_t /*steps*/) {
    return static_cast<UBool>(std::chrono::steady_clock::now() < *static_cast<const Deadline*>(deadline));
}

bool has(std::u16string_view flags, char16_t flag) {
    return flags.find(flag) != std::u16string_view::npos;
}

uint32_t icuFlags(std::u16string_view flags) {
    uint32_t bits = 0;
    if (has(flags, u'i')) bits |= UREGEX_CASE_INSENSITIVE;
    if (has(flags, u'm')) bits |= UREGEX_MULTILINE;
    if (has(flags, u's')) bits |= UREGEX_DOTALL;
    return bits;
}

}  // namespace

std::u16string icuPattern(std::u16string_view pattern, bool isMultiline) {
    return Translation(pattern, isMultiline).run();
}

bool isRegularExpressionBounded(std::u16string_view pattern, std::u16string_view flags,
                                std::u16string_view text, std::size_t start, Deadline deadline) {
    start = std::min(start, text.size());
    if (isHarmless(pattern, text.size() - start)) return true;
    if (has(flags, u'v')) return false;
    const std::u16string translated = icuPattern(pattern, has(flags, u'm'));
    UErrorCode status = U_ZERO_ERROR;
    const std::unique_ptr<URegularExpression, Closer> expression(uregex_open(
        translated.data(), static_cast<int32_t>(translated.size()), icuFlags(flags), nullptr, &status));
    uregex_setStackLimit(expression.get(), kBacktrackingStack, &status);
    uregex_setMatchCallback(expression.get(), isInTime, &deadline, &status);
    uregex_setText(expression.get(), text.data(), static_cast<int32_t>(text.size()), &status);
    uregex_find(expression.get(), static_cast<int32_t>(start), &status);
    return U_SUCCESS(status) != 0;
}

}  // namespace qvct

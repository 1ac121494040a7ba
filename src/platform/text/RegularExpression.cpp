#include "platform/text/RegularExpression.h"

#include "platform/text/Text.h"

#include <fmt/format.h>
#include <unicode/uregex.h>

namespace qvct {
namespace {

/// In ICU's units of about a millisecond each.
constexpr int32_t kTimeLimit = 1000;

struct Closer {
    void operator()(URegularExpression* expression) const { uregex_close(expression); }
};

}  // namespace

struct RegularExpression::Implementation {
    std::string pattern;
    std::unique_ptr<URegularExpression, Closer> expression;

    bool find(std::u16string_view text, Error* error = nullptr) {
        UErrorCode status = U_ZERO_ERROR;
        uregex_setText(expression.get(), text.data(), static_cast<int32_t>(text.size()), &status);
        const bool found = uregex_findNext(expression.get(), &status) != 0;
        if (U_SUCCESS(status)) return found;
        const char* reason = status == U_REGEX_TIME_OUT ? "takes too long" : u_errorName(status);
        return fail(
            error, kErrorTooLarge, reason,
            {.part = fmt::format("regular expression \"{}\" on \"{}\"", pattern, utf8FromUtf16(text))});
    }
};

RegularExpression::RegularExpression(std::unique_ptr<Implementation> implementation)
    : implementation_(std::move(implementation)) {}
RegularExpression::RegularExpression(RegularExpression&&) noexcept = default;
RegularExpression& RegularExpression::operator=(RegularExpression&&) noexcept = default;
RegularExpression::~RegularExpression() = default;

std::optional<RegularExpression> RegularExpression::compile(std::string_view pattern, Case caseMode,
                                                            Error* error) {
    const std::u16string wide = utf16FromUtf8(pattern);
    const uint32_t flags = caseMode == Case::insensitive ? UREGEX_CASE_INSENSITIVE : 0;
    UParseError place{};
    UErrorCode status = U_ZERO_ERROR;
    auto made = std::make_unique<Implementation>();
    made->pattern = pattern;
    made->expression.reset(
        uregex_open(wide.data(), static_cast<int32_t>(wide.size()), flags, &place, &status));
    if (U_FAILURE(status)) {
        fail(error, kErrorMalformed, u_errorName(status),
             {.part = fmt::format("regular expression \"{}\", character {}", pattern, place.offset)});
        return std::nullopt;
    }
    uregex_setTimeLimit(made->expression.get(), kTimeLimit, &status);
    return RegularExpression(std::move(made));
}

bool RegularExpression::occursIn(std::u16string_view text, Error* error) {
    return implementation_->find(text, error);
}

std::vector<RegularExpression::Range> RegularExpression::firstMatch(std::u16string_view text) {
    std::vector<Range> ranges;
    if (!implementation_->find(text)) return ranges;
    UErrorCode status = U_ZERO_ERROR;
    URegularExpression* expression = implementation_->expression.get();
    const int32_t groups = uregex_groupCount(expression, &status);
    for (int32_t group = 0; group <= groups; ++group) {
        const int32_t start = uregex_start(expression, group, &status);
        const int32_t end = uregex_end(expression, group, &status);
        if (start < 0) {
            ranges.push_back({});
        } else {
            ranges.push_back({static_cast<std::size_t>(start), static_cast<std::size_t>(end)});
        }
    }
    return ranges;
}

}  // namespace qvct

#include "platform/text/DecimalFormatter.h"

#include "platform/text/Text.h"

#include <unicode/numberformatter.h>

namespace qvct {

struct DecimalFormatter::Implementation {
    icu::number::LocalizedNumberFormatter formatter;
};

DecimalFormatter::DecimalFormatter(int fractionDigits)
    : implementation_(std::make_unique<Implementation>(
          Implementation{icu::number::NumberFormatter::withLocale(icu::Locale(userLocaleName().c_str()))
                             .precision(icu::number::Precision::fixedFraction(fractionDigits))
                             .grouping(UNUM_GROUPING_OFF)})) {}

DecimalFormatter::DecimalFormatter(DecimalFormatter&&) noexcept = default;
DecimalFormatter& DecimalFormatter::operator=(DecimalFormatter&&) noexcept = default;
DecimalFormatter::~DecimalFormatter() = default;

std::string DecimalFormatter::stringFromNumber(double number) const {
    UErrorCode status = U_ZERO_ERROR;
    std::string text;
    implementation_->formatter.formatDouble(number, status).toString(status).toUTF8String(text);
    return text;
}

}  // namespace qvct

#include "platform/data/propertylist/XmlPropertyListValues.h"

#include "platform/data/propertylist/PropertyListGuard.h"
#include "platform/text/Text.h"

#include <array>
#include <charconv>
#include <chrono>
#include <clocale>
#include <cstdint>
#include <cstdlib>
#include <string>

namespace qvct {
namespace {

/// Takes a number from the front of the text. Whether there is one.
template <typename Number, typename... Options>
bool takeNumber(std::string_view& text, Number& number, Options... options) {
    const auto [end, status] = std::from_chars(text.data(), text.data() + text.size(), number, options...);
    text.remove_prefix(static_cast<std::size_t>(end - text.data()));
    return status == std::errc{};
}

/// What a digit of base 64 stands for; 64 for what is none.
constexpr std::array<std::uint8_t, 256> kBase64 = [] {
    std::array<std::uint8_t, 256> values{};
    values.fill(64);
    std::uint8_t value = 0;
    for (const char c : std::string_view("ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/"))
        values[static_cast<unsigned char>(c)] = value++;
    return values;
}();

std::uint8_t base64(char c) {
    return kBase64[static_cast<unsigned char>(c)];
}

}  // namespace

std::optional<PropertyList> integerInXml(std::string_view text) {
    const bool isNegative = text.starts_with('-');
    if (isNegative || text.starts_with('+')) text.remove_prefix(1);
    const bool isHexadecimal = text.starts_with("0x") || text.starts_with("0X");
    if (isHexadecimal) text.remove_prefix(2);
    std::uint64_t magnitude = 0;
    if (!takeNumber(text, magnitude, isHexadecimal ? 16 : 10) || !text.empty()) return std::nullopt;
    if (!isNegative) return magnitude;
    if (magnitude > 1ULL << 63U) return std::nullopt;
    return static_cast<std::int64_t>(0 - magnitude);
}

std::optional<PropertyList> realInXml(std::string_view text) {
    const bool hasPlus = text.starts_with('+');
    if (hasPlus) text.remove_prefix(1);
    double number = 0;
    const auto [end, status] = std::from_chars(text.data(), text.data() + text.size(), number);
    const bool isNumber = status != std::errc::invalid_argument && end == text.data() + text.size();
    if (!isNumber || (hasPlus && text.starts_with('-'))) return std::nullopt;
    static const locale_t plain = newlocale(LC_ALL_MASK, "C", nullptr);
    return status == std::errc{} ? number : strtod_l(std::string(text).c_str(), nullptr, plain);
}

std::optional<PropertyList> dateInXml(std::string_view text) {
    std::array<unsigned, 6> fields{};
    constexpr std::string_view separators = "--T::Z";
    for (std::size_t i = 0; i < fields.size(); ++i) {
        if (!takeNumber(text, fields[i]) || !text.starts_with(separators[i])) return std::nullopt;
        text.remove_prefix(1);
    }
    using namespace std::chrono;
    const auto [y, m, d, hour, minute, second] = fields;
    if (!text.empty() || y > 9999 || m > 12 || d > 31 || hour > 23 || minute > 59 || second > 60)
        return std::nullopt;
    const year_month_day day(year(static_cast<int>(y)), month(m), std::chrono::day(d));
    const duration<double> sinceReference =
        sys_days(day) - sys_days(year(2001) / January / 1) + hours(hour) + minutes(minute) + seconds(second);
    if (!day.ok() || !isPropertyListDate(sinceReference.count())) return std::nullopt;
    return PropertyList::Date{sinceReference.count()};
}

std::optional<PropertyList> dataInXml(std::string_view digits) {
    const std::size_t count = digits.find_last_not_of('=') + 1;
    const std::size_t padding = digits.size() - count;
    const std::size_t lastGroup = count % 4;
    const bool isPadded = padding == 0 || (lastGroup > 1 && padding == 4 - lastGroup);
    digits = digits.substr(0, count);
    if (lastGroup == 1 || !isPadded || digits.find('=') != std::string_view::npos) return std::nullopt;
    PropertyList::Data bytes;
    bytes.reserve(count / 4 * 3 + 2);
    unsigned bits = 0;
    for (std::size_t i = 0; i < count; ++i) {
        bits = bits << 6U | base64(digits[i]);
        if (i % 4 > 0) bytes.push_back(static_cast<std::uint8_t>(bits >> (6 - 2 * (i % 4))));
    }
    return bytes;
}

bool isBase64(char c) {
    return base64(c) < 64 || c == '=' || isAsciiBlank(c);
}

}  // namespace qvct

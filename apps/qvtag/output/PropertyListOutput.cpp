#include "output/PropertyListOutput.h"

#include "platform/text/Text.h"

#include <algorithm>
#include <chrono>
#include <cmath>

#include <fmt/chrono.h>
#include <fmt/format.h>

namespace qvct::tool {
namespace {

std::string textOfData(const PropertyList::Data& data) {
    constexpr std::size_t most = 16;
    std::string digits;
    for (std::size_t i = 0; i < std::min(most, data.size()); ++i) digits += fmt::format("{:02x}", data[i]);
    return fmt::format("{} bytes: {}{}", data.size(), digits, data.size() > most ? "..." : "");
}

std::string textOfDate(const PropertyList::Date& date) {
    constexpr double referenceDate = 978307200;  // 2001 in the system's count from 1970
    constexpr double furthest = 1e11;            // seconds; some three thousand years
    if (!(std::abs(date.secondsSinceReferenceDate) < furthest)) {
        return fmt::format("{} seconds from 2001", date.secondsSinceReferenceDate);
    }
    const auto seconds = static_cast<std::time_t>(std::floor(date.secondsSinceReferenceDate + referenceDate));
    return fmt::format("{:%Y-%m-%dT%H:%M:%SZ}", fmt::gmtime(seconds));
}

}  // namespace

Json jsonOfPropertyList(const PropertyList& value) {
    if (const auto* dictionary = value.dictionary()) {
        Json json = Json::object();
        for (const auto& entry : *dictionary) append(json, entry.key, jsonOfPropertyList(entry.value));
        return json;
    }
    if (const auto* array = value.array()) {
        Json json = Json::array();
        for (const PropertyList& item : *array) json.push_back(jsonOfPropertyList(item));
        return json;
    }
    if (const bool* flag = value.boolean()) return *flag;
    if (const auto* number = value.signedInteger()) return *number;
    if (const auto* number = value.unsignedInteger()) return *number;
    if (const double* number = value.real()) return *number;
    if (const std::string* text = value.string()) return *text;
    return textOfPropertyList(value);
}

std::string textOfPropertyList(const PropertyList& value) {
    if (const auto* dictionary = value.dictionary()) return fmt::format("{} entries", dictionary->size());
    if (const auto* array = value.array()) return counted(array->size(), "item");
    if (const std::string* text = value.string()) return printable(*text);
    if (const auto* data = value.data()) return textOfData(*data);
    if (const auto* date = value.date()) return textOfDate(*date);
    if (const auto* uid = value.uid()) return fmt::format("reference {}", uid->value);
    return jsonText(jsonOfPropertyList(value), true);
}

}  // namespace qvct::tool

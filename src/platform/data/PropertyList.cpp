#include "platform/data/PropertyList.h"

#include "platform/text/Text.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace qvct {

PropertyList::Dictionary::Dictionary() = default;
PropertyList::Dictionary::Dictionary(std::initializer_list<Entry> entries) : entries_(entries) {}
PropertyList::Dictionary::Dictionary(const Dictionary&) = default;
PropertyList::Dictionary::Dictionary(Dictionary&&) noexcept = default;
PropertyList::Dictionary& PropertyList::Dictionary::operator=(const Dictionary&) = default;
PropertyList::Dictionary& PropertyList::Dictionary::operator=(Dictionary&&) noexcept = default;
PropertyList::Dictionary::~Dictionary() = default;

const PropertyList* PropertyList::Dictionary::value(std::string_view key) const {
    const auto hit =
        std::find_if(entries_.begin(), entries_.end(), [key](const Entry& e) { return e.key == key; });
    return hit == entries_.end() ? nullptr : &hit->value;
}

PropertyList* PropertyList::Dictionary::value(std::string_view key) {
    return const_cast<PropertyList*>(std::as_const(*this).value(key));
}

const PropertyList::Dictionary* PropertyList::Dictionary::dictionary(std::string_view key) const {
    const PropertyList* found = value(key);
    return found == nullptr ? nullptr : found->dictionary();
}

const PropertyList::Array* PropertyList::Dictionary::array(std::string_view key) const {
    const PropertyList* found = value(key);
    return found == nullptr ? nullptr : found->array();
}

const std::string* PropertyList::Dictionary::string(std::string_view key) const {
    const PropertyList* found = value(key);
    return found == nullptr ? nullptr : found->string();
}

const PropertyList::Data* PropertyList::Dictionary::data(std::string_view key) const {
    const PropertyList* found = value(key);
    return found == nullptr ? nullptr : found->data();
}

std::optional<double> PropertyList::Dictionary::doubleValue(std::string_view key) const {
    const PropertyList* found = value(key);
    return found == nullptr ? std::nullopt : found->doubleValue();
}

std::optional<std::int64_t> PropertyList::Dictionary::integerValue(std::string_view key) const {
    const PropertyList* found = value(key);
    return found == nullptr ? std::nullopt : found->integerValue();
}

bool PropertyList::Dictionary::boolValue(std::string_view key) const {
    const PropertyList* found = value(key);
    return found != nullptr && found->boolValue();
}

void PropertyList::Dictionary::set(std::string_view key, PropertyList newValue) {
    if (PropertyList* present = value(key)) {
        *present = std::move(newValue);
    } else {
        append(std::string(key), std::move(newValue));
    }
}

void PropertyList::Dictionary::append(std::string key, PropertyList newValue) {
    entries_.push_back(Entry{std::move(key), std::move(newValue)});
}

void PropertyList::Dictionary::reserve(std::size_t entries) {
    entries_.reserve(entries);
}

bool PropertyList::Dictionary::remove(std::string_view key) {
    return std::erase_if(entries_, [key](const Entry& e) { return e.key == key; }) > 0;
}

std::size_t PropertyList::Dictionary::size() const {
    return entries_.size();
}
const PropertyList::Entry* PropertyList::Dictionary::begin() const {
    return entries_.data();
}
const PropertyList::Entry* PropertyList::Dictionary::end() const {
    return entries_.data() + entries_.size();
}

bool PropertyList::Dictionary::operator==(const Dictionary& other) const {
    return size() == other.size() && std::all_of(begin(), end(), [&other](const Entry& entry) {
               const PropertyList* theirs = other.value(entry.key);
               return theirs != nullptr && *theirs == entry.value;
           });
}

PropertyList::PropertyList(std::uint64_t value) {
    constexpr auto largestSigned = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());
    if (value <= largestSigned) {
        value_ = static_cast<std::int64_t>(value);
    } else {
        value_ = value;
    }
}

bool PropertyList::isNumber() const {
    return boolean() != nullptr || signedInteger() != nullptr || unsignedInteger() != nullptr ||
           real() != nullptr;
}

std::optional<double> PropertyList::doubleValue() const {
    if (const double* number = real()) return *number;
    if (const std::int64_t* number = signedInteger()) return static_cast<double>(*number);
    if (const std::uint64_t* number = unsignedInteger()) return static_cast<double>(*number);
    if (const bool* flag = boolean()) return *flag ? 1.0 : 0.0;
    if (const std::string* text = string()) return leadingNumber(*text);
    return std::nullopt;
}

std::optional<std::int64_t> PropertyList::integerValue() const {
    using Limits = std::numeric_limits<std::int64_t>;
    if (const std::int64_t* number = signedInteger()) return *number;
    if (unsignedInteger() != nullptr) return Limits::max();
    const std::optional<double> number = doubleValue();
    if (!number) return std::nullopt;
    if (std::isnan(*number)) return 0;
    if (*number >= 0x1p63) return Limits::max();
    if (*number <= -0x1p63) return Limits::min();
    return static_cast<std::int64_t>(*number);
}

std::optional<double> PropertyList::numberValue() const {
    const std::string* text = string();
    return text != nullptr ? numberIn(*text) : doubleValue();
}

bool PropertyList::boolValue() const {
    if (const std::string* text = string()) {
        const std::size_t first = text->find_first_not_of(" \t+-0");
        return first != std::string::npos &&
               std::string_view("YyTt123456789").find((*text)[first]) != std::string_view::npos;
    }
    const std::optional<double> number = doubleValue();
    return number && *number != 0;
}

bool PropertyList::operator==(const PropertyList& other) const {
    const bool bothNumbers =
        isNumber() && other.isNumber() && (boolean() == nullptr) == (other.boolean() == nullptr);
    if (bothNumbers && value_.index() != other.value_.index()) return doubleValue() == other.doubleValue();
    return value_ == other.value_;
}

}  // namespace qvct

#pragma once

#include "platform/base/Export.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

namespace qvct {

/// A value of a property list: a dictionary, array, string, number, boolean, date, data or keyed-archive UID.
///
/// Values are deep: a copy shares nothing with its source. Dictionaries keep the order of the file, then of
/// insertion. Equality is by value: dictionaries compare without regard to order, numbers by their numeric
/// value whatever their type (0 equals 0.0), booleans only equal booleans.
class QVCT_API PropertyList {
  public:
    struct Entry;
    using Array = std::vector<PropertyList>;
    using Data = std::vector<std::uint8_t>;

    /// Seconds since 2001-01-01 00:00:00 UTC.
    struct Date {
        double secondsSinceReferenceDate = 0;
        bool operator==(const Date&) const = default;
    };
    /// A reference inside a keyed archive.
    struct Uid {
        std::uint64_t value = 0;
        bool operator==(const Uid&) const = default;
    };

    /// Keys and values in their order. Lookups are linear: the dictionaries of this field are small.
    class Dictionary {
      public:
        Dictionary();
        /// Takes the entries as they are; their keys must differ.
        Dictionary(std::initializer_list<Entry> entries);
        /// @{
        /// Copies are deep.
        Dictionary(const Dictionary&);
        Dictionary(Dictionary&&) noexcept;
        Dictionary& operator=(const Dictionary&);
        Dictionary& operator=(Dictionary&&) noexcept;
        /// @}
        ~Dictionary();

        /// @{
        /// The value under `key`, or null. Valid until the dictionary changes.
        const PropertyList* value(std::string_view key) const;
        PropertyList* value(std::string_view key);
        /// @}
        /// @{
        /// What stands under `key`, if it is of that type (see PropertyList's operations of these names);
        /// else null, nothing or false.
        const Dictionary* dictionary(std::string_view key) const;
        const Array* array(std::string_view key) const;
        const std::string* string(std::string_view key) const;
        const Data* data(std::string_view key) const;
        std::optional<double> doubleValue(std::string_view key) const;
        std::optional<std::int64_t> integerValue(std::string_view key) const;
        bool boolValue(std::string_view key) const;
        /// @}
        /// Replaces the value under `key` where it stands, or appends it.
        void set(std::string_view key, PropertyList value);
        /// Appends without looking for `key`, which the caller knows to be absent.
        void append(std::string key, PropertyList value);
        /// Makes room for that many entries.
        void reserve(std::size_t entries);
        /// Whether there was such a key.
        bool remove(std::string_view key);

        std::size_t size() const;
        bool empty() const { return size() == 0; }
        const Entry* begin() const;
        const Entry* end() const;
        bool operator==(const Dictionary& other) const;

      private:
        std::vector<Entry> entries_;
    };

    /// @{
    /// The value as a property list. Unsigned integers that fit are held signed.
    PropertyList(bool value) : value_(value) {}
    PropertyList(int value) : value_(std::int64_t{value}) {}
    PropertyList(std::int64_t value) : value_(value) {}
    PropertyList(std::uint64_t value);
    PropertyList(double value) : value_(value) {}
    PropertyList(const char* value) : value_(std::string(value)) {}
    PropertyList(std::string_view value) : value_(std::string(value)) {}
    PropertyList(std::string value) : value_(std::move(value)) {}
    PropertyList(Array value) : value_(std::move(value)) {}
    PropertyList(Dictionary value) : value_(std::move(value)) {}
    PropertyList(Data value) : value_(std::move(value)) {}
    PropertyList(Date value) : value_(value) {}
    PropertyList(Uid value) : value_(value) {}
    /// @}

    /// @{
    /// The value if it is of that type, else null.
    const Dictionary* dictionary() const { return std::get_if<Dictionary>(&value_); }
    Dictionary* dictionary() { return std::get_if<Dictionary>(&value_); }
    const Array* array() const { return std::get_if<Array>(&value_); }
    Array* array() { return std::get_if<Array>(&value_); }
    const std::string* string() const { return std::get_if<std::string>(&value_); }
    const Data* data() const { return std::get_if<Data>(&value_); }
    const Date* date() const { return std::get_if<Date>(&value_); }
    const Uid* uid() const { return std::get_if<Uid>(&value_); }
    const bool* boolean() const { return std::get_if<bool>(&value_); }
    /// Only integers above 2^63 - 1 are held unsigned.
    const std::int64_t* signedInteger() const { return std::get_if<std::int64_t>(&value_); }
    const std::uint64_t* unsignedInteger() const { return std::get_if<std::uint64_t>(&value_); }
    const double* real() const { return std::get_if<double>(&value_); }
    /// @}

    /// Whether it is an integer, a real or a boolean.
    bool isNumber() const;
    /// A number's value, or the number that a string begins with (0 when none); nothing for other types.
    std::optional<double> doubleValue() const;
    /// The same, but nothing for a string that is no number as a whole.
    std::optional<double> numberValue() const;
    /// Like `doubleValue`, truncated toward zero and clamped to the range of the type.
    std::optional<std::int64_t> integerValue() const;
    /// Whether it is a number other than 0, or a string that says yes ("YES", "true", "1", ...).
    bool boolValue() const;

    bool operator==(const PropertyList& other) const;

  private:
    std::variant<bool, std::int64_t, std::uint64_t, double, std::string, Data, Date, Uid, Array, Dictionary>
        value_;
};

/// One key of a dictionary with its value.
struct PropertyList::Entry {
    std::string key;
    PropertyList value;
};

}  // namespace qvct

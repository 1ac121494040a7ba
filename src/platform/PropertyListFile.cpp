#include "platform/PropertyListFile.h"

#include "platform/FileAccess.h"
#include "platform/PropertyListGuard.h"
#include "platform/Text.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <limits>
#include <memory>
#include <unordered_set>

#include <fmt/format.h>
#include <plist/plist.h>

namespace qvct {
namespace {

struct Deleter {
    void operator()(void* node) const { plist_free(node); }
};
using Node = std::unique_ptr<void, Deleter>;

struct BufferDeleter {
    void operator()(char* buffer) const { plist_to_bin_free(buffer); }
};

std::string binary(plist_t node) {
    char* raw = nullptr;  // the library writes nothing unless this is null
    std::uint32_t length = 0;
    plist_to_bin(node, &raw, &length);
    const std::unique_ptr<char, BufferDeleter> buffer(raw);
    return raw == nullptr ? std::string{} : std::string(raw, length);
}

std::string xml(plist_t node) {
    char* raw = nullptr;
    std::uint32_t length = 0;
    plist_to_xml(node, &raw, &length);
    const std::unique_ptr<char, decltype(&plist_to_xml_free)> buffer(raw, plist_to_xml_free);
    return raw == nullptr ? std::string{} : std::string(raw, length);
}

// The library's own accessors squeeze a date into 32 bits of seconds and do not tell a negative number from a
// large unsigned one. Its binary form of a single value keeps both, right behind the 8 bytes of the header.
constexpr std::size_t kFirstObject = 8;
constexpr char kDateMarker = 0x33;
constexpr char kIntegerMarker = 0x13;
constexpr char kWideIntegerMarker = 0x14;

PropertyList::Date date(plist_t node) {
    const std::string bytes = binary(node);
    if (bytes.size() < kFirstObject + 9 || bytes[kFirstObject] != kDateMarker) return {};
    std::uint64_t bits = 0;
    for (std::size_t i = 1; i <= 8; ++i)
        bits = bits << 8 | static_cast<unsigned char>(bytes[kFirstObject + i]);
    return {std::bit_cast<double>(bits)};
}

PropertyList integer(plist_t node) {
    std::uint64_t bits = 0;
    plist_get_uint_val(node, &bits);
    const bool fitsSigned = bits <= static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());
    if (!fitsSigned && binary(node)[kFirstObject] == kWideIntegerMarker) return bits;
    return static_cast<std::int64_t>(bits);
}

PropertyList valueOf(plist_t node);

/// XML has no element for a UID: it is a dictionary with this one key.
constexpr std::string_view kUidKey = "CF$UID";

PropertyList uidOr(PropertyList::Dictionary dictionary) {
    const PropertyList* value = dictionary.size() == 1 ? dictionary.value(kUidKey) : nullptr;
    const std::int64_t* uid = value == nullptr ? nullptr : value->signedInteger();
    if (uid != nullptr && *uid >= 0) return PropertyList::Uid{static_cast<std::uint64_t>(*uid)};
    return dictionary;
}

/// Of a key that comes twice the first value holds: a second one could not be written again.
PropertyList dictionary(plist_t node) {
    PropertyList::Dictionary result;
    std::unordered_set<std::string> seen;
    plist_dict_iter raw = nullptr;
    plist_dict_new_iter(node, &raw);
    const std::unique_ptr<void, decltype(&std::free)> iterator(raw, std::free);
    while (true) {
        char* rawKey = nullptr;
        plist_t value = nullptr;
        plist_dict_next_item(node, raw, &rawKey, &value);
        const std::unique_ptr<char, decltype(&std::free)> key(rawKey, std::free);
        if (value == nullptr) return uidOr(std::move(result));
        const std::string name = key ? key.get() : "";
        if (seen.insert(name).second) result.append(name, valueOf(value));
    }
}

PropertyList array(plist_t node) {
    PropertyList::Array result;
    plist_array_iter raw = nullptr;
    plist_array_new_iter(node, &raw);
    const std::unique_ptr<void, decltype(&std::free)> iterator(raw, std::free);
    for (plist_t item = nullptr;; result.push_back(valueOf(item))) {
        plist_array_next_item(node, raw, &item);
        if (item == nullptr) return result;
    }
}

PropertyList valueOf(plist_t node) {
    std::uint64_t length = 0;
    switch (plist_get_node_type(node)) {
        case PLIST_DICT:
            return dictionary(node);
        case PLIST_ARRAY:
            return array(node);
        case PLIST_UINT:
            return integer(node);
        case PLIST_DATE:
            return date(node);
        case PLIST_BOOLEAN: {
            std::uint8_t flag = 0;
            plist_get_bool_val(node, &flag);
            return flag != 0;
        }
        case PLIST_REAL: {
            double number = 0;
            plist_get_real_val(node, &number);
            return number;
        }
        case PLIST_UID: {
            std::uint64_t uid = 0;
            plist_get_uid_val(node, &uid);
            return PropertyList::Uid{uid};
        }
        case PLIST_DATA: {
            const char* bytes = plist_get_data_ptr(node, &length);
            return PropertyList::Data(bytes, bytes + length);
        }
        default: {
            const char* text = plist_get_string_ptr(node, &length);
            return text == nullptr ? std::string{} : std::string(text, length);
        }
    }
}

Node nodeOf(const PropertyList& value, PropertyListFormat format);

/// A value as the library reads it from a binary list with this one object: the only way to hand it a date of
/// more than 32 bits of seconds, a negative number or an unsigned one above the signed range.
Node nodeOfObject(std::string object) {
    const std::size_t tableOffset = kFirstObject + object.size();
    std::array<char, 33> tail{};  // offset table of one entry, then the trailer
    tail[0] = kFirstObject;
    tail[7] = 1;   // width of an offset
    tail[8] = 1;   // width of a reference
    tail[16] = 1;  // one object
    tail[32] = static_cast<char>(tableOffset);
    const std::string bytes = "bplist00" + std::move(object) + std::string(tail.data(), tail.size());
    plist_t node = nullptr;
    plist_from_bin(bytes.data(), static_cast<std::uint32_t>(bytes.size()), &node);
    return Node(node);
}

std::string bigEndian(std::uint64_t bits) {
    std::string bytes;
    for (int shift = 56; shift >= 0; shift -= 8)
        bytes += static_cast<char>(bits >> static_cast<unsigned>(shift));
    return bytes;
}

Node containerNode(const PropertyList& value, PropertyListFormat format) {
    if (const PropertyList::Array* items = value.array()) {
        Node node(plist_new_array());
        for (const PropertyList& item : *items)
            plist_array_append_item(node.get(), nodeOf(item, format).release());
        return node;
    }
    Node node(plist_new_dict());
    for (const PropertyList::Entry& entry : *value.dictionary()) {
        plist_dict_set_item(node.get(), entry.key.c_str(), nodeOf(entry.value, format).release());
    }
    return node;
}

Node nodeOf(const PropertyList& value, PropertyListFormat format) {
    if (const bool* flag = value.boolean()) return Node(plist_new_bool(*flag ? 1 : 0));
    if (const double* number = value.real()) return Node(plist_new_real(*number));
    if (const std::uint64_t* number = value.unsignedInteger()) {
        return nodeOfObject(kWideIntegerMarker + bigEndian(0) + bigEndian(*number));
    }
    if (const std::int64_t* number = value.signedInteger()) {
        const auto bits = static_cast<std::uint64_t>(*number);
        return *number < 0 ? nodeOfObject(kIntegerMarker + bigEndian(bits)) : Node(plist_new_uint(bits));
    }
    if (const std::string* text = value.string()) return Node(plist_new_string(text->c_str()));
    if (const PropertyList::Uid* uid = value.uid()) {
        if (format == PropertyListFormat::binary) return Node(plist_new_uid(uid->value));
        return nodeOf(PropertyList::Dictionary{{std::string(kUidKey), uid->value}}, format);
    }
    if (const PropertyList::Date* when = value.date()) {
        return nodeOfObject(kDateMarker +
                            bigEndian(std::bit_cast<std::uint64_t>(when->secondsSinceReferenceDate)));
    }
    if (const PropertyList::Data* bytes = value.data()) {
        return Node(plist_new_data(reinterpret_cast<const char*>(bytes->data()), bytes->size()));
    }
    return containerNode(value, format);
}

/// The years that XML can spell, 0001 to 9999.
constexpr double kFirstDate = -63114076800.0;
constexpr double kLastDate = 252423993599.0;

bool isValidText(std::string_view text, Error* error) {
    return isValidUtf8(text) || fail(error, kErrorMalformed, "property list: a text is not valid Unicode");
}

bool holdsOnlyValidLeaves(const PropertyList& value, Error* error) {
    if (const std::string* text = value.string()) return isValidText(*text, error);
    if (const PropertyList::Date* when = value.date()) {
        const bool inRange =
            when->secondsSinceReferenceDate >= kFirstDate && when->secondsSinceReferenceDate <= kLastDate;
        return inRange || fail(error, kErrorMalformed, "property list: a date outside the years 1 to 9999");
    }
    if (const PropertyList::Array* items = value.array()) {
        return std::all_of(items->begin(), items->end(),
                           [error](const PropertyList& item) { return holdsOnlyValidLeaves(item, error); });
    }
    if (const PropertyList::Dictionary* entries = value.dictionary()) {
        return std::all_of(entries->begin(), entries->end(), [error](const PropertyList::Entry& entry) {
            return isValidText(entry.key, error) && holdsOnlyValidLeaves(entry.value, error);
        });
    }
    return true;
}

/// Whether the text can be read back: the library ends texts at their first NUL and does not mind what is not
/// Unicode, nor that XML knows no other control characters than tab and line ends and neither U+FFFE nor
/// U+FFFF.
bool isTextStorable(std::string_view text, PropertyListFormat format) {
    if (text.find('\0') != std::string_view::npos || !isValidUtf8(text)) return false;
    if (format == PropertyListFormat::binary) return true;
    const bool hasControl = std::any_of(text.begin(), text.end(), [](char c) {
        return static_cast<unsigned char>(c) < 0x20 && c != '\t' && c != '\n' && c != '\r';
    });
    return !hasControl && text.find("\xEF\xBF\xBE") == std::string_view::npos &&
           text.find("\xEF\xBF\xBF") == std::string_view::npos;
}

bool isStorable(const PropertyList& value, PropertyListFormat format) {
    if (const std::string* text = value.string()) return isTextStorable(*text, format);
    if (const PropertyList::Array* items = value.array()) {
        return std::all_of(items->begin(), items->end(),
                           [format](const PropertyList& item) { return isStorable(item, format); });
    }
    const PropertyList::Dictionary* entries = value.dictionary();
    return entries == nullptr ||
           std::all_of(entries->begin(), entries->end(), [format](const PropertyList::Entry& entry) {
               return isTextStorable(entry.key, format) && isStorable(entry.value, format);
           });
}

bool isBinary(std::span<const std::uint8_t> bytes) {
    return bytes.size() >= 6 && std::memcmp(bytes.data(), "bplist", 6) == 0;
}

}  // namespace

std::optional<PropertyList> parsePropertyList(std::span<const std::uint8_t> bytes, Error* error) {
    if (bytes.size() > kLargestWholeFile) {
        fail(error, kErrorTooLarge, fmt::format("property list of {} bytes", bytes.size()));
        return std::nullopt;
    }
    const auto* data = reinterpret_cast<const char*>(bytes.data());
    const auto length = static_cast<std::uint32_t>(bytes.size());
    plist_t raw = nullptr;
    if (isBinary(bytes)) {
        if (!isSafeBinaryPropertyList(bytes, error)) return std::nullopt;
        plist_from_bin(data, length, &raw);
    } else {
        if (!isSafeXmlPropertyList(bytes, error)) return std::nullopt;
        plist_from_xml(data, length, &raw);
    }
    const Node node(raw);
    if (!node) {
        fail(error, kErrorMalformed, "neither an XML nor a binary property list");
        return std::nullopt;
    }
    PropertyList value = valueOf(node.get());
    if (!holdsOnlyValidLeaves(value, error)) return std::nullopt;
    return value;
}

std::optional<PropertyList> parsePropertyList(std::string_view bytes, Error* error) {
    return parsePropertyList(std::span(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size()),
                             error);
}

std::string serializePropertyList(const PropertyList& value, PropertyListFormat format) {
    if (!isStorable(value, format)) return {};
    const Node node = nodeOf(value, format);
    return format == PropertyListFormat::xml ? xml(node.get()) : binary(node.get());
}

std::optional<PropertyList> readPropertyListFile(const std::string& path, Error* error) {
    const auto bytes = readFile(path, error);
    if (!bytes) return std::nullopt;
    Error reason;
    auto value = parsePropertyList(*bytes, &reason);
    if (!value)
        fail(error, static_cast<ErrorCode>(reason.code),
             fmt::format("{}: {}", printable(path), reason.message));
    return value;
}

std::optional<PropertyList::Dictionary> readDictionaryFile(const std::string& path, Error* error) {
    auto value = readPropertyListFile(path, error);
    if (!value) return std::nullopt;
    if (PropertyList::Dictionary* dictionary = value->dictionary()) return std::move(*dictionary);
    fail(error, kErrorMalformed, fmt::format("{}: the property list is not a dictionary", printable(path)));
    return std::nullopt;
}

bool writePropertyListFile(const PropertyList& value, const std::string& path, PropertyListFormat format,
                           Error* error) {
    const std::string bytes = serializePropertyList(value, format);
    if (bytes.empty()) {
        return fail(error, kErrorInvalidArgument, fmt::format("{}: not a property list", printable(path)));
    }
    return replaceFile(path, bytes, error);
}

}  // namespace qvct

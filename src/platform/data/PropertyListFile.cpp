#include "platform/data/PropertyListFile.h"

#include "platform/base/bytes/ByteOrder.h"
#include "platform/data/propertylist/OldStylePropertyList.h"
#include "platform/data/propertylist/PropertyListBuilder.h"
#include "platform/data/propertylist/PropertyListEncoding.h"
#include "platform/data/propertylist/PropertyListGuard.h"
#include "platform/data/propertylist/XmlPropertyListReader.h"
#include "platform/data/propertylist/XmlPropertyListWriter.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <array>
#include <bit>
#include <limits>
#include <memory>
#include <utility>
#include <vector>

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

// The library's own accessors squeeze a date into 32 bits of seconds and do not tell a negative number from a
// large unsigned one. Its binary form of a single value keeps both, right behind the 8 bytes of the header.
constexpr std::size_t kFirstObject = 8;
constexpr char kDateMarker = 0x33;
constexpr char kIntegerMarker = 0x13;
constexpr char kWideIntegerMarker = 0x14;

PropertyList::Date date(plist_t node) {
    const std::string bytes = binary(node);
    if (bytes.size() < kFirstObject + 9 || bytes[kFirstObject] != kDateMarker) return {};
    const std::string_view bits = std::string_view(bytes).substr(kFirstObject + 1, 8);
    return {std::bit_cast<double>(numberOf(bits, ByteOrder::big))};
}

PropertyList integer(plist_t node) {
    std::uint64_t bits = 0;
    plist_get_uint_val(node, &bits);
    const bool fitsSigned = bits <= static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());
    if (!fitsSigned && binary(node)[kFirstObject] == kWideIntegerMarker) return bits;
    return static_cast<std::int64_t>(bits);
}

PropertyList leaf(plist_t node) {
    std::uint64_t length = 0;
    switch (plist_get_node_type(node)) {
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

/// The library's tree as a value of ours.
class TreeReader {
  public:
    PropertyList read(plist_t root) {
        enter(root);
        while (!open_.empty()) {
            if (plist_t child = nextChild()) {
                enter(child);
            } else {
                open_.pop_back();
                builder_.close();
            }
        }
        return builder_.take();
    }

  private:
    /// A container whose children are being read.
    struct Visit {
        plist_t node;
        std::unique_ptr<void, decltype(&std::free)> iterator;
    };

    void enter(plist_t node) {
        void* iterator = nullptr;
        if (PLIST_IS_DICT(node)) {
            plist_dict_new_iter(node, &iterator);
            builder_.openDictionary();
        } else if (PLIST_IS_ARRAY(node)) {
            plist_array_new_iter(node, &iterator);
            builder_.openArray();
        } else {
            return builder_.add(leaf(node));
        }
        open_.push_back({node, {iterator, std::free}});
    }

    plist_t nextChild() {
        const Visit& visit = open_.back();
        plist_t child = nullptr;
        if (builder_.isInDictionary()) {
            char* key = nullptr;
            plist_dict_next_item(visit.node, visit.iterator.get(), &key, &child);
            const std::unique_ptr<char, decltype(&std::free)> owned(key, std::free);
            builder_.key(key == nullptr ? "" : key);
        } else {
            plist_array_next_item(visit.node, visit.iterator.get(), &child);
        }
        return child;
    }

    std::vector<Visit> open_;
    PropertyListBuilder builder_;
};

/// A value of the library's, made by letting it read a binary list with this one object: the only way to give
/// it a date of more than 32 bits of seconds, a negative number or an unsigned one above the signed range.
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

/// The value as one of the library's; containers are empty.
Node nodeOf(const PropertyList& value) {
    if (value.array() != nullptr) return Node(plist_new_array());
    if (value.dictionary() != nullptr) return Node(plist_new_dict());
    if (const bool* flag = value.boolean()) return Node(plist_new_bool(*flag ? 1 : 0));
    if (const double* number = value.real()) return Node(plist_new_real(*number));
    if (const std::uint64_t* number = value.unsignedInteger()) {
        return nodeOfObject(kWideIntegerMarker + bytesOf(0, 8, ByteOrder::big) +
                            bytesOf(*number, 8, ByteOrder::big));
    }
    if (const std::int64_t* number = value.signedInteger()) {
        const auto bits = static_cast<std::uint64_t>(*number);
        return *number < 0 ? nodeOfObject(kIntegerMarker + bytesOf(bits, 8, ByteOrder::big))
                           : Node(plist_new_uint(bits));
    }
    if (const std::string* text = value.string()) return Node(plist_new_string(text->c_str()));
    if (const PropertyList::Uid* uid = value.uid()) return Node(plist_new_uid(uid->value));
    if (const PropertyList::Date* when = value.date()) {
        return nodeOfObject(
            kDateMarker +
            bytesOf(std::bit_cast<std::uint64_t>(when->secondsSinceReferenceDate), 8, ByteOrder::big));
    }
    const PropertyList::Data& bytes = *value.data();
    return Node(plist_new_data(reinterpret_cast<const char*>(bytes.data()), bytes.size()));
}

/// The whole value as a tree of the library's.
Node treeOf(const PropertyList& value) {
    Node root = nodeOf(value);
    std::vector<std::pair<const PropertyList*, plist_t>> pending = {{&value, root.get()}};
    while (!pending.empty()) {
        const auto [container, node] = pending.back();
        pending.pop_back();
        if (const PropertyList::Array* items = container->array()) {
            for (const PropertyList& item : *items) {
                pending.emplace_back(&item, nodeOf(item).release());
                plist_array_append_item(node, pending.back().second);
            }
        }
        if (const PropertyList::Dictionary* entries = container->dictionary()) {
            for (const PropertyList::Entry& entry : *entries) {
                pending.emplace_back(&entry.value, nodeOf(entry.value).release());
                plist_dict_set_item(node, entry.key.c_str(), pending.back().second);
            }
        }
    }
    return root;
}

/// Why a text could not be read back, or null. The library does not check: it ends texts at their first NUL,
/// and writes bytes that are not Unicode, and into XML characters that XML forbids: control characters other
/// than tab and line ends, U+FFFE and U+FFFF.
const char* textFault(std::string_view text, PropertyListFormat format) {
    if (text.find('\0') != std::string_view::npos) return "a text with a NUL character";
    if (!isValidUtf8(text)) return "a text that is not valid Unicode";
    if (format == PropertyListFormat::binary) return nullptr;
    const bool hasControl = std::any_of(text.begin(), text.end(), [](char c) {
        return static_cast<unsigned char>(c) < 0x20 && c != '\t' && c != '\n' && c != '\r';
    });
    const bool isForbidden = hasControl || text.find("\xEF\xBF\xBE") != std::string_view::npos ||
                             text.find("\xEF\xBF\xBF") != std::string_view::npos;
    return isForbidden ? "a text with a character that XML forbids" : nullptr;
}

/// Why a value by itself, without what it contains, could not be read back, or null.
const char* leafFault(const PropertyList& value, PropertyListFormat format) {
    if (const std::string* text = value.string()) return textFault(*text, format);
    const PropertyList::Date* when = value.date();
    return when == nullptr || isPropertyListDate(when->secondsSinceReferenceDate)
               ? nullptr
               : "a date outside of the years 1 to 9999";
}

bool isStorable(const PropertyList& root, PropertyListFormat format, Error* error) {
    std::vector<std::pair<const PropertyList*, int>> pending = {{&root, 0}};
    const auto refuse = [error](ErrorCode code, std::string reason) {
        return fail(error, code, "no property list can hold " + std::move(reason));
    };
    while (!pending.empty()) {
        const auto [value, depth] = pending.back();
        pending.pop_back();
        if (const char* fault = leafFault(*value, format)) return refuse(kErrorInvalidArgument, fault);
        const PropertyList::Array* items = value->array();
        const PropertyList::Dictionary* entries = value->dictionary();
        if ((items != nullptr || entries != nullptr) && depth == kDeepestPropertyList) {
            return refuse(kErrorTooLarge, fmt::format("more than {} levels", kDeepestPropertyList));
        }
        if (items != nullptr) {
            for (const PropertyList& item : *items) pending.emplace_back(&item, depth + 1);
        }
        if (entries == nullptr) continue;
        for (const PropertyList::Entry& entry : *entries) {
            if (const char* fault = textFault(entry.key, format)) return refuse(kErrorInvalidArgument, fault);
            pending.emplace_back(&entry.value, depth + 1);
        }
    }
    return true;
}

/// Keys and values.
std::size_t countOf(const PropertyList& value) {
    std::size_t count = 1;
    if (const auto* items = value.array()) {
        for (const PropertyList& item : *items) count += countOf(item);
    }
    if (const auto* entries = value.dictionary()) {
        for (const PropertyList::Entry& entry : *entries) count += 1 + countOf(entry.value);
    }
    return count;
}

/// The first byte behind the root element that is not part of a blank, zero, comment or instruction.
std::optional<std::size_t> remainder(std::string_view text, std::size_t end) {
    constexpr std::string_view blanks(" \t\r\n\0", 5);
    constexpr std::array<std::pair<std::string_view, std::string_view>, 2> passedOver = {
        {{"<!--", "-->"}, {"<?", "?>"}}};
    while ((end = text.find_first_not_of(blanks, end)) != std::string_view::npos) {
        const auto* hit = std::find_if(passedOver.begin(), passedOver.end(), [&](const auto& pair) {
            return text.substr(end).starts_with(pair.first);
        });
        const std::size_t close =
            hit == passedOver.end() ? std::string_view::npos : text.find(hit->second, end);
        if (close == std::string_view::npos) return end;
        end = close + hit->second.size();
    }
    return std::nullopt;
}

std::optional<PropertyList> parseBinary(std::span<const std::uint8_t> bytes, PropertyListFault& fault) {
    if (auto found = faultOfBinaryPropertyList(bytes)) {
        fault = *std::move(found);
        return std::nullopt;
    }
    plist_t node = nullptr;
    plist_from_bin(reinterpret_cast<const char*>(bytes.data()), static_cast<std::uint32_t>(bytes.size()),
                   &node);
    if (const Node tree{node}) return TreeReader().read(tree.get());
    fault = {kErrorMalformed, 0, "cannot be read"};
    return std::nullopt;
}

std::optional<PropertyList> parseXml(std::string_view text, PropertyListUse use, PropertyListFault& fault) {
    std::size_t end = 0;
    auto value = parseXmlPropertyList(text, end, fault);
    const auto behind = !value || use == PropertyListUse::reading ? std::nullopt : remainder(text, end);
    if (!behind) return value;
    fault = {kErrorMalformed, *behind, "something behind the end, which would be lost"};
    return std::nullopt;
}

bool failAt(Error* error, std::string_view form, const PropertyListFault& fault, std::size_t offset,
            std::optional<std::uint64_t> line = std::nullopt) {
    return fail(error, fault.code, fault.reason,
                {.part = fmt::format("{} property list", form), .line = line, .offset = offset});
}

}  // namespace

std::optional<PropertyList> parsePropertyList(std::span<const std::uint8_t> bytes, Error* error,
                                              PropertyListUse use) {
    if (bytes.size() > kLargestWholeFile) {
        fail(error, kErrorTooLarge, fmt::format("property list of {} bytes", bytes.size()));
        return std::nullopt;
    }
    PropertyListFault fault;
    if (isBinaryPropertyList(bytes)) {
        auto value = parseBinary(bytes, fault);
        if (!value) failAt(error, "binary", fault, fault.offset);
        return value;
    }
    const auto characters = PropertyListCharacters::decode(bytes, fault);
    if (!characters) {
        failAt(error, "text", fault, fault.offset);
        return std::nullopt;
    }
    const std::string_view text = characters->text();
    const bool isXml = isXmlPropertyList(text);
    auto value = isXml ? parseXml(text, use, fault) : parseOldStylePropertyList(text, fault);
    if (!value) {
        failAt(error, isXml ? "XML" : "old-style", fault, characters->byteOffset(fault.offset),
               lineAt(text, fault.offset));
    }
    return value;
}

std::optional<PropertyList> parsePropertyList(std::string_view bytes, Error* error, PropertyListUse use) {
    return parsePropertyList(std::span(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size()),
                             error, use);
}

std::string serializePropertyList(const PropertyList& value, PropertyListFormat format, Error* error) {
    if (!isStorable(value, format, error)) return {};
    std::string bytes =
        format == PropertyListFormat::xml ? xmlPropertyList(value) : binary(treeOf(value).get());
    if (countOf(value) < mostPropertyListValues(bytes.size())) return bytes;
    fail(error, kErrorTooLarge,
         fmt::format("no property list of {} bytes can hold so many keys and values", bytes.size()));
    return {};
}

std::optional<PropertyList> readPropertyListFile(const std::string& path, Error* error, PropertyListUse use) {
    const auto bytes = readFile(path, error);
    if (!bytes) return std::nullopt;
    auto value = parsePropertyList(*bytes, error, use);
    if (!value) failIn(path, error);
    return value;
}

std::optional<PropertyList::Dictionary> readDictionaryFile(const std::string& path, Error* error,
                                                           PropertyListUse use) {
    auto value = readPropertyListFile(path, error, use);
    if (!value) return std::nullopt;
    if (PropertyList::Dictionary* dictionary = value->dictionary()) return std::move(*dictionary);
    fail(error, kErrorMalformed, "the property list is not a dictionary", {path});
    return std::nullopt;
}

bool writePropertyListFile(const PropertyList& value, const std::string& path, PropertyListFormat format,
                           Error* error) {
    const std::string bytes = serializePropertyList(value, format, error);
    return bytes.empty() ? failIn(path, error) : replaceFile(path, bytes, error);
}

}  // namespace qvct

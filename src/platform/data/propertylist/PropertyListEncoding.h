#pragma once

#include "platform/data/propertylist/PropertyListGuard.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace qvct {

bool isBinaryPropertyList(std::span<const std::uint8_t> bytes);
/// Whether the text is meant as XML: it begins with a "<" that does not open data of the old text form.
bool isXmlPropertyList(std::string_view text);

/// The characters of a property list that is text, as UTF-8: a byte order mark in front means UTF-8 or UTF-16
/// of either byte order, a zero byte beside a first "<" means UTF-16, too; anything else is UTF-8.
class PropertyListCharacters {
  public:
    /// UTF-8 is not copied: the bytes must live as long as the object. Nothing, and the fault, for malformed
    /// UTF-16.
    static std::optional<PropertyListCharacters> decode(std::span<const std::uint8_t> bytes,
                                                        PropertyListFault& fault);

    std::string_view text() const { return isWide_ ? std::string_view(converted_) : original_; }
    /// The offset in the bytes of the character at that offset of the text. @cost  O(offset).
    std::size_t byteOffset(std::size_t textOffset) const;

  private:
    std::string_view original_;
    std::string converted_;
    std::size_t skipped_ = 0;
    bool isWide_ = false;
};

}  // namespace qvct

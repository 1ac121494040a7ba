#pragma once

#include "platform/data/PropertyListGuard.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace qvct {

/// The characters of a property list that is text, as UTF-8: a byte order mark in front says UTF-8 or UTF-16
/// of either byte order, the zero byte of a first "<" UTF-16, too; anything else is UTF-8.
class PropertyListCharacters {
  public:
    /// Does not copy UTF-8, which has to live as long. Nothing, and the fault, for UTF-16 that is none.
    static std::optional<PropertyListCharacters> decode(std::span<const std::uint8_t> bytes,
                                                        PropertyListFault& fault);

    std::string_view text() const { return isWide_ ? std::string_view(converted_) : original_; }
    /// Where in the bytes stands what stands there in the text. @cost O(offset).
    std::size_t byteOffset(std::size_t textOffset) const;

  private:
    std::string_view original_;
    std::string converted_;
    std::size_t skipped_ = 0;
    bool isWide_ = false;
};

}  // namespace qvct

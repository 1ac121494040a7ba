#pragma once

#include <cstddef>
#include <optional>
#include <string_view>

namespace qvct {

/// A label, or none; hosts may write none as a null pointer.
class OptionalLabel : public std::optional<std::string_view> {
  public:
    using std::optional<std::string_view>::optional;
    /// No label.
    OptionalLabel(std::nullptr_t) {}
    /// The text, or no label for a null pointer.
    OptionalLabel(const char* label) {
        if (label != nullptr) emplace(label);
    }
};

}  // namespace qvct

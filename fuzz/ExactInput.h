#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>
#include <vector>

namespace qvct::fuzz {

/// The input in a buffer of exactly its size, so that reading one byte too many is seen.
class ExactInput {
  public:
    ExactInput(const std::uint8_t* data, std::size_t size) : bytes_(data, data + size) {
        bytes_.shrink_to_fit();
    }
    std::span<const std::uint8_t> bytes() const { return bytes_; }
    std::string_view text() const { return {reinterpret_cast<const char*>(bytes_.data()), bytes_.size()}; }

  private:
    std::vector<std::uint8_t> bytes_;
};

/// Ends the run with the input when something that must hold does not.
inline void require(bool holds) {
    if (!holds) __builtin_trap();
}

}  // namespace qvct::fuzz

#pragma once

#include <array>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Finds every occurrence of many literals in one pass over a text: an Aho-Corasick automaton
/// (A. Aho, M. Corasick, "Efficient string matching: an aid to bibliographic search", 1975), compiled to a
/// table with one step a byte.
///
/// Bytes are compared as they are, except that ASCII letters match whatever their case.
/// @cost  Building: O(bytes of all literals · distinct bytes). Scanning: O(text + occurrences), no
/// allocation.
class LiteralScanner {
  public:
    LiteralScanner() : LiteralScanner(std::vector<std::string>{}) {}
    /// Literals are known by their index. Empty ones never occur.
    explicit LiteralScanner(const std::vector<std::string>& literals);

    /// Calls `found(index, end)` for each occurrence, `end` being the offset behind its last byte.
    template <typename Found>
    void scan(std::string_view text, Found found) const {
        std::uint32_t state = 0;
        for (std::size_t i = 0; i < text.size(); ++i) {
            state = next_[state + classOf_[static_cast<unsigned char>(text[i])]];
            if (state >= firstRestingState_) continue;
            for (const std::uint32_t index : endingAt(state)) found(index, i + 1);
        }
    }

  private:
    std::span<const std::uint32_t> endingAt(std::uint32_t state) const {
        const std::uint32_t row = state / classCount_;
        return std::span(ending_).subspan(endingStart_[row], endingStart_[row + 1] - endingStart_[row]);
    }

    /// Bytes that no literal holds share class 0.
    std::array<std::uint16_t, 256> classOf_{};
    std::uint32_t classCount_ = 1;
    /// States are offsets of their row, so that a step is one addition and one load. Those in which a literal
    /// ends are below this one, but for the start at 0, where none ends.
    std::uint32_t firstRestingState_ = 0;
    std::vector<std::uint32_t> next_;
    std::vector<std::uint32_t> endingStart_;
    std::vector<std::uint32_t> ending_;
};

}  // namespace qvct

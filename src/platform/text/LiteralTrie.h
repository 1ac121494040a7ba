#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Which of many literals stand at a place of a text, found in one walk.
///
/// Bytes are compared as they are, except that ASCII letters match whatever their case.
/// @cost  Building: O(bytes of all literals · distinct bytes). Matching: O(longest match), no allocation.
class LiteralTrie {
  public:
    LiteralTrie() : LiteralTrie(std::vector<std::string>{}) {}
    /// Literals, each different, are known by their index. An empty one never occurs.
    explicit LiteralTrie(const std::vector<std::string>& literals);

    /// Calls `found(index, end)` for each literal that starts at `offset`, the shortest first; `end` is the
    /// offset behind its last byte.
    template <typename Found>
    void matchAt(std::string_view text, std::size_t offset, Found found) const {
        std::uint32_t node = 0;
        for (std::size_t i = offset; i < text.size(); ++i) {
            node = child_[node * classCount_ + classOf_[static_cast<unsigned char>(text[i])]];
            if (node == 0) return;
            if (literalAt_[node] >= 0) found(static_cast<std::uint32_t>(literalAt_[node]), i + 1);
        }
    }

  private:
    /// Bytes that no literal holds share class 0, in which no node has a child.
    std::array<std::uint16_t, 256> classOf_{};
    std::uint32_t classCount_ = 1;
    /// A row of classes for each node; 0, the root, stands for no child.
    std::vector<std::uint32_t> child_;
    std::vector<std::int32_t> literalAt_;
};

}  // namespace qvct

#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace qvct::contentdb {

/// A number computed from bytes, to tell later whether they are still the same. Fast, the same in every
/// process, and no defence against deliberate collisions.
class Digest {
  public:
    void add(std::uint64_t word) {
        state_ = (state_ ^ word) * 0x9e3779b97f4a7c15U;
        state_ ^= state_ >> 32U;
    }
    /// The bytes and how many there are.
    void add(std::string_view bytes) {
        add(bytes.size());
        for (std::size_t at = 0; at < bytes.size(); at += sizeof(std::uint64_t)) {
            std::uint64_t word = 0;
            std::memcpy(&word, bytes.data() + at, std::min(sizeof word, bytes.size() - at));
            add(word);
        }
    }
    std::uint64_t value() const { return state_; }

  private:
    std::uint64_t state_ = 0x51776374;
};

}  // namespace qvct::contentdb

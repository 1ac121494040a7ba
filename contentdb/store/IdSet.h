#pragma once

#include <array>
#include <bit>
#include <cstdint>
#include <string>
#include <string_view>

namespace qvct::contentdb {

/// Items are numbered from 1; an index entry covers this many successive numbers.
inline constexpr unsigned kChunkBits = 16;
inline constexpr std::uint32_t kChunkSize = 1U << kChunkBits;

/// A set of the items of one chunk, by the lower 16 bits of their numbers: one bit each, 8 KB.
class IdSet {
  public:
    void insert(std::uint16_t id) { words_[id >> 6U] |= bit(id); }
    void erase(std::uint16_t id) { words_[id >> 6U] &= ~bit(id); }
    bool contains(std::uint16_t id) const { return (words_[id >> 6U] & bit(id)) != 0; }
    void clear() { words_.fill(0); }
    bool empty() const { return *this == IdSet(); }
    std::uint32_t count() const;
    /// How many members both have.
    std::uint32_t countCommon(const IdSet& other) const;

    IdSet& operator|=(const IdSet& other);
    IdSet& operator&=(const IdSet& other);
    /// Without the members of `other`.
    IdSet& operator-=(const IdSet& other);
    bool operator==(const IdSet&) const = default;

    /// Calls `visit(id)` for each member, in order, until it answers false.
    template <typename Visit>
    void forEach(Visit visit) const {
        for (std::uint32_t at = 0; at < words_.size(); ++at) {
            for (std::uint64_t word = words_[at]; word != 0; word &= word - 1) {
                if (!visit(
                        static_cast<std::uint16_t>(at * 64U + static_cast<unsigned>(std::countr_zero(word)))))
                    return;
            }
        }
    }

    /// Sorted 16-bit numbers, little endian; or, for 4,096 members and more, the bits.
    std::string encoded() const;
    /// Adds the members of an encoded set. False when the bytes are no such set.
    bool insertEncoded(std::string_view bytes);

  private:
    static constexpr std::uint64_t bit(std::uint16_t id) { return std::uint64_t{1} << (id & 63U); }

    std::array<std::uint64_t, kChunkSize / 64> words_{};
};

}  // namespace qvct::contentdb

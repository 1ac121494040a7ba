#pragma once

#include "contentdb/IndexedItem.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace qvct::contentdb {

/// Appends numbers and texts to a byte string.
class ByteWriter {
  public:
    /// Seven bits a byte, lowest first.
    void number(std::uint64_t value);
    void real(double value);
    void text(std::string_view value);
    void stamp(const ItemStamp& value);
    std::string take() { return std::move(bytes_); }

  private:
    std::string bytes_;
};

/// Reads what ByteWriter wrote. After a fault every answer is empty and `isIntact` false.
class ByteReader {
  public:
    explicit ByteReader(std::string_view bytes) : rest_(bytes) {}
    std::uint64_t number();
    double real();
    std::string_view text();
    ItemStamp stamp();
    /// A number of entries to come, each of at least one byte.
    std::size_t count();
    bool isIntact() const { return isIntact_; }
    bool isAtEnd() const { return rest_.empty(); }

  private:
    std::string_view take(std::size_t size);

    std::string_view rest_;
    bool isIntact_ = true;
};

/// What a describer said of an item: all but path, payload hash and stamp.
std::string encodedDescription(const IndexedItem& item);
/// Fills in what `encodedDescription` wrote. False when the bytes are no such description.
bool decodeDescription(std::string_view bytes, IndexedItem& item);

}  // namespace qvct::contentdb

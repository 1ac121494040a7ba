#pragma once

#include <cstdint>
#include <span>

namespace qvct {

/// Copies `source` to `destination` and there reverses the bytes of its fields.
///
/// `fieldSizes` goes along the record: a positive number is the width of the next field, which is reversed, a
/// negative one a number of bytes to be left as they are, 0 ends the table. What lies behind the fields is
/// copied; a field that does not fit any more is left as it is, as is what follows it. Both records are of
/// equal size, and may be the same one.
void SwapData(std::span<const std::uint8_t> source, std::span<std::uint8_t> destination,
              std::span<const int> fieldSizes);

}  // namespace qvct

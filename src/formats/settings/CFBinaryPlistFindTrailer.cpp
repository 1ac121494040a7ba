#include "formats/settings/CFBinaryPlistFindTrailer.h"

#include "platform/base/bytes/ByteOrder.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <limits>
#include <span>

namespace qvct {
namespace {

constexpr std::uint64_t kHighest = std::numeric_limits<std::uint64_t>::max();
constexpr std::uint64_t kSignedLimit = std::uint64_t{1} << 63U;
constexpr std::size_t kUnusedLength = 5;

std::uint64_t bigEndian(std::span<const std::uint8_t> bytes) {
    return numberOf(bytes.first(8), ByteOrder::big);
}

bool fitsInBytes(std::uint64_t value, std::uint64_t width) {
    return width >= 8 || value >> (8 * width) == 0;
}

/// Whether the fields of the 32 bytes can belong together, in data of that length.
bool isPlausibleTrailer(std::span<const std::uint8_t> trailer, std::uint64_t length) {
    constexpr std::uint64_t firstOffset = 9;  // behind the magic and one object
    const std::uint64_t offsetWidth = trailer[6];
    const std::uint64_t referenceWidth = trailer[7];
    const std::uint64_t count = bigEndian(trailer.subspan(8));
    const std::uint64_t top = bigEndian(trailer.subspan(16));
    const std::uint64_t table = bigEndian(trailer.subspan(24));
    if (count == 0 || count >= kSignedLimit || table >= kSignedLimit || top >= count) return false;
    if (table < firstOffset || table >= length - kBinaryPlistTrailerLength) return false;
    if (offsetWidth == 0 || referenceWidth == 0 || count > kHighest / offsetWidth) return false;
    if (!fitsInBytes(count, referenceWidth) || !fitsInBytes(table, offsetWidth)) return false;
    return table <= kHighest - count * offsetWidth;
}

}  // namespace

bool CFBinaryPlistFindTrailer(const std::uint8_t* bytes, std::uint64_t length, std::uint64_t* position) {
    constexpr std::array<std::uint8_t, kUnusedLength> unused{};
    if (bytes == nullptr || length < kBinaryPlistTrailerLength || std::memcmp(bytes, "bplist00", 8) != 0) {
        return false;
    }
    const std::span data(bytes, length);
    for (std::uint64_t p = 0; p <= length - kBinaryPlistTrailerLength; ++p) {
        const auto candidate = data.subspan(p, kBinaryPlistTrailerLength);
        if (!std::equal(unused.begin(), unused.end(), candidate.begin())) continue;
        if (!isPlausibleTrailer(candidate, length)) continue;
        if (position != nullptr) *position = p;
        return true;
    }
    return false;
}

}  // namespace qvct

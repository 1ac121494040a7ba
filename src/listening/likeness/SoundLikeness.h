#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace qvct {

/// Where a sound lies among all sounds: what sounds alike lies close together. `LikenessModel` tells it; only
/// places told by the same model can be compared.
struct SoundLikeness {
    static constexpr std::size_t kSize = 64;

    std::array<std::int8_t, kSize> coordinates{};

    bool operator==(const SoundLikeness&) const = default;
};

/// How far apart two sounds lie: 0 for equal ones, at most 64 * 255^2. The order of distances is what counts.
///
/// @cost  4 ns. In a header, and with differences of 16 bits, so that compilers make vectors of it.
inline int squaredDistance(const SoundLikeness& one, const SoundLikeness& other) {
    int sum = 0;
    for (std::size_t i = 0; i < SoundLikeness::kSize; ++i) {
        const auto difference = static_cast<std::int16_t>(one.coordinates[i] - other.coordinates[i]);
        sum += difference * difference;
    }
    return sum;
}

}  // namespace qvct

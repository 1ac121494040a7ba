#pragma once

#include "listening/likeness/SoundFingerprint.h"
#include "listening/likeness/SoundLikeness.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace qvct::contentdb {

/// Where a sound lies, and in which of the cells into which a model divides the space. The cell is kept with
/// the sound: a later model may divide it otherwise.
struct PlacedLikeness {
    std::uint16_t cell = 0;
    SoundLikeness place;
};

/// The bytes that `IndexedItem::likeness` holds: the cell, lowest byte first, and the coordinates.
std::string encodedLikeness(const PlacedLikeness& likeness);
/// The same, in the cell where the model of today has that place.
std::string encodedLikeness(const SoundLikeness& place);
/// Nothing when the bytes are no such likeness.
std::optional<PlacedLikeness> decodedLikeness(std::string_view bytes);

/// The coordinates alone: `SoundLikeness::kSize` bytes.
std::string_view bytesOf(const SoundLikeness& place);
SoundLikeness placeIn(std::string_view bytes);

/// What a landmark takes.
inline constexpr std::size_t kLandmarkBytes = 6;
/// The bytes that `IndexedItem::fingerprint` holds: of each landmark the hash and the frame, lowest byte
/// first.
std::string encodedFingerprint(const SoundFingerprint& fingerprint);
/// Nothing when the bytes are no such fingerprint.
std::optional<SoundFingerprint> decodedFingerprint(std::string_view bytes);

}  // namespace qvct::contentdb

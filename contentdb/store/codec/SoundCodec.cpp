#include "contentdb/store/codec/SoundCodec.h"

#include "platform/base/bytes/ByteOrder.h"
#include "resources/DefaultListeningModels.h"

#include <algorithm>
#include <cstring>

namespace qvct::contentdb {
namespace {

constexpr std::size_t kCellBytes = 2;
constexpr std::size_t kHashBytes = 4, kFrameBytes = 2;
static_assert(kHashBytes + kFrameBytes == kLandmarkBytes);

}  // namespace

std::string_view bytesOf(const SoundLikeness& place) {
    return {reinterpret_cast<const char*>(place.coordinates.data()), place.coordinates.size()};
}

SoundLikeness placeIn(std::string_view bytes) {
    SoundLikeness place;
    std::memcpy(place.coordinates.data(), bytes.data(), std::min(bytes.size(), place.coordinates.size()));
    return place;
}

std::string encodedLikeness(const PlacedLikeness& likeness) {
    std::string bytes = qvct::bytesOf(likeness.cell, kCellBytes, ByteOrder::little);
    return bytes += bytesOf(likeness.place);
}

std::string encodedLikeness(const SoundLikeness& place) {
    return encodedLikeness(PlacedLikeness{defaultLikenessModel()->nearestCell(place), place});
}

std::optional<PlacedLikeness> decodedLikeness(std::string_view bytes) {
    if (bytes.size() != kCellBytes + SoundLikeness::kSize) return std::nullopt;
    const auto cell = numberOf(bytes.substr(0, kCellBytes), ByteOrder::little);
    return PlacedLikeness{static_cast<std::uint16_t>(cell), placeIn(bytes.substr(kCellBytes))};
}

std::string encodedFingerprint(const SoundFingerprint& fingerprint) {
    std::string bytes;
    for (const auto& landmark : fingerprint.landmarks) {
        bytes += qvct::bytesOf(landmark.hash, kHashBytes, ByteOrder::little);
        bytes += qvct::bytesOf(landmark.frame, kFrameBytes, ByteOrder::little);
    }
    return bytes;
}

std::optional<SoundFingerprint> decodedFingerprint(std::string_view bytes) {
    const std::size_t count = bytes.size() / kLandmarkBytes;
    if (bytes.size() % kLandmarkBytes != 0 || count > SoundFingerprint::kMostLandmarks) return std::nullopt;
    SoundFingerprint fingerprint;
    for (; !bytes.empty(); bytes.remove_prefix(kLandmarkBytes)) {
        const auto hash = numberOf(bytes.substr(0, kHashBytes), ByteOrder::little);
        const auto frame = numberOf(bytes.substr(kHashBytes, kFrameBytes), ByteOrder::little);
        fingerprint.landmarks.push_back(
            {static_cast<std::uint32_t>(hash), static_cast<std::uint16_t>(frame)});
    }
    return fingerprint;
}

}  // namespace qvct::contentdb

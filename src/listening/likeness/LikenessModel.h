#pragma once

#include "listening/instrument/NetworkLayer.h"
#include "listening/likeness/SoundLikeness.h"
#include "platform/base/Error.h"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

namespace qvct {

/// Tells from a sound's features where it lies among all sounds: a small network whose last layer is taken as
/// a direction, so that sounds of one instrument lie together, and a projection of what differs most among
/// those. The file: docs/formats/likeness-model.md.
///
/// Cells divide the room of all places, so that a search need not look at each sound. Safe from every thread.
class LikenessModel {
  public:
    /// The model in a file's bytes, or nothing and an error that tells the offset: what is not of this
    /// format, cut off or made for other features, or holds numbers that are not finite.
    static std::optional<LikenessModel> parse(std::span<const std::uint8_t> bytes, Error* error = nullptr);

    /// Where a sound with these features lies; nothing where there are none, as of silence.
    /// REQUIRES: none or SoundFeatures::count() of them.
    /// @cost  8 us.
    std::optional<SoundLikeness> of(std::span<const float> features) const;

    /// How many cells there are, at least one.
    std::size_t cells() const { return centres_.size(); }
    /// The cell whose centre is nearest, the first of equally near ones. @cost  10 ns a cell.
    std::uint16_t nearestCell(const SoundLikeness& place) const;
    /// All cells, the nearest first. @cost  40 ns a cell.
    std::vector<std::uint16_t> cellsByDistance(const SoundLikeness& place) const;

  private:
    Standardisation standardisation_;
    NetworkLayer hidden_, direction_, differences_;
    float reach_ = 1;  // of the direction
    std::vector<SoundLikeness> centres_;
};

}  // namespace qvct

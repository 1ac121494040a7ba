#include "listening/likeness/LikenessModel.h"

#include "listening/instrument/ModelReader.h"
#include "listening/instrument/SoundFeatures.h"

#include <algorithm>
#include <cmath>
#include <numeric>

namespace qvct {
namespace {

constexpr std::uint32_t kFormat = 1;
constexpr std::size_t kMostCells = 4096;
constexpr float kFarthest = 127;

void makeDirection(std::vector<float>& values, float reach) {
    const float squares = std::inner_product(values.begin(), values.end(), values.begin(), 0.0F);
    const float scale = reach / std::max(std::sqrt(squares), 1e-9F);
    for (float& value : values) value *= scale;
}

}  // namespace

std::optional<LikenessModel> LikenessModel::parse(std::span<const std::uint8_t> bytes, Error* error) {
    ModelReader reader(bytes);
    LikenessModel model;
    reader.head("QVLM", kFormat, "is no likeness model");
    model.standardisation_ = reader.standardisation();
    model.hidden_ = reader.layer(SoundFeatures::count());
    model.direction_ = reader.layer(model.hidden_.outputs);
    model.reach_ = reader.real();
    model.differences_ = reader.layer(SoundFeatures::count());
    reader.expect(model.direction_.outputs + model.differences_.outputs == SoundLikeness::kSize,
                  "has another number of coordinates");
    model.centres_.resize(reader.count(kMostCells));
    for (SoundLikeness& centre : model.centres_) {
        const auto coordinates = reader.take(SoundLikeness::kSize);
        std::transform(coordinates.begin(), coordinates.end(), centre.coordinates.begin(),
                       [](std::uint8_t byte) { return static_cast<std::int8_t>(byte); });
    }
    reader.expectEnd();
    if (!reader.report(error)) return std::nullopt;
    return model;
}

std::optional<SoundLikeness> LikenessModel::of(std::span<const float> features) const {
    if (features.size() != standardisation_.means.size()) return std::nullopt;
    const auto inputs = standardisation_.of(features);
    auto units = hidden_.of(inputs);
    rectify(units);
    auto values = direction_.of(units);
    makeDirection(values, reach_);
    const auto differences = differences_.of(inputs);
    values.insert(values.end(), differences.begin(), differences.end());
    SoundLikeness likeness;
    for (std::size_t i = 0; i < values.size(); ++i)
        likeness.coordinates[i] =
            static_cast<std::int8_t>(std::lround(std::clamp(values[i], -kFarthest, kFarthest)));
    return likeness;
}

std::uint16_t LikenessModel::nearestCell(const SoundLikeness& place) const {
    const auto nearest =
        std::min_element(centres_.begin(), centres_.end(), [&](const auto& one, const auto& other) {
            return squaredDistance(one, place) < squaredDistance(other, place);
        });
    return static_cast<std::uint16_t>(nearest - centres_.begin());
}

std::vector<std::uint16_t> LikenessModel::cellsByDistance(const SoundLikeness& place) const {
    std::vector<int> distances(centres_.size());
    std::transform(centres_.begin(), centres_.end(), distances.begin(),
                   [&](const SoundLikeness& centre) { return squaredDistance(centre, place); });
    std::vector<std::uint16_t> cells(centres_.size());
    std::iota(cells.begin(), cells.end(), std::uint16_t{0});
    std::stable_sort(cells.begin(), cells.end(), [&](std::uint16_t one, std::uint16_t other) {
        return distances[one] < distances[other];
    });
    return cells;
}

}  // namespace qvct

#include "listening/instrument/SoundFeatures.h"
#include "listening/likeness/LikenessModel.h"

#include <bit>
#include <cmath>
#include <functional>
#include <limits>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

using Bytes = std::vector<std::uint8_t>;

/// A model that passes the first two features on as a direction, which it makes 100 long, and the third as a
/// difference. Tests change one value to make a file that is wrong.
struct ModelFile {
    std::string magic = "QVLM";
    std::uint32_t format = 1, version = SoundFeatures::kVersion;
    std::uint32_t features = static_cast<std::uint32_t>(SoundFeatures::count());
    float scale = 1, reach = 100, bias = 0;
    std::uint32_t directions = 60, cells = 3;
    Bytes rest = {};

    static void number(Bytes& out, std::uint32_t value) {
        for (unsigned shift = 0; shift < 32; shift += 8)
            out.push_back(static_cast<std::uint8_t>(value >> shift));
    }
    static void real(Bytes& out, float value) { number(out, std::bit_cast<std::uint32_t>(value)); }
    /// Passes `count` inputs on from the one numbered `first`.
    void layer(Bytes& out, std::uint32_t inputs, std::uint32_t outputs, std::uint32_t first,
               std::uint32_t count) const {
        number(out, outputs);
        for (std::uint32_t o = 0; o < outputs; ++o) real(out, 1);
        for (std::uint32_t o = 0; o < outputs; ++o) real(out, bias);
        for (std::uint32_t i = 0; i < inputs; ++i)
            for (std::uint32_t o = 0; o < outputs; ++o) out.push_back(i == o + first && o < count ? 1 : 0);
    }

    Bytes bytes() const {
        Bytes out(magic.begin(), magic.end());
        const auto inputs = static_cast<std::uint32_t>(SoundFeatures::count());
        for (const std::uint32_t value : {format, version, features}) number(out, value);
        for (std::uint32_t i = 0; i < inputs; ++i) real(out, 0);
        for (std::uint32_t i = 0; i < inputs; ++i) real(out, scale);
        layer(out, inputs, 2, 0, 2);
        layer(out, 2, directions, 0, 2);
        real(out, reach);
        layer(out, inputs, 4, 2, 1);
        number(out, cells);
        for (std::uint8_t cell = 0; cell < 3; ++cell)  // at 0, 50 and -100 on the first axis
            for (std::size_t c = 0; c < SoundLikeness::kSize; ++c)
                out.push_back(c > 0 ? 0 : std::array<std::uint8_t, 3>{0, 50, 156}[cell]);
        out.insert(out.end(), rest.begin(), rest.end());
        return out;
    }
};

std::vector<float> features(std::vector<float> values) {
    values.resize(SoundFeatures::count(), 0);
    return values;
}

SoundLikeness at(std::int8_t first) {
    SoundLikeness place;
    place.coordinates[0] = first;
    return place;
}

TEST(LikenessModel, TakesALayerAsADirectionAndAddsDifferences) {
    const auto model = LikenessModel::parse(ModelFile().bytes());
    ASSERT_TRUE(model);
    const auto place = model->of(features({3, 4, -2.4F}));
    ASSERT_TRUE(place);
    EXPECT_EQ(place->coordinates[0], 60);
    EXPECT_EQ(place->coordinates[1], 80);
    EXPECT_EQ(place->coordinates[60], -2);
    EXPECT_EQ(model->of(features({-3, 4}))->coordinates[0], 0);  // units pass nothing below 0 on
    EXPECT_EQ(model->of(features({})), at(0));
    EXPECT_FALSE(model->of({}));
    EXPECT_FALSE(model->of(std::vector<float>(3, 1.0F)));

    ModelFile far;
    far.reach = 1e6F;
    EXPECT_EQ(LikenessModel::parse(far.bytes())->of(features({1, 1}))->coordinates[0], 127);
}

TEST(LikenessModel, SortsCellsByDistance) {
    const auto model = LikenessModel::parse(ModelFile().bytes());
    ASSERT_TRUE(model);
    ASSERT_EQ(model->cells(), 3U);
    const std::pair<std::int8_t, std::vector<std::uint16_t>> rows[] = {
        {30, {1, 0, 2}}, {-60, {2, 0, 1}}, {-20, {0, 1, 2}}, {25, {0, 1, 2}}, {-128, {2, 0, 1}}};
    for (const auto& [first, cells] : rows) {
        EXPECT_EQ(model->cellsByDistance(at(first)), cells) << int{first};
        EXPECT_EQ(model->nearestCell(at(first)), cells.front()) << int{first};
    }
}

TEST(LikenessModel, DistancesCountAllCoordinatesInFull) {
    SoundLikeness low, high;
    low.coordinates.fill(-128);
    high.coordinates.fill(127);
    EXPECT_EQ(squaredDistance(low, high), 64 * 255 * 255);
    high = low;
    high.coordinates[63] = -125;
    EXPECT_EQ(squaredDistance(low, high), 9);
}

TEST(LikenessModel, RefusesWhatIsWrong) {
    const auto changed = [](const std::function<void(ModelFile&)>& change) {
        ModelFile file;
        change(file);
        return file.bytes();
    };
    const std::size_t head = 16, means = 8 * SoundFeatures::count();
    const float infinite = std::numeric_limits<float>::infinity();
    const struct {
        Bytes bytes;
        const char* reason;
        std::size_t offset;
    } rows[] = {
        {changed([](auto& f) { f.magic = "QVIM"; }), "is no likeness model", 4},
        {changed([](auto& f) { f.format = 2; }), "is of another version of the format", 8},
        {changed([](auto& f) { f.version += 1; }), "was made for other features", 12},
        {changed([](auto& f) { f.features += 1; }), "was made for other features", 16},
        {changed([](auto& f) { f.scale = std::nanf(""); }), "has a number that is not finite or too large",
         head + means / 2 + 4},
        {changed([=](auto& f) { f.bias = infinite; }), "has a number that is not finite or too large",
         head + means + 4 + 2 * 4 + 4},
        {changed([](auto& f) { f.directions = 59; }), "has another number of coordinates", 0},
        {changed([](auto& f) { f.cells = 0; }), "has a count out of bounds", 0},
        {changed([](auto& f) { f.cells = 4097; }), "has a count out of bounds", 0},
        {changed([](auto& f) { f.cells = 4; }), "is cut off", 0},
        {changed([](auto& f) { f.rest = {0}; }), "goes on after the model's end", 0},
    };
    for (const auto& [bytes, reason, offset] : rows) {
        Error error;
        EXPECT_FALSE(LikenessModel::parse(bytes, &error)) << reason;
        EXPECT_EQ(error.reason, reason);
        if (offset > 0) {
            EXPECT_EQ(error.offset, offset) << reason;
        }
    }
}

TEST(LikenessModel, RefusesWhatIsCutOffAnywhere) {
    const Bytes whole = ModelFile().bytes();
    for (std::size_t size = 0; size < whole.size(); size += size < 100 ? 1 : 97) {
        const Bytes part(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
        Error error;
        EXPECT_FALSE(LikenessModel::parse(part, &error)) << size;
        EXPECT_LE(error.offset.value_or(size + 1), size);
    }
}

}  // namespace
}  // namespace qvct

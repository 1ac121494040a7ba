#include "listening/instrument/InstrumentModel.h"
#include "listening/instrument/SoundFeatures.h"

#include <bit>
#include <cmath>
#include <functional>
#include <limits>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

using Bytes = std::vector<std::uint8_t>;

/// A model of two layers: one unit that passes the first feature on, and a likelihood for each of four
/// classes in two families. Tests change one value to make a file that is wrong.
struct ModelFile {
    std::string magic = "QVIM";
    std::uint32_t format = 1, version = SoundFeatures::kVersion;
    std::uint32_t features = static_cast<std::uint32_t>(SoundFeatures::count());
    std::uint8_t family = 1;
    std::vector<std::pair<float, float>> calibration = {{0, 0.1F}, {0.5F, 0.5F}, {1, 0.9F}};
    float mean = 2, scale = 0.5F, weightScale = 0.125F, bias = 0;
    std::uint32_t outputs = 4, networks = 1;
    Bytes rest = {};

    void number(Bytes& out, std::uint32_t value) const {
        for (unsigned shift = 0; shift < 32; shift += 8)
            out.push_back(static_cast<std::uint8_t>(value >> shift));
    }
    void real(Bytes& out, float value) const { number(out, std::bit_cast<std::uint32_t>(value)); }
    void text(Bytes& out, std::string_view words) const {
        out.push_back(static_cast<std::uint8_t>(words.size()));
        out.insert(out.end(), words.begin(), words.end());
    }

    Bytes bytes() const {
        Bytes out(magic.begin(), magic.end());
        for (const std::uint32_t value : {format, version, features, 2U}) number(out, value);
        text(out, "Kick");
        text(out, "Cymbal");
        number(out, 4);
        const std::tuple<const char*, const char*, std::uint8_t> classes[] = {
            {"Kick", "", 0}, {"Crash", "", family}, {"Ride", "bell", 1}, {"Ride", "edge", 1}};
        for (const auto& [label, detail, ofFamily] : classes) {
            text(out, label);
            text(out, detail);
            out.push_back(ofFamily);
        }
        number(out, static_cast<std::uint32_t>(calibration.size()));
        for (const auto& [raw, calibrated] : calibration) real(out, raw), real(out, calibrated);
        for (std::size_t i = 0; i < SoundFeatures::count(); ++i) real(out, mean);
        for (std::size_t i = 0; i < SoundFeatures::count(); ++i) real(out, scale);
        number(out, networks);
        number(out, 2);
        number(out, 1);  // a unit
        real(out, weightScale);
        real(out, bias);
        for (std::size_t i = 0; i < SoundFeatures::count(); ++i) out.push_back(i == 0 ? 8 : 0);
        number(out, outputs);
        for (std::uint32_t i = 0; i < outputs; ++i) real(out, 1);
        for (std::uint32_t i = 0; i < outputs; ++i) real(out, i == 0 ? 0 : std::log(i == 2 ? 0.2F : 0.1F));
        for (std::uint32_t i = 0; i < outputs; ++i) out.push_back(static_cast<std::uint8_t>(i == 1 ? -1 : 0));
        out.insert(out.end(), rest.begin(), rest.end());
        return out;
    }
};

std::optional<InstrumentModel> modelOf(const ModelFile& file, Error* error = nullptr) {
    return InstrumentModel::parse(file.bytes(), error);
}

// The first feature, as the model above sees it: one standard deviation and a half above the mean.
std::vector<float> features(float first) {
    std::vector<float> values(SoundFeatures::count(), 0);
    values[0] = first;
    return values;
}

TEST(InstrumentModel, MultipliesRectifiesAndCompares) {
    const auto model = modelOf({});
    ASSERT_TRUE(model);
    ASSERT_EQ(model->classes(), 4U);
    EXPECT_EQ(model->label(1), "Crash");
    // (5 - 2) / 2 = 1.5 of the first unit, which takes it from the second logit.
    const float crash = 0.1F * std::exp(-1.5F), sum = 1.3F + crash;
    EXPECT_THAT(model->probabilities(features(5)),
                testing::Pointwise(testing::FloatNear(1e-5F),
                                   std::vector<float>{1 / sum, crash / sum, 0.2F / sum, 0.1F / sum}));
    // What is below 0 does not get through; what strays far counts as four deviations.
    EXPECT_FLOAT_EQ(model->probabilities(features(-50))[0], 1 / 1.4F);
    EXPECT_FLOAT_EQ(model->probabilities(features(1e6F))[0], model->probabilities(features(10))[0]);
}

TEST(InstrumentModel, SaysTheLikeliestFamilyAndItsLikeliestLabel) {
    const auto plain = modelOf({});  // which owns the labels
    const auto judged = plain->judge(features(0));
    ASSERT_TRUE(judged);
    EXPECT_EQ(judged->label, "Kick");
    EXPECT_EQ(judged->familyLabel, "Kick");
    EXPECT_NEAR(judged->familyConfidence, 0.5 + (1 / 1.4 - 0.5) * 0.8,
                1e-5);  // on the calibration's second line
    EXPECT_DOUBLE_EQ(judged->confidence, judged->familyConfidence);

    // Without the kick's family the labels of cymbals count, those of one label together.
    ModelFile cymbals;
    cymbals.calibration = {{0.2F, 0.3F}, {0.25F, 0.6F}};  // beyond its ends it is level
    Bytes bytes = cymbals.bytes();
    const std::size_t kickBias = bytes.size() - 4 - 4 * 4;
    for (std::size_t i = 0; i < 4; ++i) bytes[kickBias + i] = i == 3 ? 0xC1 : 0;  // -8
    const auto model = InstrumentModel::parse(bytes);
    const auto cymbal = model->judge(features(0));
    ASSERT_TRUE(cymbal);
    EXPECT_EQ(cymbal->label, "Ride");
    EXPECT_EQ(cymbal->detail, "bell");
    EXPECT_EQ(cymbal->familyLabel, "Cymbal");
    EXPECT_NEAR(cymbal->familyConfidence, 0.6, 1e-6);
    EXPECT_NEAR(cymbal->confidence, 0.6 * 0.75, 1e-5);
}

TEST(InstrumentModel, SaysNothingOfNothing) {
    const auto model = modelOf({});
    EXPECT_FALSE(model->judge({}));
    EXPECT_FALSE(model->judge(std::vector<float>(3, 1.0F)));
}

TEST(InstrumentModel, RefusesWhatIsWrong) {
    const auto changed = [](const std::function<void(ModelFile&)>& change) {
        ModelFile file;
        change(file);
        return file;
    };
    const float notANumber = std::nanf(""), infinite = std::numeric_limits<float>::infinity();
    const std::pair<ModelFile, const char*> cases[] = {
        {changed([](auto& f) { f.magic = "QVIN"; }), "is no instrument model"},
        {changed([](auto& f) { f.format = 2; }), "is of another version of the format"},
        {changed([](auto& f) { f.version += 1; }), "was made for other features"},
        {changed([](auto& f) { f.features += 1; }), "was made for other features"},
        {changed([](auto& f) { f.family = 2; }), "names a family that there is not"},
        {changed([](auto& f) { f.calibration.clear(); }), "has a count out of bounds"},
        {changed([](auto& f) { f.calibration.resize(65); }), "has a count out of bounds"},
        {changed([](auto& f) { f.calibration[1].first = 0; }), "has a calibration that does not ascend"},
        {changed([](auto& f) { f.calibration[1].second = 1.01F; }), "has a calibration that does not ascend"},
        {changed([=](auto& f) { f.mean = notANumber; }), "has a number that is not finite or too large"},
        {changed([=](auto& f) { f.scale = infinite; }), "has a number that is not finite or too large"},
        {changed([=](auto& f) { f.weightScale = -infinite; }),
         "has a number that is not finite or too large"},
        {changed([](auto& f) { f.bias = 2e6F; }), "has a number that is not finite or too large"},
        {changed([](auto& f) { f.outputs = 3; }), "has a network for another number of classes"},
        {changed([](auto& f) { f.networks = 0; }), "has a count out of bounds"},
        {changed([](auto& f) { f.networks = 2; }), "is cut off"},
        {changed([](auto& f) { f.rest = {0}; }), "goes on after the model's end"},
    };
    for (const auto& [file, reason] : cases) {
        Error error;
        EXPECT_FALSE(modelOf(file, &error)) << reason;
        EXPECT_EQ(error.reason, reason);
    }
}

TEST(InstrumentModel, RefusesWhatIsCutOffAnywhere) {
    const Bytes whole = ModelFile().bytes();
    for (std::size_t size = 0; size < whole.size(); size += size < 200 ? 1 : 97) {
        const Bytes part(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
        Error error;
        EXPECT_FALSE(InstrumentModel::parse(part, &error)) << size;
        EXPECT_LE(error.offset.value_or(size + 1), size);
    }
}

}  // namespace
}  // namespace qvct

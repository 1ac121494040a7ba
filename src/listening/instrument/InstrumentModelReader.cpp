#include "listening/instrument/InstrumentModel.h"

#include <algorithm>
#include <bit>
#include <cmath>

namespace qvct {
namespace {

constexpr std::string_view kMagic = "QVIM";
constexpr std::uint32_t kFormat = 1;
constexpr std::size_t kMostClasses = 256, kMostNetworks = 16, kMostLayers = 8, kMostUnits = 4096;
constexpr std::size_t kMostPoints = 64;
constexpr float kLargest = 1e6F;  // of any number in the file

}  // namespace

/// Takes a model's parts from its bytes, one after the other; after the first fault everything is empty.
class InstrumentModel::Reader {
  public:
    explicit Reader(std::span<const std::uint8_t> bytes) : bytes_(bytes) {}

    bool isSound() const { return fault_.empty(); }
    void expect(bool holds, const char* otherwise) {
        if (!holds && isSound()) fault_ = otherwise;
    }
    bool report(Error* error) const {
        return isSound() || fail(error, kErrorMalformed, fault_, {.offset = at_});
    }
    void expectEnd() { expect(at_ == bytes_.size(), "goes on after the model's end"); }

    std::uint32_t number() {
        const auto four = take(4);
        return four.empty() ? 0
                            : four[0] | std::uint32_t{four[1]} << 8U | std::uint32_t{four[2]} << 16U |
                                  std::uint32_t{four[3]} << 24U;
    }
    std::size_t count(std::size_t most) {
        const std::size_t value = number();
        expect(value >= 1 && value <= most, "has a count out of bounds");
        return isSound() ? value : 0;
    }
    float real() {
        const float value = std::bit_cast<float>(number());
        expect(std::abs(value) <= kLargest, "has a number that is not finite or too large");
        return isSound() ? value : 0;
    }
    std::vector<float> reals(std::size_t count) {
        expect(count <= (bytes_.size() - at_) / 4, "is cut off");
        std::vector<float> values(isSound() ? count : 0);
        for (float& value : values) value = real();
        return values;
    }
    std::string text() {
        const auto length = take(1);
        const auto letters = take(length.empty() ? 0 : length[0]);
        return std::string(letters.begin(), letters.end());
    }
    std::size_t index(std::size_t end) {
        const auto byte = take(1);
        expect(!byte.empty() && byte[0] < end, "names a family that there is not");
        return isSound() ? byte[0] : 0;
    }
    void magic() {
        const auto four = take(4);
        expect(std::equal(four.begin(), four.end(), kMagic.begin()), "is no instrument model");
    }
    Layer layer(std::size_t inputs) {
        Layer made{inputs, count(kMostUnits), {}, {}};
        const auto scales = reals(made.outputs);
        made.biases = reals(made.outputs);
        const auto weights = take(made.inputs * made.outputs);
        made.weights.resize(weights.size());
        for (std::size_t i = 0; i < weights.size(); ++i)
            made.weights[i] =
                static_cast<float>(static_cast<std::int8_t>(weights[i])) * scales[i % made.outputs];
        return made;
    }

  private:
    std::span<const std::uint8_t> take(std::size_t size) {
        expect(size <= bytes_.size() - at_, "is cut off");
        if (!isSound()) return {};
        at_ += size;
        return bytes_.subspan(at_ - size, size);
    }

    std::span<const std::uint8_t> bytes_;
    std::size_t at_ = 0;
    std::string fault_;
};

std::optional<InstrumentModel> InstrumentModel::parse(std::span<const std::uint8_t> bytes, Error* error) {
    Reader reader(bytes);
    InstrumentModel model;
    reader.magic();
    reader.expect(reader.number() == kFormat, "is of another version of the format");
    reader.expect(reader.number() == SoundFeatures::kVersion && reader.number() == SoundFeatures::count(),
                  "was made for other features");
    model.families_.resize(reader.count(kMostClasses));
    for (Family& family : model.families_) family.label = reader.text();
    model.classes_.resize(reader.count(kMostClasses));
    for (Class& each : model.classes_) {
        each.label = reader.text();
        each.detail = reader.text();
        each.family = reader.index(model.families_.size());
    }
    model.calibration_.resize(reader.count(kMostPoints));
    for (std::size_t i = 0; i < model.calibration_.size(); ++i) {
        Point& point = model.calibration_[i];
        point = {reader.real(), reader.real()};
        reader.expect(point.calibrated >= 0 && point.calibrated <= 1 &&
                          (i == 0 || point.raw > model.calibration_[i - 1].raw),
                      "has a calibration that does not ascend");
    }
    model.means_ = reader.reals(SoundFeatures::count());
    model.scales_ = reader.reals(SoundFeatures::count());
    model.networks_.resize(reader.count(kMostNetworks));
    for (Network& network : model.networks_) {
        std::size_t inputs = SoundFeatures::count();
        for (std::size_t left = reader.count(kMostLayers); left > 0 && reader.isSound(); --left) {
            network.push_back(reader.layer(inputs));
            inputs = network.back().outputs;
        }
        reader.expect(inputs == model.classes_.size(), "has a network for another number of classes");
    }
    reader.expectEnd();
    if (!reader.report(error)) return std::nullopt;
    return model;
}

}  // namespace qvct

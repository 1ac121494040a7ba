#include "listening/instrument/InstrumentModel.h"
#include "listening/instrument/ModelReader.h"
#include "listening/instrument/SoundFeatures.h"

namespace qvct {
namespace {

constexpr std::uint32_t kFormat = 1;
constexpr std::size_t kMostClasses = 256, kMostNetworks = 16, kMostLayers = 8, kMostPoints = 64;

}  // namespace

std::optional<InstrumentModel> InstrumentModel::parse(std::span<const std::uint8_t> bytes, Error* error) {
    ModelReader reader(bytes);
    InstrumentModel model;
    reader.head("QVIM", kFormat, "is no instrument model");
    model.families_.resize(reader.count(kMostClasses));
    for (Family& family : model.families_) family.label = reader.text();
    model.classes_.resize(reader.count(kMostClasses));
    for (Class& each : model.classes_) {
        each.label = reader.text();
        each.detail = reader.text();
        each.family = reader.index(model.families_.size(), "names a family that there is not");
    }
    model.calibration_.resize(reader.count(kMostPoints));
    for (std::size_t i = 0; i < model.calibration_.size(); ++i) {
        Point& point = model.calibration_[i];
        point = {reader.real(), reader.real()};
        reader.expect(point.calibrated >= 0 && point.calibrated <= 1 &&
                          (i == 0 || point.raw > model.calibration_[i - 1].raw),
                      "has a calibration that does not ascend");
    }
    model.standardisation_ = reader.standardisation();
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

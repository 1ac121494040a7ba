#pragma once

#include "listening/instrument/NetworkLayer.h"
#include "platform/base/Error.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// What a sound is, as far as a model can tell; labels are of the taxonomy and live as long as the model.
struct InstrumentJudgement {
    std::string_view label;   ///< The likeliest label: "Ride".
    std::string_view detail;  ///< What the label alone does not tell: "open" of a hi-hat. Mostly empty.
    double confidence = 0;    ///< How likely the label is, 0 to 1: of those said with 0.9, 0.9 are right.
    std::string_view familyLabel;  ///< What is right for all that it may be mistaken for: "Cymbal".
    double familyConfidence = 0;   ///< How likely the family is; at least `confidence`.
};

/// Tells the instrument of a one-shot from its features: small networks whose answers are averaged and
/// calibrated. The file: docs/formats/instrument-model.md.
///
/// @cost  A judgement multiplies each weight once. Safe from every thread.
class InstrumentModel {
  public:
    /// The model in a file's bytes, or nothing and an error that tells the offset: what is not of this
    /// format, cut off or made for other features, or holds numbers that are not finite.
    static std::optional<InstrumentModel> parse(std::span<const std::uint8_t> bytes, Error* error = nullptr);

    /// What a sound with these features is; nothing where there are no features, as of silence.
    /// REQUIRES: none or SoundFeatures::count() of them.
    std::optional<InstrumentJudgement> judge(std::span<const float> features) const;

    /// The likelihood of each class, in the order of `label`, before calibration.
    std::vector<float> probabilities(std::span<const float> features) const;
    std::size_t classes() const { return classes_.size(); }
    std::string_view label(std::size_t index) const { return classes_[index].label; }

  private:
    struct Family {
        std::string label;
    };
    struct Class {
        std::string label, detail;
        std::size_t family;
    };
    struct Point {
        float raw, calibrated;
    };
    using Network = std::vector<NetworkLayer>;

    std::vector<float> answerOf(const Network& network, std::vector<float> values) const;
    double calibrated(float likelihood) const;

    std::vector<Family> families_;
    std::vector<Class> classes_;
    Standardisation standardisation_;
    std::vector<Network> networks_;
    std::vector<Point> calibration_;
};

}  // namespace qvct

#include "listening/instrument/InstrumentModel.h"

#include <algorithm>
#include <cmath>

namespace qvct {
namespace {

void makeLikelihoods(std::vector<float>& logits) {
    const float highest = *std::max_element(logits.begin(), logits.end());
    float sum = 0;
    for (float& logit : logits) sum += logit = std::exp(logit - highest);
    for (float& logit : logits) logit /= sum;
}

}  // namespace

std::vector<float> InstrumentModel::answerOf(const Network& network, std::vector<float> values) const {
    for (const NetworkLayer& layer : network) {
        values = layer.of(values);
        if (&layer != &network.back()) rectify(values);
    }
    makeLikelihoods(values);
    return values;
}

std::vector<float> InstrumentModel::probabilities(std::span<const float> features) const {
    const auto inputs = standardisation_.of(features);
    std::vector<float> sum(classes_.size(), 0);
    for (const Network& network : networks_) {
        const auto answer = answerOf(network, inputs);
        for (std::size_t c = 0; c < sum.size(); ++c)
            sum[c] += answer[c] / static_cast<float>(networks_.size());
    }
    return sum;
}

// Straight lines between the points.
double InstrumentModel::calibrated(float likelihood) const {
    const auto above = std::find_if(calibration_.begin(), calibration_.end(),
                                    [&](const Point& point) { return point.raw >= likelihood; });
    if (above == calibration_.begin()) return static_cast<double>(above->calibrated);
    if (above == calibration_.end()) return static_cast<double>(calibration_.back().calibrated);
    const Point& below = *(above - 1);
    const float share = (likelihood - below.raw) / (above->raw - below.raw);
    return static_cast<double>(below.calibrated + share * (above->calibrated - below.calibrated));
}

std::optional<InstrumentJudgement> InstrumentModel::judge(std::span<const float> features) const {
    if (features.size() != standardisation_.means.size()) return std::nullopt;
    const auto likelihoods = probabilities(features);
    std::vector<float> families(families_.size(), 0);
    for (std::size_t c = 0; c < classes_.size(); ++c) families[classes_[c].family] += likelihoods[c];
    const auto family =
        static_cast<std::size_t>(std::max_element(families.begin(), families.end()) - families.begin());
    // Classes of one label, such as open and closed hats, are right together.
    float labelled = 0, best = 0;
    const Class* said = nullptr;
    for (std::size_t c = 0; c < classes_.size(); ++c) {
        if (classes_[c].family != family) continue;
        float sum = 0;
        for (std::size_t other = 0; other < classes_.size(); ++other) {
            if (classes_[other].family == family && classes_[other].label == classes_[c].label)
                sum += likelihoods[other];
        }
        if (said == nullptr || sum > labelled || (sum == labelled && likelihoods[c] > best)) {
            said = &classes_[c];
            labelled = sum;
            best = likelihoods[c];
        }
    }
    if (said == nullptr) return std::nullopt;
    const double sure = calibrated(families[family]);
    const float share = families[family] > 0 ? std::min(1.0F, labelled / families[family]) : 0;
    return InstrumentJudgement{said->label, said->detail, sure * static_cast<double>(share),
                               families_[family].label, sure};
}

}  // namespace qvct

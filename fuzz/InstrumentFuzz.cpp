// Any bytes as samples at any rate: the features of a sound are finite and always as many, and a judgement's
// confidences are shares. The rest of the input is tried as a model's file.
#include "ExactInput.h"
#include "listening/instrument/SoundFeatures.h"
#include "resources/DefaultListeningModels.h"

#include <algorithm>
#include <cmath>
#include <cstring>

namespace {

constexpr double kRates[] = {2000, 4000, 8000, 11'025, 22'050, 44'100, 48'000, 64'000};

void listen(const std::vector<float>& samples, double rate) {
    static const auto model = qvct::defaultInstrumentModel();
    const auto features = qvct::SoundFeatures(rate).of(samples);
    qvct::fuzz::require(features.empty() || features.size() == qvct::SoundFeatures::count());
    for (const float value : features) qvct::fuzz::require(std::isfinite(value));
    const auto judged = model->judge(features);
    qvct::fuzz::require(judged.has_value() != features.empty());
    if (!judged) return;
    qvct::fuzz::require(judged->confidence >= 0 && judged->confidence <= judged->familyConfidence);
    qvct::fuzz::require(judged->familyConfidence <= 1 && !judged->label.empty());
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 6) return 0;
    const qvct::fuzz::ExactInput file(data, size);
    if (const auto model = qvct::InstrumentModel::parse(file.bytes()))
        qvct::fuzz::require(model->classes() > 0);

    std::vector<float> part((size - 2) / sizeof(float));
    std::memcpy(part.data(), data + 2, part.size() * sizeof(float));
    for (float& sample : part) sample = std::isfinite(sample) ? std::clamp(sample, -16.0F, 16.0F) : 0;
    std::vector<float> samples;
    const std::size_t repeats = data[1] % 16 + 1U;  // few bytes make a long signal
    for (std::size_t i = 0; i < repeats; ++i) samples.insert(samples.end(), part.begin(), part.end());
    listen(samples, kRates[data[0] % 8]);
    return 0;
}

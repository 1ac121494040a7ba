// Any bytes as samples, at any rate and channel count: what is heard is finite and within its bounds.
#include "ExactInput.h"
#include "listening/Listener.h"
#include "resources/DefaultListeningModels.h"

#include <cmath>
#include <cstring>

namespace {

constexpr double kRates[] = {1, 50, 2000, 8000, 22050, 44100, 96000, 1e7};

void requireShare(double value) {
    qvct::fuzz::require(value >= 0 && value <= 1);
}

void check(const qvct::HeardSound& sound, std::size_t frames) {
    using qvct::fuzz::require;
    std::int64_t last = -1;
    for (const std::int64_t onset : sound.onsets) {
        require(onset > last && onset < static_cast<std::int64_t>(frames));
        last = onset;
    }
    require(std::isfinite(sound.loudness.value_or(0)) && std::isfinite(sound.truePeak.value_or(0)));
    for (const auto& trait : sound.traits) {
        requireShare(trait.level);
        require(std::isfinite(trait.value));
    }
    requireShare(sound.loopConfidence.value_or(0));
    for (const auto& instrument : sound.instruments) requireShare(instrument.confidence);
    if (sound.note) {
        requireShare(sound.note->confidence);
        require(sound.note->number >= 0 && sound.note->number < 128 && std::abs(sound.note->cents) <= 50);
    }
    if (sound.key) {
        requireShare(sound.key->confidence);
        require(sound.key->tonic >= 0 && sound.key->tonic < 12);
    }
    for (const auto& tempo : sound.tempos) {
        requireShare(tempo.confidence);
        require(std::isfinite(tempo.bpm) && tempo.bpm > 0 && std::isfinite(tempo.beats));
    }
    const auto& landmarks = sound.fingerprint.landmarks;
    require(landmarks.size() <= qvct::SoundFingerprint::kMostLandmarks);
    for (std::size_t i = 1; i < landmarks.size(); ++i) require(landmarks[i - 1].frame < landmarks[i].frame);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size < 8) return 0;
    const double rate = kRates[data[0] % 8];
    const int channels = data[1] % 32 + 1;
    const std::size_t repeats = data[2] % 64 + 1U;  // few bytes make a long sound
    std::vector<float> part((size - 4) / sizeof(float));
    std::memcpy(part.data(), data + 4, part.size() * sizeof(float));
    std::vector<float> samples;
    for (std::size_t i = 0; i < repeats; ++i) samples.insert(samples.end(), part.begin(), part.end());

    static qvct::Listener listener(qvct::defaultListeningModels());
    check(listener.listen(samples, rate, channels), samples.size() / static_cast<std::size_t>(channels));
    return 0;
}

// How fast instruments are told: features and judgement of one-shots of half a second at 44.1 kHz, beside
// reading the same samples once as a bound. Processor time of one core. Usage: bench_instrument_speed
// [sounds]
#include "Measure.h"
#include "listening/instrument/SoundFeatures.h"
#include "resources/DefaultListeningModels.h"

#include <cmath>
#include <cstdlib>
#include <random>

#include <fmt/format.h>

namespace qvct::bench {
namespace {

constexpr double kRate = 44'100;

// Drums of different pitch, decay and noise.
std::vector<std::vector<float>> oneShots(std::size_t count) {
    std::mt19937 random(1);
    std::uniform_real_distribution<float> share(0, 1);
    std::vector<std::vector<float>> sounds(count, std::vector<float>(static_cast<std::size_t>(kRate / 2)));
    for (auto& sound : sounds) {
        const float pitch = 40 * std::exp2(5 * share(random)), decay = 5 + 40 * share(random),
                    noise = share(random);
        for (std::size_t i = 0; i < sound.size(); ++i) {
            const float t = static_cast<float>(i) / static_cast<float>(kRate);
            sound[i] = std::exp(-decay * t) *
                       ((1 - noise) * std::sin(6.2832F * pitch * t) + noise * (share(random) - 0.5F));
        }
    }
    return sounds;
}

}  // namespace
}  // namespace qvct::bench

int main(int count, char** arguments) {
    using namespace qvct;
    using namespace qvct::bench;
    const auto sounds = oneShots(count > 1 ? std::strtoul(arguments[1], nullptr, 10) : 400);
    const auto each = 1e6 / static_cast<double>(sounds.size());
    const double energies = medianSeconds([&] {
        float sum = 0;
        for (const auto& sound : sounds)
            for (const float sample : sound) sum += sample * sample;
        keep(sum);
    });
    std::vector<std::vector<float>> features(sounds.size());
    const double measuring = medianSeconds([&] {
        SoundFeatures measure(kRate);
        for (std::size_t i = 0; i < sounds.size(); ++i) features[i] = measure.of(sounds[i]);
    });
    const auto model = defaultInstrumentModel();
    const double judging = medianSeconds([&] {
        for (const auto& values : features) keep(model->judge(values)->confidence);
    });
    printRow("features of a one-shot of 0.5 s", fmt::format("{:.0f} us", measuring * each), "");
    printRow("  its energy, which reads each sample once", fmt::format("{:.0f} us", energies * each), "");
    printRow("judging its features", fmt::format("{:.0f} us", judging * each), "");
    const double both = (measuring + judging) * each;
    printRow("  both together", fmt::format("{:.0f} us = {:.0f} a second", both, 1e6 / both), "300 us");
}

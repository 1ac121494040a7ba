#include "listening/pitch/Decimation.h"

namespace qvct {

void decimate(std::span<const float> sound, std::size_t factor, std::vector<float>& result) {
    const std::size_t size = sound.size() / factor;
    result.resize(size);
    if (factor == 1) {
        for (std::size_t i = 0; i < size; ++i) result[i] = sound[i];
        return;
    }
    const float scale = 1 / static_cast<float>(factor * factor);
    float rising = 0;  // the first half of the triangle, which ends at this sample
    for (std::size_t i = 0; i < size; ++i) {
        const float* run = &sound[i * factor];
        float falling = 0, next = 0;
        for (std::size_t k = 0; k < factor; ++k) {
            falling += run[k] * static_cast<float>(factor - k);
            next += run[k] * static_cast<float>(k);
        }
        result[i] = (rising + falling) * scale;
        rising = next;
    }
}

}  // namespace qvct

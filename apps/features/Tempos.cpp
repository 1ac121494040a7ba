#include "Tempos.h"

#include "listening/tempo/BeatGrid.h"

#include <cstdint>
#include <cstdio>
#include <vector>

namespace qvct {
namespace {

bool readAll(void* to, std::size_t size) {
    return std::fread(to, 1, size, stdin) == size;
}

void write(const std::vector<BeatGrid>& grids) {
    const auto count = static_cast<std::uint32_t>(grids.size());
    std::fwrite(&count, sizeof(count), 1, stdout);
    for (const BeatGrid& grid : grids) {
        std::vector<float> values = {static_cast<float>(grid.bpm)};
        for (const double feature : grid.features) values.push_back(static_cast<float>(feature));
        std::fwrite(values.data(), sizeof(float), values.size(), stdout);
    }
}

}  // namespace

bool writeTempoFeatures() {
    const std::uint32_t width = 1 + BeatGrid::kFeatures;
    std::fwrite(&width, sizeof(width), 1, stdout);
    std::uint32_t loop[3];
    while (readAll(loop, sizeof(loop))) {
        const auto [rate, frames, count] = loop;
        std::vector<Onset> onsets;
        for (std::uint32_t i = 0; i < count; ++i) {
            std::uint32_t frame = 0;
            float loudness = 0;
            if (!readAll(&frame, sizeof(frame)) || !readAll(&loudness, sizeof(loudness))) return false;
            onsets.push_back({frame, loudness});
        }
        if (rate == 0) return false;
        write(BeatGrid::candidates(onsets, frames, rate));
    }
    return true;
}

}  // namespace qvct

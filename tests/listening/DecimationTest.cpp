#include "Tones.h"
#include "listening/pitch/Decimation.h"

#include <cmath>

#include <gtest/gtest.h>

namespace qvct {
namespace {

TEST(Decimation, KeepsWhatIsLowAndLowersWhatIsHigh) {
    for (const std::size_t factor : {1U, 2U, 3U, 8U}) {
        const double rate = 44100, reduced = rate / static_cast<double>(factor);
        const auto peakOf = [&](double hertz) {
            std::vector<float> result;
            decimate(toneOf(hertz, 0.2, rate, {5}), factor, result);
            EXPECT_EQ(result.size(), 8820 / factor);
            float peak = 0;
            for (const float sample : result) peak = std::max(peak, std::abs(sample));
            return peak;
        };
        EXPECT_NEAR(peakOf(reduced / 50), 1, 0.02) << factor;
        if (factor > 1) {
            EXPECT_LT(peakOf(0.9 * std::min(reduced, rate / 2)), 0.06) << factor;
        }
    }
}

}  // namespace
}  // namespace qvct

#include "listening/likeness/SoundFingerprint.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>

namespace qvct {
namespace {

// What landmarks prove whose hashes differ in so many bits: those of copies mostly do in none, those of two
// strokes on one drum mostly in some.
constexpr std::array kProof{1.0, 0.6, 0.3};
constexpr int kSlack = 1;      // frames
constexpr double kFewest = 6;  // so many landmarks prove something

struct Agreement {
    int offset;
    double proof;
};

}  // namespace

double sharedPart(const SoundFingerprint& one, const SoundFingerprint& other) {
    std::vector<Agreement> found;
    for (const auto& left : one.landmarks) {
        for (const auto& right : other.landmarks) {
            const auto bits = static_cast<std::size_t>(std::popcount(left.hash ^ right.hash));
            if (bits < kProof.size()) found.push_back({left.frame - right.frame, kProof[bits]});
        }
    }
    std::sort(found.begin(), found.end(),
              [](const Agreement& a, const Agreement& b) { return a.offset < b.offset; });
    double best = 0;
    for (std::size_t first = 0; first < found.size(); ++first) {
        double proof = 0;
        for (std::size_t k = first; k < found.size() && found[k].offset - found[first].offset <= kSlack; ++k)
            proof += found[k].proof;
        best = std::max(best, proof);
    }
    const auto both = static_cast<double>(one.landmarks.size() * other.landmarks.size());
    return std::min(1.0, best / std::max(std::sqrt(both), kFewest));
}

}  // namespace qvct

#include "listening/likeness/SoundFingerprint.h"

#include <algorithm>
#include <array>
#include <bit>

namespace qvct {
namespace {

// What landmarks prove whose hashes differ in so many bits: those of copies mostly do in none, those of two
// strokes on one drum mostly in some.
constexpr std::array kProof{1.0, 0.6, 0.3};
constexpr int kSlack = 1;       // frames
constexpr double kFewest = 10;  // so many landmarks prove something

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
    const auto shorter = static_cast<double>(std::min(one.landmarks.size(), other.landmarks.size()));
    return std::min(1.0, best / std::max(shorter, kFewest));
}

}  // namespace qvct

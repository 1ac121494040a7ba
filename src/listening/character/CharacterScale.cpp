#include "listening/character/CharacterScale.h"

#include <algorithm>
#include <cmath>

namespace qvct {
namespace {

struct Scale {
    std::string_view name, measure;
    std::array<double, kCharacterShares.size()> points{};  // measures at these levels, from pole to pole
};

constexpr std::array<Scale, kCharacterScales> kScales = {{
    {"Bright / Dark",
     "sharpness, acum",
     {8, 3.16, 2.73, 2.31, 1.97, 1.73, 1.57, 1.38, 1.24, 1.09, 0.89, 0.655, 0.1}},
    {"Cold / Warm",
     "loudness below 400 Hz, share",
     {0, 0.056, 0.0934, 0.129, 0.163, 0.2, 0.239, 0.272, 0.323, 0.402, 0.484, 0.596, 1}},
    {"Soft / Hard",
     "hardness, octaves",
     {-12, -4.95, -1.33, 1.03, 2.8, 4.12, 4.9, 5.51, 6.06, 6.58, 7.12, 7.8, 9}},
    {"Smooth / Rough",
     "roughness, asper",
     {0, 0.0086, 0.0449, 0.147, 0.233, 0.313, 0.39, 0.493, 0.583, 0.718, 0.998, 1.99, 5}},
    {"Tonal / Non-Tonal",
     "spectral flatness, dB",
     {-90, -38.3, -31.4, -24.9, -19.9, -14, -9.45, -7.29, -5.81, -4.51, -3.5, -2.55, 0}},
    {"Low / High",
     "mean frequency, Hz",
     {20, 49.9, 106, 154, 234, 328, 442, 613, 968, 1720, 3460, 5760, 15500}},
    {"Narrow / Wide",
     "share of the side signal",
     {0, 0.00138, 0.00337, 0.0189, 0.0572, 0.121, 0.259, 0.366, 0.451, 0.514, 0.796, 0.943, 1}},
    {"Simple / Complex",
     "partials",
     {1, 1.33, 2.47, 3.87, 5.32, 8.07, 12.9, 22.8, 47.8, 91.7, 145, 201, 1000}},
}};

}  // namespace

std::string_view nameOf(CharacterScale scale) {
    return kScales[indexOf(scale)].name;
}

std::string_view measureOf(CharacterScale scale) {
    return kScales[indexOf(scale)].measure;
}

double levelOf(CharacterScale scale, double measure) {
    const auto& points = kScales[indexOf(scale)].points;
    const bool rises = points.front() < points.back();
    const auto isBefore = [rises](double point, double value) {
        return rises ? point < value : point > value;
    };
    const auto next = std::lower_bound(points.begin() + 1, points.end() - 1, measure, isBefore);
    const auto segment = static_cast<std::size_t>(next - points.begin()) - 1;
    const double part = (measure - points[segment]) / (points[segment + 1] - points[segment]);
    return std::lerp(kCharacterShares[segment], kCharacterShares[segment + 1], std::clamp(part, 0.0, 1.0));
}

}  // namespace qvct

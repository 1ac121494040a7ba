#include "output/pictures/RhythmPlot.h"

#include "output/pictures/SvgDrawing.h"

#include <algorithm>
#include <cmath>
#include <set>
#include <string_view>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr double kWidth = 1200, kLeft = 60, kRight = 20, kPlotWidth = kWidth - kLeft - kRight;
constexpr double kSoundTop = 60, kSoundHeight = 200;
constexpr double kWeightTop = 300, kWeightHeight = 80;
constexpr double kLevelTop = 430, kLevelHeight = 18;
constexpr std::int32_t kMostGridCells = 1024;  // Closer lines than that are a grey area.
constexpr double kCellsPerBeat = 8;

/// Draws one plot; the panels share the axis of beats.
class Painter {
  public:
    explicit Painter(const RhythmPlot& plot)
        : plot_(plot),
          beats_(std::max(plot.beatCount, 0)),
          svg_(kWidth, kLevelTop + kLevelHeight * static_cast<double>(plot.divisions.size()) + 30) {}

    std::string paint() && {
        paintTitle();
        paintGrid();
        if (plot_.waveform.empty()) {
            paintNotes();
        } else {
            paintWaveform();
        }
        paintOnsets();
        paintWeights();
        paintLevels();
        return std::move(svg_).finish();
    }

  private:
    bool isInside(double beat) const { return beat >= 0 && beat < beats_; }
    double x(double beat) const { return beats_ > 0 ? kLeft + kPlotWidth * beat / beats_ : kLeft; }

    void paintTitle() {
        svg_.text(kLeft, 24, plot_.title, " font-size=\"16\" font-weight=\"bold\"");
        svg_.text(kLeft, 44,
                  fmt::format("density {:.3f} · complexity {:.3f} · {} beats in {}/{} at {:.6g} a minute",
                              plot_.density, plot_.complexity, plot_.beatCount, plot_.signatureTop,
                              plot_.signatureBottom, plot_.tempo));
    }

    void paintGrid() {
        svg_.rectangle(kLeft, kSoundTop, kPlotWidth, kSoundHeight, "#f4f4f4");
        const bool drawsCells = beats_ * kCellsPerBeat <= kMostGridCells;
        const auto beatStep = static_cast<std::int64_t>(beats_ / kMostGridCells) + 1;
        const std::int64_t labelStep = beatStep * (static_cast<std::int64_t>(beats_ / 64) / beatStep + 1);
        for (std::int64_t beat = 0; static_cast<double>(beat) <= beats_; beat += beatStep) {
            const auto at = static_cast<double>(beat);
            const bool isBar = plot_.signatureTop > 0 && beat % plot_.signatureTop == 0;
            svg_.line(x(at), kSoundTop, kSoundTop + kSoundHeight, isBar ? "#666" : "#aaa", isBar ? 1.5 : 1);
            if (beat % labelStep == 0 && at < beats_) {
                svg_.text(x(at) + 2, kSoundTop + kSoundHeight + 14, std::to_string(beat + 1));
            }
            for (int cell = 1; drawsCells && cell < kCellsPerBeat && at < beats_; ++cell) {
                svg_.line(x(at + cell / kCellsPerBeat), kSoundTop, kSoundTop + kSoundHeight, "#ddd", 0.5);
            }
        }
    }

    void paintWaveform() {
        const auto columns = std::min(plot_.waveform.size(), static_cast<std::size_t>(kPlotWidth));
        const double middle = kSoundTop + kSoundHeight / 2;
        const auto level = [](float sample) {
            return std::isfinite(sample) ? std::clamp(sample, -1.0F, 1.0F) : 0.0F;
        };
        for (std::size_t column = 0; column < columns; ++column) {
            const std::size_t first = column * plot_.waveform.size() / columns;
            const std::size_t end = (column + 1) * plot_.waveform.size() / columns;
            float low = 1;
            float high = -1;
            for (std::size_t i = first; i < end; ++i) {
                low = std::min(low, level(plot_.waveform[i].low));
                high = std::max(high, level(plot_.waveform[i].high));
            }
            const double width = kPlotWidth / static_cast<double>(columns);
            svg_.rectangle(kLeft + static_cast<double>(column) * width,
                           middle - double{high} * kSoundHeight / 2, width,
                           std::max(0.5, double{high - low} * kSoundHeight / 2), "#4a7ab5");
        }
    }

    void paintNotes() {
        int lowest = 127;
        int highest = 0;
        for (const Note& note : plot_.notes) {
            lowest = std::min(lowest, note.pitch);
            highest = std::max(highest, note.pitch);
        }
        const double row = kSoundHeight / std::max(1, highest - lowest + 1);
        for (const Note& note : plot_.notes) {
            if (!isInside(note.startTime) || !std::isfinite(note.endTime)) continue;
            const double end = std::clamp(note.endTime, note.startTime, beats_);
            const double strength = 0.25 + 0.75 * std::clamp(note.velocity, 0, 127) / 127;
            svg_.rectangle(x(note.startTime), kSoundTop + row * (highest - note.pitch),
                           std::max(x(end) - x(note.startTime), 2.0), std::max(row - 1, 0.5), "#4a7ab5",
                           strength);
        }
    }

    void paintOnsets() {
        for (const double onset : plot_.onsets) {
            if (isInside(onset)) svg_.line(x(onset), kSoundTop, kSoundTop + kSoundHeight, "#d0342c", 1.2);
        }
    }

    void paintWeights() {
        svg_.text(kLeft, kWeightTop - 6, "metric weight of each cell; red where an onset falls");
        std::set<std::size_t> hit;
        for (const double onset : plot_.onsets) {
            // The nearest cell, as in the measurement: an exact half is rounded down.
            if (isInside(onset)) hit.insert(static_cast<std::size_t>(std::ceil(onset * kCellsPerBeat - 0.5)));
        }
        const std::size_t cells =
            std::min(plot_.metricWeights.size(), static_cast<std::size_t>(beats_ * kCellsPerBeat));
        const std::size_t step = cells / kMostGridCells + 1;
        for (std::size_t cell = 0; cell < cells; cell += step) {
            const float weight = plot_.metricWeights[cell];
            if (!std::isfinite(weight)) continue;
            const double tall = kWeightHeight * std::clamp(double{weight}, 0.0, 1.0);
            const double left = x(static_cast<double>(cell) / kCellsPerBeat);
            const double right = x(static_cast<double>(cell + step) / kCellsPerBeat);
            svg_.rectangle(left, kWeightTop + kWeightHeight - tall, (right - left) * 0.8, tall,
                           hit.contains(cell) ? "#d0342c" : "#bbb");
        }
    }

    void paintLevels() {
        svg_.text(kLeft, kLevelTop - 8, "difference of the parts at each level");
        double length = beats_;
        for (std::size_t level = 0; level < plot_.divisions.size(); ++level) {
            const double top = kLevelTop + kLevelHeight * static_cast<double>(level);
            length /= std::max(plot_.divisions[level], 1);
            svg_.text(kLeft, top + 12,
                      fmt::format("{} parts of {:.4g} beats", plot_.divisions[level], length));
            const float score = level < plot_.levelScores.size() ? plot_.levelScores[level] : 0;
            if (!std::isfinite(score)) continue;
            const double wide = (kPlotWidth - 220) * std::clamp(double{score}, 0.0, 1.0);
            svg_.rectangle(kLeft + 160, top + 2, wide, kLevelHeight - 5, "#3d9970");
            svg_.text(kLeft + 166 + wide, top + 12, fmt::format("{:.3f}", score));
        }
    }

    const RhythmPlot& plot_;
    double beats_;
    SvgDrawing svg_;
};

}  // namespace

std::string RhythmPlot::svg() const {
    return Painter(*this).paint();
}

}  // namespace qvct

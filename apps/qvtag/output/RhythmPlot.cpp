#include "output/RhythmPlot.h"

#include <algorithm>
#include <cmath>
#include <set>
#include <string_view>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr double kWidth = 1200, kLeft = 60, kRight = 20, kPlotWidth = kWidth - kLeft - kRight;
constexpr double kSoundTop = 60, kSoundHeight = 200;
constexpr double kWeightTop = 300, kWeightHeight = 80;
constexpr double kLevelTop = 430, kLevelHeight = 18;
constexpr std::int32_t kMostGridCells = 1024;  // Closer lines than that are a grey area.
constexpr double kCellsPerBeat = 8;

std::string escaped(std::string_view text) {
    std::string out;
    for (const char c : text) {
        switch (c) {
            case '&':
                out += "&amp;";
                break;
            case '<':
                out += "&lt;";
                break;
            case '>':
                out += "&gt;";
                break;
            default:
                out += static_cast<unsigned char>(c) < 0x20 ? ' ' : c;
        }
    }
    return out;
}

/// Draws one plot; the panels share the axis of beats.
class Painter {
  public:
    explicit Painter(const RhythmPlot& plot) : plot_(plot), beats_(std::max(plot.beatCount, 0)) {}

    std::string paint() {
        const double height = kLevelTop + kLevelHeight * static_cast<double>(plot_.divisions.size()) + 30;
        svg_ = fmt::format(
            "<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 {0} {1:.0f}\" width=\"{0}\" "
            "height=\"{1:.0f}\" font-family=\"sans-serif\" font-size=\"12\">\n"
            "<rect width=\"100%\" height=\"100%\" fill=\"white\"/>\n",
            kWidth, height);
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
        return svg_ + "</svg>\n";
    }

  private:
    bool isInside(double beat) const { return beat >= 0 && beat < beats_; }
    double x(double beat) const { return beats_ > 0 ? kLeft + kPlotWidth * beat / beats_ : kLeft; }

    void text(double left, double top, std::string_view content, std::string_view more = {}) {
        svg_ +=
            fmt::format("<text x=\"{:.1f}\" y=\"{:.1f}\"{}>{}</text>\n", left, top, more, escaped(content));
    }
    void rectangle(double left, double top, double width, double height, std::string_view fill) {
        svg_ +=
            fmt::format("<rect x=\"{:.2f}\" y=\"{:.2f}\" width=\"{:.2f}\" height=\"{:.2f}\" fill=\"{}\"/>\n",
                        left, top, std::max(width, 0.5), std::max(height, 0.0), fill);
    }
    void line(double left, double top, double bottom, std::string_view colour, double width) {
        svg_ += fmt::format(
            "<line x1=\"{0:.2f}\" x2=\"{0:.2f}\" y1=\"{1:.2f}\" y2=\"{2:.2f}\" stroke=\"{3}\" "
            "stroke-width=\"{4}\"/>\n",
            left, top, bottom, colour, width);
    }

    void paintTitle() {
        text(kLeft, 24, plot_.title, " font-size=\"16\" font-weight=\"bold\"");
        text(kLeft, 44,
             fmt::format("density {:.3f} · complexity {:.3f} · {} beats in {}/{} at {:.6g} a minute",
                         plot_.density, plot_.complexity, plot_.beatCount, plot_.signatureTop,
                         plot_.signatureBottom, plot_.tempo));
    }

    void paintGrid() {
        rectangle(kLeft, kSoundTop, kPlotWidth, kSoundHeight, "#f4f4f4");
        const bool drawsCells = beats_ * kCellsPerBeat <= kMostGridCells;
        const auto beatStep = static_cast<std::int64_t>(beats_ / kMostGridCells) + 1;
        const std::int64_t labelStep = beatStep * (static_cast<std::int64_t>(beats_ / 64) / beatStep + 1);
        for (std::int64_t beat = 0; static_cast<double>(beat) <= beats_; beat += beatStep) {
            const auto at = static_cast<double>(beat);
            const bool isBar = plot_.signatureTop > 0 && beat % plot_.signatureTop == 0;
            line(x(at), kSoundTop, kSoundTop + kSoundHeight, isBar ? "#666" : "#aaa", isBar ? 1.5 : 1);
            if (beat % labelStep == 0 && at < beats_) {
                text(x(at) + 2, kSoundTop + kSoundHeight + 14, std::to_string(beat + 1));
            }
            for (int cell = 1; drawsCells && cell < kCellsPerBeat && at < beats_; ++cell) {
                line(x(at + cell / kCellsPerBeat), kSoundTop, kSoundTop + kSoundHeight, "#ddd", 0.5);
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
            rectangle(kLeft + static_cast<double>(column) * width, middle - double{high} * kSoundHeight / 2,
                      width, std::max(0.5, double{high - low} * kSoundHeight / 2), "#4a7ab5");
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
            svg_ += fmt::format(
                "<rect x=\"{:.2f}\" y=\"{:.2f}\" width=\"{:.2f}\" height=\"{:.2f}\" fill=\"#4a7ab5\" "
                "fill-opacity=\"{:.2f}\"/>\n",
                x(note.startTime), kSoundTop + row * (highest - note.pitch),
                std::max(x(end) - x(note.startTime), 2.0), std::max(row - 1, 0.5), strength);
        }
    }

    void paintOnsets() {
        for (const double onset : plot_.onsets) {
            if (isInside(onset)) line(x(onset), kSoundTop, kSoundTop + kSoundHeight, "#d0342c", 1.2);
        }
    }

    void paintWeights() {
        text(kLeft, kWeightTop - 6, "metric weight of each cell; red where an onset falls");
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
            rectangle(left, kWeightTop + kWeightHeight - tall, (right - left) * 0.8, tall,
                      hit.contains(cell) ? "#d0342c" : "#bbb");
        }
    }

    void paintLevels() {
        text(kLeft, kLevelTop - 8, "difference of the parts at each level");
        double length = beats_;
        for (std::size_t level = 0; level < plot_.divisions.size(); ++level) {
            const double top = kLevelTop + kLevelHeight * static_cast<double>(level);
            length /= std::max(plot_.divisions[level], 1);
            text(kLeft, top + 12, fmt::format("{} parts of {:.4g} beats", plot_.divisions[level], length));
            const float score = level < plot_.levelScores.size() ? plot_.levelScores[level] : 0;
            if (!std::isfinite(score)) continue;
            const double wide = (kPlotWidth - 220) * std::clamp(double{score}, 0.0, 1.0);
            rectangle(kLeft + 160, top + 2, wide, kLevelHeight - 5, "#3d9970");
            text(kLeft + 166 + wide, top + 12, fmt::format("{:.3f}", score));
        }
    }

    const RhythmPlot& plot_;
    double beats_;
    std::string svg_;
};

}  // namespace

std::string RhythmPlot::svg() const {
    return Painter(*this).paint();
}

}  // namespace qvct

#include "output/pictures/SoundPlot.h"

#include "listening/HeardSound.h"
#include "listening/sound/FourSpectra.h"
#include "listening/sound/SoundExcerpt.h"
#include "output/SoundWords.h"
#include "output/pictures/SvgDrawing.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <vector>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

constexpr double kWidth = 1200, kLeft = 60, kPlotWidth = 1120;
constexpr double kWaveTop = 60, kWaveHeight = 180;
constexpr double kBandsTop = 260, kBandsHeight = 240;
constexpr double kTextTop = 530, kLineHeight = 18;
constexpr std::size_t kColumns = 140, kBands = 40;
constexpr double kLowest = 40, kHighest = 16'000;  // Hz
constexpr double kFloor = 60;                      // dB below the strongest

/// Levels from 0 to 1 by column and band.
class Picture {
  public:
    explicit Picture(const SoundExcerpt& excerpt) : levels_(kColumns * kBands) {
        constexpr double kWindow = 0.046;
        const std::size_t size = FourSpectra::sizeFor(kWindow, excerpt.sampleRate());
        FourSpectra spectra(size);
        const auto sound = excerpt.mono();
        std::vector<float> padded(size + sound.size());
        std::copy(sound.begin(), sound.end(), padded.begin() + static_cast<std::ptrdiff_t>(size / 2));
        const double binWidth = excerpt.sampleRate() / static_cast<double>(size);
        for (std::size_t column = 0; column < kColumns; column += 4) {
            std::array<const float*, 4> frames{};
            for (std::size_t lane = 0; lane < 4; ++lane)
                frames[lane] = padded.data() + (column + lane) * sound.size() / kColumns;
            addColumns(spectra.powers(frames), binWidth, column);
        }
        const float most = *std::max_element(levels_.begin(), levels_.end());
        for (float& level : levels_)
            level = std::clamp(1 + (level - most) / static_cast<float>(kFloor), 0.0F, 1.0F);
    }

    float level(std::size_t column, std::size_t band) const { return levels_[column * kBands + band]; }

  private:
    static double edge(std::size_t band) {
        return kLowest * std::pow(kHighest / kLowest, static_cast<double>(band) / kBands);
    }

    void addColumns(std::span<const Lanes> powers, double binWidth, std::size_t column) {
        for (std::size_t band = 0; band < kBands; ++band) {
            const auto first = static_cast<std::size_t>(edge(band) / binWidth);
            const std::size_t end = std::max(first + 1, static_cast<std::size_t>(edge(band + 1) / binWidth));
            Lanes sum(1e-10F);
            for (std::size_t bin = first; bin < std::min(end, powers.size()); ++bin) sum += powers[bin];
            for (int lane = 0; lane < 4; ++lane)
                levels_[(column + static_cast<std::size_t>(lane)) * kBands + band] =
                    10 * std::log10(sum.v[lane]);
        }
    }

    std::vector<float> levels_;
};

class Painter {
  public:
    Painter(const HeardSound& sound, const SoundExcerpt& excerpt)
        : sound_(sound), excerpt_(excerpt), svg_(kWidth, kTextTop + 10 * kLineHeight) {}

    std::string paint(const std::string& title) && {
        svg_.text(kLeft, 24, title, " font-size=\"16\" font-weight=\"bold\"");
        if (!excerpt_.mono().empty()) {
            paintWaveform();
            paintBands();
            paintOnsets();
        }
        double top = kTextTop;
        for (const std::string& line : linesOfSound(sound_)) {
            svg_.text(kLeft, top, line, " xml:space=\"preserve\"");
            top += kLineHeight;
        }
        return std::move(svg_).finish();
    }

  private:
    void paintWaveform() {
        svg_.rectangle(kLeft, kWaveTop, kPlotWidth, kWaveHeight, "#f4f4f4");
        constexpr std::size_t kSlices = 560;
        const auto sound = excerpt_.mono();
        const double width = kPlotWidth / kSlices;
        for (std::size_t slice = 0; slice < kSlices; ++slice) {
            const std::size_t first = slice * sound.size() / kSlices;
            const std::size_t end = std::max(first + 1, (slice + 1) * sound.size() / kSlices);
            const auto part = sound.subspan(first, std::min(end, sound.size()) - first);
            const auto [low, high] = std::minmax_element(part.begin(), part.end());
            const double top = std::clamp(double{*high}, -1.0, 1.0);
            const double bottom = std::clamp(double{*low}, -1.0, 1.0);
            svg_.rectangle(kLeft + static_cast<double>(slice) * width, kWaveTop + (1 - top) * kWaveHeight / 2,
                           width, std::max(0.5, (top - bottom) * kWaveHeight / 2), "#4a7ab5");
        }
    }

    void paintBands() {
        const Picture picture(excerpt_);
        const double width = kPlotWidth / kColumns, height = kBandsHeight / kBands;
        svg_.rectangle(kLeft, kBandsTop, kPlotWidth, kBandsHeight, "#f4f4f4");
        for (std::size_t column = 0; column < kColumns; ++column) {
            for (std::size_t band = 0; band < kBands; ++band) {
                const float level = picture.level(column, band);
                if (level <= 0) continue;
                svg_.rectangle(kLeft + static_cast<double>(column) * width,
                               kBandsTop + kBandsHeight - static_cast<double>(band + 1) * height, width,
                               height, "#264d73", double{level});
            }
        }
        for (const auto& [hertz, label] :
             {std::pair(100.0, "100 Hz"), {1000.0, "1 kHz"}, {10000.0, "10 kHz"}}) {
            const double share = std::log(hertz / kLowest) / std::log(kHighest / kLowest);
            svg_.text(8, kBandsTop + kBandsHeight * (1 - share), label);
        }
    }

    void paintOnsets() {
        for (const std::int64_t onset : sound_.onsets) {
            const double seconds = static_cast<double>(onset - excerpt_.begin()) / sound_.sampleRate;
            if (seconds < 0 || seconds > excerpt_.seconds()) continue;
            svg_.line(kLeft + kPlotWidth * seconds / excerpt_.seconds(), kWaveTop, kWaveTop + kWaveHeight,
                      "#d0342c", 1.2);
        }
    }

    const HeardSound& sound_;
    const SoundExcerpt& excerpt_;
    SvgDrawing svg_;
};

}  // namespace

std::string svgOfSound(const std::string& title, const HeardSound& sound, const SoundExcerpt& excerpt) {
    return Painter(sound, excerpt).paint(title);
}

}  // namespace qvct::tool

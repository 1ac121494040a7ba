#include "output/Progress.h"

#include "output/StandardStreams.h"
#include "platform/processes/StandardStreams.h"

#include <algorithm>
#include <cmath>
#include <string>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

std::string duration(double seconds) {
    const auto whole = static_cast<std::int64_t>(std::llround(seconds));
    constexpr std::int64_t minute = 60;
    if (whole >= minute * minute)
        return fmt::format("{} h {:02} min", whole / minute / minute, whole / minute % minute);
    return fmt::format("{}:{:02}", whole / minute, whole % minute);
}

}  // namespace

Progress::Progress(bool isQuiet)
    : start_(std::chrono::steady_clock::now()), isShown_(!isQuiet && isTerminal(StandardStream::error)) {}

double Progress::seconds() const {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start_).count();
}

void Progress::show(std::uint64_t done, std::uint64_t total) {
    if (!isShown_) return;
    const double rate = static_cast<double>(done) / std::max(seconds(), 1e-3);
    std::string line = fmt::format("{} items, {:.0f} a second", done, rate);
    if (total > 0) {
        constexpr std::uint64_t width = 24;
        done = std::min(done, total);
        const std::string bar(done * width / total, '#');
        line = fmt::format("[{:<24}] {:3}%  {} of {}, {:.0f} a second", bar, done * 100 / total, done, total,
                           rate);
        if (rate > 0) line += fmt::format(", {} left", duration(static_cast<double>(total - done) / rate));
    }
    printError("\r\x1b[K{}", line);
    hasLine_ = true;
}

void Progress::hide() {
    if (!hasLine_) return;
    printErrorText("\r\x1b[K");
    hasLine_ = false;
}

}  // namespace qvct::tool

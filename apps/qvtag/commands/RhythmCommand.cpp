#include "CommandLine.h"
#include "commands/Commands.h"
#include "operations/RhythmMeasurement.h"
#include "output/StandardStreams.h"
#include "output/pictures/PlotFile.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"

#include <bit>
#include <charconv>
#include <cmath>
#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    std::vector<std::string> paths;
    RhythmRequest request;
    std::string signature;
    std::string plotFile;
};

/// "6/8" into its two numbers.
bool readSignature(const std::string& text, RhythmRequest& request) {
    if (text.empty()) return true;
    std::int32_t top = 0;
    std::int32_t bottom = 0;
    const char* end = text.data() + text.size();
    const auto [slash, topStatus] = std::from_chars(text.data(), end, top);
    if (topStatus != std::errc{} || slash == end || *slash != '/') return false;
    const auto [rest, bottomStatus] = std::from_chars(slash + 1, end, bottom);
    constexpr std::int32_t most = 64;
    const bool isNote = bottom >= 1 && bottom <= most && std::has_single_bit(static_cast<unsigned>(bottom));
    if (bottomStatus != std::errc{} || rest != end || top < 1 || top > most || !isNote) return false;
    request.signatureTop = top;
    request.signatureBottom = bottom;
    return true;
}

/// The value rounded to a millionth, so that it is printed without the digits of rounding errors.
double rounded(double value) {
    return std::round(value * 1e6) / 1e6;
}

Json jsonOf(const std::string& path, const RhythmResult& result) {
    Json json{{"path", URL::fileURLWithPath(path).path()},
              {"density", result.density},
              {"complexity", result.complexity},
              {"onsets", Json::array()}};
    for (const double onset : result.onsets) json["onsets"].push_back(rounded(onset));
    json["beatCount"] = result.beatCount;
    json["tempo"] = rounded(result.tempo);
    json["signature"] = fmt::format("{}/{}", result.signatureTop, result.signatureBottom);
    json["accentedComplexity"] = result.accentedComplexity ? Json(*result.accentedComplexity) : Json();
    json["reasonForZero"] = result.reasonForZero.empty() ? Json() : Json(result.reasonForZero);
    json["allTracks"] = Json();
    if (const auto& all = result.allTracks)
        json["allTracks"] = {
            {"tracks", all->count}, {"density", all->density}, {"complexity", all->complexity}};
    return json;
}

std::string bar(float value) {
    constexpr std::size_t width = 10;
    const auto full = static_cast<std::size_t>(std::lround(value * static_cast<float>(width)));
    std::string text;
    for (std::size_t i = 0; i < width; ++i) text += i < full ? "█" : "░";
    return text;
}

void printRow(const std::string& path, const RhythmResult& result) {
    print("{}\n  density {} {:3.0f}%   complexity {} {:3.0f}%   {} onsets in {} beats of {}/{} at {:g} bpm\n",
          printable(path), bar(result.density), static_cast<double>(result.density) * 100,
          bar(result.complexity), static_cast<double>(result.complexity) * 100, result.onsets.size(),
          result.beatCount, result.signatureTop, result.signatureBottom, rounded(result.tempo));
    if (!result.reasonForZero.empty()) print("  complexity 0%: {}\n", result.reasonForZero);
    if (const auto accented = result.accentedComplexity)
        print("  complexity with its accents {:.0f}%\n", double{*accented} * 100);
    if (const auto& all = result.allTracks)
        print("  first of {} tracks; all together: density {:.0f}%, complexity {:.0f}%\n", all->count,
              double{all->density} * 100, double{all->complexity} * 100);
}

void writePlot(const Options& options, const RhythmResult& result, ToolContext& context) {
    if (options.plotFile.empty()) return;
    Error error;
    if (!replaceFile(options.plotFile, result.plot.svg(), &error)) context.itemFailed(error);
}

void run(Options options, ToolContext& context) {
    if (!readSignature(options.signature, options.request)) {
        return context.usageFailed(
            fmt::format("\"{}\" is no time signature such as 6/8", printable(options.signature)));
    }
    if (!options.plotFile.empty() && options.paths.size() != 1) {
        return context.usageFailed("--plot draws one file; name only one");
    }
    const Error problem = problemOfPlot(options.plotFile, options.paths);
    if (problem.isSet()) return context.usageFailed(problem.message());
    Json items = Json::array();
    for (const std::string& path : options.paths) {
        if (isOutputLost()) break;
        Error error;
        ItemFile file(URL::fileURLWithPath(path));
        const auto result = measureRhythm(file, options.request, &error);
        if (!result) {
            context.itemFailed(error);
            continue;
        }
        for (Error damage : result->problems) {
            failIn(path, &damage);
            context.note(damage.message());
        }
        writePlot(options, *result, context);
        if (context.format == Format::table) {
            printRow(path, *result);
        } else {
            items.push_back(jsonOf(path, *result));
        }
    }
    if (context.format != Format::table) printJson(items, context.format);
}

}  // namespace

void addRhythmCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand("rhythm", "Measures how dense and how complex a rhythm is");
    command.addOption("files", options->paths, "MIDI files, loops and other sounds")
        .required()
        .valueName("FILE");
    command.addOption("--tempo", options->request.tempo, "Quarter notes a minute").between(1.0, 1000.0);
    command.addOption("--beats", options->request.beats, "Length in beats, 6 a bar of 6/8")
        .between(1, kMostBeats);
    command.addOption("--signature", options->signature, "Time signature, such as 6/8");
    command.addOption("--plot", options->plotFile, "Draw the rhythm, and what gave it its numbers")
        .valueName("FILE.svg");
    command.footer("Example:\n  qvtag rhythm \"Deep House Beat.caf\" --plot beat.svg");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool

#include "CommandLine.h"
#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "commands/Commands.h"
#include "output/StandardStreams.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <memory>

namespace qvct::tool {
namespace {

struct Options {
    std::string text;
};

void printTable(const CountedSet& found) {
    std::size_t width = 0;
    for (const auto& [label, _] : found) width = std::max(width, displayWidth(printable(label)));
    for (const auto& [label, count] : found) print("{}  {}\n", padded(printable(label), width), count);
}

void run(const Options& options, ToolContext& context) {
    if (!isValidUtf8(options.text)) {
        return context.itemFailed(
            errorOf(kErrorInvalidArgument, "the text is not UTF-8", {.part = options.text}));
    }
    const auto extractor = QVCTKeywordExtractor::defaultKeywordExtractor();
    const CountedSet found = extractor->extractKeywordsFromString(options.text);
    if (context.format == Format::table) return printTable(found);
    Json counts = Json::object();
    for (const auto& [label, count] : found) counts[label] = count;
    printJson(counts, context.format);
}

}  // namespace

void addKeywordsCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command =
        tool.addCommand("keywords", "Shows which labels the words of a text yield, and how often");
    command.addOption("text", options->text, "The text, such as a path").required();
    command.footer("Example:\n  qvtag keywords \"Loops/Deep House/Warm Analog Synth.caf\"");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool

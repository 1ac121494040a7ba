#include "CommandLine.h"
#include "TaggerOptions.h"
#include "ToolContext.h"
#include "autotagging/ContentItem.h"
#include "autotagging/ItemTagger.h"
#include "autotagging/services/TaggingServiceNames.h"
#include "commands/Commands.h"
#include "operations/Evaluation.h"
#include "output/StandardStreams.h"
#include "platform/files/FileAccess.h"
#include "platform/files/Paths.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <map>
#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    std::string folder;
    std::string truthFile;
    bool readsNamesOnly = false;
};

/// What was left out, and why.
struct LeftOut {
    std::vector<std::string> paths;   // that do not exist
    std::vector<std::string> labels;  // that the taxonomy does not know
};

std::string shown(const std::string& label) {
    return label.empty() ? "nothing" : label;
}

using Confusions = std::vector<std::pair<std::pair<std::string, std::string>, std::size_t>>;

/// Label and what was said instead, the most frequent first.
Confusions confusionsOf(const Evaluation& evaluation) {
    std::map<std::pair<std::string, std::string>, std::size_t> counts;
    for (const Evaluation::Mistake& mistake : evaluation.mistakes()) ++counts[{mistake.label, mistake.said}];
    Confusions confusions(counts.begin(), counts.end());
    std::stable_sort(confusions.begin(), confusions.end(),
                     [](const auto& a, const auto& b) { return a.second > b.second; });
    return confusions;
}

Json jsonOfScore(const Evaluation::Score& score) {
    Json json;
    json["count"] = score.truth;
    json["said"] = score.said;
    json["right"] = score.right;
    json["parentOnly"] = score.general;
    json["precision"] = score.precision();
    json["recall"] = score.recall();
    json["f"] = score.f();
    return json;
}

Json jsonOf(const Evaluation& evaluation, const LeftOut& leftOut) {
    Json json;
    json["items"] = evaluation.items();
    json["overall"] = jsonOfScore(evaluation.overall());
    json["labels"] = Json::object();
    for (const auto& [label, score] : evaluation.labels()) json["labels"][label] = jsonOfScore(score);
    json["confusions"] = Json::array();
    for (const auto& [pair, count] : confusionsOf(evaluation)) {
        Json confusion;
        confusion["label"] = pair.first.empty() ? Json() : Json(pair.first);
        confusion["said"] = pair.second.empty() ? Json() : Json(pair.second);
        confusion["count"] = count;
        json["confusions"].push_back(std::move(confusion));
    }
    json["mistakes"] = Json::array();
    for (const Evaluation::Mistake& mistake : evaluation.mistakes()) {
        Json its;
        its["path"] = mistake.path;
        its["label"] = mistake.label.empty() ? Json() : Json(mistake.label);
        its["said"] = mistake.said.empty() ? Json() : Json(mistake.said);
        json["mistakes"].push_back(std::move(its));
    }
    json["unknownPaths"] = leftOut.paths;
    json["unknownLabels"] = leftOut.labels;
    return json;
}

void printScore(const std::string& name, const Evaluation::Score& score, std::size_t width) {
    print("{}  {:>6}  {:>9.3f}  {:>6.3f}  {:>6.3f}\n", padded(name, width), score.truth, score.precision(),
          score.recall(), score.f());
}

void printTable(const Evaluation& evaluation, const Terminal& terminal) {
    constexpr std::size_t mostConfusions = 20;
    std::vector<std::pair<std::string, Evaluation::Score>> rows(evaluation.labels().begin(),
                                                                evaluation.labels().end());
    std::stable_sort(rows.begin(), rows.end(),
                     [](const auto& a, const auto& b) { return a.second.truth > b.second.truth; });
    std::size_t width = 7;
    for (const auto& [label, _] : rows) width = std::max(width, displayWidth(label));
    print("{}\n",
          colored(terminal, Color::strong, padded("label", width) + "   items  precision  recall       f"));
    for (const auto& [label, score] : rows) printScore(label, score, width);
    printScore("overall", evaluation.overall(), width);
    const Confusions confusions = confusionsOf(evaluation);
    if (confusions.empty()) return;
    print("\n{}\n", colored(terminal, Color::strong, "taken for something else"));
    for (std::size_t i = 0; i < std::min(confusions.size(), mostConfusions); ++i)
        print("{:>6}  {} as {}\n", confusions[i].second, shown(confusions[i].first.first),
              shown(confusions[i].first.second));
}

/// Lists some of what was left out.
void report(const std::vector<std::string>& leftOut, std::string_view what, ToolContext& context) {
    constexpr std::size_t mostListed = 5;
    if (leftOut.empty()) return;
    std::vector<std::string> listed;
    for (const std::string& text : std::span(leftOut).first(std::min(leftOut.size(), mostListed)))
        listed.push_back(printable(text));
    context.itemFailed(fmt::format("{}: {}{}", counted(leftOut.size(), what), join(listed, ", "),
                                   leftOut.size() > mostListed ? ", ..." : ""));
}

Resolution resolutionOf(ItemTagger& tagger, const std::string& path, const Options& options) {
    const ItemNames names(path, URL::fileURLWithPath(options.folder).path());
    if (options.readsNamesOnly) return tagger.reportOfNames(names, SoundKind::oneShot).resolution;
    const auto item = std::make_shared<ContentItem>(URL::fileURLWithPath(path));
    return tagger.report(item, names, optionsForAllTaggingServices()).resolution;
}

void run(const Options& options, ToolContext& context) {
    Error error;
    const auto items = readLabelledItems(options.truthFile, &error);
    if (!items) return context.itemFailed(error);
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    ItemTagger tagger(QVTaggingAggregator::defaultTaggingAggregator(), taxonomy);
    Evaluation evaluation(*taxonomy);
    LeftOut leftOut;
    for (LabelledItem item : *items) {
        const std::string path = pathIn(URL::fileURLWithPath(options.folder).path(), item.path);
        std::erase_if(item.labels, [&](const std::string& label) {
            const bool isUnknown = taxonomy->findTagForLabel(label) == nullptr;
            if (isUnknown) leftOut.labels.push_back(fmt::format("{} (line {})", label, item.line));
            return isUnknown;
        });
        if (!options.readsNamesOnly && !fileExists(path)) {
            leftOut.paths.push_back(item.path);
        } else {
            evaluation.add(item, resolutionOf(tagger, path, options));
        }
    }
    report(leftOut.paths, "path that does not exist", context);
    report(leftOut.labels, "label that the taxonomy does not know", context);
    if (context.format == Format::table) return printTable(evaluation, context.terminal());
    printJson(jsonOf(evaluation, leftOut), context.format);
}

}  // namespace

void addEvaluateCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand(
        "evaluate", "Compares derived tags with labels that people gave, and counts mistakes");
    command.addOption("folder", options->folder, "The folder that the paths are relative to")
        .required()
        .valueName("DIR");
    command
        .addOption("--truth", options->truthFile,
                   "Table of \"path\" and \"label\", tab-separated; \"A|B\", \"-\" for none")
        .required()
        .valueName("FILE");
    command.addFlag("--names-only", options->readsNamesOnly,
                    "Judge by names alone, as one-shots; the files need not exist");
    command.footer("Example:\n  qvtag evaluate --truth labels.tsv Drums");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool

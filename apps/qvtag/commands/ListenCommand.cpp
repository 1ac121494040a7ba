#include "CommandLine.h"
#include "commands/Commands.h"
#include "formats/ItemFile.h"
#include "formats/QVContentTaggingTypes.h"
#include "listening/Listener.h"
#include "output/SoundWords.h"
#include "output/StandardStreams.h"
#include "output/pictures/PlotFile.h"
#include "output/pictures/SoundPlot.h"
#include "platform/files/FileAccess.h"
#include "resources/DefaultListeningModels.h"

#include <memory>

namespace qvct::tool {
namespace {

struct Options {
    std::vector<std::string> paths;
    LinksOutside links = LinksOutside::files;
    std::string plotFile;
};

void run(const Options& options, ToolContext& context) {
    if (!options.plotFile.empty() && options.paths.size() != 1)
        return context.usageFailed("--plot draws one file; name only one");
    const Error problem = problemOfPlot(options.plotFile, options.paths);
    if (problem.isSet()) return context.usageFailed(problem.message());
    Listener listener(defaultListeningModels());
    JsonItems json(context.format);
    context.forEachContentItemBelow(
        options.paths, options.links, [&](const URL& url, const std::string& root) {
            Error error;
            ItemFile file(url);
            const auto sound = file.audio(&error) ? file.sound(listener, &error) : nullptr;
            if (!sound) {
                // Patches and presets lie among the sounds.
                const bool isAudio = QVContentTaggingTypes::fallBackFileTypeForURL(url) == kFileTypeAudioFile;
                if (root == url.path() || isAudio) context.itemFailed(error);
                return;
            }
            if (context.format == Format::table) {
                printText(textOfSound(url.path(), *sound, context.terminal()));
            } else {
                json.add(jsonOfSound(url.path(), *sound));
            }
            if (options.plotFile.empty()) return;
            const std::string plot = svgOfSound(url.lastPathComponent(), *sound, listener.excerpt());
            if (!replaceFile(options.plotFile, plot, &error)) context.itemFailed(error);
        });
    if (context.format != Format::table) json.finish();
}

}  // namespace

void addListenCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command = tool.addCommand("listen", "Tells what can be heard in sounds");
    command.addOption("paths", options->paths, "Sounds, and folders of them").required().valueName("PATH");
    command.addFollowFlag(options->links);
    command.addOption("--plot", options->plotFile, "Draw one sound, its onsets and its spectrum over time")
        .valueName("FILE.svg");
    command.footer("Example:\n  qvtag listen \"One Shots/Drums/untitled 7.wav\" --plot sound.svg");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool

#include "CommandLine.h"
#include "commands/Commands.h"
#include "output/InspectedParts.h"
#include "output/StandardStreams.h"
#include "platform/text/Text.h"

#include <memory>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Options {
    std::vector<std::string> paths;
    LinksOutside links = LinksOutside::files;
};

Json jsonOfPart(const InspectedPart& part) {
    Json json;
    json["id"] = part.id;
    json["offset"] = part.offset ? Json(*part.offset) : Json();
    json["size"] = part.size ? Json(*part.size) : Json();
    json["meaning"] = part.meaning;
    json["fault"] = part.fault.empty() ? Json() : Json(part.fault);
    json["parts"] = Json::array();
    for (const InspectedPart& child : part.children) json["parts"].push_back(jsonOfPart(child));
    return json;
}

void printPart(const InspectedPart& part, const Terminal& terminal, std::size_t depth) {
    const std::string place = part.offset ? fmt::format("{}", *part.offset) : "";
    const std::string size = part.size ? fmt::format("{}", *part.size) : "";
    const std::string label = std::string(2 * depth, ' ') + printable(part.id);
    print(
        "{:>10} {:>10}  {}  {}{}\n", place, size, padded(label, 20), printable(part.meaning),
        part.fault.empty() ? "" : "  " + colored(terminal, Color::accent, "FAULT: " + printable(part.fault)));
    for (const InspectedPart& child : part.children) printPart(child, terminal, depth + 1);
}

void run(const Options& options, ToolContext& context) {
    JsonItems json(context.format);
    context.forEachContentItem(options.paths, options.links, [&](const URL& url) {
        Error error;
        const auto parts = partsOfItem(url, &error);
        if (error.isSet()) context.itemFailed(error);
        if (parts.empty() && error.isSet()) return;
        if (context.format == Format::table) {
            print("{}\n", colored(context.terminal(), Color::strong, printable(url.path())));
            print("{}\n", colored(context.terminal(), Color::faint, "    offset       size  what"));
            for (const InspectedPart& part : parts) printPart(part, context.terminal(), 0);
            return;
        }
        Json item{{"path", url.path()}, {"parts", Json::array()}};
        for (const InspectedPart& part : parts) item["parts"].push_back(jsonOfPart(part));
        json.add(item);
    });
    if (context.format != Format::table) json.finish();
}

}  // namespace

void addInspectCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command =
        tool.addCommand("inspect", "Shows what is in a file: chunks, header fields, stored entries");
    command.addOption("paths", options->paths, "Files and folders").required().valueName("PATH");
    command.addFollowFlag(options->links);
    command.footer("Example:\n  qvtag inspect \"Kick 01.wav\"");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool

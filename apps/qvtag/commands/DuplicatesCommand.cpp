#include "CommandLine.h"
#include "DatabaseAccess.h"
#include "commands/Commands.h"
#include "output/StandardStreams.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

using namespace contentdb;

struct Options {
    std::vector<std::string> words;
    std::string database;
};

/// What all groups have together.
struct Totals {
    std::uint64_t groups = 0;
    std::uint64_t items = 0;
    std::uint64_t bytes = 0;  ///< Of all copies but the best.
};

bool isExact(const DuplicateGroup& group) {
    return std::all_of(group.copies.begin(), group.copies.end(),
                       [](const SoundCopy& copy) { return copy.isExact; });
}

Json jsonOf(const SoundCopy& copy) {
    const auto known = [](double number) { return number > 0 ? jsonOfNumber(number) : Json(); };
    return {{"id", copy.id},
            {"path", copy.path},
            {"exact", copy.isExact},
            {"size", copy.size},
            {"seconds", known(copy.seconds)},
            {"sampleRate", known(copy.sampleRate)},
            {"bitDepth", known(copy.bitDepth)},
            {"channels", known(copy.channels)}};
}

Json jsonOf(const DuplicateGroup& group) {
    Json json;
    json["kind"] = isExact(group) ? "exact" : "altered";
    json["best"] = group.copies.front().path;
    json["reasons"] = group.reasons;
    json["copies"] = Json::array();
    for (const SoundCopy& copy : group.copies) json["copies"].push_back(jsonOf(copy));
    return json;
}

/// "0.512 s, 44.1 kHz, 16 bits, 2 channels, 90.4 KB"
std::string factsOf(const SoundCopy& copy) {
    std::vector<std::string> facts;
    if (copy.seconds > 0) facts.push_back(fmt::format("{:.3f} s", copy.seconds));
    if (copy.sampleRate > 0) facts.push_back(fmt::format("{:g} kHz", copy.sampleRate / 1000));
    if (copy.bitDepth > 0) facts.push_back(fmt::format("{:g} bits", copy.bitDepth));
    if (copy.channels > 0) facts.push_back(counted(static_cast<std::uint64_t>(copy.channels), "channel"));
    facts.push_back(fmt::format("{:.1f} KB", static_cast<double>(copy.size) / 1e3));
    return join(facts, ", ");
}

void show(const DuplicateGroup& group, const Terminal& terminal) {
    const std::string why =
        group.reasons.empty() ? "all alike, this is the oldest" : join(group.reasons, ", ");
    for (const SoundCopy& copy : group.copies) {
        const bool isBest = &copy == &group.copies.front();
        const std::string_view kind = isBest ? "best" : copy.isExact ? "exact" : "altered";
        print("{}  {}\n         {}{}\n",
              colored(terminal, isBest ? Color::strong : Color::faint, padded(kind, 7)), printable(copy.path),
              factsOf(copy), isBest ? " (" + why + ")" : "");
    }
    print("\n");
}

void run(const Options& options, ToolContext& context) {
    const auto database = openDatabase(options.database, context);
    const auto query = database ? queryIn(join(options.words, " "), *database, context) : std::nullopt;
    if (!query) return;
    JsonItems json(context.format);
    Totals totals;
    Error error;
    const bool isDone = database->forEachDuplicate(
        *query,
        [&](const DuplicateGroup& group) {
            ++totals.groups;
            totals.items += group.copies.size();
            for (const SoundCopy& copy : group.copies) totals.bytes += copy.size;
            totals.bytes -= group.copies.front().size;
            if (context.format == Format::table) {
                show(group, context.terminal());
            } else {
                json.add(jsonOf(group));
            }
            return !isOutputLost();
        },
        &error);
    if (!isDone) return context.itemFailed(error);
    if (context.format != Format::table) return json.finish();
    context.note(fmt::format("{} of the same sound, {}; all but the best take {:.1f} MB",
                             counted(totals.groups, "group"), counted(totals.items, "item"),
                             static_cast<double>(totals.bytes) / 1e6));
}

}  // namespace

void addDuplicatesCommand(Command& tool, ToolContext& context) {
    const auto options = std::make_shared<Options>();
    Command command =
        tool.addCommand("duplicates", "Finds the same sound under other names, formats, levels and cuts");
    command.addOption("--db", options->database, "The database").required().valueName("FILE");
    command.addOption("query", options->words, "Among what; everything if left out");
    command.footer("Example:\n  qvtag duplicates 'path:\"old disk\"' --db loops.db");
    command.callback([options, &context] { run(*options, context); });
}

}  // namespace qvct::tool

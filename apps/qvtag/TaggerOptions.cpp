#include "TaggerOptions.h"

#include "Resources.h"
#include "Services.h"
#include "ToolContext.h"
#include "platform/data/PropertyListFile.h"

#include <fmt/format.h>

namespace qvct::tool {
namespace {

using Settings = QVTaggingAggregator::Settings;

/// The settings in a file; nothing, and a line on standard error, when it holds none.
template <typename Read>
Settings settingsIn(const std::string& file, std::string_view what, Read read, ToolContext& context) {
    if (file.empty()) return std::nullopt;
    Error error;
    Settings settings = read(file, &error);
    if (settings) return settings;
    error.reason += fmt::format(" (using the built-in {})", what);
    context.itemFailed(error);
    return settings;
}

Settings keywordsIn(const std::string& file, ToolContext& context) {
    const auto read = [](const std::string& path, Error* error) { return readDictionaryFile(path, error); };
    Settings keywords = settingsIn(file, "keywords", read, context);
    if (keywords) checkKeywords(*keywords, context);
    return keywords;
}

}  // namespace

Option TaggerOptions::addTo(Command& command, const Option* other) {
    const Option itsPaths = command.addOption("paths", paths, "Files and folders").valueName("PATH");
    const auto excluding = [other](Option option) {
        if (other != nullptr) option.excludes(*other);
    };
    excluding(command.addFollowFlag(links));
    excluding(addServicesOption(command, services));
    excluding(
        command
            .addOption("--keywords", keywordsFile, "Property list of keywords to use instead of the built-in")
            .valueName("FILE"));
    excluding(command.addOption("--rules", rulesFile, "Property list of rules to use instead of the built-in")
                  .valueName("FILE"));
    return itsPaths;
}

std::shared_ptr<QVTaggingAggregator> TaggerOptions::aggregator(ToolContext& context) const {
    return QVTaggingAggregator::initWithRules(settingsIn(rulesFile, "rules", readRules, context),
                                              keywordsIn(keywordsFile, context));
}

}  // namespace qvct::tool

#include "Services.h"

#include "autotagging/services/TaggingServiceNames.h"
#include "platform/text/Text.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

std::string allNames() {
    std::vector<std::string> names;
    names.reserve(std::size(kTaggingServiceNames));
    for (const TaggingServiceName& service : kTaggingServiceNames) names.emplace_back(service.name);
    return join(names, ", ");
}

}  // namespace

Option addServicesOption(Command& command, std::vector<std::string>& names) {
    return command.addOption("--services", names, "Only these services derive tags: " + allNames())
        .separatedBy(',')
        .oneWordEach()
        .valueName("A,B");
}

std::uint64_t optionsForServices(const std::vector<std::string>& names, ToolContext& context) {
    if (names.empty()) return optionsForAllTaggingServices();
    std::uint64_t options = 0;
    for (const std::string& name : names) {
        const auto* const hit =
            std::find_if(kTaggingServiceNames.begin(), kTaggingServiceNames.end(),
                         [&name](const TaggingServiceName& service) { return service.name == name; });
        if (hit == kTaggingServiceNames.end()) {
            context.usageFailed(fmt::format("no service \"{}\"; there are: {}", printable(name), allNames()));
            continue;
        }
        options |= hit->option;
    }
    return options;
}

}  // namespace qvct::tool

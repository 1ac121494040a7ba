#include "resources/PackDisplayNames.h"

#include "platform/files/FileAccess.h"
#include "platform/files/ResourceBundle.h"
#include "platform/text/Text.h"
#include "resources/QVCTCompiledResources.h"

#include <optional>

namespace qvct {
namespace {

std::vector<std::string> lines() {
    if (const auto path = ResourceBundle::pathForResource("PackDisplayNames", "csv")) {
        if (const auto text = readTextFile(*path)) return split(replaceAll(*text, "\r\n", "\n"), "\n");
    }
    return QVCTCompiledResources::PackDisplayNames().value_or(std::vector<std::string>{});
}

}  // namespace

std::vector<std::pair<std::string, std::string>> packDisplayNames() {
    std::vector<std::pair<std::string, std::string>> names;
    for (const std::string& line : lines()) {
        const std::size_t separator = line.find(';');
        if (separator != std::string::npos)
            names.emplace_back(line.substr(0, separator), line.substr(separator + 1));
    }
    return names;
}

}  // namespace qvct

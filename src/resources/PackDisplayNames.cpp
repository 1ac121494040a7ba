#include "resources/PackDisplayNames.h"

#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"
#include "resources/QVCTCompiledResources.h"
#include "resources/ReplacementFile.h"

#include <optional>

namespace qvct {
namespace {

using Lines = std::vector<std::string>;

std::optional<Lines> linesOf(const std::string& path) {
    const auto text = readTextFile(path);
    return text ? std::optional<Lines>(split(replaceAll(*text, "\r\n", "\n"), "\n")) : std::nullopt;
}

}  // namespace

std::vector<std::pair<std::string, std::string>> packDisplayNames() {
    std::vector<std::pair<std::string, std::string>> names;
    const auto lines =
        replacedOrBuiltIn({"PackDisplayNames", "csv"}, linesOf, QVCTCompiledResources::PackDisplayNames);
    for (const std::string& line : lines.value_or(Lines{})) {
        const std::size_t separator = line.find(';');
        if (separator != std::string::npos)
            names.emplace_back(line.substr(0, separator), line.substr(separator + 1));
    }
    return names;
}

}  // namespace qvct

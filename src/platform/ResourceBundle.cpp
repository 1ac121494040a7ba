#include "platform/ResourceBundle.h"

#include "platform/FileAccess.h"

#include <cstdlib>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

std::string& chosenDirectory() {
    static std::string directory;
    return directory;
}

}  // namespace

void ResourceBundle::setDirectory(std::string path) {
    chosenDirectory() = std::move(path);
}

std::string ResourceBundle::directory() {
    if (!chosenDirectory().empty()) return chosenDirectory();
    const char* fromEnvironment = std::getenv("QVCT_RESOURCES");
    return fromEnvironment == nullptr ? std::string{} : fromEnvironment;
}

std::optional<std::string> ResourceBundle::pathForResource(std::string_view name,
                                                           std::string_view extension) {
    for (const std::string& folder : {directory(), std::string(QVCT_INSTALLED_RESOURCES)}) {
        if (folder.empty()) continue;
        std::string path = fmt::format("{}/{}.{}", folder, name, extension);
        if (fileExists(path)) return path;
    }
    return std::nullopt;
}

}  // namespace qvct

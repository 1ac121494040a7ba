#include "platform/ResourceBundle.h"

#include "platform/FileAccess.h"

#include <cstdlib>
#include <map>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

std::string& chosenDirectory() {
    static std::string directory;
    return directory;
}

std::map<std::string, std::optional<std::string>>& chosenPaths() {
    static std::map<std::string, std::optional<std::string>> paths;
    return paths;
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

void ResourceBundle::setPathForResource(std::string_view name, std::string_view extension,
                                        std::optional<std::string> path) {
    chosenPaths().insert_or_assign(fmt::format("{}.{}", name, extension), std::move(path));
}

std::optional<std::string> ResourceBundle::pathForResource(std::string_view name,
                                                           std::string_view extension) {
    const std::string file = fmt::format("{}.{}", name, extension);
    if (const auto chosen = chosenPaths().find(file); chosen != chosenPaths().end()) return chosen->second;
    for (const std::string& folder : {directory(), std::string(QVCT_INSTALLED_RESOURCES)}) {
        if (folder.empty()) continue;
        std::string path = fmt::format("{}/{}", folder, file);
        if (fileExists(path)) return path;
    }
    return std::nullopt;
}

}  // namespace qvct

#include "platform/files/ResourceBundle.h"

#include "platform/base/ImagePath.h"
#include "platform/files/FileAccess.h"

#include <cstdlib>
#include <filesystem>
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

std::string installedDirectory() {
    static const std::string directory = [] {
        const auto* code = reinterpret_cast<const void*>(&ResourceBundle::directory);
        const std::filesystem::path folder = imagePath(code).parent_path();
        std::error_code ignored;
        for (const char* place : {QVCT_RESOURCES_FROM_LIBRARY, QVCT_RESOURCES_FROM_PROGRAM}) {
            const auto resources = (folder / place).lexically_normal();
            if (!folder.empty() && std::filesystem::is_directory(resources, ignored))
                return resources.string();
        }
        return std::string{};
    }();
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

void ResourceBundle::setPathForResource(std::string_view name, std::string_view extension,
                                        std::optional<std::string> path) {
    chosenPaths().insert_or_assign(fmt::format("{}.{}", name, extension), std::move(path));
}

std::optional<std::string> ResourceBundle::pathForResource(std::string_view name,
                                                           std::string_view extension) {
    const std::string file = fmt::format("{}.{}", name, extension);
    if (const auto chosen = chosenPaths().find(file); chosen != chosenPaths().end()) return chosen->second;
    for (const std::string& folder : {directory(), installedDirectory()}) {
        if (folder.empty()) continue;
        std::string path = fmt::format("{}/{}", folder, file);
        if (fileExists(path)) return path;
    }
    return std::nullopt;
}

}  // namespace qvct

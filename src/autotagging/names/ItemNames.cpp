#include "autotagging/names/ItemNames.h"

namespace qvct {
namespace {

constexpr std::size_t kMostFolders = 64;

std::string_view withoutSlashes(std::string_view path) {
    while (path.size() > 1 && path.ends_with('/')) path.remove_suffix(1);
    return path;
}

}  // namespace

ItemNames::ItemNames(std::string path, std::string_view root) : path_(std::move(path)) {
    constexpr std::size_t foldersWithoutRoot = 2;
    std::string_view rest = withoutSlashes(path_);
    root = withoutSlashes(root);
    const bool isBelowRoot = !root.empty() && rest.size() > root.size() && rest.starts_with(root) &&
                             (root.ends_with('/') || rest[root.size()] == '/');
    const std::size_t most = 1 + (isBelowRoot ? kMostFolders : foldersWithoutRoot);
    while (!rest.empty() && rest != "/" && names_.size() < most) {
        const std::size_t slash = rest.rfind('/');
        std::string_view name = rest.substr(slash == std::string_view::npos ? 0 : slash + 1);
        const std::size_t dot = names_.empty() ? name.rfind('.') : std::string_view::npos;
        if (dot != std::string_view::npos && dot > 0) {
            extension_ = name.substr(dot + 1);
            name = name.substr(0, dot);
        }
        names_.push_back(name);
        if (slash == std::string_view::npos || (isBelowRoot && rest.size() <= root.size())) break;
        rest = rest.substr(0, slash);
    }
}

std::vector<std::string_view> ItemNames::folders() const {
    std::vector<std::string_view> folders;
    for (std::size_t i = 1; i < names_.size(); ++i) {
        const auto end = static_cast<std::size_t>(names_[i].data() + names_[i].size() - path_.data());
        folders.push_back(std::string_view(path_).substr(0, end));
    }
    return folders;
}

}  // namespace qvct

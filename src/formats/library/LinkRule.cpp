#include "formats/library/LinkRule.h"

#include <filesystem>
#include <system_error>

namespace qvct {
namespace {

/// The path without links, as far as it exists; empty when that cannot be told.
std::string resolved(const std::string& path) {
    std::error_code failure;
    return std::filesystem::weakly_canonical(path, failure).string();
}

}  // namespace

LinkRule::LinkRule(const std::string& folder, LinksOutside outside)
    : outside_(outside), folder_(resolved(folder)) {
    if (!folder_.empty() && !folder_.ends_with('/')) folder_ += '/';
}

bool LinkRule::follows(const std::string& link, bool entersFolder) const {
    if (outside_ == LinksOutside::all || (outside_ == LinksOutside::files && !entersFolder)) return true;
    return !folder_.empty() && (resolved(link) + '/').starts_with(folder_);
}

}  // namespace qvct

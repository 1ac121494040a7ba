#pragma once

#include "platform/base/Export.h"

#include <string>

namespace qvct {

/// What a walk does with a link that leads out of the folder in which it began. A link that stays inside is
/// always followed.
enum class LinksOutside {
    none,   ///< Passes over all: nothing outside of the folder is touched.
    files,  ///< Takes files and bundles, and does not enter folders.
    all     ///< Takes files and bundles, and enters folders.
};

/// Decides for one walk which links it follows.
class QVCT_API LinkRule {
  public:
    /// `folder` is where the walk begins; when it is a link itself, what it points to counts.
    LinkRule(const std::string& folder, LinksOutside outside);

    /// Whether the link at a path may be followed. `entersFolder` when it leads to a folder to be walked.
    /// @cost  None where every link is followed; else the resolution of one path on the disk.
    bool follows(const std::string& link, bool entersFolder) const;

  private:
    LinksOutside outside_;
    std::string folder_;  // without links, with a slash at its end
};

}  // namespace qvct

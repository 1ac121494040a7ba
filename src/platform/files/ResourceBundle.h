#pragma once

#include "platform/base/Export.h"

#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// Finds the resource files that replace the compiled-in copies.
///
/// Searched in this order: the folder set here; the folder named by the environment variable QVCT_RESOURCES;
/// the resource folder of the installation, which is share/qvcontenttagging/resources beside the folder of
/// the library (or of the program that contains it), wherever that was moved to. Set the folder at start-up,
/// before any other thread looks something up.
class QVCT_API ResourceBundle {
  public:
    /// An empty path undoes the setting.
    static void setDirectory(std::string path);
    /// The folder set by `setDirectory` or the environment; empty when none is.
    static std::string directory();
    /// Takes one resource from a file of its own; without a path the compiled-in copy is used.
    static void setPathForResource(std::string_view name, std::string_view extension,
                                   std::optional<std::string> path);
    /// The path of the resource if a file of that name exists in one of the folders.
    static std::optional<std::string> pathForResource(std::string_view name, std::string_view extension);
};

}  // namespace qvct

#pragma once

#include "platform/base/Export.h"

#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// Where resource files may lie that replace the compiled-in copies.
///
/// Looked into, in this order: the folder set here, the folder that the environment variable QVCT_RESOURCES
/// names, the resource folder of the installation: share/qvcontenttagging/resources beside the folder in
/// which the library lies, or the program that it is part of, wherever these were moved to. Setting is for
/// start-up, before the first look-up of another thread.
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

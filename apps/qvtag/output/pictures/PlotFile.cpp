#include "output/pictures/PlotFile.h"

#include "platform/files/FileAccess.h"
#include "platform/text/Url.h"

#include <filesystem>
#include <fstream>

namespace qvct::tool {
namespace {

bool beginsLikeSvg(const std::string& path) {
    if (!isRegularFile(path)) return false;
    std::string start(5, '\0');
    std::ifstream(path, std::ios::binary).read(start.data(), static_cast<std::streamsize>(start.size()));
    return start.starts_with("<svg") || start == "<?xml";
}

}  // namespace

Error problemOfPlot(const std::string& target, const std::vector<std::string>& inputs) {
    namespace fs = std::filesystem;
    std::error_code ignored;
    if (target.empty() || !fs::exists(target, ignored)) return {};
    for (const std::string& input : inputs) {
        if (fs::equivalent(target, input, ignored))
            return errorOf(kErrorInvalidArgument,
                           "is one of the files to be measured; the picture would overwrite it", {target});
    }
    const bool isSvg =
        URL::fileURLWithPath(target).lowercasePathExtension() == "svg" && beginsLikeSvg(target);
    return isSvg ? Error{}
                 : errorOf(kErrorInvalidArgument, "exists and is not an SVG file; it is not overwritten",
                           {target});
}

}  // namespace qvct::tool

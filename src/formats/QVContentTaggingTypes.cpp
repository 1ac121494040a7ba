#include "formats/QVContentTaggingTypes.h"

#include <algorithm>
#include <array>
#include <utility>

namespace qvct {

FileType QVContentTaggingTypes::fallBackFileTypeForURL(const URL& url) {
    using Row = std::pair<std::string_view, FileType>;
    constexpr std::array<Row, 14> types = {{{"patch", kFileTypePatch},
                                            {"loopdata", kFileTypeLoop},
                                            {"vcp", kFileTypeSynthPreset},
                                            {"sxv", kFileTypeSamplerSettings},
                                            {"pst", kFileTypePlugInSettings},
                                            {"aaz", kFileTypePlugInSettings},
                                            {"cst", kFileTypeChannelStrip},
                                            {"aif", kFileTypeAudioFile},
                                            {"aiff", kFileTypeAudioFile},
                                            {"aifc", kFileTypeAudioFile},
                                            {"caf", kFileTypeAudioFile},
                                            {"wav", kFileTypeAudioFile},
                                            {"wave", kFileTypeAudioFile},
                                            {"ostrax", kFileTypeProject}}};
    const std::string extension = url.lowercasePathExtension();
    const auto* hit = std::find_if(types.begin(), types.end(),
                                   [&extension](const Row& row) { return row.first == extension; });
    return hit == types.end() ? kFileTypeNone : hit->second;
}

std::string_view QVContentTaggingTypes::nameForFileType(std::int64_t type) {
    constexpr std::array<std::string_view, 9> names = {"other",   "patch", "loop",  "preset", "sampler",
                                                       "plug-in", "strip", "audio", "project"};
    return type > 0 && type < std::int64_t{names.size()} ? names[static_cast<std::size_t>(type)] : names[0];
}

}  // namespace qvct

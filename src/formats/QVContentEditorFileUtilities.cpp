#include "formats/QVContentEditorFileUtilities.h"

#include "platform/files/FileAccess.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <string>
#include <vector>

namespace qvct {
namespace {

std::optional<URL> firstThatExists(const std::vector<URL>& candidates) {
    const auto hit = std::find_if(candidates.begin(), candidates.end(),
                                  [](const URL& url) { return url.isFileURL() && fileExists(url.path()); });
    return hit == candidates.end() ? std::nullopt : std::optional(*hit);
}

}  // namespace

std::optional<URL> QVContentEditorFileUtilities::intermediateCacheURLForURL(const std::optional<URL>& url) {
    if (!url) return std::nullopt;
    const std::string extension = url->lowercasePathExtension();
    if (extension == "xml" || extension == "zxml") return url;
    const std::string cache = std::string(kProductPrefix) + ".intermediate.cache.";
    return firstThatExists(
        {url->URLByAppendingPathComponent(cache + "zxml"), url->URLByAppendingPathComponent(cache + "xml"),
         url->URLByAppendingPathComponent("#Root.cst.intermediate.cache.xml"),
         url->URLByAppendingPathExtension("zxml"), url->URLByAppendingPathExtension("xml")});
}

std::optional<URL> QVContentEditorFileUtilities::prelistenURLForURL(const std::optional<URL>& url) {
    if (!url) return std::nullopt;
    constexpr std::array<std::string_view, 4> audio = {"caf", "aif", "wav", "aiff"};
    const bool isAudio = std::find(audio.begin(), audio.end(), url->lowercasePathExtension()) != audio.end();
    if (isAudio && url->isFileURL() && fileExists(url->path())) return url;
    return firstThatExists(
        {url->URLByAppendingPathComponent("prelisten.caf"), url->URLByAppendingPathExtension("caf")});
}

}  // namespace qvct

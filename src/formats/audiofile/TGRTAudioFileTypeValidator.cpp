#include "formats/audiofile/TGRTAudioFileTypeValidator.h"

#include "media/loopfile/LCFileParser.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <array>

namespace qvct {
namespace {

std::shared_ptr<LCFileData> fileDataOf(const URL& url, unsigned allowedFileTypes) {
    if (!url.isFileURL() || TGRTAudioFileTypeValidator::isPrelistenFile(url)) return nullptr;
    return LCFileParser::fileParserForURL(url, false, allowedFileTypes)->fileData();
}

}  // namespace

bool TGRTAudioFileTypeValidator::isPrelistenFile(const URL& url) {
    constexpr std::array<std::string_view, 5> endings = {".cst.caf", ".vcp.caf", ".pst.caf", ".sxv.caf",
                                                         ".patch/prelisten.caf"};
    if (url.lowercasePathExtension() != "caf") return false;  // spares most files the folding of a path
    const std::string path = lowercase(url.path());
    return std::any_of(endings.begin(), endings.end(),
                       [&path](std::string_view ending) { return path.ends_with(ending); });
}

bool TGRTAudioFileTypeValidator::isValidContentTypeAtFileURL(const URL& url) const {
    return fileDataOf(url, kLCAllAudio) != nullptr;
}

std::optional<URL> TGRTAudioFileTypeValidator::prelistenURLForFileURL(const URL& url) const {
    return isValidContentTypeAtFileURL(url) ? std::optional(url) : std::nullopt;
}

bool TGRTTavioLoopTypeValidator::isValidContentTypeAtFileURL(const URL& url) const {
    return fileDataOf(url, kLCLoopFiles) != nullptr;  // with loop-type chunks, by which the parser tells them
}

}  // namespace qvct

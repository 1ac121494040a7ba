#include "formats/library/ContentNames.h"

#include "formats/QVContentTaggingTypes.h"
#include "formats/audiofile/TGRTAudioFileTypeValidator.h"

namespace qvct {
namespace {

ContentKind kindOfExtension(std::string_view extension) {
    const URL url = URL::fileURLWithPath("/x." + std::string(extension));
    switch (QVContentTaggingTypes::fallBackFileTypeForURL(url)) {
        case kFileTypeNone:
            return ContentKind::none;
        case kFileTypePatch:
        case kFileTypeProject:
            return ContentKind::bundle;
        default:
            return ContentKind::file;
    }
}

}  // namespace

ContentKind ContentNames::kindOf(std::string_view name) {
    const std::size_t dot = name.rfind('.');
    if (dot == std::string_view::npos || name[0] == '.') return ContentKind::none;
    const std::string_view extension = name.substr(dot + 1);
    auto known = kinds_.find(extension);
    if (known == kinds_.end()) {
        constexpr std::size_t enough = 10000;  // extensions that a hostile folder can make us remember
        if (kinds_.size() >= enough) kinds_.clear();
        known = kinds_.emplace(extension, kindOfExtension(extension)).first;
    }
    const bool mayBePreview =
        extension.size() == 3 && (extension[0] | 0x20) == 'c' && known->second == ContentKind::file;
    const auto url = [&name] { return URL::fileURLWithPath("/" + std::string(name)); };
    return mayBePreview && TGRTAudioFileTypeValidator::isPrelistenFile(url()) ? ContentKind::none
                                                                              : known->second;
}

}  // namespace qvct

#include "formats/library/ContentWalk.h"

#include "formats/library/ContentFolderWalk.h"
#include "platform/files/FileAccess.h"

namespace qvct {

void walkContent(const std::string& path, const std::function<bool(const URL& item)>& item,
                 const std::function<void(const Error& error)>& failed, const WalkedLinks& links) {
    const URL start = URL::fileURLWithPath(path);
    const bool isFolder = isDirectory(start.path());
    const bool isBundle = isFolder && ContentNames().kindOf(start.lastPathComponent()) == ContentKind::bundle;
    if (isBundle || isRegularFile(start.path())) {
        if (item) item(start);
        return;
    }
    if (!isFolder && fileExists(start.path())) {
        if (failed) failed(errorOf(kErrorUnreadable, "neither a file nor a folder", {start.path()}));
        return;
    }
    const auto visit = [&item](const ContentFolder& folder) {
        const URL url = URL::fileURLWithPath(folder.path);
        for (const ContentFolder::Item& found : folder.items) {
            if (item && !item(url.URLByAppendingPathComponent(std::string(found.entry.name)))) return false;
        }
        return true;
    };
    const auto tell = [&failed](const std::string&, const Error& error) {
        if (failed) failed(error);
    };
    walkContentFolders(start.path(), visit, tell, links);
}

}  // namespace qvct

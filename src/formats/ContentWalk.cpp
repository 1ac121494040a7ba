#include "formats/ContentWalk.h"

#include "formats/QVContentTaggingTypes.h"
#include "formats/audiofile/TGRTAudioFileTypeValidator.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <deque>
#include <memory>
#include <set>
#include <utility>
#include <vector>

#include <dirent.h>
#include <fmt/format.h>
#include <sys/stat.h>

namespace qvct {
namespace {

using Identity = std::pair<dev_t, ino_t>;

bool isBundleName(const URL& url) {
    const FileType type = QVContentTaggingTypes::fallBackFileTypeForURL(url);
    return type == kFileTypePatch || type == kFileTypeProject;
}

struct FolderEntry {
    std::string name;
    unsigned char kind;  // as readdir tells it
};

class Walk {
  public:
    Walk(const URL& start, const std::function<void(const URL&)>& item,
         const std::function<void(const Error&)>& failed, const WalkedLinks& links)
        : start_(start),
          item_(item),
          failed_(failed),
          passedOver_(links.passedOver),
          rule_(start.path(), links.outside) {}

    void run() {
        struct stat status {};
        if (::stat(start_.path().c_str(), &status) != 0) return fail(start_);
        if (!S_ISDIR(status.st_mode) || isBundleName(start_)) return item(start_);
        folder(start_, {status.st_dev, status.st_ino});
        for (; !links_.empty(); links_.pop_front()) folder(links_.front().first, links_.front().second);
    }

  private:
    void item(const URL& url) {
        if (item_) item_(url);
    }

    void fail(const URL& url) {
        if (!failed_) return;
        failed_({std::string(QVCTErrorDomain), kErrorUnreadable,
                 fmt::format("{}: {}", printable(url.path()), std::strerror(errno))});
    }

    void folder(const URL& url, Identity identity) {
        if (!entered_.insert(identity).second) return;
        std::vector<FolderEntry> entries;
        if (!list(url, entries)) return fail(url);
        for (const FolderEntry& entry : entries)
            visit(url.URLByAppendingPathComponent(entry.name), entry.kind);
    }

    static bool list(const URL& url, std::vector<FolderEntry>& entries) {
        const std::unique_ptr<DIR, int (*)(DIR*)> directory(::opendir(url.path().c_str()), ::closedir);
        if (!directory) return false;
        while (const dirent* entry = ::readdir(directory.get())) {
            const std::string_view name = entry->d_name;
            if (!name.starts_with('.')) entries.push_back({std::string(name), entry->d_type});
        }
        std::sort(entries.begin(), entries.end(),
                  [](const auto& a, const auto& b) { return a.name < b.name; });
        return true;
    }

    void visit(const URL& url, unsigned char kind) {
        if (kind == DT_REG && !isContentName(url)) return;
        struct stat status {};
        const bool isKnown = kind == DT_REG;
        if (!isKnown && ::stat(url.path().c_str(), &status) != 0) {
            if (isContentName(url)) fail(url);
            return;
        }
        const bool isFolder = !isKnown && S_ISDIR(status.st_mode);
        const bool isWalked = isFolder && !isBundleName(url);
        if (!isWalked && !(isContentName(url) && isFolder == isBundleName(url))) return;
        const bool isALink = isLink(url, kind);
        if (isALink && !rule_.follows(url.path(), isWalked)) {
            if (passedOver_) passedOver_(url);
            return;
        }
        if (!isWalked) return item(url);
        const Identity identity = {status.st_dev, status.st_ino};
        if (isALink) {
            links_.emplace_back(url, identity);
        } else {
            folder(url, identity);
        }
    }

    static bool isLink(const URL& url, unsigned char kind) {
        struct stat status {};
        if (kind != DT_UNKNOWN) return kind == DT_LNK;
        return ::lstat(url.path().c_str(), &status) == 0 && S_ISLNK(status.st_mode);
    }

    const URL& start_;
    const std::function<void(const URL&)>& item_;
    const std::function<void(const Error&)>& failed_;
    const std::function<void(const URL&)>& passedOver_;
    const LinkRule rule_;
    std::set<Identity> entered_;
    // To folders: entered when all others were, so that a folder has the path where it lies.
    std::deque<std::pair<URL, Identity>> links_;
};

}  // namespace

bool isContentName(const URL& url) {
    return QVContentTaggingTypes::fallBackFileTypeForURL(url) != kFileTypeNone &&
           !url.lastPathComponent().starts_with('.') && !TGRTAudioFileTypeValidator::isPrelistenFile(url);
}

void walkContent(const std::string& path, const std::function<void(const URL& item)>& item,
                 const std::function<void(const Error& error)>& failed, const WalkedLinks& links) {
    Walk(URL::fileURLWithPath(path), item, failed, links).run();
}

}  // namespace qvct

#include "formats/library/ContentFolderWalk.h"

#include "platform/files/Paths.h"

#include <deque>
#include <set>
#include <utility>

namespace qvct {
namespace {

class Walk {
  public:
    Walk(const std::string& start, const ContentFolderVisitor& visit, const WalkFailure& failed,
         const WalkedLinks& links)
        : visit_(visit), failed_(failed), passedOver_(links.passedOver), rule_(start, links.outside) {
        links_.push_back(start);
    }

    /// Links come last, so that a folder is walked under its real path, whatever links point to it.
    bool run() {
        bool goesOn = true;
        for (; goesOn && !links_.empty(); links_.pop_front()) goesOn = enter(links_.front());
        return goesOn;
    }

  private:
    /// The system's limit on path length bounds this recursion.
    bool enter(const std::string& path) {
        std::vector<std::string> folders;
        if (!show(path, folders)) return false;
        for (const std::string& name : folders) {
            if (!enter(pathIn(path, name))) return false;
        }
        return true;
    }

    /// Shows the folder's items to the visitor; the folders in it are entered later, when it is closed again.
    bool show(const std::string& path, std::vector<std::string>& folders) {
        Error error;
        auto listing = FolderListing::read(path, &error);
        if (!listing) {
            fail(path, error);
            return true;
        }
        const EntryStatus status = listing->status();
        if (!entered_.emplace(status.device, status.inode).second) return true;
        ContentFolder folder{path, std::move(*listing), {}};
        for (const FolderListing::Entry& entry : folder.listing.entries()) add(folder, entry, folders);
        return visit_(folder);
    }

    void add(ContentFolder& folder, const FolderListing::Entry& entry, std::vector<std::string>& folders) {
        const ContentKind kind = names_.kindOf(entry.name);
        const EntryKind reached = kindReached(folder, entry, kind);
        const bool isWalked = reached == EntryKind::folder && kind != ContentKind::bundle;
        const EntryKind promised = kind == ContentKind::bundle ? EntryKind::folder : EntryKind::file;
        if (!isWalked && (kind == ContentKind::none || reached != promised)) return;
        if (entry.kind == EntryKind::link) {
            const std::string link = pathIn(folder.path, entry.name);
            if (!rule_.follows(link, isWalked)) {
                if (passedOver_) passedOver_(URL::fileURLWithPath(link));
                return;
            }
            if (isWalked) return links_.push_back(link);
        }
        if (isWalked) {
            folders.emplace_back(entry.name);
        } else {
            folder.items.push_back({entry, kind});
        }
    }

    /// The kind of the entry, links followed. A link that leads nowhere is reported when its name promises
    /// content.
    EntryKind kindReached(const ContentFolder& folder, const FolderListing::Entry& entry, ContentKind kind) {
        if (entry.kind != EntryKind::link) return entry.kind;
        Error error;
        const auto status = folder.listing.status(entry, Links::follow, folder.path, &error);
        if (status) return status->kind;
        if (kind != ContentKind::none) fail(pathIn(folder.path, entry.name), error);
        return EntryKind::other;
    }

    void fail(const std::string& path, const Error& error) const {
        if (failed_) failed_(path, error);
    }

    const ContentFolderVisitor& visit_;
    const WalkFailure& failed_;
    const std::function<void(const URL&)>& passedOver_;
    const LinkRule rule_;
    ContentNames names_;
    std::set<std::pair<std::uint64_t, std::uint64_t>> entered_;
    std::deque<std::string> links_;  // to folders, the start among them
};

}  // namespace

bool walkContentFolders(const std::string& path, const ContentFolderVisitor& visit, const WalkFailure& failed,
                        const WalkedLinks& links) {
    return Walk(path, visit, failed, links).run();
}

}  // namespace qvct

#include "contentdb/index/BundleWalk.h"

namespace qvct::contentdb {
namespace {

constexpr int kMostEntries = 10'000;
constexpr int kDeepest = 16;

class BundleWalk {
  public:
    explicit BundleWalk(const std::function<bool(const BundleEntry&)>& visit) : visit_(visit) {}

    void walk(const FolderListing& folder, const std::string& path, int depth) {
        for (const FolderListing::Entry& entry : folder.entries()) {
            if (left_-- == 0 || !visit_({folder, entry, path})) {
                isEnded_ = true;
                return;
            }
            if (entry.kind == EntryKind::folder) walkBelow(folder, entry, path, depth + 1);
            if (isEnded_) return;
        }
    }

    bool isComplete() const { return isComplete_ && !isEnded_; }

  private:
    void walkBelow(const FolderListing& parent, const FolderListing::Entry& entry, const std::string& path,
                   int depth) {
        const auto folder = depth > kDeepest ? std::nullopt : parent.readIn(entry, Links::keep);
        if (folder) {
            walk(*folder, path + std::string(entry.name) + '/', depth);
        } else {
            isComplete_ = false;
        }
    }

    const std::function<bool(const BundleEntry&)>& visit_;
    int left_ = kMostEntries;
    bool isEnded_ = false;
    bool isComplete_ = true;
};

}  // namespace

bool forEachInBundle(const FolderListing& bundle, const std::function<bool(const BundleEntry&)>& visit) {
    BundleWalk walk(visit);
    walk.walk(bundle, {}, 0);
    return walk.isComplete();
}

}  // namespace qvct::contentdb

#include "contentdb/index/LibraryWalk.h"

#include "contentdb/store/Digest.h"
#include "contentdb/store/Paths.h"
#include "formats/QVContentTaggingTypes.h"
#include "platform/text/Text.h"
#include "platform/text/Url.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <deque>
#include <map>
#include <memory>
#include <set>
#include <utility>

#include <dirent.h>
#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>

namespace qvct::contentdb {
namespace {

using Identity = std::pair<dev_t, ino_t>;
using Folder = std::unique_ptr<DIR, int (*)(DIR*)>;

/// Deepest that folders are entered: no path that the system takes holds more.
constexpr std::size_t kDeepest = 2000;

enum class Kind : unsigned char { other, file, bundle };

/// The kind of content that a name promises, remembered by extension.
class NameKinds {
  public:
    Kind of(std::string_view name) {
        const std::size_t dot = name.rfind('.');
        if (dot == std::string_view::npos || name[0] == '.') return Kind::other;
        const std::string_view extension = name.substr(dot + 1);
        auto known = kinds_.find(extension);
        if (known == kinds_.end()) {
            constexpr std::size_t enough = 10000;  // extensions that a hostile folder can make us remember
            if (kinds_.size() >= enough) kinds_.clear();
            known = kinds_.emplace(extension, kindOfExtension(extension)).first;
        }
        // Whether it is the preview of another item only the whole name tells.
        const bool mayBePreview =
            extension.size() == 3 && (extension[0] | 0x20) == 'c' && known->second == Kind::file;
        if (mayBePreview && !isContentName(URL::fileURLWithPath("/" + std::string(name)))) return Kind::other;
        return known->second;
    }

  private:
    static Kind kindOfExtension(std::string_view extension) {
        const URL url = URL::fileURLWithPath("/x." + std::string(extension));
        switch (QVContentTaggingTypes::fallBackFileTypeForURL(url)) {
            case kFileTypeNone:
                return Kind::other;
            case kFileTypePatch:
            case kFileTypeProject:
                return Kind::bundle;
            default:
                return Kind::file;
        }
    }

    std::map<std::string, Kind, std::less<>> kinds_;
};

/// A folder's names, sorted, in one piece of memory.
class Listing {
  public:
    struct Entry {
        std::size_t start;
        std::size_t size;
        unsigned char kind;  // as readdir tells it
    };

    explicit Listing(DIR* folder) {
        while (const dirent* entry = ::readdir(folder)) {
            if (entry->d_name[0] == '.') continue;
            const std::size_t size = std::strlen(entry->d_name);
            entries_.push_back({names_.size(), size, entry->d_type});
            names_.append(entry->d_name, size + 1);  // with its end, for the system's calls
        }
        std::sort(entries_.begin(), entries_.end(),
                  [this](const Entry& a, const Entry& b) { return name(a) < name(b); });
    }

    const std::vector<Entry>& entries() const { return entries_; }
    std::string_view name(const Entry& entry) const { return {names_.data() + entry.start, entry.size}; }
    /// Calls `visit` with the end of each name that begins so.
    template <typename Visit>
    void forEachThatBegins(std::string_view start, Visit visit) const {
        auto hit = std::lower_bound(entries_.begin(), entries_.end(), start,
                                    [this](const Entry& a, std::string_view b) { return name(a) < b; });
        for (; hit != entries_.end() && name(*hit).starts_with(start); ++hit)
            visit(name(*hit).substr(start.size()));
    }

  private:
    std::string names_;
    std::vector<Entry> entries_;
};

std::int64_t nanoseconds(const timespec& time) {
    constexpr std::int64_t second = 1'000'000'000;
    return time.tv_sec * second + time.tv_nsec;
}

ItemStamp stampOf(const struct stat& status) {
    return {static_cast<std::uint64_t>(status.st_size), nanoseconds(status.st_mtim),
            nanoseconds(status.st_ctim), static_cast<std::uint64_t>(status.st_ino)};
}

/// Makes the stamp tell changes of a second file as well.
void include(ItemStamp& stamp, const ItemStamp& other) {
    stamp.size += other.size;
    stamp.modified = std::max(stamp.modified, other.modified);
    stamp.changed = std::max(stamp.changed, other.changed);
    stamp.inode = stamp.inode * 31 + other.inode;
}

/// Takes in all that lies in a bundle, up to a bound that no bundle reaches.
void includeContents(int parent, const char* name, ItemStamp& stamp, std::size_t& budget, std::size_t depth) {
    constexpr std::size_t deepest = 16;
    // The bundle itself may be a link; one within it is part of it as it stands.
    const int links = depth == 0 ? 0 : O_NOFOLLOW;
    const int file = ::openat(parent, name, O_RDONLY | O_DIRECTORY | links | O_CLOEXEC);
    if (file < 0 || depth > deepest) {
        if (file >= 0) ::close(file);
        return;
    }
    const Folder folder(::fdopendir(file), ::closedir);
    if (!folder) return;
    const Listing listing(folder.get());
    for (const Listing::Entry& entry : listing.entries()) {
        struct stat status {};
        const char* its = listing.name(entry).data();
        if (budget == 0 || ::fstatat(file, its, &status, AT_SYMLINK_NOFOLLOW) != 0) continue;
        --budget;
        include(stamp, stampOf(status));
        if (S_ISDIR(status.st_mode)) includeContents(file, its, stamp, budget, depth + 1);
    }
}

class Walk {
  public:
    Walk(const std::string& start, const FolderVisitor& visit,
         const std::function<void(const std::string&, const Error&)>& failed, const WalkedLinks& links)
        : start_(start),
          visit_(visit),
          failed_(failed),
          passedOver_(links.passedOver),
          rule_(start, links.outside) {}

    /// Links come last, so that a folder has the path where it lies, whatever points to it.
    bool run() {
        bool goesOn = folder(start_, 0);
        for (; goesOn && !links_.empty(); links_.pop_front()) goesOn = folder(links_.front(), 0);
        return goesOn;
    }

  private:
    bool folder(const std::string& path, std::size_t depth) {
        std::vector<std::string> folders;
        if (!list(path, folders)) return false;
        bool goesOn = true;
        for (const std::string& name : folders) {
            if (goesOn && depth < kDeepest) goesOn = folder(pathIn(path, name), depth + 1);
        }
        return goesOn;
    }

    /// Shows the folder's items to the visitor; what lies in it is entered later, when it is closed again.
    bool list(const std::string& path, std::vector<std::string>& folders) {
        const Folder folder(::opendir(path.c_str()), ::closedir);
        struct stat status {};
        if (!folder || ::fstat(::dirfd(folder.get()), &status) != 0) {
            fail(path);
            return true;
        }
        if (!entered_.insert({status.st_dev, status.st_ino}).second) return true;
        const Listing listing(folder.get());
        std::vector<ListedItem> items;
        for (const Listing::Entry& entry : listing.entries())
            addEntry(path, ::dirfd(folder.get()), listing, entry, items, folders);
        return visit_(path, items);
    }

    void fail(const std::string& path) {
        failed_(path, {std::string(QVCTErrorDomain), kErrorUnreadable,
                       fmt::format("{}: {}", printable(path), std::strerror(errno))});
    }

    void addEntry(const std::string& path, int folder, const Listing& listing, const Listing::Entry& entry,
                  std::vector<ListedItem>& items, std::vector<std::string>& folders) {
        const std::string_view name = listing.name(entry);
        const Kind kind = kinds_.of(name);
        if (kind == Kind::other && entry.kind == DT_REG) return;
        if (kind == Kind::other && entry.kind == DT_DIR) {
            folders.emplace_back(name);
            return;
        }
        struct stat status {};
        if (::fstatat(folder, name.data(), &status, 0) != 0) {
            if (kind != Kind::other) fail(path + "/" + std::string(name));
            return;
        }
        const bool isWalked = S_ISDIR(status.st_mode) && kind != Kind::bundle;
        const bool isContent =
            kind == Kind::bundle ? S_ISDIR(status.st_mode) : kind != Kind::other && S_ISREG(status.st_mode);
        if (!isWalked && !isContent) return;
        const bool isALink = isLink(folder, name, entry.kind);
        if (isALink && !rule_.follows(pathIn(path, name), isWalked)) {
            if (passedOver_) passedOver_(URL::fileURLWithPath(pathIn(path, name)));
            return;
        }
        if (isWalked) {
            if (isALink) {
                links_.push_back(pathIn(path, name));
            } else {
                folders.emplace_back(name);
            }
            return;
        }
        ListedItem item{name, stampOf(status)};
        includeCompanions(folder, listing, item);
        if (kind == Kind::bundle) {
            std::size_t budget = 10000;
            includeContents(folder, name.data(), item.stamp, budget, 0);
        }
        items.push_back(item);
    }

    /// The record, description and preview that lie beside an item. The size stays the item's own.
    static void includeCompanions(int folder, const Listing& listing, ListedItem& item) {
        const std::uint64_t size = item.stamp.size;
        listing.forEachThatBegins(std::string(item.name) + ".", [&](std::string_view ending) {
            constexpr std::array<std::string_view, 4> endings = {"plist", "zxml", "xml", "caf"};
            struct stat status {};
            if (std::find(endings.begin(), endings.end(), ending) == endings.end()) return;
            const char* companion = ending.data() - item.name.size() - 1;
            if (::fstatat(folder, companion, &status, 0) == 0) include(item.stamp, stampOf(status));
        });
        item.stamp.size = size;
    }

    static bool isLink(int folder, std::string_view name, unsigned char kind) {
        struct stat status {};
        if (kind != DT_UNKNOWN) return kind == DT_LNK;
        return ::fstatat(folder, name.data(), &status, AT_SYMLINK_NOFOLLOW) == 0 && S_ISLNK(status.st_mode);
    }

    const std::string& start_;
    const FolderVisitor& visit_;
    const std::function<void(const std::string&, const Error&)>& failed_;
    const std::function<void(const URL&)>& passedOver_;
    const LinkRule rule_;
    NameKinds kinds_;
    std::set<Identity> entered_;
    std::deque<std::string> links_;  // to folders, to be entered when the others were
};

std::uint64_t countBelow(const std::string& path, NameKinds& kinds, std::size_t depth) {
    const Folder folder(::opendir(path.c_str()), ::closedir);
    std::uint64_t count = 0;
    while (const dirent* entry = folder ? ::readdir(folder.get()) : nullptr) {
        const std::string_view name = entry->d_name;
        const Kind kind = kinds.of(name);
        if (kind != Kind::other) {
            ++count;
        } else if (entry->d_type == DT_DIR && name[0] != '.' && depth < kDeepest) {
            count += countBelow(path + "/" + std::string(name), kinds, depth + 1);
        }
    }
    return count;
}

}  // namespace

bool walkLibrary(const std::string& folder, const FolderVisitor& visit,
                 const std::function<void(const std::string& path, const Error& error)>& failed,
                 const WalkedLinks& links) {
    return Walk(folder, visit, failed, links).run();
}

std::uint64_t countContentNames(const std::string& folder) {
    NameKinds kinds;
    return countBelow(folder, kinds, 0);
}

}  // namespace qvct::contentdb

#include "platform/files/FolderListing.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include <dirent.h>
#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qvct {
namespace {

/// Some file systems do not report the kind of an entry in their listings.
EntryKind kindOf(int folder, const dirent& entry) {
    struct stat status {};
    status.st_mode = static_cast<mode_t>(DTTOIF(entry.d_type));
    const bool isThere =
        entry.d_type != DT_UNKNOWN || ::fstatat(folder, entry.d_name, &status, AT_SYMLINK_NOFOLLOW) == 0;
    return isThere ? EntryStatus::of(status).kind : EntryKind::other;
}

}  // namespace

std::optional<FolderListing> FolderListing::read(const std::string& path, Error* error) {
    auto listing = readAt(AT_FDCWD, path.c_str(), Links::follow);
    if (!listing) fail(error, kErrorUnreadable, std::strerror(errno), {path});
    return listing;
}

std::optional<FolderListing> FolderListing::readIn(const Entry& folder, Links links) const {
    return readAt(descriptor(), folder.name.data(), links);
}

/// Leaves the reason in `errno`.
std::optional<FolderListing> FolderListing::readAt(int parent, const char* name, Links links) {
    const int kept = links == Links::keep ? O_NOFOLLOW : 0;
    const int descriptor = ::openat(parent, name, O_RDONLY | O_DIRECTORY | O_CLOEXEC | kept);
    if (descriptor < 0) return std::nullopt;
    FolderListing listing(::fdopendir(descriptor));
    const int reason = listing.folder_ ? listing.readNames() : errno;
    if (reason == 0) return listing;
    if (!listing.folder_) ::close(descriptor);
    listing.folder_.reset();
    errno = reason;
    return std::nullopt;
}

/// Zero, or the reason why there may be more names.
int FolderListing::readNames() {
    std::vector<std::size_t> sizes;
    std::vector<EntryKind> kinds;
    const dirent* entry = nullptr;
    while (errno = 0, (entry = ::readdir(folder_.get())) != nullptr) {
        if (entry->d_name[0] == '.') continue;
        sizes.push_back(std::strlen(entry->d_name));
        names_.insert(names_.end(), entry->d_name, entry->d_name + sizes.back() + 1);
        kinds.push_back(kindOf(descriptor(), *entry));
    }
    if (errno != 0) return errno;
    const char* name = names_.data();
    entries_.reserve(sizes.size());
    for (std::size_t i = 0; i < sizes.size(); name += sizes[i++] + 1)
        entries_.push_back({{name, sizes[i]}, kinds[i]});
    std::sort(entries_.begin(), entries_.end(),
              [](const Entry& a, const Entry& b) { return a.name < b.name; });
    return 0;
}

std::span<const FolderListing::Entry> FolderListing::entriesThatBegin(std::string_view start) const {
    const auto begin = std::lower_bound(entries_.begin(), entries_.end(), start,
                                        [](const Entry& a, std::string_view b) { return a.name < b; });
    const auto end =
        std::find_if(begin, entries_.end(), [&](const Entry& a) { return !a.name.starts_with(start); });
    return {begin, end};
}

EntryStatus FolderListing::status() const {
    struct stat status {};
    return ::fstat(descriptor(), &status) == 0 ? EntryStatus::of(status) : EntryStatus{};
}

std::optional<EntryStatus> FolderListing::status(const Entry& entry, Links links, std::string_view path,
                                                 Error* error) const {
    struct stat status {};
    const int kept = links == Links::keep ? AT_SYMLINK_NOFOLLOW : 0;
    if (::fstatat(descriptor(), entry.name.data(), &status, kept) == 0) return EntryStatus::of(status);
    fail(error, kErrorUnreadable, std::strerror(errno), {fmt::format("{}/{}", path, entry.name)});
    return std::nullopt;
}

}  // namespace qvct

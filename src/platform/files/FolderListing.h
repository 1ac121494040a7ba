#pragma once

#include "platform/base/Error.h"
#include "platform/files/EntryStatus.h"

#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include <dirent.h>

namespace qvct {

/// The names in a folder, sorted by their bytes, without those that begin with a dot. The folder stays open
/// as long as the listing lives, so that its entries are found even if it is moved meanwhile.
class FolderListing {
  public:
    struct Entry {
        std::string_view name;  ///< A NUL stands behind it.
        EntryKind kind;
    };

    /// Nothing, and an error, for what is no folder or cannot be read to its end.
    static std::optional<FolderListing> read(const std::string& path, Error* error = nullptr);
    /// Lists a folder in this one; nothing when the entry is no folder, or cannot be read to its end.
    std::optional<FolderListing> readIn(const Entry& folder, Links links) const;

    const std::vector<Entry>& entries() const { return entries_; }
    std::span<const Entry> entriesThatBegin(std::string_view start) const;

    /// Of the folder itself.
    EntryStatus status() const;
    /// Nothing, and an error, when the entry is gone or leads nowhere. `path` is the folder's, for the error.
    std::optional<EntryStatus> status(const Entry& entry, Links links, std::string_view path = {},
                                      Error* error = nullptr) const;

  private:
    struct Closer {
        void operator()(DIR* folder) const { ::closedir(folder); }
    };

    explicit FolderListing(DIR* folder) : folder_(folder) {}
    static std::optional<FolderListing> readAt(int parent, const char* name, Links links);
    int readNames();
    int descriptor() const { return ::dirfd(folder_.get()); }

    std::unique_ptr<DIR, Closer> folder_;
    std::vector<char> names_;
    std::vector<Entry> entries_;
};

}  // namespace qvct

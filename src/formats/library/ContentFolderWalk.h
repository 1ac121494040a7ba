#pragma once

#include "formats/library/ContentNames.h"
#include "formats/library/ContentWalk.h"
#include "platform/files/FolderListing.h"

#include <functional>
#include <string>
#include <vector>

namespace qvct {

/// A folder on a walk, with all that is content in it.
struct ContentFolder {
    struct Item {
        FolderListing::Entry entry;
        ContentKind kind;
    };

    std::string path;
    FolderListing listing;
    std::vector<Item> items;  ///< In the order of names.
};

/// Called for each folder; answers whether to go on.
using ContentFolderVisitor = std::function<bool(const ContentFolder& folder)>;
/// Called with the path of what cannot be read, and the reason.
using WalkFailure = std::function<void(const std::string& path, const Error& error)>;

/// The walk of `walkContent`, folder by folder: a folder's items, then its folders by name.
/// @return  False when the visitor stopped it.
bool walkContentFolders(const std::string& path, const ContentFolderVisitor& visit, const WalkFailure& failed,
                        const WalkedLinks& links = {});

}  // namespace qvct

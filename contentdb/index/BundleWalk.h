#pragma once

#include "platform/files/FolderListing.h"

#include <functional>
#include <string>

namespace qvct::contentdb {

/// Something in a bundle.
struct BundleEntry {
    const FolderListing& folder;  ///< where it lies
    const FolderListing::Entry& entry;
    const std::string& folderPath;  ///< relative to the bundle, ends with "/"; empty for the bundle itself
};

/// Visits what lies in a bundle in the order of the names, a folder before what lies in it; hidden entries
/// are passed over and links are not followed. Ends early when `visit` answers false.
///
/// False when not everything was visited: a visit ended it, a folder could not be listed (the others are
/// visited nevertheless), or there are more than 10,000 entries or 16 folders in each other, which no real
/// bundle has.
bool forEachInBundle(const FolderListing& bundle, const std::function<bool(const BundleEntry&)>& visit);

}  // namespace qvct::contentdb

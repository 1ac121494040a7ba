#pragma once

#include "formats/ContentWriters.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"

#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>

namespace qvct {

// What a person said of all that lies in a folder, now and later: which tags nothing in it has. It is kept in
// a hidden property list in the folder (docs/formats/folder.md).

/// The name of that file.
inline constexpr std::string_view kFolderRecordName = ".qvct-folder.plist";

/// The path of that file in a folder, whether it is there or not.
QVCT_API std::string folderRecordPath(std::string_view folder);

/// The labels that a folder itself rejects, without those above it. None where there is no such file;
/// nothing, and an error, where it cannot be read: no property list, no array of labels, more than a
/// mebibyte.
QVCT_API std::optional<std::set<std::string>> rejectedLabelsOfFolder(std::string_view folder,
                                                                     Error* error = nullptr);
/// Replaces them, and leaves the rest of the file alone.
///
/// Written like an item's record, with the same guarantees; what cannot be read is never written over.
QVCT_API bool setRejectedLabelsOfFolder(const std::set<std::string>& labels, std::string_view folder,
                                        Error* error = nullptr, const ContentWriteOptions& options = {});

/// What folders reject, each looked at once, when it is first asked for. What cannot be read counts as none
/// and is logged.
///
/// It shows folders as they were then: make a new one for each run. Not thread-safe.
class QVCT_API FolderRejections {
  public:
    using Labels = std::set<std::string>;

    /// The labels that a folder itself rejects; null for none.
    /// @cost  Two system calls the first time.
    std::shared_ptr<const Labels> ofFolder(std::string_view folder);

  private:
    std::map<std::string, std::shared_ptr<const Labels>, std::less<>> known_;
};

}  // namespace qvct

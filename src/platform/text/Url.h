#pragma once

#include "platform/base/Export.h"

#include <string>
#include <string_view>

namespace qvct {

/// Where a content item lies: almost always a file URL.
///
/// A file URL is kept as its path, byte for byte, since file names need not be UTF-8.
class QVCT_API URL {
  public:
    /// The URL of a path. A relative path is taken from the current directory; "." and ".." and doubled
    /// slashes are resolved in the text, without looking at the disk. A trailing slash is dropped.
    static URL fileURLWithPath(std::string_view path);
    /// The URL written as the text; "file://" forms are percent-decoded.
    static URL URLWithString(std::string_view text);

    bool isFileURL() const { return isFile_; }
    /// The absolute path of a file URL; for other URLs their text, which is refused as a path when reading or
    /// writing.
    const std::string& path() const { return isFile_ ? path_ : text_; }
    /// "file://" and the percent-encoded path; for other URLs their text.
    std::string absoluteString() const;
    /// "file://" and the path as it is: `absoluteString` with the percent-encoding removed.
    std::string decodedString() const;

    std::string lastPathComponent() const;
    /// The characters after the last dot of the last component; empty when there is none.
    std::string pathExtension() const;
    /// The extension in lower case, for comparing.
    std::string lowercasePathExtension() const;
    std::string lastPathComponentWithoutExtension() const;
    /// The URL of the entry of that name inside this one.
    URL URLByAppendingPathComponent(std::string_view component) const;
    /// This URL with "." and the extension appended to its last component.
    URL URLByAppendingPathExtension(std::string_view extension) const;
    URL URLByDeletingLastPathComponent() const;

    bool operator==(const URL&) const = default;

  private:
    URL(bool isFile, std::string text, std::string path);

    bool isFile_;
    std::string text_;  // of a URL that is no file URL
    std::string path_;  // of other URLs the text after the host
};

/// Whether a path is really the text of a URL, such as "https://host/Loop.wav", and so names no file on this
/// machine.
bool isURLText(std::string_view path);

}  // namespace qvct

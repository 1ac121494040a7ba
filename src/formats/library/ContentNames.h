#pragma once

#include <map>
#include <string>
#include <string_view>

namespace qvct {

/// What a name promises.
enum class ContentKind : unsigned char {
    none,
    file,
    bundle  ///< A folder that is one item.
};

/// Tells which names are those of content: the extension is that of a kind that the framework knows, the name
/// is not hidden, and it is not that of the recorded preview of another item.
///
/// Data files (".data") do not count: countless programs use that extension, and only a search through all
/// bytes tells whether a file carries a record. A caller that names one can read it.
/// @cost  Each extension is looked up once and remembered.
class ContentNames {
  public:
    ContentKind kindOf(std::string_view name);

  private:
    std::map<std::string, ContentKind, std::less<>> kinds_;
};

}  // namespace qvct

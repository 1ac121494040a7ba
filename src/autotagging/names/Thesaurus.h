#pragma once

#include "platform/base/Export.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace qvct {

class NamingHabits;

/// A tag that a word stands for, with the level that it speaks of: 1 of Bright / Dark for "dark".
struct MeantTag {
    std::string label;
    std::optional<double> level;
};

/// What people mean by a word, from the habits by which names are read.
///
/// Immutable, so it may be shared by threads.
class QVCT_API Thesaurus {
  public:
    /// From the built-in habits, or those that a resource folder has.
    /// @cost  Some milliseconds.
    Thesaurus();
    ~Thesaurus();
    Thesaurus(const Thesaurus&) = delete;
    Thesaurus& operator=(const Thesaurus&) = delete;

    /// The tag that a word or phrase says plainly or by an abbreviation: Kick for "bd" and "bass drum".
    std::optional<MeantTag> tagMeant(std::string_view text) const;

  private:
    std::shared_ptr<const NamingHabits> habits_;
};

}  // namespace qvct

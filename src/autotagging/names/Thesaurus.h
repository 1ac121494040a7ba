#pragma once

#include "platform/base/Export.h"

#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

class NamingHabits;

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

    /// The labels that a word or phrase says plainly or by an abbreviation: Kick for "bd" and "bass drum".
    std::vector<std::string> labelsMeant(std::string_view text) const;

  private:
    std::shared_ptr<const NamingHabits> habits_;
};

}  // namespace qvct

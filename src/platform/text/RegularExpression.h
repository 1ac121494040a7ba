#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// A compiled ICU regular expression.
///
/// Searching changes the expression's own state: use one from one thread at a time. A search that backtracks
/// without end is given up after about a second and counts as no match, with an error where one is asked for.
class QVCT_API RegularExpression {
  public:
    /// Whether upper and lower case differ.
    enum class Case { sensitive, insensitive };
    /// A match: UTF-16 offsets of the whole (first) and of each capture group.
    struct Range {
        std::size_t start = 0;
        std::size_t end = 0;
    };

    /// The compiled pattern (UTF-8), or nothing and an error with the position of the fault.
    static std::optional<RegularExpression> compile(std::string_view pattern, Case caseMode,
                                                    Error* error = nullptr);

    /// @{
    /// A moved-from expression can only be assigned to or destroyed.
    RegularExpression(RegularExpression&&) noexcept;
    RegularExpression& operator=(RegularExpression&&) noexcept;
    /// @}
    ~RegularExpression();

    /// Whether the pattern occurs anywhere in the text.
    bool occursIn(std::u16string_view text, Error* error = nullptr);
    /// The first occurrence with its capture groups; empty when there is none.
    std::vector<Range> firstMatch(std::u16string_view text);

  private:
    struct Implementation;
    explicit RegularExpression(std::unique_ptr<Implementation> implementation);
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace qvct
